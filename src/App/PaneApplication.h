// PaneApplication: what panes and the save screen need of the application object (Parts 1.2 and 1.3): the save-button decision, showSaveView and closeSaveView.
#pragma once

namespace vantorel {

class PaneApplication {
public:
    virtual ~PaneApplication() = default;
    // Part 1.1's `allowSaveButton`: panes show the save button only when true.
    virtual bool allowSaveButton() const = 0;
    // Part 1.1: present the save screen (a second call while shown does nothing).
    virtual void showSaveView() = 0;
    // Part 1.1: dismiss the save screen, sent by the screen itself when done.
    virtual void closeSaveView() = 0;
};

}  // namespace vantorel
