// PDPContextListTest: tests PDPContextList (Part 5.2 "PDP Context Info": the 0xFF0002 property list shown as sent).
#include "LogGenerator/MVK_GSM/PDPContextList.h"

#include "LogGenerator/ArrayLock.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

constexpr int32_t kPDPContexts = 0xFF0002;

Value context(const char* apn, int64_t nsapi, const char* address) {
    auto d = Dictionary::create();
    d->set("APN", Value(apn));
    d->set("NSAPI", Value::integer(nsapi));
    d->set("PDP Address", Value(address));
    return Value(d);
}

// The 0xFF0002 extra record: payload from offset 13 is the serialised value.
Bytes pdpRecord(const Value& root, bool binary = false) {
    return RecordBuilder::extraPropertyList(0x0002, root, binary);
}

class PDPContextListTest : public ::testing::Test {
protected:
    void SetUp() override {
        section.updateSectionRef(Value(list));
        old = context("old.apn", 5, "10.0.0.1");
        list->append(old);
    }

    ArrayRef list = Array::create();
    Value old;
    PDPContextList section;
};

TEST_F(PDPContextListTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "PDP Context Info");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0xFF0002}));
}

TEST_F(PDPContextListTest, EveryUpdateLogsPDPContextListAtWarningPriority) {
    SystemLogCapture cap;
    section.updateWithData(pdpRecord(Value(Array::create())), kPDPContexts);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
    EXPECT_EQ(lines[0].text, "PDPContextList");
}

// --- Edge case worth testing (Part 5.2) --------------------------------------------

TEST_F(PDPContextListTest, DictionaryPropertyListLeavesThePDPListAsItWas) {
    auto root = Dictionary::create();
    root->set("APN", Value("new.apn"));
    section.updateWithData(pdpRecord(Value(root)), kPDPContexts);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(list->at(0), old);
}

// --- Algorithm ------------------------------------------------------------------------

TEST_F(PDPContextListTest, XmlArrayReplacesTheListWithItsElementsAsSent) {
    const Value a = context("internet", 5, "10.1.2.3");
    const Value b = context("ims", 6, "fd00::1");
    section.updateWithData(pdpRecord(Value(Array::of({a, b})), /*binary=*/false), kPDPContexts);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(list->at(0), a);
    EXPECT_EQ(list->at(1), b);
    EXPECT_EQ(list->at(0).asDictionary()->keys(), (std::vector<std::string>{"APN", "NSAPI", "PDP Address"}));
}

TEST_F(PDPContextListTest, BinaryArrayReplacesTheList) {
    const Value a = context("internet", 5, "10.1.2.3");
    section.updateWithData(pdpRecord(Value(Array::of({a})), /*binary=*/true), kPDPContexts);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(list->at(0), a);
}

TEST_F(PDPContextListTest, EmptyArrayEmptiesTheList) {
    section.updateWithData(pdpRecord(Value(Array::create())), kPDPContexts);
    EXPECT_TRUE(list->empty());
}

TEST_F(PDPContextListTest, TheLogCodeIsNotChecked) {
    const Value a = context("internet", 5, "10.1.2.3");
    SystemLogCapture cap;
    section.updateWithData(pdpRecord(Value(Array::of({a}))), 0x7135);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(list->at(0), a);
    EXPECT_FALSE(cap.containsText("Received an unknown log message: 28981"));
}

TEST_F(PDPContextListTest, UnparsablePayloadLeavesTheListSilently) {
    SystemLogCapture cap;
    // 13..: bytes that are neither an XML nor a binary property list.
    section.updateWithData(RecordBuilder::extra(0x0002).bytes(13, {'j', 'u', 'n', 'k'}).build(), kPDPContexts);
    section.updateWithData(RecordBuilder::extra(0x0002).build(), kPDPContexts);  // no payload at all
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(list->at(0), old);
    EXPECT_EQ(cap.lines().size(), 2u);  // the two entry lines only
}

TEST_F(PDPContextListTest, ListRewriteLeavesArrayLockReleased) {
    const uint8_t before = ArrayLock::counter();
    section.updateWithData(pdpRecord(Value(Array::of({context("a", 1, "b")}))), kPDPContexts);
    EXPECT_EQ(ArrayLock::counter(), before);
    EXPECT_EQ(list->size(), 1u);
}

}  // namespace
}  // namespace vantorel
