// VantorelModelLeafNode: a display-tree node with a value string.
#pragma once

#include "Model/VantorelModelNode.h"

namespace vantorel {

class VantorelModelLeafNode : public VantorelModelNode {
public:
    VantorelModelLeafNode(std::string name, std::string withValue)
        : VantorelModelNode(std::move(name)), _string(std::move(withValue)) {}
    const std::string* value() const override { return &_string; }

private:
    std::string _string;
};

}  // namespace vantorel
