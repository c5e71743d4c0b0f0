// TreeFormatter: text forms of the display (Part 2.3's tree, JSON through QJsonDocument, XML through libplist).
#include "cli/TreeFormatter.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QDateTime>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

namespace vantorel {

namespace {

void appendRows(const NodeRef& node, int depth, std::string& out) {
    const auto* children = node->childNodes();
    if (!children) return;
    for (const NodeRef& child : *children) {
        out.append(static_cast<size_t>(depth) * 2, ' ');
        out += child->displayName();
        if (const std::string* v = child->value()) {
            out += ": " + *v + "\n";
        } else {
            out += child->childNodes()->empty() ? " (empty)\n" : "\n";
            appendRows(child, depth + 1, out);
        }
    }
}

QJsonValue toJson(const Value& v) {
    switch (v.type()) {
    case Value::Type::String: return QString::fromStdString(*v.asString());
    case Value::Type::Integer: return static_cast<qint64>(*v.asInteger());
    case Value::Type::Real: return *v.asReal();
    case Value::Type::Boolean: return *v.asBoolean();
    case Value::Type::Data: {
        const Bytes& b = *v.asData();
        return QString::fromLatin1(
            QByteArray(reinterpret_cast<const char*>(b.data()), static_cast<qsizetype>(b.size())).toBase64());
    }
    case Value::Type::Date:
        return QDateTime::fromMSecsSinceEpoch(static_cast<qint64>(v.asDate()->secondsSince1970 * 1000), Qt::UTC)
            .toString(Qt::ISODateWithMs);
    case Value::Type::Dictionary: {
        QJsonObject o;
        for (const auto& [k, item] : *v.asDictionary()) o.insert(QString::fromStdString(k), toJson(item));
        return o;
    }
    case Value::Type::Array: {
        QJsonArray a;
        for (const Value& item : *v.asArray()) a.append(toJson(item));
        return a;
    }
    case Value::Type::Null: break;
    }
    return QJsonValue();
}

}  // namespace

std::optional<TreeFormatter::Format> TreeFormatter::parse(const std::string& name) {
    if (name == "tree") return Format::Tree;
    if (name == "json") return Format::Json;
    if (name == "plist") return Format::Plist;
    return std::nullopt;
}

std::string TreeFormatter::tree(const NodeRef& root) {
    std::string out;
    if (root) appendRows(root, 0, out);
    return out;
}

std::string TreeFormatter::json(const Value& display) {
    QJsonValue v = toJson(display);
    QJsonDocument doc = v.isObject() ? QJsonDocument(v.toObject()) : QJsonDocument(v.toArray());
    if (v.isNull()) return "null\n";
    return doc.toJson(QJsonDocument::Indented).toStdString();
}

std::string TreeFormatter::plist(const Value& display) {
    return PropertyListSerialization::writeXML(display).value_or("");
}

std::string TreeFormatter::format(Format f, const Value& display) {
    switch (f) {
    case Format::Tree: {
        PathDictionary paths;
        return tree(VantorelModelNode::makeTreeFromObject(display, paths));
    }
    case Format::Json: return json(display);
    case Format::Plist: return plist(display);
    }
    return "";
}

}  // namespace vantorel
