// Tests for the display tree: shown names and order, array numbering, "(unknown)" leaves, child paths and the path index.
#include "Model/VantorelModelNode.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

std::string childNames(const NodeRef& node) {
    std::string names;
    for (const auto& c : *node->childNodes()) names += (names.empty() ? "" : ",") + c->displayName();
    return names;
}

Value dict(std::initializer_list<std::pair<const char*, Value>> entries) {
    auto d = Dictionary::create();
    for (const auto& [key, value] : entries) d->set(key, value);
    return Value(d);
}

}  // namespace

TEST(VantorelModelNode, TheDisplayDictionaryBecomesRowsIndexedByPath) {
    const Value cell = dict({{"UARFCN", "10054"}, {"Count", Value::integer(3)}});
    const Value display = dict({{"_sorted", "_sorted"}, {"3;b", "second"}, {"1;x", "first"}, {"2;a;b", "two semicolons"},
                                {"4;Cell", "later"}, {"0;Cell", "earlier"},
                                {"5;Lists", Value(Array::of({cell, Value(Array::of({"deep", Value::real(1.5)}))}))},
                                {"6;UL/DL", dict({{"Rx", "-70"}})},
                                {"7;Plain", dict({{"02;y", "1"}, {"01;x", "2"}})},
                                {"8;Empty", Value(Array::create())}});
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(display, paths);
    ASSERT_EQ(paths.at("/"), root);
    EXPECT_EQ(root->displayName(), "Vantorel");

    const struct {
        const char* path;
        const char* shown;  // a leaf's value, or a tree node's child names
    } rows[] = {
        // An ordered dictionary sorts its keys and shows "prefix;name" as name, only
        // with exactly one ";"; both "Cell" rows show, the later one owns the path.
        {"/", "Cell,x,2;a;b,b,Cell,Lists,UL/DL,Plain,Empty"},
        {"/2;a;b", "two semicolons"},
        {"/Cell", "later"},
        // Arrays are numbered from 0; anything not text, dictionary or array is "(unknown)".
        {"/Lists", "0,1"},
        {"/Lists/0/UARFCN", "10054"},
        {"/Lists/0/Count", "(unknown)"},
        {"/Lists/1/0", "deep"},
        // A name holding "/" adds path components; an unordered dictionary shows keys whole.
        {"/UL/DL/Rx", "-70"},
        {"/Plain/01;x", "2"},
        {"/Empty", ""},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.path);
        ASSERT_TRUE(paths.count(row.path));
        const NodeRef& node = paths.at(row.path);
        EXPECT_EQ(node->value() ? *node->value() : childNames(node), row.shown);
        EXPECT_NE(node->value() == nullptr, node->childNodes() == nullptr);
    }
    EXPECT_EQ(paths.count("/_sorted"), 0u);
    EXPECT_EQ(paths.size(), 18u);  // one entry per distinct path: the two "Cell" rows share one

    paths.clear();
    NodeRef none = VantorelModelNode::makeTreeFromObject(Value(), paths);  // no display: a root leaf
    EXPECT_EQ(*none->value(), "(unknown)");
    EXPECT_EQ(none->childNodes(), nullptr);
}
