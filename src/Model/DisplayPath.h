// DisplayPath: display-tree paths that pick a list entry by what it shows (its cell, its state, its rank) rather than by its position.
#pragma once

#include "Model/VantorelModelNode.h"

#include <string>
#include <vector>

namespace vantorel {

// A path component in brackets picks one entry ("0", "1", ...) of the list above it:
//   [Physical Cell ID=251]                 the first entry whose leaf shows that text
//   [UARFCN=10055,Cell ID=11]              ... all of these (a cell named by two leaves)
//   [Status!=ASET]                         ... a leaf that is missing or shows another text
//   [#2 Filtered RSRP]                     the entry with the 2nd highest number at that leaf
//   [#1 Filter RSCP,Status!=ASET]          ... among the entries the conditions keep
// so that a plotted value, a CSV column or a selected row follows a cell while the decoder
// reorders its list. Other components are the names the tree shows; a path without brackets
// is looked up as it is.
class DisplayPath {
public:
    // The leaves that name a cell or a context, in the order they count for an entry's
    // identity (LTE, UMTS/UTRAN, GSM, CDMA, packet data).
    static const std::vector<std::string>& identityKeys();

    // The node at path, or null when a component or a selector finds nothing.
    static NodeRef resolve(const std::string& path, const PathDictionary& nodes);
    // The text of the leaf at path, or null.
    static const std::string* leafText(const std::string& path, const PathDictionary& nodes);

    // "[Physical Cell ID=251,E-ARFCN=5780]": the entry's identity leaves; "" when it has none.
    static std::string identitySelector(const NodeRef& entry);
    // The same path with every list index that names an entry with identity leaves turned
    // into that entry's identity selector ("/Neighbours/List/2/RSRP" -> "/Neighbours/List/[PCI=17]/RSRP").
    static std::string following(const std::string& path, const PathDictionary& nodes);
    // Readable names: "Filtered RSRP (Physical Cell ID 251)", "Filtered RSRP (2nd strongest)",
    // "Filter RSCP (Status ASET)"; a path without selectors gives its last component.
    static std::string label(const std::string& path);
    // The cell that the path's last selector picks now, in label words ("PCI 251, EARFCN
    // 6300"); "" when it picks none or the entry has no identity leaves.
    static std::string cellOf(const std::string& path, const PathDictionary& nodes);
    // True for a path with a rank selector ("[#n ...]").
    static bool isRanked(const std::string& path);
};

}  // namespace vantorel
