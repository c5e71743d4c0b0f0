// NavigationController: the stack of drill-down panes with its top bar (title, back button).
#include "App/NavigationController.h"

#include "App/NavigationControllerDelegate.h"
#include "App/VantorelPaneController.h"

#include <QHBoxLayout>
#include <QLabel>
#include <QShortcut>
#include <QStackedWidget>
#include <QToolButton>
#include <QVBoxLayout>

namespace vantorel {

namespace {

constexpr const char* kBackPrefix = "\u2039 ";  // "‹ Title"
constexpr int kBarHeight = 44;

}  // namespace

NavigationController::NavigationController(std::unique_ptr<VantorelPaneController> rootViewController,
                                           QWidget* parent)
    : QWidget(parent),
      stack_(new QStackedWidget(this)),
      backButton_(new QToolButton(this)),
      titleLabel_(new QLabel(this)) {
    auto* bar = new QWidget(this);
    bar->setFixedHeight(kBarHeight);
    auto* barLayout = new QHBoxLayout(bar);
    barLayout->setContentsMargins(6, 0, 6, 0);
    backButton_->setParent(bar);
    backButton_->setAutoRaise(true);
    backButton_->setFocusPolicy(Qt::NoFocus);
    titleLabel_->setParent(bar);
    titleLabel_->setTextFormat(Qt::PlainText);
    titleLabel_->setAlignment(Qt::AlignCenter);
    QFont titleFont = titleLabel_->font();
    titleFont.setBold(true);
    titleLabel_->setFont(titleFont);
    barLayout->addWidget(backButton_);
    barLayout->addWidget(titleLabel_, 1);
    connect(backButton_, &QToolButton::clicked, this, [this] { pop(true); });

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(bar);
    layout->addWidget(stack_, 1);

    for (const QKeySequence& keys : {QKeySequence(Qt::Key_Backspace), QKeySequence(Qt::ALT | Qt::Key_Left)}) {
        auto* shortcut = new QShortcut(keys, this);
        shortcut->setContext(Qt::WidgetWithChildrenShortcut);
        connect(shortcut, &QShortcut::activated, this, [this] { pop(true); });
    }

    if (rootViewController) {
        VantorelPaneController* root = rootViewController.release();
        root->setNavigationController(this);
        connect(root, &VantorelPaneController::titleChanged, this, &NavigationController::updateBar);
        stack_->addWidget(root);
        panes_.push_back(root);
    }
    updateBar();
}

NavigationController::~NavigationController() {
    // The panes go with stack_; none may reach back to this controller meanwhile.
    for (VantorelPaneController* pane : panes_) pane->setNavigationController(nullptr);
}

void NavigationController::setVisible(bool visible) {
    // The root (or whatever is on top) appears with the controller the first time.
    if (visible && !isVisible() && topPane() && topPane() != shownPane_) transition(topPane(), nullptr);
    QWidget::setVisible(visible);
}

void NavigationController::showEvent(QShowEvent* event) {
    QWidget::showEvent(event);
    // As a child of a window that is being shown, this controller is shown without
    // setVisible: the top pane appears here then, still before anything is painted.
    if (topPane() && topPane() != shownPane_) transition(topPane(), nullptr);
    // A hidden pane cannot take the keyboard: give it now.
    if (topPane()) topPane()->setFocus();
}

void NavigationController::transition(VantorelPaneController* incoming, VantorelPaneController* outgoing) {
    if (delegate_) delegate_->navigationControllerWillShow(*this, *incoming);
    if (outgoing) outgoing->viewWillDisappear();
    incoming->viewWillAppear();
    stack_->setCurrentWidget(incoming);
    shownPane_ = incoming;
    updateBar();
    incoming->setFocus();
}

void NavigationController::push(std::unique_ptr<VantorelPaneController> pane, bool /*animated*/) {
    if (!pane) return;
    VantorelPaneController* outgoing = topPane();
    VantorelPaneController* incoming = pane.release();
    incoming->setNavigationController(this);
    connect(incoming, &VantorelPaneController::titleChanged, this, &NavigationController::updateBar);
    stack_->addWidget(incoming);
    panes_.push_back(incoming);
    transition(incoming, outgoing);
}

bool NavigationController::pop(bool animated) { return popTo(int(panes_.size()) - 2, animated); }

bool NavigationController::popTo(int index, bool /*animated*/) {
    if (index < 0 || index + 1 >= int(panes_.size())) return false;
    VantorelPaneController* incoming = panes_[std::size_t(index)];
    transition(incoming, topPane());
    // Panes may be popped from inside their own event handlers: delete them later.
    while (int(panes_.size()) > index + 1) {
        VantorelPaneController* popped = panes_.back();
        panes_.pop_back();
        popped->setNavigationController(nullptr);
        disconnect(popped, nullptr, this, nullptr);
        stack_->removeWidget(popped);
        popped->hide();
        popped->deleteLater();
    }
    updateBar();
    return true;
}

bool NavigationController::popToViewController(VantorelPaneController* pane, bool animated) {
    for (std::size_t i = 0; i < panes_.size(); ++i)
        if (panes_[i] == pane) return popTo(int(i), animated);
    return false;
}

void NavigationController::updateBar() {
    VantorelPaneController* top = topPane();
    titleLabel_->setText(top ? QString::fromStdString(top->title()) : QString());
    if (panes_.size() > 1) {
        const VantorelPaneController* previous = panes_[panes_.size() - 2];
        backButton_->setText(QString::fromUtf8(kBackPrefix) + QString::fromStdString(previous->title()));
        backButton_->setVisible(true);
    } else {
        backButton_->setText(QString());
        backButton_->setVisible(false);
    }
}

}  // namespace vantorel
