// VantorelModelTreeNode: a display-tree node with child nodes.
#pragma once

#include "Model/VantorelModelNode.h"

namespace vantorel {

class VantorelModelTreeNode : public VantorelModelNode {
public:
    VantorelModelTreeNode(std::string name, std::vector<NodeRef> withChildren)
        : VantorelModelNode(std::move(name)), _childNodes(std::move(withChildren)) {}
    const std::vector<NodeRef>* childNodes() const override { return &_childNodes; }

private:
    std::vector<NodeRef> _childNodes;
};

}  // namespace vantorel
