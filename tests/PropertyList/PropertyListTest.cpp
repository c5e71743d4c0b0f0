// PropertyListTest: the value model (order, shared containers, deep copies, 32-bit reading) and XML/binary property lists, good and bad.
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <gtest/gtest.h>

#include <limits>
#include <optional>
#include <random>
#include <string>

namespace vantorel {
namespace {

TEST(Value, DictionariesKeepInsertionOrderAndContainersAreSharedUntilDeepCopied) {
    auto d = Dictionary::create();
    d->set("b", "1");
    d->set("a", "2");
    d->set("b", "3");  // replaced in place
    EXPECT_EQ(d->keys(), (std::vector<std::string>{"b", "a"}));
    EXPECT_EQ(*d->get("b").asString(), "3");

    auto list = Array::create();
    const Value shared(list);
    const Value copy = shared.deepCopy();
    list->append("x");
    EXPECT_EQ(shared.asArray()->size(), 1u);
    EXPECT_TRUE(copy.asArray()->empty());
}

TEST(Value, NumbersReadAsSigned32BitIntegersByTruncation) {
    const std::pair<Value, std::optional<int32_t>> rows[] = {
        {Value::integer(16711681), 16711681},
        {Value::integer(0x1FFFFFFFFLL), -1},  // the low 32 bits
        {Value::real(2.9), 2},
        {Value::real(-2.9), -2},
        {Value::real(2147483647.0), 2147483647},
        {Value::real(2147483648.0), std::nullopt},
        {Value::real(std::numeric_limits<double>::quiet_NaN()), std::nullopt},
        {Value("7"), std::nullopt},
    };
    for (const auto& [value, expected] : rows) EXPECT_EQ(value.asInt32(), expected) << value.typeName();
}

Value sample() {
    auto inner = Dictionary::create();
    inner->set("z", "last inserted first");
    inner->set("a", Value::integer(-42));
    auto d = Dictionary::create();
    d->set("string", "Vantorel ü");
    d->set("integer", Value::integer(16711681));
    d->set("big", Value::integer(0x7FFFFFFFFFFFLL));
    d->set("real", Value::real(-3.25));
    d->set("true", Value::boolean(true));
    d->set("data", Value::data({0x00, 0x7E, 0x7D, 0xFF}));
    d->set("date", Value::date(Date{1700000000.0}));
    d->set("array", Value(Array::of({"x", Value::integer(1), Value(inner)})));
    d->set("empty dict", Value(Dictionary::create()));
    return Value(d);
}

ByteView view(const std::string& s) { return ByteView(reinterpret_cast<const uint8_t*>(s.data()), s.size()); }

TEST(PropertyListSerialization, XMLAndBinaryRoundTripsKeepValuesTypesAndKeyOrder) {
    for (auto format : {PropertyListSerialization::Format::XML, PropertyListSerialization::Format::Binary}) {
        const auto bytes = PropertyListSerialization::write(sample(), format);
        ASSERT_TRUE(bytes);
        const auto back = PropertyListSerialization::read(*bytes);
        ASSERT_TRUE(back) << back.error;
        EXPECT_EQ(*back.value, sample());
        EXPECT_EQ(back.value->asDictionary()->keys(), sample().asDictionary()->keys());
    }
    EXPECT_FALSE(PropertyListSerialization::write(Value(), PropertyListSerialization::Format::XML));
    EXPECT_FALSE(PropertyListSerialization::writeXML(Value(Array::of({Value()}))));
}

TEST(PropertyListSerialization, BadInputIsAnErrorResultNeverACrash) {
    const std::string xml = *PropertyListSerialization::writeXML(sample());
    const Bytes bin = *PropertyListSerialization::write(sample(), PropertyListSerialization::Format::Binary);
    const std::pair<const char*, Bytes> rows[] = {
        {"empty", {}},
        {"not a property list", Bytes{'h', 'e', 'l', 'l', 'o'}},
        {"unclosed XML", Bytes(xml.begin(), xml.begin() + static_cast<long>(xml.rfind("</dict>")))},
        {"bare binary magic", Bytes{'b', 'p', 'l', 'i', 's', 't', '0', '0'}},
        {"binary cut by one byte", Bytes(bin.begin(), bin.end() - 1)},
    };
    for (const auto& [what, bytes] : rows) {
        const auto r = PropertyListSerialization::read(bytes);
        EXPECT_FALSE(r) << what;
        EXPECT_FALSE(r.error.empty()) << what;
    }
    EXPECT_EQ(PropertyListSerialization::read(ByteView()).error, "empty property list");

    const std::string array = *PropertyListSerialization::writeXML(Value(Array::of({"a"})));
    EXPECT_EQ(PropertyListSerialization::readDictionary(view(array)).error,
              "property list root is array, not a dictionary");

    std::mt19937 rng(7);
    for (int round = 0; round < 300; ++round) {
        Bytes mutated = bin;
        for (int k = 0; k < 4; ++k) mutated[8 + rng() % (mutated.size() - 8)] = static_cast<uint8_t>(rng());
        const auto r = PropertyListSerialization::read(mutated);
        EXPECT_TRUE(r.value.has_value() || !r.error.empty());
    }
}

}  // namespace
}  // namespace vantorel
