// Tests the display's text forms: JSON and plist carry the names and order the tree shows; display keeps the decoder's keys.
#include "Monitor/TreeFormatter.h"

#include "Model/VantorelModelNode.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

TEST(TreeFormatter, JsonAndPlistUseTheShownNamesInTheShownOrder) {
    auto cell = Dictionary::create();
    cell->set("_sorted", Value("yes"));
    cell->set("1;PCI", Value("7"));
    cell->set("0;E-ARFCN", Value("a;b\x1b"));
    auto display = Dictionary::create();
    display->set("_sorted", Value("yes"));
    display->set("2;Neighbours", Value(Array::of({Value(cell), Value(Array::create())})));
    display->set("0;Technology", Value("LTE"));
    display->set("1;Serving", Value(cell));
    const std::string cellJson = "{\n            \"E-ARFCN\": \"a;b\\u001b\",\n            \"PCI\": \"7\"\n        }";
    EXPECT_EQ(TreeFormatter::format(TreeFormatter::Format::Json, Value(display)),
              "{\n    \"Technology\": \"LTE\",\n    \"Serving\": {\n        \"E-ARFCN\": \"a;b\\u001b\",\n"
              "        \"PCI\": \"7\"\n    },\n    \"Neighbours\": [\n        " + cellJson + ",\n        []\n    ]\n}\n");
    const std::string plist = TreeFormatter::format(TreeFormatter::Format::Plist, Value(display));
    EXPECT_LT(plist.find("<key>Technology</key>"), plist.find("<key>Serving</key>")) << plist;
    EXPECT_EQ(plist.find("_sorted"), std::string::npos) << plist;
    const std::string stored = TreeFormatter::format(*TreeFormatter::parse("display"), Value(display));
    EXPECT_NE(stored.find("\"0;Technology\": \"LTE\""), std::string::npos) << stored;
    EXPECT_NE(stored.find("\"_sorted\""), std::string::npos);
}

TEST(TreeFormatter, TheTerminalTreeShowsListsOfValuesAndOfNamedValuesOnOneLine) {
    auto cell = Dictionary::create();
    cell->set("ARFCN", Value("95"));
    cell->set("BSIC", Value("12"));
    auto display = Dictionary::create();
    display->set("ARFCNs", Value(Array::of({"95", "98"})));
    display->set("One", Value(Array::of({"7"})));
    display->set("Cells", Value(Array::of({Value(cell)})));
    display->set("Empty", Value(Array::create()));
    PathDictionary paths;
    EXPECT_EQ(TreeFormatter::compactTree(VantorelModelNode::makeTreeFromObject(Value(display), paths)),
              "ARFCNs: 95 98\nOne: 7\nCells\n  0: ARFCN 95 | BSIC 12\nEmpty (empty)\n");
}
