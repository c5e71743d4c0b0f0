// NavigationControllerDelegate: told by the navigation controller before it shows a pane, so that the pane's status line is current when it appears.
#pragma once

namespace vantorel {

class NavigationController;
class VantorelPaneController;

class NavigationControllerDelegate {
public:
    virtual ~NavigationControllerDelegate() = default;
    // Called before `pane` is shown: when it is pushed, when a pop makes it the top
    // pane, and for the root when the controller is first shown.
    virtual void navigationControllerWillShow(NavigationController& navigationController,
                                              VantorelPaneController& pane) = 0;
};

}  // namespace vantorel
