// TreeFormatter: text forms of the display (the pane tree, JSON in the tree's order, XML through libplist).
#include "Monitor/TreeFormatter.h"

#include "LogGenerator/ArrayLock.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "Platform/TerminalText.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QDateTime>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>
#include <cstdio>

namespace vantorel {

namespace {

bool onlyLeaves(const NodeRef& node) {
    const auto* children = node->childNodes();
    if (!children || children->empty()) return false;
    for (const NodeRef& c : *children)
        if (!c->value()) return false;
    return true;
}

// "UARFCN 10096 | Cell ID 120" for a node of named values; "13 16 13" for a list.
std::string oneLine(const NodeRef& node, bool withNames) {
    std::string line;
    for (const NodeRef& c : *node->childNodes()) {
        if (!line.empty()) line += withNames ? " | " : " ";
        line += withNames ? TerminalText::visible(c->displayName()) + " " + TerminalText::visible(*c->value())
                          : TerminalText::visible(*c->value());
    }
    return line;
}

void appendRows(const NodeRef& node, int depth, bool compact, std::string& out) {
    const auto* children = node->childNodes();
    if (!children) return;
    // Array rows are named 0, 1, 2...: a node whose first child is "0" is a list.
    const bool isList = !children->empty() && (*children)[0]->displayName() == "0";
    for (const NodeRef& child : *children) {
        out.append(static_cast<size_t>(depth) * 2, ' ');
        // Names and values come from the modem or a file: printed on a terminal.
        out += TerminalText::visible(child->displayName());
        if (const std::string* v = child->value()) {
            out += ": " + TerminalText::visible(*v) + "\n";
        } else if (child->childNodes()->empty()) {
            out += " (empty)\n";
        } else if (compact && onlyLeaves(child) && (isList || (*child->childNodes())[0]->displayName() == "0")) {
            const bool named = (*child->childNodes())[0]->displayName() != "0";
            out += ": " + oneLine(child, named) + "\n";
        } else {
            out += "\n";
            appendRows(child, depth + 1, compact, out);
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

// The display as the panes name and order it: a "_sorted" dictionary's keys in plain
// string order, "prefix;name" shown as name, "_sorted" itself left out (as VantorelModelNode).
Value shownValue(const Value& v) {
    if (DictionaryRef dict = v.asDictionary()) {
        const bool ordered = dict->contains("_sorted");
        std::vector<std::string> keys = dict->keys();
        if (ordered) std::sort(keys.begin(), keys.end());
        DictionaryRef out = Dictionary::create();
        for (const std::string& key : keys) {
            if (key == "_sorted") continue;
            std::string shown = key;
            if (ordered && std::count(key.begin(), key.end(), ';') == 1) shown = key.substr(key.find(';') + 1);
            out->set(shown, shownValue(dict->get(key)));
        }
        return out;
    }
    if (ArrayRef array = v.asArray()) {
        ArrayRef out = Array::create();
        ArrayLock::lockArray();  // decoders refill arrays under this lock
        for (const Value& element : *array) out->append(shownValue(element));
        ArrayLock::unlockArray();
        return out;
    }
    return v;
}

std::string jsonString(const std::string& s) {
    // Through QString: text that is not UTF-8 becomes U+FFFD, so the output stays valid JSON.
    const QByteArray utf8 = QString::fromStdString(s).toUtf8();
    std::string out = "\"";
    for (const char c : utf8) {
        switch (c) {
        case '"': out += "\\\""; break;
        case '\\': out += "\\\\"; break;
        case '\n': out += "\\n"; break;
        case '\r': out += "\\r"; break;
        case '\t': out += "\\t"; break;
        default:
            if (static_cast<unsigned char>(c) < 0x20) {
                char escaped[8];
                std::snprintf(escaped, sizeof escaped, "\\u%04x", static_cast<unsigned>(c));
                out += escaped;
            } else {
                out += c;
            }
        }
    }
    return out + "\"";
}

// QJsonObject sorts its keys; the shown order is the point here, so objects are written by hand.
void appendJson(const Value& v, int depth, std::string& out) {
    const std::string indent(static_cast<size_t>(depth + 1) * 4, ' ');
    if (DictionaryRef dict = v.asDictionary()) {
        if (dict->empty()) {
            out += "{}";
            return;
        }
        out += "{\n";
        bool first = true;
        for (const auto& [key, item] : *dict) {
            out += (first ? "" : ",\n") + indent + jsonString(key) + ": ";
            appendJson(item, depth + 1, out);
            first = false;
        }
        out += "\n" + std::string(static_cast<size_t>(depth) * 4, ' ') + "}";
    } else if (ArrayRef array = v.asArray()) {
        if (array->size() == 0) {
            out += "[]";
            return;
        }
        out += "[\n";
        for (size_t i = 0; i < array->size(); ++i) {
            out += (i ? ",\n" : "") + indent;
            appendJson(array->at(i), depth + 1, out);
        }
        out += "\n" + std::string(static_cast<size_t>(depth) * 4, ' ') + "]";
    } else if (const std::string* s = v.asString()) {
        out += jsonString(*s);
    } else {
        // Scalars through QJsonDocument: numbers, booleans, base64 data, ISO dates, null.
        const QByteArray one = QJsonDocument(QJsonArray{toJson(v)}).toJson(QJsonDocument::Compact);
        out += one.mid(1, one.size() - 2).toStdString();
    }
}

}  // namespace

std::optional<TreeFormatter::Format> TreeFormatter::parse(const std::string& name) {
    if (name == "tree") return Format::Tree;
    if (name == "json") return Format::Json;
    if (name == "plist") return Format::Plist;
    if (name == "display") return Format::Display;
    return std::nullopt;
}

std::string TreeFormatter::tree(const NodeRef& root) {
    std::string out;
    if (root) appendRows(root, 0, false, out);
    return out;
}

std::string TreeFormatter::compactTree(const NodeRef& root) {
    std::string out;
    if (root) appendRows(root, 0, true, out);
    return out;
}

std::string TreeFormatter::shownJson(const Value& display) {
    if (display.type() == Value::Type::Null) return "null\n";
    std::string out;
    appendJson(shownValue(display), 0, out);
    return out + "\n";
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
    case Format::Json: return shownJson(display);
    case Format::Plist: return plist(shownValue(display));
    case Format::Display: return json(display);
    }
    return "";
}

}  // namespace vantorel
