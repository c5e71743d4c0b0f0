// VantorelModelNode: turns the decoder's display dictionary into the tree of rows the panes show, with an index by path.
#include "Model/VantorelModelNode.h"

#include "LogGenerator/ArrayLock.h"
#include "Model/VantorelModelLeafNode.h"
#include "Model/VantorelModelTreeNode.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <algorithm>

namespace vantorel {

namespace {

NodeRef build(const std::string& name, const Value& value, const std::string& path, PathDictionary& index) {
    NodeRef node;
    if (const std::string* s = value.asString()) {
        node = std::make_shared<VantorelModelLeafNode>(name, *s);
    } else if (DictionaryRef dict = value.asDictionary()) {
        const bool ordered = dict->contains("_sorted");
        std::vector<std::string> keys = dict->keys();
        if (ordered) std::sort(keys.begin(), keys.end());  // plain string comparison
        std::vector<NodeRef> children;
        for (const std::string& key : keys) {
            if (key == "_sorted") continue;
            const Value* child = dict->find(key);
            if (!child) continue;
            std::string shown = key;
            // "prefix;name" shows as name, only with exactly one ";".
            if (ordered && std::count(key.begin(), key.end(), ';') == 1) shown = key.substr(key.find(';') + 1);
            if (NodeRef c = build(shown, *child, VantorelModelNode::childPath(path, shown), index)) children.push_back(std::move(c));
        }
        node = std::make_shared<VantorelModelTreeNode>(name, std::move(children));
    } else if (ArrayRef array = value.asArray()) {
        // Held across the recursion: sections refill arrays under the same lock.
        ArrayLock::lockArray();
        std::vector<NodeRef> children;
        for (const Value& element : *array) {
            std::string shown = std::to_string(children.size());
            if (NodeRef c = build(shown, element, VantorelModelNode::childPath(path, shown), index)) children.push_back(std::move(c));
        }
        ArrayLock::unlockArray();
        node = std::make_shared<VantorelModelTreeNode>(name, std::move(children));
    } else {
        node = std::make_shared<VantorelModelLeafNode>(name, "(unknown)");
    }
    index[path] = node;  // a later node with the same path replaces an earlier one
    return node;
}

}  // namespace

std::string VantorelModelNode::childPath(const std::string& parent, const std::string& name) {
    return parent == "/" ? "/" + name : parent + "/" + name;
}

NodeRef VantorelModelNode::makeTreeFromObject(const Value& display, PathDictionary& withPathDictionary) {
    return build("Vantorel", display, "/", withPathDictionary);
}

}  // namespace vantorel
