// Tests QmdlReader: synthetic DIAG streams and the four real captures of captures/README.md (frames, log codes, packet versions, a flipped byte).
#include "TelephonyService/Replay/QmdlReader.h"

#include "Platform/ByteReader.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/DiagTestFrames.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace vantorel {
namespace {

using testframes::append;
using testframes::hdlcFrame;
using testframes::logPacketBody;

std::string capturePath(const std::string& name) { return std::string(VANTOREL_CAPTURES_DIR) + "/" + name; }

// ---- synthetic streams ----

TEST(QmdlReaderTest, SyntheticStreamCountsEveryKindOfFrame) {
    const Bytes a = logPacketBody(0x7130, 100, {0x01, 0x02});
    const Bytes text{0x79, 0x00, 0x41, 0x42};
    const Bytes badCrc = logPacketBody(0x7131, 200, {0x03});
    Bytes badLengths = logPacketBody(0x7132, 300, {0x04});
    badLengths[2] = 0x20;  // outer length 32, inner 13
    const Bytes wrapped = testframes::dualSimWrapped(1, logPacketBody(0xB0C1, 400, {0x02, 0x7E, 0x7D}));

    Bytes stream{0x7E};  // leading flag: an empty frame
    append(stream, hdlcFrame(a));
    append(stream, hdlcFrame(text));
    append(stream, hdlcFrame(badCrc, 0x8000));
    const uint64_t badLengthsOffset = stream.size();
    append(stream, hdlcFrame(badLengths));
    append(stream, hdlcFrame(wrapped));
    append(stream, Bytes{0x10, 0x00, 0x0C});  // unclosed tail

    const RecordedLog log = QmdlReader::readBytes(stream);
    EXPECT_TRUE(log.ok());
    EXPECT_EQ(log.frames, 4u);  // a, text, badLengths, wrapped
    EXPECT_EQ(log.logPackets, 2u);
    EXPECT_EQ(log.otherPackets, 1u);
    EXPECT_EQ(log.badCrc, 1u);
    EXPECT_EQ(log.malformed, 1u);
    EXPECT_EQ(log.truncated, 1u);
    ASSERT_EQ(log.entries.size(), 2u);
    EXPECT_EQ(log.entries[0].logCode, 0x7130);
    EXPECT_EQ(log.entries[0].timeStamp, 100u);
    EXPECT_EQ(log.entries[0].record, testframes::morvekRecord(0x7130, 100, {0x01, 0x02}));
    EXPECT_EQ(log.entries[1].logCode, 0xB0C1);
    EXPECT_EQ(log.entries[1].record, testframes::morvekRecord(0xB0C1, 400, {0x02, 0x7E, 0x7D}));
    EXPECT_EQ(log.count(0x7130), 1u);
    EXPECT_EQ(log.count(0x7131), 0u);
    EXPECT_EQ(log.count(0xB0C1), 1u);
    ASSERT_EQ(log.problems.size(), 3u);
    EXPECT_EQ(log.problems[1], "malformed packet at byte " + std::to_string(badLengthsOffset) +
                                   ": log packet lengths differ: outer 32, inner 13");
    EXPECT_EQ(log.problems[2].rfind("truncated frame at byte ", 0), 0u);
}

TEST(QmdlReaderTest, EmptyInputGivesAnEmptyLog) {
    const RecordedLog log = QmdlReader::readBytes(ByteView());
    EXPECT_TRUE(log.ok());
    EXPECT_TRUE(log.entries.empty());
    EXPECT_EQ(log.frames + log.badCrc + log.malformed + log.truncated, 0u);
}

TEST(QmdlReaderTest, MissingFileGivesAnErrorNamingThePathAndReason) {
    const std::string path = capturePath("no-such-capture.qmdl");
    const RecordedLog log = QmdlReader::readFile(path);
    EXPECT_FALSE(log.ok());
    EXPECT_EQ(log.error, path + ": No such file or directory");
    EXPECT_TRUE(log.entries.empty());
}

TEST(QmdlReaderTest, DirectoryGivesAnError) {
    const RecordedLog log = QmdlReader::readFile(VANTOREL_CAPTURES_DIR);
    EXPECT_FALSE(log.ok());
    EXPECT_EQ(log.error, std::string(VANTOREL_CAPTURES_DIR) + ": is a directory");
}

// ---- real captures (read once for the suite) ----

struct CaptureExpectation {
    const char* file;
    size_t frames;        // good HDLC frames (measured)
    size_t logPackets;    // README's "frames" column
    size_t otherPackets;  // measured
    size_t badCrc;        // measured: see LeadingBytesOfCmccAndSprintFailTheFirstCrc
    std::map<uint16_t, size_t> codes;     // README, 0 where the README names none
    std::map<uint16_t, uint8_t> versions;  // README: first payload byte of every packet of that code
};

const std::vector<CaptureExpectation>& expectations() {
    static const std::vector<CaptureExpectation> k = {
        {"qmdl_example.qmdl", 345, 336, 9, 0,
         {{0x7130, 17}, {0x7131, 11}, {0x7132, 4}, {0x7135, 0}, {0x7150, 1}, {0xB0C1, 2}, {0xB0C2, 12},
          {0xB179, 0}, {0xB17F, 0}, {0x4116, 0}, {0x134F, 0}},
         {{0xB0C1, 1}, {0xB0C2, 2}}},
        {"offline_log_example.mi2log", 16485, 1127, 15358, 0,
         {{0x7130, 7}, {0x7131, 2}, {0x7132, 2}, {0x7135, 0}, {0x7150, 1}, {0xB0C1, 1}, {0xB0C2, 1},
          {0xB179, 11}, {0xB17F, 1}, {0x4116, 1}, {0x134F, 5}},
         {{0xB0C1, 2}, {0xB0C2, 3}, {0xB179, 4}, {0xB17F, 5}}},
        {"cmcc.mi2log", 5500, 5483, 17, 1,
         {{0x7130, 68}, {0x7131, 55}, {0x7132, 8}, {0x7135, 13}, {0x7150, 7}, {0xB0C1, 97}, {0xB0C2, 62},
          {0xB179, 0}, {0xB17F, 0}, {0x4116, 0}, {0x134F, 0}},
         {{0xB0C1, 2}, {0xB0C2, 3}}},
        {"sprint.mi2log", 47106, 47087, 19, 1,
         {{0x7130, 520}, {0x7131, 11}, {0x7132, 18}, {0x7135, 0}, {0x7150, 94}, {0xB0C1, 559}, {0xB0C2, 840},
          {0xB179, 0}, {0xB17F, 0}, {0x4116, 14011}, {0x134F, 0}},
         {{0xB0C1, 2}, {0xB0C2, 3}}},
    };
    return k;
}

class QmdlReaderCaptureTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        logs_ = new std::map<std::string, RecordedLog>();
        for (const auto& e : expectations()) (*logs_)[e.file] = QmdlReader::readFile(capturePath(e.file));
    }
    static void TearDownTestSuite() {
        delete logs_;
        logs_ = nullptr;
    }
    static const RecordedLog& log(const std::string& file) { return logs_->at(file); }

    static std::map<std::string, RecordedLog>* logs_;
};

std::map<std::string, RecordedLog>* QmdlReaderCaptureTest::logs_ = nullptr;

TEST_F(QmdlReaderCaptureTest, RealCapturesFrameAndLogPacketCountsMatchTheReadme) {
    for (const auto& e : expectations()) {
        SCOPED_TRACE(e.file);
        const RecordedLog& l = log(e.file);
        ASSERT_TRUE(l.ok()) << l.error;
        EXPECT_EQ(l.logPackets, e.logPackets);
        EXPECT_EQ(l.entries.size(), e.logPackets);
        EXPECT_EQ(l.frames, e.frames);
        EXPECT_EQ(l.otherPackets, e.otherPackets);
        EXPECT_EQ(l.frames, l.logPackets + l.otherPackets);  // no malformed log packet
        EXPECT_EQ(l.badCrc, e.badCrc);
        EXPECT_EQ(l.malformed, 0u);
        EXPECT_EQ(l.truncated, 0u);
    }
}

TEST_F(QmdlReaderCaptureTest, RealCapturesLogCodeCountsMatchTheReadme) {
    for (const auto& e : expectations()) {
        SCOPED_TRACE(e.file);
        const RecordedLog& l = log(e.file);
        for (const auto& [code, n] : e.codes) EXPECT_EQ(l.count(code), n) << "code 0x" << std::hex << code;
    }
}

TEST_F(QmdlReaderCaptureTest, RealCapturesPacketVersionsMatchTheReadme) {
    for (const auto& e : expectations()) {
        SCOPED_TRACE(e.file);
        std::map<uint16_t, size_t> seen;
        for (const RecordedEntry& entry : log(e.file).entries) {
            auto it = e.versions.find(entry.logCode);
            if (it == e.versions.end()) continue;
            // Payload byte 0 = Morvek record offset 13.
            EXPECT_EQ(ByteReader(entry.record).u8(13), it->second) << "code 0x" << std::hex << entry.logCode;
            ++seen[entry.logCode];
        }
        for (const auto& [code, version] : e.versions) EXPECT_EQ(seen[code], e.codes.at(code));
    }
}

TEST_F(QmdlReaderCaptureTest, RealCaptureEntriesAreMorvekRecords) {
    for (const auto& e : expectations()) {
        SCOPED_TRACE(e.file);
        const RecordedLog& l = log(e.file);
        for (const RecordedEntry& entry : l.entries) {
            ByteReader r(entry.record);
            ASSERT_GE(entry.record.size(), 13u);
            ASSERT_EQ(r.u8(0), 1);
            ASSERT_EQ(r.u16(1), entry.record.size() - 1);
            ASSERT_EQ(r.u16(3), entry.logCode);
            ASSERT_EQ(r.u64(5), entry.timeStamp);
        }
        // The recordings were made in 2015 and 2016.
        ASSERT_FALSE(l.entries.empty());
        const int64_t first = DiagPacket::microsecondsSince1970(l.entries.front().timeStamp);
        EXPECT_GE(first, 1420070400ll * 1000000);  // 2015-01-01
        EXPECT_LT(first, 1483228800ll * 1000000);  // 2017-01-01
    }
}

TEST_F(QmdlReaderCaptureTest, LeadingBytesOfCmccAndSprintFailTheFirstCrc) {
    // Both recordings start with 7 bytes (4B 12 0F 02 01 02 00) that precede the first
    // frame's body, so the first frame fails its CRC; everything after it is read.
    for (const char* file : {"cmcc.mi2log", "sprint.mi2log"}) {
        SCOPED_TRACE(file);
        const RecordedLog& l = log(file);
        ASSERT_FALSE(l.problems.empty());
        EXPECT_EQ(l.problems[0].rfind("bad CRC frame at byte 0: ", 0), 0u) << l.problems[0];
        EXPECT_EQ(l.problems.size(), 1u);
    }
}

TEST_F(QmdlReaderCaptureTest, FlippedByteInACopyLosesOneFrameAndTheRestIsRead) {
    const char* file = "offline_log_example.mi2log";
    const RecordedLog& base = log(file);
    QFile in(QString::fromStdString(capturePath(file)));
    ASSERT_TRUE(in.open(QIODevice::ReadOnly));
    QByteArray data = in.readAll();
    // A byte in the middle that is no flag or escape, does not follow an escape, and
    // does not become one when bit 0 flips: the framing stays, one frame's CRC breaks.
    qsizetype at = data.size() / 2;
    auto special = [](char c) { return c == 0x7E || c == 0x7D; };
    while (special(data[at]) || special(static_cast<char>(data[at] ^ 0x01)) || special(data[at - 1])) ++at;
    data[at] = static_cast<char>(data[at] ^ 0x01);

    QTemporaryDir dir;
    ASSERT_TRUE(dir.isValid());
    const QString copyPath = dir.filePath("flipped.mi2log");
    QFile out(copyPath);
    ASSERT_TRUE(out.open(QIODevice::WriteOnly));
    ASSERT_EQ(out.write(data), data.size());
    out.close();

    const RecordedLog l = QmdlReader::readFile(copyPath.toStdString());
    ASSERT_TRUE(l.ok()) << l.error;
    EXPECT_EQ(l.frames, base.frames - 1);
    EXPECT_EQ(l.badCrc, base.badCrc + 1);
    EXPECT_EQ(l.malformed, 0u);
    EXPECT_EQ(l.truncated, 0u);
    EXPECT_EQ(l.logPackets + l.otherPackets, base.logPackets + base.otherPackets - 1);
    // Every entry but the lost one (if that frame was a log packet) is read unchanged.
    const size_t lost = base.entries.size() - l.entries.size();
    ASSERT_LE(lost, 1u);
    size_t same = 0;
    while (same < l.entries.size() && l.entries[same].record == base.entries[same].record) ++same;
    for (size_t i = same; i < l.entries.size(); ++i) ASSERT_EQ(l.entries[i].record, base.entries[i + lost].record);
}

}  // namespace
}  // namespace vantorel
