// TreeFormatter: the display as text: the tree as the panes show it, the display dictionary as JSON or as an XML property list.
#pragma once

#include "Model/VantorelModelNode.h"
#include "PropertyList/Value.h"

#include <string>

namespace vantorel {

class TreeFormatter {
public:
    // Json and Plist carry the shown names in the shown order; Display is the display
    // dictionary as the decoder keeps it ("0;Technology", "_sorted"), as JSON.
    enum class Format { Tree, Json, Plist, Display };
    // "tree", "json", "plist", "display" → the format; empty when unknown.
    static std::optional<Format> parse(const std::string& name);

    // Rows as the panes show them: sorted order, shown names, "(unknown)"; a row
    // that drills down is followed by its children, indented two blanks a level.
    static std::string tree(const NodeRef& root);
    // The terminal view's denser form of the same rows: a list whose entries hold only
    // values shows one line per entry ("0: UARFCN 10096 | Cell ID 120 | ..."), and a
    // list of plain values one line ("SIR: 13 16 13 12 14 12").
    static std::string compactTree(const NodeRef& root);
    // The display dictionary itself (data as base64, dates as ISO 8601 text).
    static std::string json(const Value& display);
    // The display as the tree names and orders it ("Technology", never "_sorted"), as JSON.
    static std::string shownJson(const Value& display);
    static std::string plist(const Value& display);
    static std::string format(Format f, const Value& display);
};

}  // namespace vantorel
