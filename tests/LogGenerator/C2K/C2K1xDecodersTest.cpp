// Tests the CDMA 1x routines: subpacket search, status fields and Ec/Io, the running frame error rate, system identity.
#include "LogGenerator/C2K/C2K1xDecoders.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/LogCodes.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

// Every lookup key bound to a display entry of its own name; shown() joins entries with "|".
struct Screen {
    DictionaryRef display = Dictionary::create(), lookup = Dictionary::create();
    Dictionary state;
    SystemLogCapture log;
    Screen() {
        for (const char* key : {"k1xDeviceState", "k1xRx0BandClass", "k1xRx0ChanNum", "k1xRxAGC0", "k1xRx1BandClass",
                                "k1xRx1ChanNum", "k1xRxAGC1", "k1xTxAGC", "k1xActiveSetInfo", "k1xTrafficFER",
                                "k1xRoamingHome", "kSystemId", "kNetworkId", "kPacketZoneId", "kBaseId",
                                "kProtocolRevision"}) {
            auto binding = Dictionary::create();
            binding->set("key", Value(key));
            binding->set("dict", Value(display));
            lookup->set(key, Value(Array::of({Value(binding)})));
            display->set(key, Value(""));
        }
    }
    std::string shown(std::initializer_list<const char*> keys) const {
        std::string out;
        for (const char* key : keys) out += "|" + sectiontest::render(display->get(key));
        return out.substr(1);
    }
    std::string logged() const {  // "priority text" lines joined by ";"
        std::string out;
        for (const auto& line : log.lines()) out += ";" + std::to_string(line.priority) + " " + line.text;
        return out.empty() ? out : out.substr(1);
    }
};

// Subpackets 1 @17 (size 8), 2 @25 (16), 3 @41 (52: two pilots, k = 1, stride 20), 4 @93 (4).
RecordBuilder status(uint8_t deviceState) {
    return RecordBuilder::ordinary(LogCode::kC2K1xStatus, 97).u8(14, 4).u8(17, 1).u16(19, 8).u8(21, deviceState)
        .u8(25, 2).u16(27, 16).u8(29, 1).u8(30, 3).u16(31, 283).u16(33, 1013).u8(35, 0).u8(36, 0x9c).u16(37, 0xffc9)
        .u8(41, 3).u16(43, 52).u16(45, 4).u8(47, 1).u8(48, 2).u8(49, 2).u8(50, 1).u16(51, 100)
        .u16(53, 100).u16(69, 90).u16(73, 200).u16(89, 36)   // Ec/Io 1.0 (reference) and 0.25
        .u8(93, 4).u16(95, 4);
}

RecordBuilder demod(bool frameInError) {
    return RecordBuilder::ordinary(LogCode::kC2KTrafficFER, 60).u8(14, 1).u8(17, 11).u16(19, 40).u8(41, frameInError);
}

TEST(C2K1xDecoders, SubpacketSearchFindsTheFrameFlagOrSaysWhyNot) {
    const std::string missing = "4 Log code 0x119d: missing traffic demod subpacket.";
    const std::vector<std::pair<RecordBuilder, std::string>> rows = {
        {demod(true).u8(14, 0), "|" + missing},
        {demod(true).u16(19, 21).resize(21), "|3 Log code error in subpkt#0: bad size (21).;" + missing},
        {demod(true).u16(19, 20).resize(21), "0.00%|"},  // claims 16 bytes past the end; the flag is not there
        {demod(true).u8(14, 200).u8(17, 5).u16(19, 0), "|" + missing},
        {demod(false).u8(14, 3).u8(17, 5).u16(19, 8).u8(25, 7).u16(27, 4).u8(29, 11).u16(31, 20).u8(53, 1), "1.56%|"},
        {demod(true).u8(17, 5).u16(19, 8).u8(25, 11).u16(27, 20).u8(49, 1), "|" + missing},
        {demod(true).resize(16), "|3 Log code 0x119d is 16 bytes long but must be at least 17 bytes."},
        {demod(true).resize(17), "|" + missing},  // 17 bytes pass the length rule; the subpacket is not there
    };
    for (const auto& [record, expected] : rows) {
        Screen screen;
        C2K1xDecoders::trafficFER(record.build(), screen.state, screen.lookup);
        EXPECT_EQ(screen.shown({"k1xTrafficFER"}) + "|" + screen.logged(), expected);
    }
}

TEST(C2K1xDecoders, StatusShowsChainsInTrafficNAOtherwiseAndNeedsAllFourSubpackets) {
    const std::string rx0 = "1.8 to 2.0GHz PCS band [1]|283|-63.25 dBm|";
    const std::string rx1 = "832 to 925MHz JTACS band [3]|1013|-96.65 dBm|-5.50 dBm|";
    const std::string pilots = "{_sorted=_sorted, 0;100=(ref pilot) +0.00 dB, 1;200=-6.02 dB}|";
    const std::string missing = "|||||||||4 Log code 0x119c: missing subpacket ";
    const std::vector<std::pair<RecordBuilder, std::string>> rows = {
        {status(8), "Traffic [8]|" + rx0 + rx1 + pilots},
        {status(6), "Paging [6]|" + rx0 + "N/A|N/A|N/A|N/A|" + pilots},
        {status(12).u8(49, 0), "[Bad Value 12]|" + rx0 + "N/A|N/A|N/A|N/A|{_sorted=_sorted}|"},
        {status(8).u16(45, 0),  // N = 0: both energies fall to the floor
         "Traffic [8]|" + rx0 + rx1 + "{_sorted=_sorted, 0;100=(ref pilot) -50.00 dB, 1;200=-50.00 dB}|"},
        {status(8).u8(14, 3), missing + "(ss=1,rf=1,ai=1,fi=0)."},
        {status(8).u8(25, 9), missing + "(ss=1,rf=0,ai=1,fi=1)."},
    };
    for (const auto& [record, expected] : rows) {
        Screen screen;
        C2K1xDecoders::oneXStatus(record.build(), screen.state, screen.lookup);
        EXPECT_EQ(screen.shown({"k1xDeviceState", "k1xRx0BandClass", "k1xRx0ChanNum", "k1xRxAGC0", "k1xRx1BandClass",
                                "k1xRx1ChanNum", "k1xRxAGC1", "k1xTxAGC", "k1xActiveSetInfo"}) + "|" + screen.logged(),
                  expected);
    }
}

TEST(C2K1xDecoders, FrameErrorRateAveragesDuringACallAndTurnsOldAfterIt) {
    Screen screen;
    const auto step = [&](const RecordBuilder& record) {
        const Bytes bytes = record.build();
        (bytes[3] == 0x9d ? C2K1xDecoders::trafficFER : C2K1xDecoders::oneXStatus)(bytes, screen.state, screen.lookup);
        return screen.shown({"k1xTrafficFER"}) + (screen.state.contains("TrafficFER") ? " kept" : "");
    };
    EXPECT_EQ(step(demod(true)), "1.56% kept");
    EXPECT_EQ(step(demod(false)), "1.54% kept");
    EXPECT_EQ(step(status(8)), "1.54% kept");
    EXPECT_EQ(step(status(6)), "1.54% (old)");
    EXPECT_EQ(step(demod(false)), "0.00% kept");
}

TEST(C2K1xDecoders, SystemIdentityChecksLengthAndVersionAndShowsIdentifiersOfCDMASystems) {
    const auto identity = [](size_t length, uint8_t version, uint32_t type, uint32_t eri) {
        return RecordBuilder::ordinary(LogCode::kC2KSystemIdentity, length).u8(13, version).u32(42, eri).u32(46, type)
            .u16(50, 4145).u16(52, 7).u8(131, 9).u8(133, 6).u16(184, 0x1234).resize(length);
    };
    const std::vector<std::pair<RecordBuilder, std::string>> rows = {
        {identity(186, 2, 2, 1), "ON [1]|4145|7|9|4660|6|"},
        {identity(186, 3, 1, 13), "ERI - 13|(unknown system type 1)|(unknown system type 1)|9|4660|6|"},
        {identity(171, 2, 2, 12), "Banner OFF [12]|4145|7|9|0|6|"},  // the base station ID lies beyond the record
        {identity(185, 2, 2, 0), "OFF [0]|4145|7|9|52|6|"},
        {identity(186, 1, 2, 1), "||||||3 Log code 0x134f has version=1; only version 2 or higher expected; dropping."},
        {identity(170, 2, 2, 1), "||||||3 Log code 0x134f is 170 bytes long but must be at least 171 bytes."},
    };
    for (const auto& [record, expected] : rows) {
        Screen screen;
        C2K1xDecoders::systemIdentity(record.build(), screen.state, screen.lookup);
        EXPECT_EQ(screen.shown({"k1xRoamingHome", "kSystemId", "kNetworkId", "kPacketZoneId", "kBaseId",
                                "kProtocolRevision"}) + "|" + screen.logged(), expected);
    }
}

}  // namespace
}  // namespace vantorel
