// Tests LogMask: classification of channel messages and the start command's log mask (prefix, extras, Streaming alone, junk forwarded).
#include "TelephonyService/LogMask.h"

#include "Platform/RecordBuilder.h"
#include "PropertyList/Array.h"
#include "TelephonyService/ServiceTestSupport.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using servicetest::startCommand;

DictionaryRef streamingAlone() {
    auto dict = Dictionary::create();
    dict->set("SetState", Value("Streaming"));
    return dict;
}

TEST(LogMaskTest, ClassifyReadsTypeAndCodeOfBytes0And3To4) {
    const auto c = LogMask::classify(RecordBuilder::ordinary(0xD00A, 20).build());
    ASSERT_TRUE(c);
    EXPECT_EQ(c->type, 1);
    EXPECT_EQ(c->code, 0xD00A);
    EXPECT_EQ(c->effectiveCode(), 0xD00Au);
    const auto e = LogMask::classify(RecordBuilder::extra(0x0001).build());
    ASSERT_TRUE(e);
    EXPECT_EQ(e->type, 255);
    EXPECT_EQ(e->code, 1);
    EXPECT_EQ(e->effectiveCode(), 0xFF0001u);
}

TEST(LogMaskTest, ClassifyRemovesThe0x81Prefix) {
    const auto c = LogMask::classify(RecordBuilder::ordinary(0xD0E0, 20).buildWithPrefix());
    ASSERT_TRUE(c);
    EXPECT_EQ(c->type, 1);
    EXPECT_EQ(c->code, 0xD0E0);
}

TEST(LogMaskTest, ClassifyGivesNothingForJunk) {
    EXPECT_FALSE(LogMask::classify(Bytes{}));
    EXPECT_FALSE(LogMask::classify(Bytes{0x01, 0x0C, 0x00, 0x0A}));        // no room for the code's high byte
    EXPECT_FALSE(LogMask::classify(Bytes{0x81, 0x00, 0x01, 0x0C, 0x00}));  // 3 bytes after the prefix
    EXPECT_FALSE(LogMask::classify(RecordBuilder(2, 0xD00A, 20).build()));  // type 2
}

TEST(LogMaskTest, StreamingAloneForwardsEverything) {
    const LogMask mask = LogMask::fromStartCommand(*streamingAlone());
    EXPECT_TRUE(mask.forwardsAll());
    EXPECT_EQ(mask.description(), "all codes");
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(0x1234, 20).build()));
    EXPECT_TRUE(mask.forwards(RecordBuilder::extra(7).build()));
    EXPECT_TRUE(mask.forwards(Bytes{0x42}));
}

TEST(LogMaskTest, OnlySubscribedOrdinaryCodesPass) {
    const LogMask mask = LogMask::fromStartCommand(*startCommand({0xD00A, 0xD0E0}, {}));
    EXPECT_FALSE(mask.forwardsAll());
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(0xD00A, 20).build()));
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(0xD0E0, 20).build()));
    EXPECT_FALSE(mask.forwards(RecordBuilder::ordinary(0xD00C, 20).build()));
    EXPECT_EQ(mask.description(), "2 log codes, 0 extra codes");
}

TEST(LogMaskTest, ExtraCodesAreMatchedWithout0xFF0000AndApartFromOrdinaryCodes) {
    // "SetTsExtraCodes" holds 1 for 0xFF0001 (Part 3.2).
    const LogMask mask = LogMask::fromStartCommand(*startCommand({0x0002}, {1}));
    EXPECT_TRUE(mask.forwards(RecordBuilder::extra(1).build()));
    EXPECT_FALSE(mask.forwards(RecordBuilder::extra(2).build()));     // 2 is subscribed as an ordinary code only
    EXPECT_FALSE(mask.forwards(RecordBuilder::ordinary(1, 20).build()));  // 1 is subscribed as an extra code only
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(2, 20).build()));
}

TEST(LogMaskTest, PrefixedRecordIsMatchedByItsCodeAfterThePrefix) {
    const LogMask mask = LogMask::fromStartCommand(*startCommand({0xD00A}, {}));
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(0xD00A, 20).buildWithPrefix()));
    EXPECT_FALSE(mask.forwards(RecordBuilder::ordinary(0xD00E, 20).buildWithPrefix()));
}

TEST(LogMaskTest, JunkIsForwardedWhateverTheMask) {
    const LogMask mask = LogMask::fromStartCommand(*startCommand({0xD00A}, {}));
    EXPECT_TRUE(mask.forwards(Bytes{}));
    EXPECT_TRUE(mask.forwards(Bytes{0x01, 0x02}));
    EXPECT_TRUE(mask.forwards(Bytes{0x81, 0x00}));
    EXPECT_TRUE(mask.forwards(RecordBuilder(2, 0xD00E, 20).build()));  // another type: the decoder logs and drops it
}

TEST(LogMaskTest, MissingListSubscribesToNoneOfItsKind) {
    // The C2K start command carries "SetMorvekLogCodes" only (Part 4.1).
    auto dict = startCommand({0x108A}, {});
    dict->remove("SetTsExtraCodes");
    const LogMask mask = LogMask::fromStartCommand(*dict);
    EXPECT_FALSE(mask.forwardsAll());
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(0x108A, 20).build()));
    EXPECT_FALSE(mask.forwards(RecordBuilder::extra(1).build()));
}

TEST(LogMaskTest, EntriesThatAreNotCodesAreSkippedAndReported) {
    auto dict = startCommand({0xD00A, -1, 0x10000}, {1});
    dict->get("SetMorvekLogCodes").asArray()->append(Value("53472"));
    std::string problem;
    const LogMask mask = LogMask::fromStartCommand(*dict, &problem);
    EXPECT_EQ(problem, "skipped 3 entries of SetMorvekLogCodes and 0 of SetTsExtraCodes that are not codes 0..65535");
    EXPECT_EQ(mask.description(), "1 log codes, 1 extra codes");
    EXPECT_TRUE(mask.forwards(RecordBuilder::ordinary(0xD00A, 20).build()));
}

TEST(LogMaskTest, DefaultMaskForwardsOnlyJunk) {
    const LogMask mask;
    EXPECT_FALSE(mask.forwards(RecordBuilder::ordinary(0xD00A, 20).build()));
    EXPECT_FALSE(mask.forwards(RecordBuilder::extra(1).build()));
    EXPECT_TRUE(mask.forwards(Bytes{0x00}));
}

}  // namespace
}  // namespace vantorel
