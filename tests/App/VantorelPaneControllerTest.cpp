// Tests for VantorelPaneController (Part 1.2): rows, cell reuse, selection, status and toolbar, inside a real navigation stack.
#include "App/VantorelPaneController.h"

#include "App/ActivityIndicator.h"
#include "App/VantorelCell.h"
#include "PaneTestSupport.h"

#include <QAction>
#include <QLabel>
#include <QScrollArea>
#include <QScrollBar>
#include <QTableWidget>
#include <QToolBar>
#include <QToolButton>

#include <gtest/gtest.h>

#include <memory>

using namespace vantorel;
using namespace vantorel::panetest;

namespace {

// {"Cell": {"MCC": "310", "Neighbours": ["n0", {"PSC": "12"}]}, "Empty": {}, "Mode": "Idle"}
Value sampleDisplay() {
    auto cell = Dictionary::create();
    cell->set("MCC", "310");
    auto neighbour = Dictionary::create();
    neighbour->set("PSC", "12");
    cell->set("Neighbours", Value(Array::of({"n0", Value(neighbour)})));
    auto display = Dictionary::create();
    display->set("Cell", Value(cell));
    display->set("Empty", Value(Dictionary::create()));
    display->set("Mode", "Idle");
    return Value(display);
}

int rowNamed(const VantorelPaneController& pane, const std::string& name) {
    const auto* children = pane.node()->childNodes();
    for (std::size_t i = 0; i < children->size(); ++i)
        if ((*children)[i]->displayName() == name) return int(i);
    return -1;
}

// A shown navigation stack whose root pane shows `display`, 400 × 600.
struct Stack {
    explicit Stack(const Value& display, bool allowSave = false)
        : application(allowSave),
          root(makeTree(display)),
          navigation(std::make_unique<VantorelPaneController>(root, "/", &application)) {
        navigation.setDelegate(&delegate);
        showAt(navigation, 400, 600);
    }
    VantorelPaneController& rootPane() { return *navigation.panes().front(); }
    VantorelPaneController& top() { return *navigation.topPane(); }
    // Clicks the middle of a row of the top pane, through the cell under the pointer.
    void clickRow(int row) {
        QTableWidget* table = top().tableView();
        const QRect rect = table->visualRect(table->model()->index(row, 0));
        click(table->viewport(), rect.center());
    }

    FakeApplication application;
    RecordingDelegate delegate;
    NodeRef root;
    NavigationController navigation;
};

}  // namespace

TEST(VantorelPaneController, InitWithNodeAtPathStartsLoadingWithAnEmptyStatus) {
    FakeApplication application;
    VantorelPaneController pane(nullptr, "/", &application);
    EXPECT_EQ(pane.path(), "/");
    EXPECT_EQ(pane.status(), "");
    EXPECT_TRUE(pane.isLoading());
    EXPECT_EQ(pane.node(), nullptr);
}

TEST(VantorelPaneController, TitleIsVantorelWithoutANodeAndTheNodesNameWithOne) {
    FakeApplication application;
    VantorelPaneController pane(nullptr, "/", &application);
    pane.viewWillAppear();
    EXPECT_EQ(pane.title(), "Vantorel");
    NodeRef root = makeTree(sampleDisplay());
    pane.reloadWithNode(childNamed(root, "Cell"));
    EXPECT_EQ(pane.title(), "Cell");
    pane.reloadWithNode(nullptr);
    EXPECT_EQ(pane.title(), "Vantorel");
}

TEST(VantorelPaneController, RowCountIsTheNodesChildCountAndZeroWithoutChildren) {
    FakeApplication application;
    NodeRef root = makeTree(sampleDisplay());
    VantorelPaneController pane(root, "/", &application);
    EXPECT_EQ(pane.numberOfRowsInSection(), 3);
    EXPECT_EQ(pane.tableView()->rowCount(), 3);
    EXPECT_EQ(pane.tableView()->columnCount(), 1);
    EXPECT_EQ(pane.tableView()->rowHeight(0), 50);
    pane.reloadWithNode(childNamed(root, "Mode"));  // a leaf
    EXPECT_EQ(pane.tableView()->rowCount(), 0);
    pane.reloadWithNode(nullptr);
    EXPECT_EQ(pane.tableView()->rowCount(), 0);
    pane.reloadWithNode(childNamed(root, "Empty"));
    EXPECT_EQ(pane.tableView()->rowCount(), 0);
}

TEST(VantorelPaneController, TreeChildrenGetDrillDownRowsAndLeavesGetValueRows) {
    FakeApplication application;
    VantorelPaneController pane(makeTree(sampleDisplay()), "/", &application);
    VantorelCell* cell = pane.cellAtRow(rowNamed(pane, "Cell"));
    VantorelCell* mode = pane.cellAtRow(rowNamed(pane, "Mode"));
    ASSERT_NE(cell, nullptr);
    ASSERT_NE(mode, nullptr);
    EXPECT_EQ(cell->kind(), VantorelCell::Kind::DrillDown);
    EXPECT_EQ(cell->key()->text(), "Cell");
    EXPECT_EQ(cell->accessoryType(), VantorelCell::AccessoryType::DisclosureIndicator);
    EXPECT_EQ(mode->kind(), VantorelCell::Kind::Value);
    EXPECT_EQ(mode->key()->text(), "Mode");
    EXPECT_EQ(mode->value()->text(), "Idle");
    EXPECT_EQ(mode->accessoryType(), VantorelCell::AccessoryType::None);
    EXPECT_EQ(pane.tableView()->cellWidget(rowNamed(pane, "Mode"), 0), mode->parentWidget());
}

TEST(VantorelPaneController, ATreeNodeWithNoChildrenShowsADisclosureRowAndSelectingItPushesAnEmptyPane) {
    Stack stack(sampleDisplay());
    const int row = rowNamed(stack.rootPane(), "Empty");
    VantorelCell* cell = stack.rootPane().cellAtRow(row);
    EXPECT_EQ(cell->kind(), VantorelCell::Kind::DrillDown);
    EXPECT_TRUE(cell->accessoryView()->isVisible());
    stack.clickRow(row);
    ASSERT_EQ(stack.navigation.panes().size(), 2u);
    EXPECT_EQ(stack.top().path(), "/Empty");
    EXPECT_EQ(stack.top().title(), "Empty");
    EXPECT_EQ(stack.top().tableView()->rowCount(), 0);
}

TEST(VantorelPaneController, SelectingALeafRowPushesNothingAndLeavesNoRowSelected) {
    Stack stack(sampleDisplay());
    const int row = rowNamed(stack.rootPane(), "Mode");
    stack.clickRow(row);
    EXPECT_EQ(stack.rootPane().tableView()->currentRow(), row);  // the click reached the table
    EXPECT_EQ(stack.navigation.panes().size(), 1u);
    EXPECT_TRUE(stack.rootPane().tableView()->selectionModel()->selectedIndexes().isEmpty());
    // The same by keyboard: arrows select the row, Enter deselects it.
    stack.rootPane().tableView()->setFocus();
    stack.rootPane().tableView()->setCurrentCell(row, 0);
    ASSERT_FALSE(stack.rootPane().tableView()->selectionModel()->selectedIndexes().isEmpty());
    pressKey(&stack.navigation, Qt::Key_Return);
    EXPECT_EQ(stack.navigation.panes().size(), 1u);
    EXPECT_TRUE(stack.rootPane().tableView()->selectionModel()->selectedIndexes().isEmpty());
}

TEST(VantorelPaneController, APushedPaneStartsWithItsParentsStatusTextAndLoadingFlag) {
    Stack stack(sampleDisplay());
    stack.rootPane().setStatus(std::string("Updated 2024-05-01 at 10:00:00"), false);
    stack.delegate.calls.clear();
    stack.clickRow(rowNamed(stack.rootPane(), "Cell"));
    ASSERT_EQ(stack.navigation.panes().size(), 2u);
    // Already when the delegate hears of it, not with the empty defaults.
    ASSERT_EQ(stack.delegate.calls.size(), 1u);
    EXPECT_EQ(stack.delegate.calls[0].status, "Updated 2024-05-01 at 10:00:00");
    EXPECT_FALSE(stack.delegate.calls[0].isLoading);
    EXPECT_EQ(stack.top().status(), "Updated 2024-05-01 at 10:00:00");
    EXPECT_FALSE(stack.top().isLoading());
    EXPECT_EQ(stack.top().statusLabel()->text(), "Updated 2024-05-01 at 10:00:00");
    EXPECT_FALSE(stack.top().activityIndicator()->isAnimating());
}

TEST(VantorelPaneController, ALongValueMovesRightOfItsKeyByExactly50PointsAndCanBeScrolledHorizontally) {
    auto display = Dictionary::create();
    const std::string longValue = "Long value text that cannot possibly fit beside its key in a narrow row";
    display->set("Long Key", longValue);
    display->set("K", "1");
    Stack stack{Value(display)};
    VantorelPaneController& pane = stack.rootPane();
    VantorelCell* cell = pane.cellAtRow(rowNamed(pane, "Long Key"));
    const int W = pane.tableView()->viewport()->width();
    ASSERT_EQ(cell->width(), W);
    const QSize k = VantorelCell::measure("Long Key");
    const QSize v = VantorelCell::measure(QString::fromStdString(longValue));
    ASSERT_GE(10 + k.width() + 50 + v.width(), W);
    EXPECT_EQ(cell->value()->x(), cell->key()->x() + k.width() + 50);
    EXPECT_EQ(cell->key()->x(), 10);
    EXPECT_EQ(cell->scrollExtent(), QSize(W + k.width() + v.width(), 50));
    EXPECT_EQ(cell->view()->size(), QSize(W, 50));
    EXPECT_EQ(cell->view()->horizontalScrollBar()->maximum(), k.width() + v.width());
}

TEST(VantorelPaneController, AShortValueSitsFlushWithTheRowsRightEdge) {
    auto display = Dictionary::create();
    display->set("K", "1");
    Stack stack{Value(display)};
    VantorelCell* cell = stack.rootPane().cellAtRow(0);
    const int W = stack.rootPane().tableView()->viewport()->width();
    ASSERT_EQ(cell->width(), W);
    const QSize v = VantorelCell::measure("1");
    EXPECT_EQ(cell->value()->x(), W - v.width());
    EXPECT_EQ(cell->value()->mapTo(cell, QPoint(v.width(), 0)).x(), W);
    EXPECT_EQ(cell->scrollExtent(), QSize(W, 50));
}

TEST(VantorelPaneController, WithoutTheSavePreferenceTheToolbarHoldsThreeItemsWithItFour) {
    FakeApplication plain(false);
    VantorelPaneController without(nullptr, "/", &plain);
    without.viewWillAppear();
    EXPECT_EQ(without.toolbarItemCount(), 3);
    EXPECT_EQ(without.saveItem(), nullptr);

    FakeApplication internal(true);
    VantorelPaneController with(nullptr, "/", &internal);
    with.viewWillAppear();
    EXPECT_EQ(with.toolbarItemCount(), 4);
    ASSERT_NE(with.saveItem(), nullptr);
    // Left to right: indicator, status, flexible space, save.
    const QList<QAction*> items = with.toolbar()->actions();
    EXPECT_EQ(with.toolbar()->widgetForAction(items[0]), with.activityIndicator());
    EXPECT_EQ(with.toolbar()->widgetForAction(items[1]), with.statusLabel());
    EXPECT_EQ(with.toolbar()->widgetForAction(items[2])->sizePolicy().horizontalPolicy(), QSizePolicy::Expanding);
    EXPECT_EQ(items[3], with.saveItem());
}

TEST(VantorelPaneController, TheSaveButtonSendsShowSaveViewToTheApplication) {
    FakeApplication internal(true);
    VantorelPaneController pane(nullptr, "/", &internal);
    showAt(pane, 400, 600);
    auto* button = qobject_cast<QToolButton*>(pane.toolbar()->widgetForAction(pane.saveItem()));
    ASSERT_NE(button, nullptr);
    EXPECT_EQ(button->text(), "Save");
    EXPECT_FALSE(pane.saveItem()->icon().isNull());
    button->click();
    settle();
    EXPECT_EQ(internal.showSaveViewCalls, 1);
}

TEST(VantorelPaneController, ActivityIndicatorSpinsAndShowsIffLoading) {
    FakeApplication application;
    VantorelPaneController pane(nullptr, "/", &application);
    showAt(pane, 400, 600);
    EXPECT_TRUE(pane.activityIndicator()->isAnimating());
    EXPECT_TRUE(pane.activityIndicator()->isVisible());
    pane.setStatus(std::string("Updated"), false);
    settle();
    EXPECT_FALSE(pane.activityIndicator()->isAnimating());
    EXPECT_FALSE(pane.activityIndicator()->isVisible());
    EXPECT_EQ(pane.toolbarItemCount(), 3);  // the hidden indicator is still an item
    pane.setStatus(std::string("Connecting..."), true);
    settle();
    EXPECT_TRUE(pane.activityIndicator()->isAnimating());
    EXPECT_TRUE(pane.activityIndicator()->isVisible());
}

TEST(VantorelPaneController, StatusLabelShowsTheStatusInTheSystemFontOf14Points) {
    FakeApplication application;
    VantorelPaneController pane(nullptr, "/", &application);
    pane.setStatus(std::string("Connecting..."), true);
    EXPECT_EQ(pane.status(), "Connecting...");
    EXPECT_EQ(pane.statusLabel()->text(), "Connecting...");
    EXPECT_EQ(pane.statusLabel()->font().pixelSize(), 14);
    EXPECT_FALSE(pane.statusLabel()->font().bold());
    EXPECT_EQ(pane.toolbarItemCount(), 3);  // rebuilt, not appended to
}

TEST(VantorelPaneController, SetStatusWithNilGivesTheEmptyString) {
    FakeApplication application;
    VantorelPaneController pane(nullptr, "/", &application);
    pane.setStatus(std::string("Connecting"), true);
    pane.setStatus(nullptr, false);
    EXPECT_EQ(pane.status(), "");
    EXPECT_FALSE(pane.isLoading());
    EXPECT_EQ(pane.statusLabel()->text(), "");
}

TEST(VantorelPaneController, ReloadHandsThePreviousRowsCellsBackInRowOrder) {
    FakeApplication application;
    auto three = Dictionary::create();
    three->set("a", "1");
    three->set("b", "2");
    three->set("c", "3");
    VantorelPaneController pane(makeTree(Value(three)), "/", &application);
    VantorelCell* c0 = pane.cellAtRow(0);
    VantorelCell* c1 = pane.cellAtRow(1);
    VantorelCell* c2 = pane.cellAtRow(2);

    auto two = Dictionary::create();
    two->set("x", "9");
    two->set("y", "8");
    pane.reloadWithNode(makeTree(Value(two)));
    EXPECT_EQ(pane.cellAtRow(0), c0);
    EXPECT_EQ(pane.cellAtRow(1), c1);
    EXPECT_EQ(pane.reusePoolSize(), 1u);
    EXPECT_EQ(pane.cellAtRow(0)->value()->text(), "9");

    // The pool hands out its oldest cell first: the one left over from before,
    // then the previous rows' cells in row order, then a new one.
    auto four = Dictionary::create();
    for (const char* k : {"p", "q", "r", "s"}) four->set(k, "v");
    pane.reloadWithNode(makeTree(Value(four)));
    EXPECT_EQ(pane.cellAtRow(0), c2);
    EXPECT_EQ(pane.cellAtRow(1), c0);
    EXPECT_EQ(pane.cellAtRow(2), c1);
    EXPECT_NE(pane.cellAtRow(3), nullptr);
    EXPECT_EQ(pane.reusePoolSize(), 0u);
    runDeferredDeletes();  // the table's old holders go; the cells stay
    EXPECT_EQ(pane.cellAtRow(2)->key()->text(), "r");
}

TEST(VantorelPaneController, DequeueReusableCellHandsOutOnlyCellsOfThatIdentifier) {
    FakeApplication application;
    auto one = Dictionary::create();
    one->set("a", "1");
    VantorelPaneController pane(makeTree(Value(one)), "/", &application);
    pane.reloadWithNode(nullptr);
    ASSERT_EQ(pane.reusePoolSize(), 1u);
    EXPECT_EQ(pane.dequeueReusableCell("SomethingElse"), nullptr);
    VantorelCell* cell = pane.dequeueReusableCell("VantorelPaneControllerCell");
    ASSERT_NE(cell, nullptr);
    EXPECT_EQ(pane.dequeueReusableCell("VantorelPaneControllerCell"), nullptr);
    cell->setParent(&pane);  // owned by the pane again
}

TEST(VantorelPaneController, ADrillDownRowReusedForALeafShowsNoValueUntilTheTableMakesANewCell) {
    FakeApplication application;
    auto before = Dictionary::create();
    before->set("Group", Value(Dictionary::create()));
    VantorelPaneController pane(makeTree(Value(before)), "/", &application);
    showAt(pane, 400, 600);
    VantorelCell* drillDown = pane.cellAtRow(0);
    ASSERT_EQ(drillDown->kind(), VantorelCell::Kind::DrillDown);

    auto after = Dictionary::create();
    after->set("Leaf", "42 dBm");
    pane.reloadWithNode(makeTree(Value(after)));
    settle();
    VantorelCell* reused = pane.cellAtRow(0);
    EXPECT_EQ(reused, drillDown);
    EXPECT_EQ(reused->kind(), VantorelCell::Kind::DrillDown);
    EXPECT_EQ(reused->key()->text(), "Leaf");
    EXPECT_EQ(reused->value(), nullptr);
    EXPECT_EQ(reused->accessoryType(), VantorelCell::AccessoryType::None);
    EXPECT_FALSE(reused->accessoryView()->isVisible());
    for (QLabel* label : reused->findChildren<QLabel*>())
        EXPECT_NE(label->text(), "42 dBm");

    // A second row needs a new cell: that one is a value row and shows its value.
    after->set("Other", "7");
    pane.reloadWithNode(makeTree(Value(after)));
    settle();
    EXPECT_EQ(pane.cellAtRow(0), drillDown);
    ASSERT_EQ(pane.cellAtRow(1)->kind(), VantorelCell::Kind::Value);
    EXPECT_EQ(pane.cellAtRow(1)->value()->text(), "7");
    EXPECT_TRUE(pane.cellAtRow(1)->value()->isVisible());
}

TEST(VantorelPaneController, AValueRowReusedForATreeNodeShowsTheDisclosureAndNoValue) {
    FakeApplication application;
    auto before = Dictionary::create();
    before->set("Leaf", "42 dBm");
    VantorelPaneController pane(makeTree(Value(before)), "/", &application);
    VantorelCell* valueRow = pane.cellAtRow(0);
    auto after = Dictionary::create();
    after->set("Group", Value(Dictionary::create()));
    pane.reloadWithNode(makeTree(Value(after)));
    EXPECT_EQ(pane.cellAtRow(0), valueRow);
    EXPECT_EQ(valueRow->kind(), VantorelCell::Kind::Value);
    EXPECT_EQ(valueRow->key()->text(), "Group");
    EXPECT_EQ(valueRow->value()->text(), "");
    EXPECT_EQ(valueRow->accessoryType(), VantorelCell::AccessoryType::DisclosureIndicator);
}

TEST(VantorelPaneController, KeyboardEnterOnADrillDownRowPushesItsPane) {
    Stack stack(sampleDisplay());
    QTableWidget* table = stack.rootPane().tableView();
    ASSERT_TRUE(table->hasFocus());
    ASSERT_EQ(rowNamed(stack.rootPane(), "Cell"), 0);
    // Arrow keys move the current row; Enter on "Cell" drills down.
    pressKey(&stack.navigation, Qt::Key_Down);
    EXPECT_EQ(table->currentRow(), 1);
    EXPECT_EQ(stack.navigation.panes().size(), 1u);
    pressKey(&stack.navigation, Qt::Key_Up);
    ASSERT_EQ(table->currentRow(), 0);
    pressKey(&stack.navigation, Qt::Key_Enter);
    ASSERT_EQ(stack.navigation.panes().size(), 2u);
    EXPECT_EQ(stack.top().path(), "/Cell");
    // The new pane has the keyboard: Return drills further.
    ASSERT_TRUE(stack.top().tableView()->hasFocus());
    stack.top().tableView()->setCurrentCell(rowNamed(stack.top(), "Neighbours"), 0);
    pressKey(&stack.navigation, Qt::Key_Return);
    ASSERT_EQ(stack.navigation.panes().size(), 3u);
    EXPECT_EQ(stack.top().path(), "/Cell/Neighbours");
}

TEST(VantorelPaneController, PushedPanesArePathedBelowTheirParent) {
    auto inner = Dictionary::create();
    inner->set("B", Value(Dictionary::create()));
    inner->set("List", Value(Array::of({Value(Dictionary::create())})));
    auto display = Dictionary::create();
    display->set("A", Value(inner));
    Stack stack{Value(display)};
    stack.clickRow(rowNamed(stack.top(), "A"));
    EXPECT_EQ(stack.top().path(), "/A");
    stack.clickRow(rowNamed(stack.top(), "B"));
    EXPECT_EQ(stack.top().path(), "/A/B");
    stack.navigation.pop(true);
    stack.clickRow(rowNamed(stack.top(), "List"));
    EXPECT_EQ(stack.top().path(), "/A/List");
    stack.clickRow(0);
    EXPECT_EQ(stack.top().path(), "/A/List/0");
    EXPECT_EQ(stack.top().title(), "0");
}

TEST(VantorelPaneController, ArrayElementsArePathedByTheirIndex) {
    auto element = Dictionary::create();
    element->set("x", "1");
    auto display = Dictionary::create();
    display->set("A", Value(Array::of({Value(element)})));
    Stack stack{Value(display)};
    stack.clickRow(0);
    EXPECT_EQ(stack.top().path(), "/A");
    stack.clickRow(0);
    EXPECT_EQ(stack.top().path(), "/A/0");
    EXPECT_EQ(stack.top().title(), "0");
    EXPECT_EQ(stack.top().cellAtRow(0)->value()->text(), "1");
}

TEST(VantorelPaneController, SelectionWithoutAnIndexPathDoesNothing) {
    Stack stack(sampleDisplay());
    stack.rootPane().didSelectRowAtIndexPath(std::nullopt);
    stack.rootPane().didSelectRowAtIndexPath(99);
    EXPECT_EQ(stack.navigation.panes().size(), 1u);
    // Enter with no current row.
    stack.rootPane().tableView()->setCurrentIndex(QModelIndex());
    pressKey(&stack.navigation, Qt::Key_Return);
    EXPECT_EQ(stack.navigation.panes().size(), 1u);
}

TEST(VantorelPaneController, ViewWillAppearShowsTheToolbarWithFreshItems) {
    FakeApplication application;
    VantorelPaneController pane(nullptr, "/", &application);
    pane.toolbar()->hide();
    showAt(pane, 400, 600);
    pane.viewWillAppear();
    settle();
    EXPECT_TRUE(pane.toolbar()->isVisible());
    EXPECT_EQ(pane.toolbarItemCount(), 3);
}

TEST(VantorelPaneController, ViewWillDisappearOnlyGivesUpTheKeyboard) {
    FakeApplication application;
    VantorelPaneController pane(makeTree(sampleDisplay()), "/", &application);
    showAt(pane, 400, 600);
    pane.setFocus();
    settle();
    ASSERT_TRUE(pane.tableView()->hasFocus());
    pane.viewWillDisappear();
    EXPECT_FALSE(pane.tableView()->hasFocus());
    EXPECT_EQ(pane.tableView()->rowCount(), 3);
    EXPECT_TRUE(pane.isLoading());
}

TEST(VantorelPaneController, APaneKeepsShowingItsOldTreeAfterTheModelDropsIt) {
    FakeApplication application;
    std::unique_ptr<VantorelPaneController> pane;
    {
        NodeRef root = makeTree(sampleDisplay());
        pane = std::make_unique<VantorelPaneController>(childNamed(root, "Cell"), "/Cell", &application);
    }
    EXPECT_EQ(pane->title(), "Cell");
    EXPECT_EQ(pane->tableView()->rowCount(), 2);
    pane->didSelectRowAtIndexPath(rowNamed(*pane, "MCC"));  // a leaf: nothing to push
}
