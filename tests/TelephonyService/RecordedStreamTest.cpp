// Tests the recorded-stream readers: the four real QMDL / mi2log captures, DIAG bodies, DLF files, capture files and bad or cut input to each, and format detection.
#include "TelephonyService/Replay/RecordedStream.h"

#include "LogGenerator/DLFAddVersionReport.h"
#include "LogGenerator/LogGenerator.h"
#include "LogGenerator/MVKLogGenerator.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Emulator/CDMAScenario.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/DlfReader.h"
#include "TelephonyService/Replay/QmdlReader.h"
#include "TelephonyService/ServiceTestSupport.h"

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using servicetest::append;
using servicetest::capturePath;
using servicetest::hdlcFrame;
using servicetest::logPacketBody;
using servicetest::morvekRecord;

// Frame and code counts from the captures' README; otherPackets and badCrc measured
// (cmcc and sprint start with 7 stray bytes that spoil the first frame's CRC).
struct CaptureRow {
    const char* file;
    size_t frames, logPackets, otherPackets, badCrc;
    std::map<uint16_t, size_t> codes;
};

TEST(RecordedStream, RealCapturesReadAsTheirReadmeCounts) {
    const std::vector<CaptureRow> rows = {
        {"qmdl_example.qmdl", 345, 336, 9, 0, {{0x7130, 17}, {0x7131, 11}, {0x7132, 4}, {0x7150, 1}, {0xB0C1, 2}, {0xB0C2, 12}}},
        {"offline_log_example.mi2log", 16485, 1127, 15358, 0, {{0x134F, 5}, {0x4116, 1}, {0x7130, 7}, {0xB179, 11}, {0xB17F, 1}}},
        {"cmcc.mi2log", 5500, 5483, 17, 1, {{0x7130, 68}, {0x7135, 13}, {0x7150, 7}, {0xB0C1, 97}}},
        {"sprint.mi2log", 47106, 47087, 19, 1, {{0x4116, 14011}, {0x7150, 94}, {0xB0C2, 840}}},
    };
    for (const CaptureRow& row : rows) {
        SCOPED_TRACE(row.file);
        const RecordedStream stream = RecordedStream::open(capturePath(row.file), kTSLogChannelTechnology_Morvek_GSM);
        ASSERT_TRUE(stream.ok()) << stream.error();
        EXPECT_EQ(stream.format(), RecordedStream::Format::Qmdl);
        EXPECT_EQ(stream.technology(), kTSLogChannelTechnology_Morvek_GSM);
        const RecordedLog& log = stream.report();
        EXPECT_EQ(log.frames, row.frames);
        EXPECT_EQ(log.logPackets, row.logPackets);
        EXPECT_EQ(log.otherPackets, row.otherPackets);
        EXPECT_EQ(log.badCrc, row.badCrc);
        EXPECT_EQ(log.malformed + log.truncated, 0u);
        for (const auto& [code, n] : row.codes) EXPECT_EQ(log.count(code), n) << std::hex << code;
        ASSERT_EQ(stream.messages().size(), row.logPackets);
        for (const TimedMessage& m : stream.messages()) {
            const ByteReader r(m.data);
            ASSERT_TRUE(r.has(0, 13));
            ASSERT_EQ(r.u8(0).value_or(0), LogCode::kOrdinaryType);
            ASSERT_EQ(r.u16(1).value_or(0), m.data.size() - 1);  // the DLF length
        }
    }
}

Bytes qmdlOf(std::initializer_list<uint16_t> codes) {
    Bytes file;
    uint64_t stamp = 0x00D0B23E36510000ull;
    for (uint16_t code : codes) append(file, hdlcFrame(logPacketBody(code, stamp += 0x10000, {0x02})));
    return file;
}

Bytes captureOf(const std::string& technology, std::initializer_list<uint16_t> codes) {
    Bytes file = CaptureWriter::headerBytes(technology);
    for (uint16_t code : codes) append(file, CaptureWriter::messageBytes(1700000000000000, 0, morvekRecord(code, 1, {2})));
    return file;
}

TEST(RecordedStream, TheServingCellRecordsNameTheTechnologyAndFollowTheModem) {
    using Span = RecordedStream::TechnologySpan;
    const std::string lte = kTSLogChannelTechnology_Morvek_LTE, gsm = kTSLogChannelTechnology_Morvek_GSM,
                      utran = kTSLogChannelTechnology_Morvek_UTRAN2;
    struct Row { const char* name; Bytes file; std::string override; std::vector<Span> spans; const char* says; };
    const std::vector<Row> rows = {
        {"LTE, then GSM, then LTE again", qmdlOf({0x7130, 0xB0C2, 0x7130, 0x5134, 0x4127, 0xB0C1}), "",
         {{0, lte}, {3, gsm}, {5, lte}}, "QMDL, technologies LTE, GSM/UMTS, 6 messages\n"},
        {"no serving cell", qmdlOf({0x7130, 0x7131}), "", {}, "QMDL, technology unknown, 2 messages\n"},
        {"--technology holds for the whole file", qmdlOf({0xB0C2, 0x5134}), utran, {{0, utran}},
         "QMDL, technology UTRAN (TD-SCDMA), 2 messages\n"},
        {"a capture's header until its modem moves", captureOf(utran, {0xD00A, 0xB0C2}), "", {{0, utran}, {1, lte}},
         "capture, technologies UTRAN (TD-SCDMA), LTE, 2 messages\n"},
        {"a serving cell first corrects the header", captureOf(lte, {0x5134, 0xD00A}), "", {{0, gsm}},
         "capture, technology GSM/UMTS, 2 messages\n"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        const RecordedStream stream = RecordedStream::fromBytes(row.file, row.override);
        EXPECT_EQ(stream.technologySpans(), row.spans);
        EXPECT_EQ(stream.summary().rfind(row.says, 0), 0u) << stream.summary();
        for (const Span& span : row.spans) EXPECT_EQ(stream.technologyAt(span.from), span.technology);
    }
    for (const char* file : {"qmdl_example.qmdl", "offline_log_example.mi2log", "cmcc.mi2log", "sprint.mi2log"})
        EXPECT_EQ(RecordedStream::open(capturePath(file)).technologySpans(), (std::vector<Span>{{0, lte}})) << file;
}

TEST(RecordedStream, TheTimeSpanRunsFromTheEarliestToTheLatestTimeHoweverFarApart) {
    const struct { const char* name; std::vector<int64_t> times; const char* says; } rows[] = {
        {"time going back", {1700000005000000, 1700000001000000, 1700000003000000},
         "time span 2023-11-14 22:13:21.000 to 2023-11-14 22:13:25.000 UTC (4.000 s)\n"},
        {"garbage stamps at both ends", {INT64_MIN + 1, INT64_MAX}, "UTC (18446744073709.55"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        std::vector<Bytes> records(row.times.size(), morvekRecord(0xD00A, 1, {}));
        const std::string summary = servicetest::streamOf(records, row.times).summary();
        EXPECT_NE(summary.find(row.says), std::string::npos) << summary;
    }
}

TEST(DiagPacket, BodiesAreClassifiedAndLogPacketsSplit) {
    const Bytes good = logPacketBody(0x7130, 0x1122, {0xA1, 0xA2});
    Bytes wrapped{0x98, 0x01, 0x00, 0x00, 0x07, 0x00, 0x00, 0x00};
    append(wrapped, good);
    // The good packet with its outer (byte 2) and inner (byte 4) lengths set, and maybe a byte over.
    auto lengths = [&](uint8_t outer, uint8_t inner, bool byteOver = false) {
        Bytes b = good;
        b[2] = outer;
        b[4] = inner;
        if (byteOver) b.push_back(0xEE);
        return b;
    };
    using K = DiagPacket::Kind;
    struct Row { const char* name; Bytes body; K kind; std::string error; std::optional<uint32_t> subscription; };
    const std::vector<Row> rows = {
        {"log packet", good, K::LogPacket, "", {}},
        {"dual-SIM wrapped log packet", wrapped, K::LogPacket, "", 7},
        {"cut dual-SIM wrapper", {0x98, 0x01, 0x00, 0x00, 0x07}, K::Malformed, "dual-SIM wrapper cut short: 5 of 8 bytes", {}},
        {"other 0x98 body", {0x98, 0x02, 0x00, 0x00, 0x07, 0, 0, 0, 0x10}, K::NotLogPacket, "", {}},
        {"lengths differ", lengths(32, 14), K::Malformed, "log packet lengths differ: outer 32, inner 14", {}},
        {"length past the body", lengths(15, 15), K::Malformed, "log packet length 15 runs past the body (14 bytes after the command header)", {}},
        {"bytes over", lengths(14, 14, true), K::Malformed, "log packet length 14 leaves 1 bytes over at the end of the body", {}},
        {"length below the header", lengths(11, 11), K::Malformed, "log packet length 11 is below the 12-byte log header", {}},
        {"cut header", Bytes(good.begin(), good.begin() + 15), K::Malformed, "log packet of 15 bytes, shorter than its 16-byte header", {}},
        {"text message", {0x79, 0x00, 0x01, 0x02}, K::NotLogPacket, "", {}},
        {"empty", {}, K::NotLogPacket, "", {}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        const DiagPacket packet(row.body);
        EXPECT_EQ(packet.kind(), row.kind);
        EXPECT_EQ(packet.error(), row.error);
        EXPECT_EQ(packet.subscriptionId(), row.subscription);
        if (row.kind != K::LogPacket) {
            EXPECT_TRUE(packet.morvekRecord().empty());
            continue;
        }
        EXPECT_EQ(packet.logCode(), 0x7130);
        EXPECT_EQ(packet.timeStamp(), 0x1122u);
        EXPECT_EQ(packet.payload().size(), 2u);
        EXPECT_EQ(packet.morvekRecord(), morvekRecord(0x7130, 0x1122, {0xA1, 0xA2}));
    }
}

TEST(DiagPacket, TimeStampsCount1Point25MsTicksSinceTheGpsEpoch) {
    const uint64_t oneDay = 69120000ull << 16;  // 86400 s in ticks, above bit 16
    EXPECT_EQ(DiagPacket::microsecondsSince1970(0), 315964800ll * 1000000);
    EXPECT_EQ(DiagPacket::microsecondsSince1970(oneDay | 0x8000), (315964800ll + 86400) * 1000000 + 625);
    // The first log packet of qmdl_example.qmdl: 2015-07-08 22:25:23.941250 UTC.
    EXPECT_EQ(DiagPacket::microsecondsSince1970(0x00D0B23E36510000ull), 1436394323941250ll);
    EXPECT_GT(DiagPacket::microsecondsSince1970(~0ull), 0);
}

TEST(QmdlReader, ASyntheticStreamCountsEveryKindOfFrame) {
    Bytes badLengths = logPacketBody(0x7132, 300, {0x04});
    badLengths[2] = 0x20;
    Bytes stream{0x7E};
    append(stream, hdlcFrame(logPacketBody(0x7130, 100, {0x7E, 0x7D})));
    append(stream, hdlcFrame(Bytes{0x79, 0x00, 0x41}));
    append(stream, hdlcFrame(logPacketBody(0x7131, 200, {0x03}), 0x8000));
    append(stream, hdlcFrame(badLengths));
    append(stream, Bytes{0x10, 0x00});
    const RecordedLog log = QmdlReader::readBytes(stream);
    EXPECT_EQ(log.frames, 3u);
    EXPECT_EQ(log.logPackets, 1u);
    EXPECT_EQ(log.otherPackets, 1u);
    EXPECT_EQ(log.badCrc, 1u);
    EXPECT_EQ(log.malformed, 1u);
    EXPECT_EQ(log.truncated, 1u);
    ASSERT_EQ(log.entries.size(), 1u);
    EXPECT_EQ(log.entries[0].record, morvekRecord(0x7130, 100, {0x7E, 0x7D}));
    EXPECT_EQ(log.problems.size(), 3u);
}

Bytes dlfOf(const Bytes& morvek) { return Bytes(morvek.begin() + 1, morvek.end()); }

TEST(DlfReader, RecordsAreReadUpToTheFirstCutOrMalformedOne) {
    const Bytes a = morvekRecord(0x7130, 1000, {0x01, 0x7E});
    const Bytes b = morvekRecord(0xB0C1, 2000, {});
    Bytes two = dlfOf(a);
    append(two, dlfOf(b));
    struct Row {
        const char* name;
        Bytes tail;  // after the two good records
        size_t malformed, truncated;
    };
    const std::vector<Row> rows = {
        {"clean", {}, 0, 0},
        {"one stray byte", {0x05}, 0, 1},
        {"length past the end", {0x20, 0x00, 0x30, 0x71}, 0, 1},
        {"length below 12", {0x0B, 0x00, 0x30, 0x71, 0, 0, 0, 0, 0, 0, 0}, 1, 0},
        {"length 0", {0x00, 0x00, 0x30, 0x71}, 1, 0},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        Bytes file = two;
        append(file, row.tail);
        const RecordedLog log = DlfReader::readBytes(file);
        ASSERT_EQ(log.entries.size(), 2u);
        EXPECT_EQ(log.entries[0].record, a);
        EXPECT_EQ(log.entries[1].record, b);
        EXPECT_EQ(log.entries[1].timeStamp, 2000u);
        EXPECT_EQ(log.malformed, row.malformed);
        EXPECT_EQ(log.truncated, row.truncated);
        EXPECT_EQ(log.problems.size(), row.malformed + row.truncated);
    }
}

TEST(DlfReader, TheMonitorsOwnDlfReadsBackAndIsDetectedAsDlf) {
    const Bytes record = morvekRecord(0xD0E0, 3000, {1, 3});
    auto entry = Dictionary::create();
    entry->set("DisplayState", Value::data(record));
    Dictionary state;
    state.set("History", Value(Array::of({Value(entry)})));
    const auto dlf = MVKLogGenerator().generateDlfFromState(state);
    ASSERT_TRUE(dlf);
    const RecordedStream stream = RecordedStream::fromBytes(*dlf, kTSLogChannelTechnology_Morvek_UTRAN2);
    EXPECT_EQ(stream.format(), RecordedStream::Format::Dlf);
    ASSERT_EQ(stream.messages().size(), 2u);
    EXPECT_EQ(ByteReader(stream.messages()[0].data).u16(3), LogCode::kDlfVersionReport);
    EXPECT_EQ(stream.messages()[1].data, record);
    EXPECT_EQ(stream.messages()[1].timeMicros, DiagPacket::microsecondsSince1970(3000));
}

TEST(DlfReader, SnapshotDlfsReadBackMessageByMessage) {
    // A decoder's history entries, as its save contents write them.
    std::unique_ptr<LogGenerator> decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_CDMA);
    Dictionary state;
    CDMAScenario scenario(3);
    for (uint64_t tick = 0; tick < 12; ++tick) {
        for (const Bytes& record : scenario.recordsForTick(tick)) decoder->updateState(state, record);
        if (tick % 4 == 3) decoder->generateLogUsingState(state);
    }
    Bytes kept;  // every message the entries hold, in order
    for (const Value& entry : *state.get("History").asArray())
        if (const Bytes* bytes = entry.asDictionary()->get("DisplayState").asData()) append(kept, *bytes);
    const ArrayRef contents = decoder->getSaveContentsFromState(state).asArray();
    // Whole messages after an entry's first record: a type byte, some behind the 0x81 prefix, extras.
    const Bytes a = morvekRecord(0x7130, 1, {1}), b = morvekRecord(0xB0C1, 2, {}), c = morvekRecord(0x0001, 3, {9});
    Bytes handmade = a, extra = c;
    extra[0] = LogCode::kExtraType;
    append(handmade, Bytes{0x81, 0x00});
    append(handmade, b);
    append(handmade, extra);
    auto entry = Dictionary::create();
    entry->set("DisplayState", Value::data(handmade));
    Dictionary handmadeState;
    handmadeState.set("History", Value(Array::of({Value(entry)})));
    Bytes handmadeKept = a;
    append(handmadeKept, b);
    append(handmadeKept, extra);
    const struct { const char* name; Bytes dlf, messages; } rows[] = {
        {"CDMA decoder", *contents->at(contents->size() - 1).asDictionary()->get("DLF").asData(), kept},
        {"prefix and extra", *MVKLogGenerator().generateDlfFromState(handmadeState), handmadeKept},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        const RecordedStream stream = RecordedStream::fromBytes(row.dlf, kTSLogChannelTechnology_Morvek_CDMA);
        EXPECT_EQ(stream.report().malformed + stream.report().truncated, 0u) << stream.summary();
        ASSERT_GT(stream.messages().size(), 2u);
        Bytes read;
        for (size_t i = 1; i < stream.messages().size(); ++i) append(read, stream.messages()[i].data);
        EXPECT_EQ(read, row.messages);
    }
}

TEST(DlfReader, OnlyOurOwnDlfsHoldMessageHeadersAnywhereElseAStrayByteStopsReading) {
    const Bytes a = morvekRecord(0x7130, 1, {1}), b = morvekRecord(0xB0C1, 2, {});
    Bytes extra = morvekRecord(0x0001, 3, {9});
    extra[0] = LogCode::kExtraType;
    Bytes version(kDLFVersionReportLength, 0);
    unsigned written = 0;
    ASSERT_EQ(DLFAddVersionReport(version.data(), kDLFVersionReportLength, &written, 1, 1, "(none)", "X", "Jan", 0, 0, 0), 0);
    const Bytes versionEntry = [&] { Bytes m{LogCode::kOrdinaryType}; append(m, version); return m; }();
    // Records after the first one, each behind a message header: [1], [0x81 0x00 1], [255].
    const auto behindHeaders = [&](Bytes file) {
        append(file, dlfOf(a));
        append(file, Bytes{0x01});
        append(file, dlfOf(b));
        append(file, Bytes{0x81, 0x00});
        append(file, a);
        append(file, extra);
        return file;
    };
    // A fuzzer's find: 0xFF, then a record of 37 bytes, then one of 15: read whole, the first
    // record's length (0x25FF) runs past the end.
    const Bytes typeByteFirst{
        0xFF, 0x25, 0x00, 0xC2, 0xB0, 0x00, 0x00, 0x0D, 0x5E, 0x3E, 0xB2, 0xD0, 0x00, 0x02, 0x57, 0x00,
        0x94, 0x16, 0xE4, 0x5C, 0x32, 0x32, 0x0F, 0x0B, 0x6D, 0x08, 0x40, 0x87, 0x11, 0x00, 0x00, 0x00,
        0x36, 0x01, 0x03, 0x9A, 0x01, 0x00, 0x0F, 0x00, 0x32, 0x4F, 0xA9, 0x43, 0x00, 0x71, 0x00, 0xB2,
        0xD0, 0xFF, 0xFF, 0xEF, 0xFF, 0x01, 0x01, 0xFF, 0xFF, 0x00, 0x03, 0x00, 0x00, 0x0F, 0x00, 0x30,
        0x00, 0x03, 0x1E, 0x00, 0x71};
    const struct {
        const char* name;
        Bytes file;
        std::vector<Bytes> entries;
        size_t problems;
    } rows[] = {
        {"our own DLF", behindHeaders(version), {versionEntry, a, b, a, extra}, 0},
        {"a QXDM DLF", behindHeaders({}), {a}, 1},
        {"a type byte before the first record", typeByteFirst, {}, 1},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        const RecordedLog log = DlfReader::readBytes(row.file);
        std::vector<Bytes> entries;
        for (const RecordedEntry& e : log.entries) entries.push_back(e.record);
        EXPECT_EQ(entries, row.entries);
        EXPECT_EQ(log.malformed + log.truncated, row.problems);
        EXPECT_EQ(log.logPackets + log.otherPackets, row.entries.size());
    }
}

TEST(RecordedStream, FormatIsDetectedFromTheContent) {
    const Bytes a = dlfOf(morvekRecord(0x7130, 1, {0x01}));
    Bytes chain = a;
    append(chain, a);
    Bytes versionFirst(kDLFVersionReportLength, 0);
    unsigned written = 0;
    ASSERT_EQ(DLFAddVersionReport(versionFirst.data(), kDLFVersionReportLength, &written, 1, 1, "(none)", "X",
                                  "Jun 28 2016 22:01", 1467151270, -210, 0), 0);
    struct Row { const char* name; Bytes data; RecordedStream::Format format; };
    const std::vector<Row> rows = {
        {"capture", CaptureWriter::headerBytes("x"), RecordedStream::Format::Capture},
        {"two chained DLF records", chain, RecordedStream::Format::Dlf},
        {"a lone version report", versionFirst, RecordedStream::Format::Dlf},
        {"one DLF record", a, RecordedStream::Format::Qmdl},
        {"chain with a stray byte", [&] { Bytes c = chain; c.push_back(0); return c; }(), RecordedStream::Format::Qmdl},
        {"HDLC frames", hdlcFrame(logPacketBody(0x7130, 1, {0x01})), RecordedStream::Format::Qmdl},
    };
    for (const Row& row : rows) EXPECT_EQ(RecordedStream::detect(row.data), row.format) << row.name;
}

TEST(CaptureReader, MessagesRoundTripAndACutLastMessageIsReportedAndDropped) {
    const Bytes ordinary = RecordBuilder::ordinary(0xD00A, 20).buildWithPrefix();
    const Bytes extra = RecordBuilder::extra(LogCode::kCellMonitor, 20).build();
    Bytes file = CaptureWriter::headerBytes(kTSLogChannelTechnology_Morvek_UTRAN2);
    append(file, CaptureWriter::messageBytes(1700000000000001, 0, ordinary));
    append(file, CaptureWriter::messageBytes(1700000000000002, -5, extra));
    const Bytes whole = file;
    const size_t lastOffset = file.size();
    append(file, CaptureWriter::messageBytes(1700000000000003, 0, Bytes(10, 0x42)));
    for (size_t cut : {size_t(0), size_t(1), size_t(20)}) {
        SCOPED_TRACE(cut);
        const Capture capture = CaptureReader::readBytes(
            cut == 0 ? ByteView(whole) : ByteView(file).first(file.size() - cut));
        ASSERT_TRUE(capture.ok()) << capture.report.error;
        EXPECT_EQ(capture.technology, kTSLogChannelTechnology_Morvek_UTRAN2);
        EXPECT_EQ(capture.messages, (std::vector<TimedMessage>{{1700000000000001, 0, ordinary},
                                                               {1700000000000002, -5, extra}}));
        EXPECT_EQ(capture.report.logPackets, 1u);
        EXPECT_EQ(capture.report.count(0xD00A), 1u);
        EXPECT_EQ(capture.report.otherPackets, 1u);
        EXPECT_EQ(capture.report.truncated, cut == 0 ? 0u : 1u);
        if (cut != 0) {
            EXPECT_EQ(capture.report.problems.at(0).rfind("truncated message at byte " + std::to_string(lastOffset), 0), 0u);
        }
    }
}

TEST(CaptureReader, FilesThatAreNoCaptureAreErrors) {
    Bytes otherVersion = CaptureWriter::headerBytes("x");
    otherVersion[8] = 2;
    Bytes longTech = CaptureWriter::headerBytes("x");
    longTech[12] = 10;
    const std::vector<std::pair<Bytes, std::string>> rows = {
        {{'N', 'O', 'T'}, "not a Vantorel capture (no \"VNTRLCAP\" at the start)"},
        {otherVersion, "unsupported capture format version 2 (this reader knows 1)"},
        {Bytes(otherVersion.begin(), otherVersion.begin() + 12), "capture header cut short"},
        {longTech, "capture header cut short: technology of 10 bytes runs past the end"},
    };
    for (const auto& [data, error] : rows) {
        const Capture capture = CaptureReader::readBytes(data);
        EXPECT_EQ(capture.report.error, error);
        EXPECT_TRUE(capture.messages.empty());
    }
    EXPECT_EQ(RecordedStream::open(VANTOREL_CAPTURES_DIR).error(), std::string(VANTOREL_CAPTURES_DIR) + ": is a directory");
}

}  // namespace
}  // namespace vantorel
