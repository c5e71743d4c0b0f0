// Tests CaptureReader: writer → reader round trip (bytes and times exact), a truncated last message reported and ignored, bad magic, version and header.
#include "TelephonyService/Replay/CaptureReader.h"

#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Replay/CaptureWriter.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace vantorel {
namespace {

// Header + messages, in memory.
Bytes captureBytes(const std::string& technology, const std::vector<TimedMessage>& messages) {
    Bytes out = CaptureWriter::headerBytes(technology);
    for (const TimedMessage& m : messages) {
        const Bytes one = CaptureWriter::messageBytes(m.timeMicros, m.messageId, m.data);
        out.insert(out.end(), one.begin(), one.end());
    }
    return out;
}

std::vector<TimedMessage> sampleMessages() {
    return {
        {1700000000123456, 0, RecordBuilder::ordinary(0xD00A, 30).u8(13, 0x7E).build()},
        {1700000000123457, 0, RecordBuilder::ordinary(0xD00A, 20).buildWithPrefix()},
        {1700000000123457, 0, RecordBuilder::extra(1, 40).build()},
        {1700000000200000, 0, Bytes{}},                                       // an empty message
        {1700000000300000, 0, Bytes{0x02, 0x00}},                             // junk
        {-5, static_cast<int32_t>(0xFFFFFFFF), RecordBuilder::ordinary(0xD0E0, 15).build()},  // extreme time and id
    };
}

TEST(CaptureReaderTest, RoundTripKeepsBytesAndTimesExact) {
    QTemporaryDir dir;
    ASSERT_TRUE(dir.isValid());
    const std::string path = dir.filePath("round.vcap").toStdString();
    const std::vector<TimedMessage> messages = sampleMessages();
    {
        std::string error;
        auto writer = CaptureWriter::create(path, kTSLogChannelTechnology_Morvek_UTRAN2, &error);
        ASSERT_TRUE(writer) << error;
        for (const TimedMessage& m : messages) ASSERT_TRUE(writer->write(m.timeMicros, m.messageId, m.data));
    }
    const Capture capture = CaptureReader::readFile(path);
    ASSERT_TRUE(capture.ok()) << capture.report.error;
    EXPECT_EQ(capture.version, 1u);
    EXPECT_EQ(capture.technology, kTSLogChannelTechnology_Morvek_UTRAN2);
    EXPECT_EQ(capture.messages, messages);
    EXPECT_EQ(capture.messages[5].messageId, -1);
    EXPECT_EQ(capture.report.truncated, 0u);
    EXPECT_TRUE(capture.report.problems.empty());
}

TEST(CaptureReaderTest, ReportCountsOrdinaryRecordsByCodeAndOthersApart) {
    const Capture capture = CaptureReader::readBytes(captureBytes("t", sampleMessages()));
    ASSERT_TRUE(capture.ok());
    EXPECT_EQ(capture.report.logPackets, 3u);  // two 0xD00A (one behind the prefix), one 0xD0E0
    EXPECT_EQ(capture.report.count(0xD00A), 2u);
    EXPECT_EQ(capture.report.count(0xD0E0), 1u);
    EXPECT_EQ(capture.report.otherPackets, 3u);  // the extra, the empty message, the junk
    EXPECT_TRUE(capture.report.entries.empty());
}

TEST(CaptureReaderTest, TruncatedLastMessageIsReportedAndIgnored) {
    const std::vector<TimedMessage> messages = sampleMessages();
    const Bytes whole = captureBytes("t", messages);
    const size_t lastLength = 16 + messages.back().data.size();
    const size_t lastOffset = whole.size() - lastLength;

    // Cut inside the data.
    Bytes cut(whole.begin(), whole.end() - 3);
    Capture capture = CaptureReader::readBytes(cut);
    ASSERT_TRUE(capture.ok());
    EXPECT_EQ(capture.messages, std::vector<TimedMessage>(messages.begin(), messages.end() - 1));
    EXPECT_EQ(capture.report.truncated, 1u);
    ASSERT_EQ(capture.report.problems.size(), 1u);
    EXPECT_EQ(capture.report.problems[0], "truncated message at byte " + std::to_string(lastOffset) +
                                              ": 15 bytes of data announced, 12 bytes left in the file");

    // Cut inside the message header.
    cut.assign(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(lastOffset + 10));
    capture = CaptureReader::readBytes(cut);
    ASSERT_TRUE(capture.ok());
    EXPECT_EQ(capture.messages.size(), messages.size() - 1);
    EXPECT_EQ(capture.report.truncated, 1u);
    ASSERT_EQ(capture.report.problems.size(), 1u);
    EXPECT_EQ(capture.report.problems[0], "truncated message at byte " + std::to_string(lastOffset) +
                                              ": 10 bytes left, less than a message header");
}

TEST(CaptureReaderTest, HeaderAloneIsAnEmptyCapture) {
    const Capture capture = CaptureReader::readBytes(CaptureWriter::headerBytes(kTSLogChannelTechnology_IFX));
    ASSERT_TRUE(capture.ok());
    EXPECT_EQ(capture.technology, kTSLogChannelTechnology_IFX);
    EXPECT_TRUE(capture.messages.empty());
}

TEST(CaptureReaderTest, BadMagicIsAnError) {
    Bytes data = CaptureWriter::headerBytes("t");
    data[0] = 'X';
    const Capture capture = CaptureReader::readBytes(data);
    EXPECT_FALSE(capture.ok());
    EXPECT_EQ(capture.report.error, "not a Vantorel capture (no \"VNTRLCAP\" at the start)");
    EXPECT_TRUE(capture.messages.empty());
    EXPECT_FALSE(CaptureReader::hasMagic(Bytes{'V', 'N', 'T'}));
}

TEST(CaptureReaderTest, OtherVersionIsAnError) {
    Bytes data = captureBytes("t", sampleMessages());
    data[8] = 2;
    const Capture capture = CaptureReader::readBytes(data);
    EXPECT_FALSE(capture.ok());
    EXPECT_EQ(capture.report.error, "unsupported capture format version 2 (this reader knows 1)");
    EXPECT_TRUE(capture.messages.empty());
}

TEST(CaptureReaderTest, HeaderCutShortIsAnError) {
    const Bytes whole = CaptureWriter::headerBytes("technology");
    Capture capture = CaptureReader::readBytes(Bytes(whole.begin(), whole.begin() + 10));
    EXPECT_EQ(capture.report.error, "capture header cut short");
    capture = CaptureReader::readBytes(Bytes(whole.begin(), whole.end() - 1));
    EXPECT_EQ(capture.report.error, "capture header cut short: technology of 10 bytes runs past the end");
}

TEST(CaptureReaderTest, MissingFileGivesAnErrorNamingThePath) {
    const Capture capture = CaptureReader::readFile("/nonexistent-vantorel.vcap");
    EXPECT_FALSE(capture.ok());
    EXPECT_EQ(capture.report.error, "/nonexistent-vantorel.vcap: No such file or directory");
}

TEST(CaptureReaderTest, ErrorOfAFileNamesThePath) {
    QTemporaryDir dir;
    const QString path = dir.filePath("bad.vcap");
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write("NOTACAPTURE.....");
    file.close();
    const Capture capture = CaptureReader::readFile(path.toStdString());
    EXPECT_EQ(capture.report.error, path.toStdString() + ": not a Vantorel capture (no \"VNTRLCAP\" at the start)");
}

}  // namespace
}  // namespace vantorel
