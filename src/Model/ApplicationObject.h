// ApplicationObject: what the model tells the program that shows its display after new data; the window and the terminal view each play that role.
#pragma once

namespace vantorel {

class ApplicationObject {
public:
    virtual ~ApplicationObject() = default;
    // New data was decoded: reload what is shown from the model.
    virtual void updateViewControllerFromModel() = 0;
};

}  // namespace vantorel
