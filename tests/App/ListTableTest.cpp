// Tests for list tables: the model over a display-tree list, the selected entry kept by identity, numeric sorting, the pane's table toggle and "Plot this value".
#include "App/ListTableModel.h"
#include "App/ListTableView.h"
#include "App/NavigationController.h"
#include "PaneTestSupport.h"
#include "Platform/Preferences.h"
#include "PropertyList/Array.h"

#include <QAbstractItemModelTester>
#include <QAction>
#include <QLabel>
#include <QMenu>
#include <QSortFilterProxyModel>
#include <QTableWidget>
#include <QTemporaryDir>
#include <QToolBar>
#include <gtest/gtest.h>

using namespace vantorel;
using panetest::dict;

namespace {

// /Neighbours: one entry per {pci, rsrp}; the second entry also has a "Note".
NodeRef neighbours(std::initializer_list<std::pair<const char*, const char*>> cells) {
    auto list = Array::create();
    for (const auto& [pci, rsrp] : cells) {
        Value entry = dict({{"Physical Cell ID", pci}, {"RSRP", rsrp}});
        if (list->size() == 1) entry.asDictionary()->set("Note", "weak");
        list->append(entry);
    }
    return panetest::makeTree(dict({{"Neighbours", Value(list)}, {"RSRP", "-95.50 dBm"}, {"Band", "Not Present"}}));
}

NodeRef child(const NodeRef& node, const std::string& name) {
    for (const NodeRef& c : *node->childNodes())
        if (c->displayName() == name) return c;
    return nullptr;
}

std::vector<std::string> column(const QAbstractItemModel& model, int c) {
    std::vector<std::string> values;
    for (int r = 0; r < model.rowCount(); ++r) values.push_back(model.index(r, c).data().toString().toStdString());
    return values;
}

}  // namespace

TEST(ListTableModel, RowsAreEntriesAndColumnsTheUnionOfTheirKeysOnlyForListsOfDictionaries) {
    ListTableModel model;
    QAbstractItemModelTester tester(&model, QAbstractItemModelTester::FailureReportingMode::Fatal);
    const NodeRef root = neighbours({{"301", "-97 dBm"}, {"17", "-101 dBm"}, {"5", "-88 dBm"}});
    model.setList(child(root, "Neighbours"));
    ASSERT_EQ(model.rowCount(), 3);
    ASSERT_EQ(model.columnCount(), 3);
    EXPECT_EQ(model.headerData(2, Qt::Horizontal).toString(), "Note");
    EXPECT_EQ(column(model, 2), (std::vector<std::string>{"", "weak", ""}));
    EXPECT_EQ(model.rowOfIdentity(model.identity(1)), 1);
    for (const NodeRef& notList : {root, child(root, "RSRP"), NodeRef()}) {
        model.setList(notList);
        EXPECT_EQ(model.rowCount(), 0);
    }
    // Entries that show their keys in another order, or lack some, move no column.
    auto list = Array::create();
    list->append(dict({{"Note", "strong"}, {"RSRP", "-80 dBm"}, {"E-ARFCN", "6300"}}));
    model.setList(child(panetest::makeTree(dict({{"Neighbours", Value(list)}})), "Neighbours"));
    std::vector<std::string> headers;
    for (int c = 0; c < model.columnCount(); ++c) headers.push_back(model.headerData(c, Qt::Horizontal).toString().toStdString());
    EXPECT_EQ(headers, (std::vector<std::string>{"Physical Cell ID", "RSRP", "Note", "E-ARFCN"}));
    EXPECT_EQ(column(model, 1), (std::vector<std::string>{"-80 dBm"}));
}

TEST(ListTableView, TheSelectedCellStaysSelectedWhenARefreshReordersTheEntriesAndNumbersSortByValue) {
    ListTableView view;
    view.setList(child(neighbours({{"301", "-97 dBm"}, {"17", "-101 dBm"}, {"5", "-88 dBm"}}), "Neighbours"));
    view.selectEntry(1);  // PCI 17
    view.setList(child(neighbours({{"17", "-99 dBm"}, {"9", "-90 dBm"}, {"301", "-96 dBm"}}), "Neighbours"));
    EXPECT_EQ(view.currentEntry(), 0);
    EXPECT_TRUE(view.selectionModel()->isRowSelected(view.currentIndex().row(), {}));

    view.sortByColumn(0, Qt::AscendingOrder);
    EXPECT_EQ(column(*view.model(), 0), (std::vector<std::string>{"9", "17", "301"}));
    view.sortByColumn(1, Qt::AscendingOrder);
    EXPECT_EQ(column(*view.model(), 1), (std::vector<std::string>{"-99 dBm", "-96 dBm", "-90 dBm"}));
    EXPECT_EQ(view.model()->index(view.currentIndex().row(), 0).data().toString(), "17");
    view.setList(child(neighbours({{"301", "-100 dBm"}, {"17", "-80 dBm"}}), "Neighbours"));  // sorted again
    EXPECT_EQ(column(*view.model(), 0), (std::vector<std::string>{"301", "17"}));
    EXPECT_EQ(view.model()->index(view.currentIndex().row(), 0).data().toString(), "17");
}

TEST(ListTablePane, TheTableChoiceIsRememberedEnterDrillsIntoTheEntryAndOnlyNumbersArePlotted) {
    QTemporaryDir settings;
    Preferences::setDirectory(settings.path().toStdString());
    panetest::FakeApplication app;
    const NodeRef root = neighbours({{"301", "-97 dBm"}, {"17", "-101 dBm"}});
    VantorelPaneController rootPane(root, "/", &app);
    EXPECT_EQ(rootPane.tableItem(), nullptr);  // not a list

    // Rows view: "Plot this value" for the numeric leaf only.
    auto offered = [&](const QModelIndex& index, VantorelPaneController* pane = nullptr) {
        QMenu* menu = (pane ? pane : &rootPane)->contextMenu(index);
        if (!menu) return std::string();
        menu->actions().front()->trigger();
        delete menu;
        return app.plotted.back();
    };
    const QAbstractItemModel* rows = rootPane.tableView()->model();
    EXPECT_EQ(offered(rows->index(panetest::rowOf(rootPane, "RSRP"), 0)), "/RSRP");
    EXPECT_EQ(offered(rows->index(panetest::rowOf(rootPane, "Band"), 0)), "");
    EXPECT_EQ(offered(rows->index(panetest::rowOf(rootPane, "Neighbours"), 0)), "");

    auto pane = std::make_unique<VantorelPaneController>(child(root, "Neighbours"), "/Neighbours", &app);
    ASSERT_NE(pane->tableItem(), nullptr);
    EXPECT_FALSE(pane->showsTable());
    pane->tableItem()->trigger();
    VantorelPaneController again(child(root, "Neighbours"), "/Neighbours", &app);
    EXPECT_TRUE(again.showsTable());  // remembered
    again.reloadWithNode(child(neighbours({}), "Neighbours"));  // a tick without neighbours
    again.reloadWithNode(child(root, "Neighbours"));
    EXPECT_TRUE(again.showsTable());
    ListTableView& table = *again.listTableView();
    EXPECT_EQ(offered(table.model()->index(1, 1), &again), "/Neighbours/1/RSRP");

    NavigationController nav(std::move(pane));
    panetest::showAt(nav, 480, 600);
    nav.topPane()->listTableView()->selectEntry(1);
    panetest::pressKey(&nav, Qt::Key_Return);
    EXPECT_EQ(nav.topPane()->path(), "/Neighbours/1");
    Preferences::setDirectory("");
}

// A live status changes every second: a click pressed before a tick and released after it still counts.
TEST(ListTablePane, AClickOnTheTableToggleSurvivesTheStatusTickBetweenPressAndRelease) {
    QTemporaryDir settings;
    Preferences::setDirectory(settings.path().toStdString());
    panetest::FakeApplication app;
    VantorelPaneController pane(child(neighbours({{"301", "-97 dBm"}}), "Neighbours"), "/Neighbours", &app);
    panetest::showAt(pane, 480, 600);
    auto* toolbar = pane.findChild<QToolBar*>();
    panetest::click(toolbar, toolbar->widgetForAction(pane.tableItem())->geometry().center(), [&] {
        pane.setStatus("Updated at 12:00:01", false);
        pane.reloadWithNode(child(neighbours({{"301", "-98 dBm"}}), "Neighbours"));
    });
    EXPECT_TRUE(pane.showsTable());
    EXPECT_EQ(pane.statusLabel()->text(), "Updated at 12:00:01");
    Preferences::setDirectory("");
}

// The display strings keep the decoders' unit words; a column header says what the values are.
TEST(ListTableModel, ASignalColumnHeaderCarriesTheCataloguesUnit) {
    const struct {
        const char *path, *leaf, *shown, *header;
    } rows[] = {
        {"/Neighbours/Neighbor Cells List", "Srxlev", "22 dBm", "Srxlev (dB)"},
        {"/Neighbours/Neighbor Cells List", "Measured RSRP", "-102.00 dBm", "Measured RSRP (dBm)"},
        {"/GSM Neighbours/Neighboring Cells", "RSSI", "23", "RSSI (level)"},
        {"/Cell Sets/Active Set", "RSCP", "-81 dB", "RSCP (dBm)"},
        {"/Neighbours/Neighbor Cells List", "Frequency Offset", "270", "Frequency Offset"},
        // Converted for the plot, shown as they are here: no unit their cells are not in.
        {"/GSM Neighbours/Neighboring Cells", "RSSI", "-70 dBm", "RSSI"},
        {"/Neighbours/Neighbor Cell List", "Filter RSCP", "0.183594", "Filter RSCP"},
        {"", "Srxlev", "22 dBm", "Srxlev"},  // a list whose path is not known
    };
    for (const auto& row : rows) {
        auto list = Array::create();
        list->append(dict({{row.leaf, row.shown}}));
        ListTableModel model;
        model.setList(panetest::makeTree(dict({{"List", Value(list)}}))->childNodes()->front(), row.path);
        EXPECT_EQ(model.headerData(0, Qt::Horizontal).toString(), row.header) << row.path;
        EXPECT_EQ(model.data(model.index(0, 0)).toString(), row.shown) << "the cell keeps the display string";
    }
}
