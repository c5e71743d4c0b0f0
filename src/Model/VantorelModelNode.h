// VantorelModelNode: a named node of the display tree, and the builder of that tree from a display dictionary.
#pragma once

#include "PropertyList/Value.h"

#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

namespace vantorel {

class VantorelModelNode;
using NodeRef = std::shared_ptr<const VantorelModelNode>;
// The path index: "/" for the root, "/A/B" below it.
using PathDictionary = std::unordered_map<std::string, NodeRef>;

class VantorelModelNode {
public:
    explicit VantorelModelNode(std::string name) : _name(std::move(name)) {}
    virtual ~VantorelModelNode() = default;

    const std::string& displayName() const { return _name; }
    // A tree node's children; nullptr for a leaf (a row that does not drill down).
    virtual const std::vector<NodeRef>* childNodes() const { return nullptr; }
    // A leaf's value; nullptr for a tree node.
    virtual const std::string* value() const { return nullptr; }

    // Builds the tree of a display dictionary: the root is named "Vantorel" at "/";
    // every node is registered in pathDictionary under its path.
    static NodeRef makeTreeFromObject(const Value& display, PathDictionary& withPathDictionary);
    // The path of the child shown as `name` under `parent`: "/name" below the root,
    // "parent/name" deeper. Shown names may hold "/" themselves; they are not escaped.
    static std::string childPath(const std::string& parent, const std::string& name);

private:
    std::string _name;
};

}  // namespace vantorel
