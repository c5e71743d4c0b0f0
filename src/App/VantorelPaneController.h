// VantorelPaneController: one level of the display tree as a table pane with its toolbar (status, activity, signal plot, list table, save).
#pragma once

#include "Model/VantorelModelNode.h"

#include <QWidget>

#include <deque>
#include <optional>
#include <string>
#include <vector>

class QAction;
class QLabel;
class QMenu;
class QModelIndex;
class QTableWidget;
class QToolBar;

namespace vantorel {

class ActivityIndicator;
class ListTableView;
class NavigationController;
class PaneApplication;
class VantorelCell;

// The platform's table view controller stands behind this class: a one-column
// table of 50-point rows above the pane's toolbar. Its rows are VantorelCells that
// go through a reuse pool, as the platform's cells do, so that a reused cell keeps
// the kind it was made as.
class VantorelPaneController : public QWidget {
    Q_OBJECT
public:
    // `initWithNode:atPath:`: `_isLoading` true, `_status` empty. `application`
    // decides the save button and receives showSaveView; it outlives the pane.
    VantorelPaneController(NodeRef node, std::string atPath, PaneApplication* application,
                           QWidget* parent = nullptr);
    ~VantorelPaneController() override;

    const std::string& path() const { return _keyPath; }
    const NodeRef& node() const { return _nodes; }
    // The pane's title: the node's displayName, or "Vantorel" without a node. Set at
    // creation, by viewWillAppear and by reloadWithNode.
    const std::string& title() const { return title_; }
    const std::string& status() const { return _status; }
    bool isLoading() const { return _isLoading; }
    // Stale values (the stream is lost): the rows are greyed until it is back.
    void setStale(bool stale);
    bool isStale() const { return stale_; }
    // Why the pane has nothing to show (a source that cannot start, a service nobody
    // runs), in place of its rows while it has none; empty: nothing in their place.
    void setPlaceholder(const std::string& text);
    QLabel* placeholderLabel() const { return placeholder_; }

    // The platform's appearance calls, sent by the navigation controller.
    void viewWillAppear();
    void viewWillDisappear();

    // `setStatus:isLoading:`: nil (nullptr) gives the empty string.
    void setStatus(const std::string* status, bool isLoading);
    void setStatus(const std::string& status, bool isLoading) { setStatus(&status, isLoading); }
    // `reloadWithNode:`: replaces the node (nullptr allowed), the title, the rows and
    // the toolbar. The current row follows its name, not its index.
    void reloadWithNode(NodeRef node);
    // Rebuilds the toolbar: activity indicator, status label, flexible space, the signal
    // plot button, the table toggle on a list pane, and the save button only when the
    // application allows it. When that set of items is unchanged, they are updated in place.
    void createToolbarItems();

    // A list of dictionaries (ListTableModel::isList) can be shown as a table instead of
    // its rows of indices. The choice is one setting for every list pane, kept in the
    // preferences.
    static constexpr const char* kListTablesPreference = "ListTables";
    bool showsTable() const { return showsTable_; }
    void setShowsTable(bool shown);
    ListTableView* listTableView() const { return listView_; }
    // The context menu of a row (of the rows view) or a cell (of the table view): "Plot
    // this value" when the leaf there reads as a number; nullptr when nothing is offered.
    QMenu* contextMenu(const QModelIndex& index);

    // The table's data source and delegate, by row (the index path's last index).
    int numberOfRowsInSection() const;
    VantorelCell* cellForRowAtIndexPath(int row);
    // Selection; std::nullopt stands for "no index path".
    void didSelectRowAtIndexPath(std::optional<int> row);
    // The platform's cell reuse: the first pooled cell with that identifier, or
    // nullptr when the table has to make a new one.
    VantorelCell* dequeueReusableCell(const std::string& identifier);
    // Reloads every row: the rows' cells go back to the reuse pool, in row order,
    // then each row is made again through cellForRowAtIndexPath.
    void reloadData();

    // The navigation controller that holds this pane (set by it; nullptr outside one).
    NavigationController* navigationController() const { return navigationController_; }
    void setNavigationController(NavigationController* controller) { navigationController_ = controller; }

    // The table, its rows' cells and the cells waiting for reuse.
    QTableWidget* tableView() const { return table_; }
    VantorelCell* cellAtRow(int row) const;     // the cell shown in that row
    std::size_t reusePoolSize() const { return reusePool_.size(); }
    // The toolbar's items: the indicator's action is hidden while not loading.
    QAction* activityIndicatorItem() const { return activityIndicatorItem_; }
    QLabel* statusLabel() const { return statusLabel_; }
    QAction* saveItem() const { return saveItem_; }  // nullptr without the save button
    QAction* signalItem() const { return signalItem_; }
    QAction* tableItem() const { return tableItem_; }  // nullptr unless the pane is a list

signals:
    void titleChanged();

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    void updateTitle();
    // Fits the status into the toolbar's room (elided, whole in the tooltip), so that
    // a long status never pushes the save button into the toolbar's overflow menu.
    void fitStatus();
    // Shows the rows or the table, as the node and the setting say, and refills the table.
    void updateListView();
    void updatePlaceholder();

    NodeRef _nodes;
    std::string _keyPath;
    std::string _status;
    bool _isLoading = true;
    bool stale_ = false;
    bool showsTable_ = false;

    PaneApplication* application_;
    NavigationController* navigationController_ = nullptr;
    std::string title_;
    QTableWidget* table_;
    QToolBar* toolbar_;
    std::vector<VantorelCell*> rowCells_;   // the cell of each row, in row order
    std::deque<VantorelCell*> reusePool_;   // cells waiting to be reused, oldest first
    ActivityIndicator* activityIndicator_ = nullptr;
    QAction* activityIndicatorItem_ = nullptr;
    QLabel* statusLabel_ = nullptr;
    QLabel* placeholder_;
    QAction* saveItem_ = nullptr;
    QAction* signalItem_ = nullptr;
    QAction* tableItem_ = nullptr;
    int toolbarShape_ = -1;  // which optional items the toolbar holds; -1 before the first build
    ListTableView* listView_;
};

}  // namespace vantorel
