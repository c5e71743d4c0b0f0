// NavigationController: the stack of drill-down panes with its top bar (title, back button).
#pragma once

#include <QWidget>

#include <memory>
#include <vector>

class QLabel;
class QStackedWidget;
class QToolButton;

namespace vantorel {

class NavigationControllerDelegate;
class VantorelPaneController;

// A stack of VantorelPaneController panes, root first, with a top bar that shows the
// top pane's title and a back button titled after the pane below it. The shown
// pane carries its own toolbar. Backspace and Alt+Left go back. Popped panes are
// deleted from the event loop. The "animated" flags are accepted and not animated.
class NavigationController : public QWidget {
    Q_OBJECT
public:
    // `initWithRootViewController:`. The root is shown (and its delegate call made)
    // when the controller is first shown.
    explicit NavigationController(std::unique_ptr<VantorelPaneController> rootViewController,
                                  QWidget* parent = nullptr);
    ~NavigationController() override;

    NavigationControllerDelegate* delegate() const { return delegate_; }
    void setDelegate(NavigationControllerDelegate* delegate) { delegate_ = delegate; }

    // Pushes a pane on top and shows it (the delegate is told first).
    void push(std::unique_ptr<VantorelPaneController> pane, bool animated);
    // Pops the top pane; false at the root.
    bool pop(bool animated = true);
    // Pops every pane above the one at `index` (0 = root) and shows it; false when
    // there is nothing above it or the index is out of range.
    bool popTo(int index, bool animated = true);
    bool popToViewController(VantorelPaneController* pane, bool animated = true);

    // The stack, root first.
    const std::vector<VantorelPaneController*>& panes() const { return panes_; }
    VantorelPaneController* topPane() const { return panes_.empty() ? nullptr : panes_.back(); }

    // The top bar: the back button (titled after the pane below) and the title.
    QToolButton* backButton() const { return backButton_; }
    QLabel* titleLabel() const { return titleLabel_; }

    // Shows the top pane (the root at start) before the controller first becomes
    // visible, so that the delegate hears of it before it is shown (showEvent does it
    // when a parent window shows this controller without calling setVisible).
    void setVisible(bool visible) override;

protected:
    void showEvent(QShowEvent* event) override;

private:
    // Delegate, disappear/appear calls and the switch to `incoming`.
    void transition(VantorelPaneController* incoming, VantorelPaneController* outgoing);
    void updateBar();

    NavigationControllerDelegate* delegate_ = nullptr;
    std::vector<VantorelPaneController*> panes_;   // owned through stack_
    VantorelPaneController* shownPane_ = nullptr;  // the pane the last transition showed
    QStackedWidget* stack_;
    QToolButton* backButton_;
    QLabel* titleLabel_;
};

}  // namespace vantorel
