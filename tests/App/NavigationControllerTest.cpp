// Tests for NavigationController: the pane stack of Parts 1.1 and 1.2 with its back button, keyboard, delegate and pane lifetime.
#include "App/NavigationController.h"

#include "App/VantorelPaneController.h"
#include "PaneTestSupport.h"

#include <QLabel>
#include <QPointer>
#include <QTableWidget>
#include <QToolBar>
#include <QToolButton>
#include <QVBoxLayout>

#include <gtest/gtest.h>

#include <memory>

using namespace vantorel;
using namespace vantorel::panetest;

namespace {

// {"A": {"B": {"C": {}}}}
NodeRef threeLevels() {
    auto b = Dictionary::create();
    b->set("C", Value(Dictionary::create()));
    auto a = Dictionary::create();
    a->set("B", Value(b));
    auto display = Dictionary::create();
    display->set("A", Value(a));
    return makeTree(Value(display));
}

struct Fixture {
    Fixture() : root(threeLevels()), navigation(std::make_unique<VantorelPaneController>(root, "/", &application)) {
        navigation.setDelegate(&delegate);
    }
    void show() { showAt(navigation, 400, 600); }
    // Drills down through the first row of the top pane.
    void drill() { navigation.topPane()->didSelectRowAtIndexPath(0); }

    FakeApplication application;
    RecordingDelegate delegate;
    NodeRef root;
    NavigationController navigation;
};

}  // namespace

TEST(NavigationController, TheRootIsShownWithTheDelegateToldFirst) {
    Fixture f;
    EXPECT_TRUE(f.delegate.calls.empty());  // not before the controller is shown
    f.show();
    ASSERT_EQ(f.delegate.calls.size(), 1u);
    EXPECT_EQ(f.delegate.calls[0].pane, f.navigation.panes()[0]);
    EXPECT_FALSE(f.delegate.calls[0].wasVisible);
    EXPECT_EQ(f.navigation.titleLabel()->text(), "Vantorel");
    EXPECT_FALSE(f.navigation.backButton()->isVisible());
    EXPECT_TRUE(f.navigation.topPane()->toolbar()->isVisible());
}

TEST(NavigationController, TheRootIsShownOnceWhenAParentWindowShowsTheController) {
    FakeApplication application;
    RecordingDelegate delegate;
    QWidget window;
    auto* navigation =
        new NavigationController(std::make_unique<VantorelPaneController>(threeLevels(), "/", &application), &window);
    navigation->setDelegate(&delegate);
    auto* layout = new QVBoxLayout(&window);
    layout->addWidget(navigation);
    showAt(window, 400, 600);
    ASSERT_EQ(delegate.calls.size(), 1u);
    EXPECT_EQ(delegate.calls[0].path, "/");
    EXPECT_TRUE(navigation->topPane()->isVisible());
    EXPECT_TRUE(navigation->topPane()->tableView()->hasFocus());
    window.hide();
    window.show();
    settle();
    EXPECT_EQ(delegate.calls.size(), 1u);
}

TEST(NavigationController, TheDelegateIsCalledBeforeAPaneIsShown) {
    Fixture f;
    f.show();
    f.delegate.calls.clear();
    f.drill();
    ASSERT_EQ(f.delegate.calls.size(), 1u);
    EXPECT_EQ(f.delegate.calls[0].path, "/A");
    EXPECT_FALSE(f.delegate.calls[0].wasCurrent);
    EXPECT_FALSE(f.delegate.calls[0].wasVisible);
    EXPECT_TRUE(f.navigation.topPane()->isVisible());

    f.drill();
    f.delegate.calls.clear();
    f.navigation.pop(true);  // the pane below is told about before it shows again
    ASSERT_EQ(f.delegate.calls.size(), 1u);
    EXPECT_EQ(f.delegate.calls[0].path, "/A");
    EXPECT_FALSE(f.delegate.calls[0].wasCurrent);
}

TEST(NavigationController, PushShowsTheNewPaneAndItsToolbar) {
    Fixture f;
    f.show();
    f.drill();
    ASSERT_EQ(f.navigation.panes().size(), 2u);
    VantorelPaneController* top = f.navigation.topPane();
    EXPECT_EQ(top->navigationController(), &f.navigation);
    EXPECT_TRUE(top->isVisible());
    EXPECT_FALSE(f.navigation.panes()[0]->isVisible());
    EXPECT_TRUE(top->toolbar()->isVisible());
    EXPECT_EQ(f.navigation.titleLabel()->text(), "A");
}

TEST(NavigationController, TheBackButtonShowsThePreviousPanesTitle) {
    Fixture f;
    f.show();
    f.drill();
    EXPECT_TRUE(f.navigation.backButton()->isVisible());
    EXPECT_EQ(f.navigation.backButton()->text(), QString::fromUtf8("\u2039 Vantorel"));
    f.drill();
    EXPECT_EQ(f.navigation.backButton()->text(), QString::fromUtf8("\u2039 A"));
    EXPECT_EQ(f.navigation.titleLabel()->text(), "B");
    f.navigation.backButton()->click();
    settle();
    EXPECT_EQ(f.navigation.panes().size(), 2u);
    EXPECT_EQ(f.navigation.titleLabel()->text(), "A");
    EXPECT_EQ(f.navigation.backButton()->text(), QString::fromUtf8("\u2039 Vantorel"));
    f.navigation.backButton()->click();
    settle();
    EXPECT_EQ(f.navigation.panes().size(), 1u);
    EXPECT_FALSE(f.navigation.backButton()->isVisible());
}

TEST(NavigationController, TheTitleFollowsAReloadOfTheTopPane) {
    Fixture f;
    f.show();
    f.drill();
    f.navigation.topPane()->reloadWithNode(nullptr);
    EXPECT_EQ(f.navigation.titleLabel()->text(), "Vantorel");
}

TEST(NavigationController, BackspaceAndAltLeftGoBack) {
    Fixture f;
    f.show();
    f.drill();
    f.drill();
    ASSERT_EQ(f.navigation.panes().size(), 3u);
    pressKey(&f.navigation, Qt::Key_Backspace);
    EXPECT_EQ(f.navigation.panes().size(), 2u);
    pressKey(&f.navigation, Qt::Key_Left, Qt::AltModifier);
    EXPECT_EQ(f.navigation.panes().size(), 1u);
    pressKey(&f.navigation, Qt::Key_Backspace);  // nothing below the root
    EXPECT_EQ(f.navigation.panes().size(), 1u);
    EXPECT_EQ(f.navigation.topPane()->path(), "/");
}

TEST(NavigationController, PopToAnIndexPopsEveryPaneAboveItAndDeletesThem) {
    Fixture f;
    f.show();
    f.drill();
    f.drill();
    f.drill();
    ASSERT_EQ(f.navigation.panes().size(), 4u);
    QPointer<VantorelPaneController> b = f.navigation.panes()[2];
    QPointer<VantorelPaneController> c = f.navigation.panes()[3];
    f.delegate.calls.clear();
    EXPECT_TRUE(f.navigation.popTo(1, true));
    ASSERT_EQ(f.navigation.panes().size(), 2u);
    EXPECT_EQ(f.navigation.topPane()->path(), "/A");
    ASSERT_EQ(f.delegate.calls.size(), 1u);  // only the pane that shows
    EXPECT_EQ(f.delegate.calls[0].path, "/A");
    runDeferredDeletes();
    EXPECT_TRUE(b.isNull());
    EXPECT_TRUE(c.isNull());
    EXPECT_FALSE(f.navigation.popTo(1, true));  // nothing above it
    EXPECT_FALSE(f.navigation.popTo(5, true));
    EXPECT_FALSE(f.navigation.popTo(-1, true));
}

TEST(NavigationController, PopToViewControllerFindsThePaneOnTheStack) {
    Fixture f;
    f.show();
    f.drill();
    f.drill();
    VantorelPaneController* root = f.navigation.panes()[0];
    EXPECT_TRUE(f.navigation.popToViewController(root, true));
    EXPECT_EQ(f.navigation.panes().size(), 1u);
    EXPECT_EQ(f.navigation.topPane(), root);
    EXPECT_FALSE(f.navigation.popToViewController(root, true));
    EXPECT_FALSE(f.navigation.pop(true));
}

TEST(NavigationController, APoppedPaneNoLongerReachesTheController) {
    Fixture f;
    f.show();
    f.drill();
    QPointer<VantorelPaneController> a = f.navigation.topPane();
    f.navigation.pop(true);
    ASSERT_FALSE(a.isNull());  // deleted later, not in place
    EXPECT_EQ(a->navigationController(), nullptr);
    a->didSelectRowAtIndexPath(0);  // would push: nowhere to push to
    EXPECT_EQ(f.navigation.panes().size(), 1u);
    runDeferredDeletes();
    EXPECT_TRUE(a.isNull());
}

TEST(NavigationController, TheShownPaneHasTheKeyboard) {
    Fixture f;
    f.show();
    EXPECT_TRUE(f.navigation.topPane()->tableView()->hasFocus());
    f.drill();
    EXPECT_TRUE(f.navigation.topPane()->tableView()->hasFocus());
    f.navigation.pop(true);
    EXPECT_TRUE(f.navigation.topPane()->tableView()->hasFocus());
}
