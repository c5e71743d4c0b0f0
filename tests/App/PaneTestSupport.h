// PaneTestSupport: fakes and input helpers shared by the pane, cell and navigation tests (Part 1.2).
#pragma once

#include "App/NavigationController.h"
#include "App/NavigationControllerDelegate.h"
#include "App/PaneApplication.h"
#include "App/VantorelPaneController.h"
#include "Model/VantorelModelNode.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <QApplication>
#include <QMouseEvent>
#include <QStackedWidget>
#include <QWidget>
#include <QWindow>

#include <string>
#include <vector>

// Exported by QtGui for its own test library: delivers a key event as the platform
// would, shortcuts first, then to the window's focus widget.
Q_GUI_EXPORT void qt_handleKeyEvent(QWindow* window, QEvent::Type type, int key, Qt::KeyboardModifiers modifiers,
                                    const QString& text = QString(), bool autorep = false, ushort count = 1);

namespace vantorel::panetest {

// The application object as panes see it: the save preference and counters.
class FakeApplication : public PaneApplication {
public:
    explicit FakeApplication(bool allowSave = false) : allowSave(allowSave) {}
    bool allowSaveButton() const override { return allowSave; }
    void showSaveView() override { ++showSaveViewCalls; }
    void closeSaveView() override { ++closeSaveViewCalls; }

    bool allowSave;
    int showSaveViewCalls = 0;
    int closeSaveViewCalls = 0;
};

// Records every navigationControllerWillShow call with what the pane and the stack
// looked like at that moment.
class RecordingDelegate : public NavigationControllerDelegate {
public:
    struct Call {
        VantorelPaneController* pane;
        std::string path;
        std::string status;
        bool isLoading;
        bool wasCurrent;  // already the stack's shown pane when told
        bool wasVisible;
    };
    void navigationControllerWillShow(NavigationController& navigationController,
                                      VantorelPaneController& pane) override {
        auto* stack = navigationController.findChild<QStackedWidget*>();
        calls.push_back({&pane, pane.path(), pane.status(), pane.isLoading(),
                         stack && stack->currentWidget() == &pane, pane.isVisible()});
    }
    std::vector<Call> calls;
};

inline NodeRef makeTree(const Value& display) {
    PathDictionary paths;
    return VantorelModelNode::makeTreeFromObject(display, paths);
}

// The child of `node` with that display name (nullptr when absent).
inline NodeRef childNamed(const NodeRef& node, const std::string& name) {
    if (!node || !node->childNodes()) return nullptr;
    for (const NodeRef& child : *node->childNodes())
        if (child->displayName() == name) return child;
    return nullptr;
}

inline void settle() {
    for (int i = 0; i < 3; ++i) QApplication::processEvents();
}

// A left click at `pos` of `widget`, delivered to the deepest child there, as the
// platform does (unaccepted presses travel up to the parents).
inline void click(QWidget* widget, QPoint pos) {
    QWidget* target = widget->childAt(pos);
    if (!target) target = widget;
    const QPointF local = target->mapFrom(widget, QPointF(pos));
    const QPointF global = widget->mapToGlobal(QPointF(pos));
    QMouseEvent press(QEvent::MouseButtonPress, local, global, Qt::LeftButton, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(target, &press);
    QMouseEvent release(QEvent::MouseButtonRelease, local, global, Qt::LeftButton, Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(target, &release);
    settle();
}

// A key press and release through the window, shortcuts included.
inline void pressKey(QWidget* widget, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QWindow* window = widget->window()->windowHandle();
    qt_handleKeyEvent(window, QEvent::KeyPress, key, modifiers);
    qt_handleKeyEvent(window, QEvent::KeyRelease, key, modifiers);
    settle();
}

// Shows a top-level widget at a fixed size and makes it the active window.
inline void showAt(QWidget& widget, int width, int height) {
    widget.resize(width, height);
    widget.show();
    widget.activateWindow();
    QApplication::setActiveWindow(&widget);
    settle();
}

// Runs the deleteLater calls made so far.
inline void runDeferredDeletes() {
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    settle();
}

}  // namespace vantorel::panetest
