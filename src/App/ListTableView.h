// ListTableView: the table view of a list pane: sortable columns, the selected entry kept by its identity, Enter or a double click drills in.
#pragma once

#include "Model/VantorelModelNode.h"

#include <QTableView>

class QSortFilterProxyModel;

namespace vantorel {

class ListTableModel;

class ListTableView : public QTableView {
    Q_OBJECT
public:
    explicit ListTableView(QWidget* parent = nullptr);

    ListTableModel* listModel() const { return model_; }
    QSortFilterProxyModel* sortModel() const { return sort_; }

    // Replaces the list. The current entry stays current (and selected, if it was) when an
    // entry with the same identity is still there, wherever the refresh put it. `path`: the
    // list's display path (the columns' units).
    void setList(NodeRef node, const std::string& path = {});
    // The entry (its row in the list, the tree's index) shown at a view index, or -1.
    int entryAt(const QModelIndex& index) const;
    int currentEntry() const { return entryAt(currentIndex()); }
    // Makes the entry current and selected (scrolled into view).
    void selectEntry(int entry);

signals:
    // Double click, Enter or Return on an entry.
    void entryActivated(int entry);

protected:
    void keyPressEvent(QKeyEvent* event) override;

private:
    ListTableModel* model_;
    QSortFilterProxyModel* sort_;
};

}  // namespace vantorel
