// Tests for TreeFormatter: the display as the panes show it (Part 2.3), as JSON and as an XML property list.
#include "Monitor/TreeFormatter.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <gtest/gtest.h>

using namespace vantorel;

namespace {
Value sampleDisplay() {
    auto cell = Dictionary::create();
    cell->set("State", "Cell DCH");
    cell->set("Count", Value::integer(3));
    auto root = Dictionary::create();
    root->set("_sorted", "_sorted");
    root->set("2;Lists", Value(Array::of({"a"})));
    root->set("1;RRC Info", Value(cell));
    root->set("3;Empty", Value(Array::create()));
    return Value(root);
}
}  // namespace

TEST(TreeFormatter, TreeShowsSortedShownNamesUnknownAndEmptyRows) {
    EXPECT_EQ(TreeFormatter::format(TreeFormatter::Format::Tree, sampleDisplay()),
              "RRC Info\n"
              "  State: Cell DCH\n"
              "  Count: (unknown)\n"
              "Lists\n"
              "  0: a\n"
              "Empty (empty)\n");
}

TEST(TreeFormatter, JsonIsTheDisplayDictionary) {
    const std::string json = TreeFormatter::format(TreeFormatter::Format::Json, sampleDisplay());
    QJsonParseError error;
    QJsonDocument doc = QJsonDocument::fromJson(QByteArray::fromStdString(json), &error);
    ASSERT_EQ(error.error, QJsonParseError::NoError);
    EXPECT_EQ(doc.object()["1;RRC Info"].toObject()["State"].toString(), "Cell DCH");
    EXPECT_EQ(doc.object()["1;RRC Info"].toObject()["Count"].toInt(), 3);
    EXPECT_EQ(TreeFormatter::json(Value()), "null\n");
}

TEST(TreeFormatter, PlistRoundTripsThroughLibplist) {
    const std::string xml = TreeFormatter::format(TreeFormatter::Format::Plist, sampleDisplay());
    auto back = PropertyListSerialization::read(ByteView(reinterpret_cast<const uint8_t*>(xml.data()), xml.size()));
    ASSERT_TRUE(back);
    EXPECT_EQ(*back.value, sampleDisplay());
}

TEST(TreeFormatter, FormatNamesParse) {
    EXPECT_EQ(TreeFormatter::parse("json"), TreeFormatter::Format::Json);
    EXPECT_FALSE(TreeFormatter::parse("yaml"));
}

TEST(TreeFormatter, CompactTreeShowsFlatListEntriesOnOneLine) {
    auto entry = Dictionary::create();
    entry->set("UARFCN", "10096");
    entry->set("Cell ID", "120");
    auto sir = Dictionary::create();
    sir->set("CCTRCH ID", "1");
    sir->set("SIR", Value(Array::of({"13", "16"})));
    auto root = Dictionary::create();
    root->set("Neighbor Cell List", Value(Array::of({Value(entry)})));
    root->set("CCTRCH SIR", Value(Array::of({Value(sir)})));
    root->set("RRC Info", Value(Dictionary::create()));
    PathDictionary paths;
    NodeRef tree = VantorelModelNode::makeTreeFromObject(Value(root), paths);
    EXPECT_EQ(TreeFormatter::compactTree(tree),
              "Neighbor Cell List\n"
              "  0: UARFCN 10096 | Cell ID 120\n"
              "CCTRCH SIR\n"
              "  0\n"
              "    CCTRCH ID: 1\n"
              "    SIR: 13 16\n"
              "RRC Info (empty)\n");
}
