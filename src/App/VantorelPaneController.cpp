// VantorelPaneController: one level of the display tree as a table pane with its toolbar (status, activity, save).
#include "App/VantorelPaneController.h"

#include "App/ActivityIndicator.h"
#include "App/ListTableModel.h"
#include "App/ListTableView.h"
#include "App/NavigationController.h"
#include "App/PaneApplication.h"
#include "App/VantorelCell.h"
#include "Model/SignalValue.h"
#include "Platform/Preferences.h"

#include <QAction>
#include <QApplication>
#include <QHeaderView>
#include <QKeyEvent>
#include <QLabel>
#include <QMenu>
#include <QSortFilterProxyModel>
#include <QStyle>
#include <QTableWidget>
#include <QToolBar>
#include <QVBoxLayout>

namespace vantorel {

namespace {

constexpr const char* kUntitled = "Vantorel";
constexpr int kStatusFontSize = 14;

}  // namespace

VantorelPaneController::VantorelPaneController(NodeRef node, std::string atPath, PaneApplication* application,
                                               QWidget* parent)
    : QWidget(parent),
      _nodes(std::move(node)),
      _keyPath(std::move(atPath)),
      application_(application),
      table_(new QTableWidget(this)),
      toolbar_(new QToolBar(this)),
      placeholder_(new QLabel(this)),
      listView_(new ListTableView(this)) {
    table_->setColumnCount(1);
    table_->horizontalHeader()->hide();
    table_->horizontalHeader()->setStretchLastSection(true);
    table_->verticalHeader()->hide();
    table_->verticalHeader()->setSectionResizeMode(QHeaderView::Fixed);
    table_->verticalHeader()->setMinimumSectionSize(VantorelCell::kRowHeight);
    table_->verticalHeader()->setDefaultSectionSize(VantorelCell::kRowHeight);
    table_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    table_->setVerticalScrollMode(QAbstractItemView::ScrollPerPixel);
    table_->setSelectionBehavior(QAbstractItemView::SelectRows);
    table_->setSelectionMode(QAbstractItemView::SingleSelection);
    table_->setEditTriggers(QAbstractItemView::NoEditTriggers);
    table_->setTabKeyNavigation(false);
    // The cells fill their rows (W × 50) and draw their own separators.
    table_->setShowGrid(false);
    table_->installEventFilter(this);  // Enter and Return select the current row
    connect(table_, &QTableWidget::clicked, this, [this](const QModelIndex& index) {
        didSelectRowAtIndexPath(index.isValid() ? std::optional<int>(index.row()) : std::nullopt);
    });

    listView_->hide();
    connect(listView_, &ListTableView::entryActivated, this, [this](int entry) { didSelectRowAtIndexPath(entry); });
    for (QAbstractItemView* view : {static_cast<QAbstractItemView*>(table_), static_cast<QAbstractItemView*>(listView_)}) {
        view->setContextMenuPolicy(Qt::CustomContextMenu);
        connect(view, &QWidget::customContextMenuRequested, this, [this, view](const QPoint& pos) {
            if (QMenu* menu = contextMenu(view->indexAt(pos))) menu->popup(view->viewport()->mapToGlobal(pos));
        });
    }

    toolbar_->setMovable(false);
    toolbar_->setFloatable(false);
    toolbar_->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(table_, 1);
    layout->addWidget(listView_, 1);
    // A sentence, not a row: wrapped in the middle of the pane, the table hidden meanwhile.
    placeholder_->setAlignment(Qt::AlignCenter);
    placeholder_->setWordWrap(true);
    placeholder_->setTextFormat(Qt::PlainText);
    placeholder_->setMargin(24);
    placeholder_->setTextInteractionFlags(Qt::TextSelectableByMouse);
    placeholder_->hide();
    layout->addWidget(placeholder_, 1);
    layout->addWidget(toolbar_);
    setFocusProxy(table_);

    updateTitle();
    reloadData();
    updateListView();
    createToolbarItems();
}

VantorelPaneController::~VantorelPaneController() = default;

void VantorelPaneController::updateTitle() {
    std::string title = _nodes ? _nodes->displayName() : kUntitled;
    if (title == title_) return;
    title_ = std::move(title);
    setWindowTitle(QString::fromStdString(title_));
    emit titleChanged();
}

void VantorelPaneController::viewWillAppear() {
    // Base behaviour of the platform's table pane: no row stays selected.
    table_->clearSelection();
    listView_->clearSelection();
    updateTitle();
    updateListView();  // the setting may have changed on another pane
    toolbar_->setVisible(true);
    createToolbarItems();
}

void VantorelPaneController::viewWillDisappear() {
    QWidget* focus = QApplication::focusWidget();
    if (focus && (focus == this || isAncestorOf(focus))) focus->clearFocus();
}

void VantorelPaneController::setStatus(const std::string* status, bool isLoading) {
    _status = status ? *status : std::string();
    _isLoading = isLoading;
    createToolbarItems();
}

void VantorelPaneController::reloadWithNode(NodeRef node) {
    // The refresh replaces every row: the keyboard's place is kept by the row's name,
    // since rows come and go and an index would land on another row.
    const QModelIndex current = table_->currentIndex();
    const bool selected = current.isValid() && table_->selectionModel()->isRowSelected(current.row(), QModelIndex());
    std::optional<std::string> currentName;
    if (current.isValid() && current.row() < numberOfRowsInSection())
        currentName = _nodes->childNodes()->at(std::size_t(current.row()))->displayName();

    _nodes = std::move(node);
    updateTitle();
    reloadData();
    updateListView();
    updatePlaceholder();
    createToolbarItems();

    const std::vector<NodeRef>* children = _nodes ? _nodes->childNodes() : nullptr;
    for (std::size_t row = 0; currentName && children && row < children->size(); ++row) {
        if ((*children)[row]->displayName() != *currentName) continue;
        const QModelIndex index = table_->model()->index(int(row), 0);
        table_->selectionModel()->setCurrentIndex(
            index, selected ? QItemSelectionModel::ClearAndSelect | QItemSelectionModel::Rows : QItemSelectionModel::NoUpdate);
        break;
    }
}

void VantorelPaneController::setStale(bool stale) {
    if (stale == stale_) return;
    stale_ = stale;
    for (VantorelCell* cell : rowCells_) cell->setEnabled(!stale_);
    listView_->setEnabled(!stale_);
}

void VantorelPaneController::setPlaceholder(const std::string& text) {
    const QString shown = QString::fromStdString(text);
    if (shown == placeholder_->text()) return;
    placeholder_->setText(shown);
    updatePlaceholder();
}

void VantorelPaneController::updatePlaceholder() {
    const bool shown = !placeholder_->text().isEmpty() && numberOfRowsInSection() == 0;
    placeholder_->setVisible(shown);
    table_->setVisible(!shown && !showsTable_);
    listView_->setVisible(!shown && showsTable_);
}

void VantorelPaneController::setShowsTable(bool shown) {
    Preferences::setOwnBool(kListTablesPreference, shown);
    updateListView();
}

void VantorelPaneController::updateListView() {
    const bool table = ListTableModel::isList(_nodes) && Preferences::ownBool(kListTablesPreference).value_or(false);
    if (table) listView_->setList(_nodes, _keyPath);
    if (tableItem_) tableItem_->setChecked(table);
    if (table == showsTable_) return;
    showsTable_ = table;
    if (!table) listView_->setList(nullptr);
    const bool focused = hasFocus() || (focusProxy() && focusProxy()->hasFocus());
    table_->setVisible(!table && placeholder_->isHidden());
    listView_->setVisible(table && placeholder_->isHidden());
    setFocusProxy(table ? static_cast<QWidget*>(listView_) : table_);
    if (focused) setFocus();
}

QMenu* VantorelPaneController::contextMenu(const QModelIndex& index) {
    if (!_nodes || !index.isValid()) return nullptr;
    NodeRef leaf;
    std::string path;
    if (index.model() == table_->model()) {
        if (index.row() >= numberOfRowsInSection()) return nullptr;
        leaf = _nodes->childNodes()->at(std::size_t(index.row()));
        path = VantorelModelNode::childPath(_keyPath, leaf->displayName());
    } else if (const int entry = listView_->entryAt(index); entry >= 0) {
        const NodeRef row = listView_->listModel()->entry(entry);
        const std::string& key = listView_->listModel()->key(listView_->sortModel()->mapToSource(index).column());
        for (const NodeRef& child : *row->childNodes())
            if (child->displayName() == key) leaf = child;
        path = VantorelModelNode::childPath(VantorelModelNode::childPath(_keyPath, row->displayName()), key);
    }
    if (!leaf || !leaf->value() || !SignalValue::parse(*leaf->value()) || !application_) return nullptr;
    auto* menu = new QMenu(this);
    menu->setAttribute(Qt::WA_DeleteOnClose);
    PaneApplication* application = application_;
    connect(menu->addAction(tr("Plot this value")), &QAction::triggered, this,
            [application, path] { application->plotValue(path); });
    return menu;
}

void VantorelPaneController::createToolbarItems() {
    // The status changes every second on a live display. Items whose set has not
    // changed are refreshed in place: replacing the buttons would drop a click whose
    // press landed on the old button and whose release lands on the new one.
    const int shape = (application_ ? 1 : 0) | (ListTableModel::isList(_nodes) ? 2 : 0) |
                      (application_ && application_->allowSaveButton() ? 4 : 0);
    if (shape == toolbarShape_) {
        if (_isLoading) activityIndicator_->startAnimating();
        else activityIndicator_->stopAnimating();
        activityIndicatorItem_->setVisible(_isLoading);
        fitStatus();
        if (tableItem_) tableItem_->setChecked(showsTable_);
        return;
    }
    toolbarShape_ = shape;

    // The old items go from the event loop: a save button may be inside its own
    // trigger when a status change rebuilds the toolbar.
    for (QAction* action : toolbar_->actions()) {
        toolbar_->removeAction(action);
        action->deleteLater();
    }

    // 1. The activity indicator. The toolbar shows or hides its widgets by their
    // actions, so "hidden when stopped" hides the item's action.
    activityIndicator_ = new ActivityIndicator;
    activityIndicatorItem_ = toolbar_->addWidget(activityIndicator_);
    if (_isLoading) activityIndicator_->startAnimating();
    activityIndicatorItem_->setVisible(_isLoading);

    // 2. The status line: system font 14 pt, dark text on a clear background.
    statusLabel_ = new QLabel(QString::fromStdString(_status));
    QFont font = QApplication::font();
    font.setPixelSize(kStatusFontSize);
    statusLabel_->setFont(font);
    statusLabel_->setTextFormat(Qt::PlainText);
    QPalette palette = statusLabel_->palette();
    palette.setColor(QPalette::WindowText, Qt::black);
    statusLabel_->setPalette(palette);
    statusLabel_->setAutoFillBackground(false);
    fitStatus();
    toolbar_->addWidget(statusLabel_);

    // 3. The flexible space.
    auto* space = new QWidget;
    space->setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Preferred);
    toolbar_->addWidget(space);

    // 4. The signal plot, and the table toggle on a list.
    signalItem_ = nullptr;
    if (application_) {
        signalItem_ = toolbar_->addAction(tr("Signal"));
        signalItem_->setToolTip(tr("Plot the signal values over time"));
        PaneApplication* application = application_;
        connect(signalItem_, &QAction::triggered, this, [application] { application->showSignalPlot(); });
    }
    tableItem_ = nullptr;
    if (ListTableModel::isList(_nodes)) {
        tableItem_ = toolbar_->addAction(tr("Table"));
        tableItem_->setToolTip(tr("Show the list as a sortable table"));
        tableItem_->setCheckable(true);
        tableItem_->setChecked(showsTable_);
        // Only the user's click changes the setting: a list that empties for a tick unchecks the
        // item without changing the choice.
        connect(tableItem_, &QAction::triggered, this, [this](bool on) { setShowsTable(on); });
    }

    // 5. The save button, on internal installs only.
    saveItem_ = nullptr;
    if (application_ && application_->allowSaveButton()) {
        saveItem_ = toolbar_->addAction(style()->standardIcon(QStyle::SP_DialogSaveButton), tr("Save"));
        PaneApplication* application = application_;
        connect(saveItem_, &QAction::triggered, this, [application] { application->showSaveView(); });
    }
}

void VantorelPaneController::fitStatus() {
    if (!statusLabel_) return;
    const QString full = QString::fromStdString(_status);
    // The room the indicator, the save button and the toolbar's margins leave.
    const int reserved = 24 + (_isLoading ? 32 : 0) + (application_ ? 64 : 0) + (ListTableModel::isList(_nodes) ? 56 : 0) +
                         (application_ && application_->allowSaveButton() ? 96 : 0);
    const int room = std::max(80, width() - reserved);
    statusLabel_->setText(statusLabel_->fontMetrics().elidedText(full, Qt::ElideRight, room));
    statusLabel_->setToolTip(statusLabel_->text() == full ? QString() : full);
}

void VantorelPaneController::resizeEvent(QResizeEvent* event) {
    QWidget::resizeEvent(event);
    fitStatus();
}

int VantorelPaneController::numberOfRowsInSection() const {
    const std::vector<NodeRef>* children = _nodes ? _nodes->childNodes() : nullptr;
    return children ? int(children->size()) : 0;
}

VantorelCell* VantorelPaneController::dequeueReusableCell(const std::string& identifier) {
    for (auto it = reusePool_.begin(); it != reusePool_.end(); ++it) {
        if ((*it)->reuseIdentifier() == identifier) {
            VantorelCell* cell = *it;
            reusePool_.erase(it);
            return cell;
        }
    }
    return nullptr;
}

VantorelCell* VantorelPaneController::cellForRowAtIndexPath(int row) {
    const NodeRef& child = _nodes->childNodes()->at(std::size_t(row));
    VantorelCell* cell = dequeueReusableCell(VantorelCell::kReuseIdentifier);
    const QString name = QString::fromStdString(child->displayName());
    if (child->childNodes()) {
        if (!cell)
            cell = new VantorelCell(VantorelCell::withStyleKey, VantorelCell::CellStyle::Value1,
                                    VantorelCell::kReuseIdentifier);
        cell->key()->setText(name);
        cell->setAccessoryType(VantorelCell::AccessoryType::DisclosureIndicator);
        if (cell->value()) cell->value()->setText(QString());
        cell->setLayoutKey();
    } else {
        if (!cell) cell = new VantorelCell(VantorelCell::CellStyle::Value1, VantorelCell::kReuseIdentifier);
        cell->key()->setText(name);
        cell->setAccessoryType(VantorelCell::AccessoryType::None);
        // A drill-down row reused for a leaf has no value label: the value is not
        // shown until the table makes a new cell (deliberate: a reused cell keeps the
        // kind it was made with).
        const std::string* value = child->value();
        if (cell->value()) cell->value()->setText(value ? QString::fromStdString(*value) : QString());
        cell->setLayoutValue();
    }
    return cell;
}

void VantorelPaneController::reloadData() {
    // The rows' cells go back to the pool in row order; the table then deletes the
    // emptied holders.
    for (VantorelCell* cell : rowCells_) {
        cell->hide();
        cell->setParent(this);
        reusePool_.push_back(cell);
    }
    rowCells_.clear();
    table_->setRowCount(0);

    const int rows = numberOfRowsInSection();
    table_->setRowCount(rows);
    for (int row = 0; row < rows; ++row) {
        VantorelCell* cell = cellForRowAtIndexPath(row);
        // The table owns (and deletes) its index widgets; the cell sits in a holder
        // so that it can leave the table and wait in the pool.
        auto* holder = new QWidget;
        auto* layout = new QVBoxLayout(holder);
        layout->setContentsMargins(0, 0, 0, 0);
        layout->addWidget(cell);
        cell->show();
        cell->setEnabled(!stale_);
        table_->setCellWidget(row, 0, holder);
        rowCells_.push_back(cell);
    }
}

VantorelCell* VantorelPaneController::cellAtRow(int row) const {
    return row >= 0 && std::size_t(row) < rowCells_.size() ? rowCells_[std::size_t(row)] : nullptr;
}

void VantorelPaneController::didSelectRowAtIndexPath(std::optional<int> row) {
    if (!row || *row < 0 || *row >= numberOfRowsInSection()) return;
    const NodeRef child = _nodes->childNodes()->at(std::size_t(*row));  // held across the push
    if (!child->childNodes()) {
        table_->selectionModel()->select(table_->model()->index(*row, 0),
                                         QItemSelectionModel::Deselect | QItemSelectionModel::Rows);
        return;
    }
    auto pane = std::make_unique<VantorelPaneController>(child, VantorelModelNode::childPath(_keyPath, child->displayName()),
                                                         application_);
    pane->setStatus(&_status, _isLoading);
    if (navigationController_) navigationController_->push(std::move(pane), true);
}

bool VantorelPaneController::eventFilter(QObject* watched, QEvent* event) {
    if (watched == table_ && event->type() == QEvent::KeyPress) {
        const int key = static_cast<QKeyEvent*>(event)->key();
        if (key == Qt::Key_Return || key == Qt::Key_Enter) {
            const QModelIndex current = table_->currentIndex();
            didSelectRowAtIndexPath(current.isValid() ? std::optional<int>(current.row()) : std::nullopt);
            return true;
        }
    }
    return QWidget::eventFilter(watched, event);
}

}  // namespace vantorel
