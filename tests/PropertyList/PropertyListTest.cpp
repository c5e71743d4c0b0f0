// PropertyListTest: the value model (order, shared containers, deep copies, 32-bit reading) and XML/binary property lists, good and bad.
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <gtest/gtest.h>

#include <chrono>
#include <limits>
#include <optional>
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

void put(Bytes& out, uint64_t value, int width) {
    for (int i = width - 1; i >= 0; --i) out.push_back(static_cast<uint8_t>(value >> (8 * i)));
}

// A container marker followed by 4-byte object references.
Bytes refs(uint8_t marker, std::initializer_list<uint32_t> indexes) {
    Bytes out{marker};
    for (uint32_t index : indexes) put(out, index, 4);
    return out;
}

// A binary plist of these encoded objects, object 0 on top, with 4-byte offsets and references.
Bytes bplist(const std::vector<Bytes>& objects) {
    Bytes out{'b', 'p', 'l', 'i', 's', 't', '0', '0'};
    std::vector<uint64_t> offsets;
    for (const Bytes& object : objects) {
        offsets.push_back(out.size());
        out.insert(out.end(), object.begin(), object.end());
    }
    const uint64_t table = out.size();
    for (uint64_t offset : offsets) put(out, offset, 4);
    out.insert(out.end(), {0, 0, 0, 0, 0, 0, 4, 4});
    for (uint64_t field : {uint64_t{objects.size()}, uint64_t{0}, table}) put(out, field, 8);
    return out;
}

// n arrays each holding the next (twice over: 2^n values once expanded), the last one empty.
Bytes chain(uint32_t n, bool twice = false) {
    std::vector<Bytes> objects;
    for (uint32_t i = 1; i < n; ++i) objects.push_back(twice ? refs(0xA2, {i, i}) : refs(0xA1, {i}));
    objects.push_back({0xA0});
    return bplist(objects);
}

Bytes written(size_t depth, PropertyListSerialization::Format format) {
    Value v(Array::create());
    while (depth-- > 0) v = Value(Array::of({v}));
    return *PropertyListSerialization::write(v, format);
}

TEST(PropertyListSerialization, BadOrHostileInputIsAnErrorBeforeLibplistCanAbortOverflowOrExpand) {
    const auto xml = PropertyListSerialization::Format::XML, bin = PropertyListSerialization::Format::Binary;
    std::string deepXML;
    for (int i = 0; i < 1'000'000; ++i) deepXML += "<array>";
    for (int i = 0; i < 1'000'000; ++i) deepXML += "</array>";
    std::string nulXML = *PropertyListSerialization::writeXML(Value(Array::of({"a-b"})));
    nulXML[nulXML.find("a-b") + 1] = '\0';
    const std::string sampleXML = *PropertyListSerialization::writeXML(sample());
    const Bytes sampleBin = *PropertyListSerialization::write(sample(), bin);
    const std::tuple<const char*, Bytes, const char*> rows[] = {
        {"empty", {}, "empty property list"},
        {"not a property list", Bytes{'h', 'e', 'l', 'l', 'o'}, "not a property list"},
        {"unclosed XML", Bytes(sampleXML.begin(), sampleXML.begin() + long(sampleXML.rfind("</dict>"))), "not a property list"},
        {"bare binary magic", Bytes{'b', 'p', 'l', 'i', 's', 't', '0', '0'}, "too short for its trailer"},
        {"binary cut by one byte", Bytes(sampleBin.begin(), sampleBin.end() - 1), "binary property list"},
        {"256 levels below the top, binary", written(256, bin), ""},
        {"256 levels below the top, XML", written(256, xml), ""},
        {"257 levels below the top, binary", written(257, bin), "nested deeper than 256"},
        {"257 levels below the top, XML", written(257, xml), "nested deeper than 256"},
        {"NUL in an ASCII string", bplist({{0x53, 'a', 0, 'b'}}), "string holds a NUL character"},
        {"NUL in a UTF-16 string", bplist({{0x62, 0, 'a', 0, 0}}), "string holds a NUL character"},
        {"NUL in a key", bplist({refs(0xD1, {1, 2}), {0x62, 0, 'k', 0, 0}, {0x09}}), "string holds a NUL character"},
        {"a string that is not UTF-8", bplist({{0x52, 0xC3, 0x28}}), "string is not valid UTF-8"},
        {"raw NUL in XML", Bytes(nulXML.begin(), nulXML.end()), "NUL byte"},
        {"50,000 nested binary arrays", chain(50'000), "nested deeper than 256"},
        {"100,000 nested binary arrays", chain(100'000), "nested deeper than 256"},
        {"1,000,000 nested XML arrays", Bytes(deepXML.begin(), deepXML.end()), "nested deeper than 256"},
        {"40 arrays each holding the next twice", chain(40, true), "expands to more than 1048576 values"},
        {"an array holding itself", bplist({refs(0xA1, {0})}), "contains itself"},
        {"a reference past the objects", bplist({refs(0xA1, {1})}), "reference out of range"},
        {"a key that is not a string", bplist({refs(0xD1, {1, 1}), {0x09}}), "key is not a string"},
        {"a set", bplist({refs(0xC1, {1}), {0x09}}), "unsupported marker 0xC1"},
        {"a count past the data", bplist({{0x5F, 0x13, 0x7F, 0, 0, 0, 0, 0, 0, 0, 'a'}}), "runs past its data"},
        {"a trailer cut short", [] { Bytes b = chain(2); b.resize(30); return b; }(), "too short for its trailer"},
    };
    for (const auto& [what, bytes, error] : rows) {
        const auto start = std::chrono::steady_clock::now();
        const auto r = PropertyListSerialization::read(bytes);
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10)) << what;  // no hang
        EXPECT_EQ(r.value.has_value(), *error == '\0') << what << ": " << r.error;
        EXPECT_NE(r.error.find(error), std::string::npos) << what << ": " << r.error;
    }
    const std::string array = *PropertyListSerialization::writeXML(Value(Array::of({"a"})));
    EXPECT_EQ(PropertyListSerialization::readDictionary(view(array)).error, "property list root is array, not a dictionary");
}

}  // namespace
}  // namespace vantorel
