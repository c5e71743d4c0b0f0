// Tests for panes inside the navigation stack: drilling down by click and keyboard, going back, the delegate, cell reuse and the toolbar.
#include "App/NavigationController.h"
#include "App/NavigationControllerDelegate.h"
#include "App/VantorelCell.h"
#include "PaneTestSupport.h"
#include "PropertyList/Array.h"

#include <QAction>
#include <QItemSelectionModel>
#include <QLabel>
#include <QPointer>
#include <QTableWidget>
#include <QToolBar>
#include <QToolButton>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::panetest;

namespace {

Value sampleDisplay() {
    return dict({{"Cell", dict({{"MCC", "310"}, {"Neighbours", Value(Array::of({"n0", dict({{"PSC", "12"}})}))}})},
                 {"Empty", dict({})},
                 {"Mode", "Idle"}});
}

// Records each pane it is told about, marked if it was already on screen.
class RecordingDelegate : public NavigationControllerDelegate {
public:
    void navigationControllerWillShow(NavigationController&, VantorelPaneController& pane) override {
        told.push_back(pane.path() + (pane.isVisible() ? " (visible)" : ""));
    }
    std::vector<std::string> told;
};

struct Stack {
    explicit Stack(bool allowSave = false)
        : application(allowSave),
          navigation(std::make_unique<VantorelPaneController>(makeTree(sampleDisplay()), "/", &application)) {
        navigation.setDelegate(&delegate);
        showAt(navigation, 400, 600);
    }
    VantorelPaneController& top() { return *navigation.topPane(); }
    void clickRow(const std::string& name) {
        QTableWidget* table = top().tableView();
        click(table->viewport(), table->visualRect(table->model()->index(rowOf(top(), name), 0)).center());
    }
    FakeApplication application;
    RecordingDelegate delegate;
    NavigationController navigation;
};

}  // namespace

TEST(PaneNavigation, RowsDrillDownByClickOrEnterAndBackByButtonBackspaceOrAltLeft) {
    Stack s;
    s.top().setStatus("Updated 2016-06-28 at 22:01:10", false);
    s.clickRow("Mode");  // a leaf: nothing pushed, no row left selected
    s.top().didSelectRowAtIndexPath(std::nullopt);  // Enter with no current row
    EXPECT_EQ(s.navigation.panes().size(), 1u);
    EXPECT_TRUE(s.top().tableView()->selectionModel()->selectedRows().empty());

    s.clickRow("Cell");
    EXPECT_EQ(s.top().status(), "Updated 2016-06-28 at 22:01:10");  // the parent's status
    s.top().tableView()->setCurrentCell(rowOf(s.top(), "Neighbours"), 0);
    pressKey(s.top().tableView(), Qt::Key_Return);
    s.clickRow("1");
    EXPECT_EQ(s.top().path(), "/Cell/Neighbours/1");
    EXPECT_EQ(s.navigation.backButton()->text(), "\u2039 Neighbours");
    EXPECT_EQ(s.delegate.told, (std::vector<std::string>{"/", "/Cell", "/Cell/Neighbours", "/Cell/Neighbours/1"}));

    s.navigation.backButton()->click();
    settle();
    pressKey(s.top().tableView(), Qt::Key_Backspace);
    EXPECT_EQ(s.top().path(), "/Cell");
    pressKey(s.top().tableView(), Qt::Key_Left, Qt::AltModifier);
    EXPECT_EQ(s.top().path(), "/");
    EXPECT_FALSE(s.navigation.backButton()->isVisible());
    EXPECT_TRUE(s.top().tableView()->hasFocus());

    s.clickRow("Empty");  // a tree node without children still drills down
    EXPECT_EQ(s.top().path(), "/Empty");
    QPointer<VantorelPaneController> empty = &s.top();
    EXPECT_TRUE(s.navigation.popTo(0));
    settle();
    EXPECT_TRUE(empty.isNull());  // popped panes are deleted
    EXPECT_FALSE(s.navigation.pop());
}

TEST(PaneNavigation, ReloadReusesCellsInRowOrderAndAReusedCellKeepsItsKind) {
    FakeApplication application;
    VantorelPaneController pane(makeTree(dict({{"Group", dict({})}, {"b", "2"}, {"c", "3"}})), "/", &application);
    showAt(pane, 400, 600);
    VantorelCell* drillDown = pane.cellAtRow(0);
    VantorelCell* valueRow = pane.cellAtRow(1);

    pane.reloadWithNode(makeTree(dict({{"Leaf", "42 dBm"}, {"Sub", dict({})}})));
    settle();
    // Deliberate, a reused cell keeps its kind: the drill-down cell shows the leaf
    // without its value, the value cell shows a disclosure and no value.
    ASSERT_EQ(pane.cellAtRow(0), drillDown);
    EXPECT_EQ(drillDown->key()->text(), "Leaf");
    EXPECT_EQ(drillDown->value(), nullptr);
    ASSERT_EQ(pane.cellAtRow(1), valueRow);
    EXPECT_EQ(valueRow->value()->text(), "");
    EXPECT_EQ(valueRow->accessoryType(), VantorelCell::AccessoryType::DisclosureIndicator);
    EXPECT_EQ(pane.reusePoolSize(), 1u);  // the third row's cell waits for reuse
}

TEST(PaneNavigation, TheToolbarShowsTheIndicatorWhileLoadingAndTheSaveButtonOnlyWhenAllowed) {
    for (bool allowSave : {false, true}) {
        Stack s(allowSave);
        EXPECT_TRUE(s.top().activityIndicatorItem()->isVisible());
        s.top().setStatus("Updated", false);
        EXPECT_FALSE(s.top().activityIndicatorItem()->isVisible());
        ASSERT_EQ(s.top().saveItem() != nullptr, allowSave);
        if (allowSave) s.top().saveItem()->trigger();
        EXPECT_EQ(s.application.showSaveViewCalls, allowSave ? 1 : 0);

        // A status longer than the pane is elided, whole in the tooltip, and every button stays on the bar.
        const std::string longStatus = "Updated 2016-06-28 at 22:01:10 · recording /home/engineer/captures/" +
                                       std::string(60, 'x') + ".qmdl";
        s.top().setStatus(longStatus, false);
        settle();
        EXPECT_TRUE(s.top().statusLabel()->text().endsWith(QChar(0x2026)));
        EXPECT_EQ(s.top().statusLabel()->toolTip().toStdString(), longStatus);
        auto* toolbar = s.top().findChild<QToolBar*>();
        for (QAction* item : {s.top().signalItem(), s.top().saveItem()})
            if (item) EXPECT_TRUE(toolbar->widgetForAction(item)->isVisible()) << item->text().toStdString();
    }
}

TEST(PaneSelection, ARefreshKeepsTheSelectedRowByItsNameWhereverItMoves) {
    FakeApplication application;
    VantorelPaneController pane(makeTree(dict({{"Cell", "1"}, {"Mode", "Idle"}})), "/", &application);
    showAt(pane, 320, 400);
    pane.tableView()->selectRow(rowOf(pane, "Mode"));
    pane.reloadWithNode(makeTree(dict({{"Alpha", "0"}, {"Beta", "0"}, {"Cell", "1"}, {"Mode", "Connected"}})));
    const int moved = rowOf(pane, "Mode");
    ASSERT_NE(moved, 1);
    EXPECT_EQ(pane.tableView()->currentIndex().row(), moved);
    EXPECT_TRUE(pane.tableView()->selectionModel()->isRowSelected(moved, QModelIndex()));
    pane.reloadWithNode(makeTree(dict({{"Cell", "1"}})));  // its row went: nothing selected
    EXPECT_FALSE(pane.tableView()->selectionModel()->hasSelection());
}
