// PaneTestSupport: a fake application object, tree building, row lookup and input helpers for the window tests.
#pragma once

#include "App/PaneApplication.h"
#include "App/VantorelPaneController.h"
#include "Model/VantorelModelNode.h"
#include "PropertyList/Dictionary.h"

#include <QApplication>
#include <QMouseEvent>
#include <QWindow>

#include <functional>

// Exported by QtGui for its own test library: delivers a key event as the platform
// would, shortcuts first, then to the window's focus widget.
Q_GUI_EXPORT void qt_handleKeyEvent(QWindow* window, QEvent::Type type, int key, Qt::KeyboardModifiers modifiers,
                                    const QString& text = QString(), bool autorep = false, ushort count = 1);

namespace vantorel::panetest {

class FakeApplication : public PaneApplication {
public:
    explicit FakeApplication(bool allowSave = false) : allowSave(allowSave) {}
    bool allowSaveButton() const override { return allowSave; }
    void showSaveView() override { ++showSaveViewCalls; }
    void closeSaveView() override { ++closeSaveViewCalls; }
    void showSignalPlot() override {}
    void plotValue(const std::string& path) override { plotted.push_back(path); }
    bool allowSave;
    int showSaveViewCalls = 0;
    int closeSaveViewCalls = 0;
    std::vector<std::string> plotted;
};

// A dictionary holding `entries` in order.
inline Value dict(std::initializer_list<std::pair<const char*, Value>> entries) {
    auto d = Dictionary::create();
    for (const auto& [key, value] : entries) d->set(key, value);
    return Value(d);
}

inline NodeRef makeTree(const Value& display) {
    PathDictionary paths;
    return VantorelModelNode::makeTreeFromObject(display, paths);
}

// The row of `pane` showing `name`, or -1.
inline int rowOf(const VantorelPaneController& pane, const std::string& name) {
    const auto* children = pane.node()->childNodes();
    for (std::size_t i = 0; children && i < children->size(); ++i)
        if ((*children)[i]->displayName() == name) return int(i);
    return -1;
}

inline void settle() {
    for (int i = 0; i < 3; ++i) QApplication::processEvents();
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
}

// A left click at `pos` of `widget`, delivered to the deepest child there; `between`
// runs after the press, as a refresh may while the user holds the button.
inline void click(QWidget* widget, QPoint pos, const std::function<void()>& between = {}) {
    auto send = [&](QEvent::Type type, Qt::MouseButtons buttons) {
        QWidget* target = widget->childAt(pos) ? widget->childAt(pos) : widget;
        QMouseEvent event(type, target->mapFrom(widget, QPointF(pos)), widget->mapToGlobal(QPointF(pos)), Qt::LeftButton,
                          buttons, Qt::NoModifier);
        QApplication::sendEvent(target, &event);
    };
    send(QEvent::MouseButtonPress, Qt::LeftButton);
    if (between) {
        between();
        settle();
    }
    send(QEvent::MouseButtonRelease, Qt::NoButton);
    settle();
}

// A key press and release through the window, shortcuts included.
inline void pressKey(QWidget* widget, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QWindow* window = widget->window()->windowHandle();
    qt_handleKeyEvent(window, QEvent::KeyPress, key, modifiers);
    qt_handleKeyEvent(window, QEvent::KeyRelease, key, modifiers);
    settle();
}

inline void showAt(QWidget& widget, int width, int height) {
    widget.resize(width, height);
    widget.show();
    QApplication::setActiveWindow(&widget);
    settle();
}

}  // namespace vantorel::panetest
