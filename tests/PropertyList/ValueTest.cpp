// Tests for Value, Dictionary and Array: the value model of DESIGN.md (shared containers, deep copy, order).
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/Value.h"

#include <gtest/gtest.h>

using namespace vantorel;

TEST(Value, DictionaryKeepsInsertionOrderAndReplacesInPlace) {
    auto d = Dictionary::create();
    d->set("b", "1");
    d->set("a", "2");
    d->set("c", "3");
    d->set("a", "4");
    EXPECT_EQ(d->keys(), (std::vector<std::string>{"b", "a", "c"}));
    EXPECT_EQ(*d->get("a").asString(), "4");
    d->remove("b");
    EXPECT_EQ(d->keys(), (std::vector<std::string>{"a", "c"}));
    EXPECT_EQ(*d->get("c").asString(), "3");
    EXPECT_TRUE(d->get("b").isNull());
}

TEST(Value, ContainersAreSharedByReference) {
    auto inner = Array::create();
    auto outer = Dictionary::create();
    outer->set("list", Value(inner));
    inner->append("x");
    ASSERT_EQ(outer->get("list").asArray()->size(), 1u);
    EXPECT_EQ(outer->get("list").asArray().get(), inner.get());
}

TEST(Value, DeepCopySharesNoContainer) {
    auto inner = Dictionary::create();
    inner->set("k", "v");
    auto outer = Dictionary::create();
    outer->set("inner", Value(inner));
    Value copy = Value(outer).deepCopy();
    inner->set("k", "changed");
    EXPECT_EQ(*copy.asDictionary()->get("inner").asDictionary()->get("k").asString(), "v");
    EXPECT_NE(copy.asDictionary()->get("inner").asDictionary().get(), inner.get());
}

TEST(Value, TypedAccessIsEmptyForOtherTypes) {
    Value s("text");
    EXPECT_EQ(*s.asString(), "text");
    EXPECT_FALSE(s.asInteger());
    EXPECT_FALSE(s.asDictionary());
    Value i = Value::integer(-7);
    EXPECT_EQ(i.asInt32(), -7);
    EXPECT_EQ(Value::real(12.9).asInt32(), 12);
    EXPECT_FALSE(Value("12").asInt32());
    EXPECT_TRUE(Value().isNull());
    EXPECT_TRUE(Value(DictionaryRef()).isNull());
}

TEST(Value, ArrayRemoveRangeClipsToTheArray) {
    auto a = Array::of({"0", "1", "2", "3", "4", "5"});
    a->removeRange(0, 2);
    EXPECT_EQ(*a->at(0).asString(), "2");
    a->removeRange(3, 10);
    EXPECT_EQ(a->size(), 3u);
    a->removeRange(7, 1);
    EXPECT_EQ(a->size(), 3u);
}
