// ListTableModel: the entries of a display-tree list as a table, with the identity that keeps a row selected and a numeric-aware sort.
#include "App/ListTableModel.h"

#include "Model/DisplayPath.h"
#include "Model/SignalCatalogue.h"
#include "Model/SignalValue.h"

#include <QSortFilterProxyModel>

#include <algorithm>

namespace vantorel {

namespace {

// Numbers compare by value ("-100 dBm" below "-95 dBm", "9" below "10"); anything else, or a
// number against a text, compares as text.
class NumericSortModel : public QSortFilterProxyModel {
public:
    using QSortFilterProxyModel::QSortFilterProxyModel;

protected:
    bool lessThan(const QModelIndex& left, const QModelIndex& right) const override {
        const QString a = left.data().toString(), b = right.data().toString();
        const std::optional<double> x = SignalValue::parse(a.toStdString()), y = SignalValue::parse(b.toStdString());
        if (x && y && *x != *y) return *x < *y;
        return a.localeAwareCompare(b) < 0;
    }
};

const std::vector<NodeRef>* childrenOf(const NodeRef& node) { return node ? node->childNodes() : nullptr; }

}  // namespace

bool ListTableModel::isList(const NodeRef& node) {
    const std::vector<NodeRef>* entries = childrenOf(node);
    if (!entries || entries->empty()) return false;
    for (std::size_t i = 0; i < entries->size(); ++i) {
        const NodeRef& entry = (*entries)[i];
        const std::vector<NodeRef>* leaves = entry->childNodes();
        if (entry->displayName() != std::to_string(i) || !leaves) return false;
        if (std::none_of(leaves->begin(), leaves->end(), [](const NodeRef& n) { return n->value() != nullptr; }))
            return false;
    }
    return true;
}

QSortFilterProxyModel* ListTableModel::makeSortModel(QObject* parent) { return new NumericSortModel(parent); }

ListTableModel::ListTableModel(QObject* parent) : QAbstractTableModel(parent) {}

void ListTableModel::setList(NodeRef node, const std::string& path) {
    beginResetModel();
    list_ = isList(node) ? std::move(node) : nullptr;
    path_ = path;
    // Columns only ever grow: a key an entry lacks now keeps its column, so no column moves
    // between refreshes and a sort stays on its key.
    if (const std::vector<NodeRef>* entries = childrenOf(list_)) {
        for (const NodeRef& entry : *entries)
            for (const NodeRef& child : *entry->childNodes())
                if (child->value() && std::find(keys_.begin(), keys_.end(), child->displayName()) == keys_.end())
                    keys_.push_back(child->displayName());
    }
    endResetModel();
}

NodeRef ListTableModel::entry(int row) const {
    const std::vector<NodeRef>* entries = childrenOf(list_);
    return entries && row >= 0 && std::size_t(row) < entries->size() ? (*entries)[std::size_t(row)] : nullptr;
}

const std::string* ListTableModel::leaf(int row, const std::string& key) const {
    const NodeRef e = entry(row);
    if (!e) return nullptr;
    for (const NodeRef& child : *e->childNodes())
        if (child->displayName() == key && child->value()) return child->value();
    return nullptr;
}

std::string ListTableModel::identity(int row) const {
    const NodeRef e = entry(row);
    const std::string id = DisplayPath::identitySelector(e);
    return !id.empty() || !e ? id : e->displayName();
}

int ListTableModel::rowOfIdentity(const std::string& id) const {
    for (int row = 0; row < rowCount(); ++row)
        if (identity(row) == id) return row;
    return -1;
}

int ListTableModel::rowCount(const QModelIndex& parent) const {
    const std::vector<NodeRef>* entries = childrenOf(list_);
    return parent.isValid() || !entries ? 0 : int(entries->size());
}

int ListTableModel::columnCount(const QModelIndex& parent) const { return parent.isValid() ? 0 : int(keys_.size()); }

QVariant ListTableModel::data(const QModelIndex& index, int role) const {
    if (!checkIndex(index, CheckIndexOption::IndexIsValid)) return {};
    if (role == Qt::DisplayRole || role == Qt::ToolTipRole) {
        const std::string* value = leaf(index.row(), key(index.column()));
        return value ? QString::fromStdString(*value) : QString();
    }
    // Measurements line up on their digits.
    if (role == Qt::TextAlignmentRole) {
        const std::string* value = leaf(index.row(), key(index.column()));
        const bool number = value && SignalValue::parse(*value);
        return QVariant::fromValue(Qt::AlignVCenter | (number ? Qt::AlignRight : Qt::AlignLeft));
    }
    return {};
}

QVariant ListTableModel::headerData(int section, Qt::Orientation orientation, int role) const {
    if (orientation == Qt::Horizontal && section >= 0 && section < columnCount() &&
        (role == Qt::DisplayRole || role == Qt::ToolTipRole)) {
        // The unit from the catalogue: the display strings may carry another word ("Srxlev 22 dBm"
        // is dB). Only where the cells' numbers are in it: a value the catalogue converts
        // (TD-SCDMA's RSCP report, RxLev from dBm) keeps the plain key over its display strings.
        const std::optional<SignalQuantity> quantity =
            path_.empty() ? std::nullopt : SignalCatalogue::find("", path_ + "/0/" + key(section), leaf(0, key(section)));
        if (!quantity || quantity->scale != 1 || quantity->offset != 0) return QString::fromStdString(key(section));
        if (role == Qt::ToolTipRole)
            return QString::fromStdString(quantity->name + ": " + quantity->quantity +
                                          (quantity->unit.empty() ? "" : ", " + quantity->unit));
        return QString::fromStdString(SignalCatalogue::columnTitle(key(section), quantity));
    }
    if (role != Qt::DisplayRole) return {};
    if (orientation == Qt::Horizontal) return QVariant();
    const NodeRef e = entry(section);
    return e ? QString::fromStdString(e->displayName()) : QVariant();
}

}  // namespace vantorel
