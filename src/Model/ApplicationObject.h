// ApplicationObject: what the model needs of "the application object" (Part 2.2 refresh step 4): the Qt application and the terminal view each play that role.
#pragma once

namespace vantorel {

class ApplicationObject {
public:
    virtual ~ApplicationObject() = default;
    // New data was decoded: reload the visible panes from the model (Part 1.1).
    virtual void updateViewControllerFromModel() = 0;
};

}  // namespace vantorel
