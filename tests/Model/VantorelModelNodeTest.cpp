// Tests for the display tree of Part 2.3: makeTreeFromObject:withPathDictionary:, shown names, numbering, "(unknown)" and the path index.
#include "Model/VantorelModelNode.h"

#include "LogGenerator/ArrayLock.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>


using namespace vantorel;

namespace {

DictionaryRef ordered() {
    auto d = Dictionary::create();
    d->set("_sorted", "_sorted");
    return d;
}

std::vector<std::string> childNames(const NodeRef& node) {
    std::vector<std::string> names;
    for (const auto& c : *node->childNodes()) names.push_back(c->displayName());
    return names;
}

}  // namespace

TEST(VantorelModelNode, ANumberAnywhereInTheDisplayShowsAsALeafWhoseValueIsUnknown) {
    auto inner = Dictionary::create();
    inner->set("Count", Value::integer(3));
    auto display = Dictionary::create();
    display->set("Group", Value(inner));
    display->set("List", Value(Array::of({Value::real(1.5), "text"})));
    PathDictionary paths;
    VantorelModelNode::makeTreeFromObject(Value(display), paths);
    EXPECT_EQ(*paths.at("/Group/Count")->value(), "(unknown)");
    EXPECT_EQ(*paths.at("/List/0")->value(), "(unknown)");
    EXPECT_EQ(*paths.at("/List/1")->value(), "text");
    EXPECT_EQ(paths.at("/Group/Count")->childNodes(), nullptr);
}

TEST(VantorelModelNode, InAnOrderedDictionaryTheKey03bShowsAsBAfter01x) {
    auto display = ordered();
    display->set("03;b", "second");
    display->set("01;x", "first");
    display->set("02;a;b", "two semicolons");
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(display), paths);
    EXPECT_EQ(childNames(root), (std::vector<std::string>{"x", "02;a;b", "b"}));
    EXPECT_EQ(*paths.at("/b")->value(), "second");
    EXPECT_EQ(*paths.at("/x")->value(), "first");
    EXPECT_EQ(*paths.at("/02;a;b")->value(), "two semicolons");  // two semicolons: shown whole
}

TEST(VantorelModelNode, InAnUnorderedDictionary01xShowsWholeInTheDictionarysOwnOrder) {
    auto display = Dictionary::create();
    display->set("02;y", "1");
    display->set("01;x", "2");
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(display), paths);
    EXPECT_EQ(childNames(root), (std::vector<std::string>{"02;y", "01;x"}));
    EXPECT_TRUE(paths.count("/01;x"));
}

TEST(VantorelModelNode, TwoKeysSharingAShownNameMapToOnePathTheLaterInSortOrderWinsBothRowsShown) {
    auto display = ordered();
    display->set("2;Cell", "later");
    display->set("1;Cell", "earlier");
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(display), paths);
    ASSERT_EQ(root->childNodes()->size(), 2u);
    EXPECT_EQ(*(*root->childNodes())[0]->value(), "earlier");
    EXPECT_EQ(*(*root->childNodes())[1]->value(), "later");
    EXPECT_EQ(*paths.at("/Cell")->value(), "later");
}

TEST(VantorelModelNode, AnEmptyDictionaryOrArrayGivesATreeNodeWithNoChildren) {
    auto display = Dictionary::create();
    display->set("Empty Dict", Value(Dictionary::create()));
    display->set("Empty List", Value(Array::create()));
    PathDictionary paths;
    VantorelModelNode::makeTreeFromObject(Value(display), paths);
    ASSERT_TRUE(paths.at("/Empty Dict")->childNodes());
    EXPECT_TRUE(paths.at("/Empty Dict")->childNodes()->empty());
    ASSERT_TRUE(paths.at("/Empty List")->childNodes());
    EXPECT_TRUE(paths.at("/Empty List")->childNodes()->empty());
    EXPECT_EQ(paths.at("/Empty List")->value(), nullptr);
}

TEST(VantorelModelNode, NoDisplayDictionaryYieldsARootLeafNamedVantorelWithValueUnknown) {
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(), paths);
    EXPECT_EQ(root->displayName(), "Vantorel");
    ASSERT_TRUE(root->value());
    EXPECT_EQ(*root->value(), "(unknown)");
    EXPECT_EQ(root->childNodes(), nullptr);  // the root pane shows no rows
    EXPECT_EQ(paths.at("/"), root);
}

TEST(VantorelModelNode, APathThatNoLongerExistsAfterARebuildIsNotInTheNewIndex) {
    auto display = Dictionary::create();
    display->set("Neighbours", Value(Array::of({"a", "b", "c"})));
    PathDictionary before;
    VantorelModelNode::makeTreeFromObject(Value(display), before);
    EXPECT_TRUE(before.count("/Neighbours/2"));
    display->set("Neighbours", Value(Array::of({"a"})));
    PathDictionary after;
    VantorelModelNode::makeTreeFromObject(Value(display), after);
    EXPECT_EQ(after.count("/Neighbours/2"), 0u);
    EXPECT_TRUE(after.count("/Neighbours/0"));
}

TEST(VantorelModelNode, AKeyContainingASlashAddsMoreThanOnePathComponent) {
    auto inner = Dictionary::create();
    inner->set("Rx", "-70");
    auto display = Dictionary::create();
    display->set("UL/DL", Value(inner));
    PathDictionary paths;
    VantorelModelNode::makeTreeFromObject(Value(display), paths);
    EXPECT_EQ(*paths.at("/UL/DL/Rx")->value(), "-70");
    EXPECT_EQ(paths.at("/UL/DL")->displayName(), "UL/DL");
}

TEST(VantorelModelNode, ArraysAreNumberedFromZeroAndNestedPathsJoinWithSlashes) {
    auto cell = Dictionary::create();
    cell->set("UARFCN", "10054");
    auto display = ordered();
    display->set("2;Lists", Value(Array::of({Value(cell), Value(Array::of({"deep"}))})));
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(display), paths);
    EXPECT_EQ(root->displayName(), "Vantorel");
    EXPECT_EQ(*paths.at("/Lists/0/UARFCN")->value(), "10054");
    EXPECT_EQ(*paths.at("/Lists/1/0")->value(), "deep");
    EXPECT_EQ(paths.at("/Lists/1")->displayName(), "1");
    EXPECT_FALSE(paths.count("/_sorted"));
    EXPECT_EQ(paths.size(), 6u);  // /, /Lists, /Lists/0, /Lists/0/UARFCN, /Lists/1, /Lists/1/0
}

TEST(VantorelModelNode, TheTreeBuilderNestsTheLockWhenAnArrayHoldsDictionariesThatHoldArrays) {
    // The "SIR" lists inside "CCTRCH SIR": array > dictionary > array.
    auto entry = Dictionary::create();
    entry->set("CCTRCH ID", "1");
    entry->set("SIR", Value(Array::of({"1", "2", "3", "4", "5", "6"})));
    auto display = Dictionary::create();
    display->set("CCTRCH SIR", Value(Array::of({Value(entry)})));
    PathDictionary paths;
    VantorelModelNode::makeTreeFromObject(Value(display), paths);
    EXPECT_EQ(*paths.at("/CCTRCH SIR/0/SIR/5")->value(), "6");
    EXPECT_EQ(ArrayLock::counter(), 0);
}
