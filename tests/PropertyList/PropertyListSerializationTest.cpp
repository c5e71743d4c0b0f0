// Tests for PropertyListSerialization: XML and binary round trips through libplist, and malformed input giving an error result.
#include "PropertyList/PropertyListSerialization.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

#include <random>
#include <string>

using namespace vantorel;

namespace {

Value sample() {
    auto inner = Dictionary::create();
    inner->set("z", "last inserted first");
    inner->set("a", Value::integer(-42));
    auto d = Dictionary::create();
    d->set("string", "Vantorel ü");
    d->set("integer", Value::integer(16711681));
    d->set("negative", Value::integer(-5));
    d->set("big", Value::integer(0x7FFFFFFFFFFFLL));
    d->set("real", Value::real(-3.25));
    d->set("true", Value::boolean(true));
    d->set("false", Value::boolean(false));
    d->set("data", Value::data({0x00, 0x7E, 0x7D, 0xFF}));
    d->set("date", Value::date(Date{1700000000.0}));
    d->set("array", Value(Array::of({"x", Value::integer(1), Value(inner)})));
    d->set("empty array", Value(Array::create()));
    d->set("empty dict", Value(Dictionary::create()));
    return Value(d);
}

ByteView view(const std::string& s) { return ByteView(reinterpret_cast<const uint8_t*>(s.data()), s.size()); }

}  // namespace

TEST(PropertyListSerialization, XmlRoundTripKeepsValuesTypesAndKeyOrder) {
    auto xml = PropertyListSerialization::write(sample(), PropertyListSerialization::Format::XML);
    ASSERT_TRUE(xml);
    auto back = PropertyListSerialization::read(*xml);
    ASSERT_TRUE(back) << back.error;
    EXPECT_EQ(*back.value, sample());
    EXPECT_EQ(back.value->asDictionary()->keys(), sample().asDictionary()->keys());
    EXPECT_EQ(back.value->asDictionary()->get("negative").asInteger(), -5);
}

TEST(PropertyListSerialization, BinaryRoundTripKeepsValuesTypes) {
    auto bin = PropertyListSerialization::write(sample(), PropertyListSerialization::Format::Binary);
    ASSERT_TRUE(bin);
    EXPECT_EQ(std::string(bin->begin(), bin->begin() + 6), "bplist");
    auto back = PropertyListSerialization::read(*bin);
    ASSERT_TRUE(back) << back.error;
    EXPECT_EQ(*back.value, sample());
}

TEST(PropertyListSerialization, XmlTextIsAVersionOnePropertyList) {
    auto xml = PropertyListSerialization::writeXML(Value(Dictionary::create()));
    ASSERT_TRUE(xml);
    EXPECT_NE(xml->find("<plist version=\"1.0\">"), std::string::npos);
}

TEST(PropertyListSerialization, EmptyInputIsAnError) {
    auto r = PropertyListSerialization::read(ByteView());
    EXPECT_FALSE(r);
    EXPECT_EQ(r.error, "empty property list");
}

TEST(PropertyListSerialization, TruncatedXmlIsAnError) {
    auto xml = *PropertyListSerialization::writeXML(sample());
    // Cut inside the content: before the closing tag of the root dictionary, and earlier.
    for (size_t cut : {size_t(10), xml.size() / 2, xml.rfind("</dict>")}) {
        auto r = PropertyListSerialization::read(view(xml.substr(0, cut)));
        EXPECT_FALSE(r) << "cut at " << cut;
        EXPECT_FALSE(r.error.empty());
    }
}

TEST(PropertyListSerialization, TruncatedBinaryIsAnError) {
    auto bin = *PropertyListSerialization::write(sample(), PropertyListSerialization::Format::Binary);
    for (size_t cut : {size_t(8), bin.size() / 2, bin.size() - 1}) {
        auto r = PropertyListSerialization::read(ByteView(bin.data(), cut));
        EXPECT_FALSE(r) << "cut at " << cut;
    }
}

TEST(PropertyListSerialization, TextThatIsNotAPropertyListIsAnError) {
    EXPECT_FALSE(PropertyListSerialization::read(view("hello, modem")));
    EXPECT_FALSE(PropertyListSerialization::read(view("<plist><dict><key>a</key></plist>")));
    EXPECT_FALSE(PropertyListSerialization::read(view("bplist00")));
}

TEST(PropertyListSerialization, WrongRootTypeIsAnErrorWhereADictionaryIsNeeded) {
    auto xml = *PropertyListSerialization::writeXML(Value(Array::of({"a"})));
    auto r = PropertyListSerialization::readDictionary(view(xml));
    EXPECT_FALSE(r);
    EXPECT_EQ(r.error, "property list root is array, not a dictionary");
    EXPECT_TRUE(PropertyListSerialization::read(view(xml)));
}

TEST(PropertyListSerialization, RandomBytesNeverCrashTheReader) {
    std::mt19937 rng(7);
    auto bin = *PropertyListSerialization::write(sample(), PropertyListSerialization::Format::Binary);
    for (int round = 0; round < 300; ++round) {
        Bytes mutated = bin;
        for (int k = 0; k < 4; ++k) mutated[8 + rng() % (mutated.size() - 8)] = static_cast<uint8_t>(rng());
        auto r = PropertyListSerialization::read(mutated);
        EXPECT_TRUE(r.value.has_value() || !r.error.empty());
    }
}

TEST(PropertyListSerialization, ANullValueCannotBeWritten) {
    EXPECT_FALSE(PropertyListSerialization::write(Value(), PropertyListSerialization::Format::XML));
    EXPECT_FALSE(PropertyListSerialization::writeXML(Value(Array::of({Value()}))));
}
