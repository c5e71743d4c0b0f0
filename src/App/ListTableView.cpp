// ListTableView: a sortable QTableView over a ListTableModel that keeps the current entry by identity across refreshes.
#include "App/ListTableView.h"

#include "App/ListTableModel.h"

#include <QHeaderView>
#include <QKeyEvent>
#include <QScrollBar>
#include <QSortFilterProxyModel>

namespace vantorel {

ListTableView::ListTableView(QWidget* parent)
    : QTableView(parent), model_(new ListTableModel(this)), sort_(ListTableModel::makeSortModel(this)) {
    sort_->setSourceModel(model_);
    setModel(sort_);
    setSortingEnabled(true);
    sortByColumn(-1, Qt::AscendingOrder);  // the list's own order until a header is clicked
    setSelectionBehavior(QAbstractItemView::SelectRows);
    setSelectionMode(QAbstractItemView::SingleSelection);
    setEditTriggers(QAbstractItemView::NoEditTriggers);
    setTabKeyNavigation(false);
    setAlternatingRowColors(true);
    setWordWrap(false);
    horizontalHeader()->setHighlightSections(false);
    horizontalHeader()->setStretchLastSection(true);
    horizontalHeader()->setSectionsMovable(true);
    verticalHeader()->setSectionResizeMode(QHeaderView::Fixed);
    verticalHeader()->setDefaultSectionSize(fontMetrics().height() + 10);
    verticalHeader()->hide();
    connect(this, &QTableView::doubleClicked, this, [this](const QModelIndex& index) {
        if (const int entry = entryAt(index); entry >= 0) emit entryActivated(entry);
    });
}

void ListTableView::setList(NodeRef node, const std::string& path) {
    const int current = currentEntry();
    const bool selected = current >= 0 && selectionModel()->isRowSelected(currentIndex().row(), QModelIndex());
    const std::string identity = current >= 0 ? model_->identity(current) : std::string();
    const int column = currentIndex().column();
    const int scrolledTo = verticalScrollBar()->value();
    std::vector<std::string> keys;
    for (int c = 0; c < model_->columnCount(); ++c) keys.push_back(model_->key(c));

    model_->setList(std::move(node), path);

    bool sameColumns = int(keys.size()) == model_->columnCount();
    for (int c = 0; sameColumns && c < model_->columnCount(); ++c) sameColumns = keys[std::size_t(c)] == model_->key(c);
    if (!sameColumns) resizeColumnsToContents();
    verticalScrollBar()->setValue(scrolledTo);

    const int row = identity.empty() ? -1 : model_->rowOfIdentity(identity);
    if (row < 0) return;
    const QModelIndex index = sort_->mapFromSource(model_->index(row, std::max(0, column)));
    selectionModel()->setCurrentIndex(
        index, selected ? QItemSelectionModel::ClearAndSelect | QItemSelectionModel::Rows : QItemSelectionModel::NoUpdate);
}

int ListTableView::entryAt(const QModelIndex& index) const {
    if (!index.isValid() || index.model() != sort_) return -1;
    return sort_->mapToSource(index).row();
}

void ListTableView::selectEntry(int entry) {
    if (entry < 0 || entry >= model_->rowCount() || model_->columnCount() == 0) return;
    const QModelIndex index = sort_->mapFromSource(model_->index(entry, 0));
    selectionModel()->setCurrentIndex(index, QItemSelectionModel::ClearAndSelect | QItemSelectionModel::Rows);
    scrollTo(index);
}

void ListTableView::keyPressEvent(QKeyEvent* event) {
    if ((event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter) && currentEntry() >= 0) {
        emit entryActivated(currentEntry());
        return;
    }
    QTableView::keyPressEvent(event);
}

}  // namespace vantorel
