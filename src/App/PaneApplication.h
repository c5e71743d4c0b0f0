// PaneApplication: what panes and the save screen need of the application object: the save button, the save screen and the signal plot.
#pragma once

#include <string>

namespace vantorel {

class PaneApplication {
public:
    virtual ~PaneApplication() = default;
    // Panes show the save button only when true (internal installs, or asked for).
    virtual bool allowSaveButton() const = 0;
    // Presents the save screen (a second call while shown does nothing).
    virtual void showSaveView() = 0;
    // Dismisses the save screen, sent by the screen itself when done.
    virtual void closeSaveView() = 0;
    // Opens (or raises) the signal plot window.
    virtual void showSignalPlot() = 0;
    // Adds the leaf at a display-tree path to the plotted values ("Plot this value").
    virtual void plotValue(const std::string& path) = 0;
};

}  // namespace vantorel
