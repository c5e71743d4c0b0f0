// ListTableModel: a list of dictionaries in the display tree (neighbours, cell sets, PDP contexts) as rows and columns.
#pragma once

#include "Model/VantorelModelNode.h"

#include <QAbstractTableModel>

#include <string>
#include <vector>

class QSortFilterProxyModel;

namespace vantorel {

// One row per entry ("0", "1", ... in the tree), one column per leaf key: the union of the
// keys of every list shown so far, in the order first seen. A column of a signal value
// SignalCatalogue knows has its unit in the header ("Srxlev (dB)", "RSSI (level)"), the
// cells keeping the display strings as the decoder wrote them. Nested dictionaries of an entry
// are not columns: they are reached by drilling into the entry.
class ListTableModel : public QAbstractTableModel {
    Q_OBJECT
public:
    // True for a node whose children are the entries "0".."n-1" (at least one), each a
    // dictionary with at least one leaf.
    static bool isList(const NodeRef& node);
    // A sort model over a ListTableModel: numbers by value (SignalValue) when both cells
    // hold one, text otherwise.
    static QSortFilterProxyModel* makeSortModel(QObject* parent);

    explicit ListTableModel(QObject* parent = nullptr);

    // Replaces the list (a reset); a node that is not a list gives an empty table. `path`
    // is the list's display path, which names the columns' quantities.
    void setList(NodeRef node, const std::string& path = {});
    const NodeRef& list() const { return list_; }
    NodeRef entry(int row) const;
    const std::string& key(int column) const { return keys_.at(std::size_t(column)); }
    // The entry's identity (DisplayPath::identitySelector), or its index name without
    // identity leaves: a row stays selected across refreshes by it, not by its index.
    std::string identity(int row) const;
    int rowOfIdentity(const std::string& id) const;  // -1 when no entry has it

    int rowCount(const QModelIndex& parent = QModelIndex()) const override;
    int columnCount(const QModelIndex& parent = QModelIndex()) const override;
    QVariant data(const QModelIndex& index, int role = Qt::DisplayRole) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role = Qt::DisplayRole) const override;

private:
    const std::string* leaf(int row, const std::string& key) const;

    NodeRef list_;
    std::string path_;
    std::vector<std::string> keys_;
};

}  // namespace vantorel
