// Tests IFXScenario: a stream of display property lists with cell changes, collapsible wrappers and the refused messages, and how a capture of it is described.
#include "TelephonyService/Emulator/IFXScenario.h"

#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/Replay/CaptureWriter.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

// True when every leaf is a string and nothing is empty once each array loses its first element.
bool displayable(const Value& v) {
    bool ok = v.isString() || (v.asDictionary() && v.asDictionary()->size() > 0) || (v.asArray() && v.asArray()->size() > 1);
    if (auto d = v.asDictionary()) for (const auto& entry : *d) ok = ok && displayable(entry.second);
    if (auto a = v.asArray()) for (const Value& e : *a) ok = ok && displayable(e);
    return ok;
}

TEST(IFXScenario, EveryTickIsOneDisplayListExceptTheRefusedOnesAndTheServingCellMoves) {
    for (uint64_t seed : {1, 7}) {
        IFXScenario scenario(seed);
        size_t unreadable = 0, refused = 0, binary = 0, changes = 0, oldServingListed = 0;
        std::string servingCell, servingArfcn;
        for (uint64_t tick = 0; tick < 120; ++tick) {
            const std::vector<Bytes> messages = scenario.recordsForTick(tick);
            ASSERT_EQ(messages.size(), 1u);
            const PropertyListResult read = PropertyListSerialization::read(messages[0]);
            if (!read) {
                ++unreadable;
                continue;
            }
            binary += messages[0][0] == 'b';
            if (!displayable(*read.value)) {
                ++refused;
                continue;
            }
            const DictionaryRef top = read.value->asDictionary();
            ASSERT_TRUE(top) << tick;
            const DictionaryRef cell =
                top->find("Serving Cell")->asDictionary()->find("Identity")->asDictionary()->find("Cell")->asDictionary();
            const ArrayRef neighbours = top->find("Neighbours")->asArray();
            EXPECT_EQ(*neighbours->begin()->asString(), std::to_string(neighbours->size() - 1) + " cells");
            std::set<std::string> neighbourArfcns;
            for (auto it = neighbours->begin() + 1; it != neighbours->end(); ++it)
                neighbourArfcns.insert(*it->asDictionary()->find("Cell")->asDictionary()->find("ARFCN")->asString());
            const std::string id = *cell->find("Cell ID")->asString();
            if (!servingCell.empty() && id != servingCell) {
                ++changes;
                oldServingListed += neighbourArfcns.count(servingArfcn);
            }
            servingCell = id;
            servingArfcn = *cell->find("ARFCN")->asString();
        }
        EXPECT_EQ(unreadable, 120 / IFXScenario::kRefusedPeriod / 2) << seed;
        EXPECT_EQ(refused, 120 / IFXScenario::kRefusedPeriod / 2) << seed;
        EXPECT_GE(binary, 15u) << seed;
        EXPECT_GE(changes, 4u) << seed;
        EXPECT_EQ(oldServingListed, changes) << seed;
    }
}

TEST(IFXScenario, InfoOnACaptureCountsPropertyListsNotLogRecords) {
    QTemporaryDir dir;
    const std::string path = dir.filePath("ifx.vcap").toStdString();
    std::string error;
    auto writer = CaptureWriter::create(path, kTSLogChannelTechnology_IFX, &error);
    ASSERT_TRUE(writer) << error;
    IFXScenario scenario(3);
    for (uint64_t tick = 0; tick < 40; ++tick) writer->write(1000 * tick, 0, scenario.recordsForTick(tick)[0]);
    ASSERT_TRUE(writer->flush());
    const std::string summary = RecordedStream::open(path).summary();
    EXPECT_NE(summary.find("40 messages\n39 property-list messages, 1 unreadable, truncated 0\n"), std::string::npos)
        << summary;
}

}  // namespace
}  // namespace vantorel
