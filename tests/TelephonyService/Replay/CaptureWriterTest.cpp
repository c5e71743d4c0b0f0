// Tests CaptureWriter: the exact bytes of the capture header and of a message (docs/capture-format.md), and write errors.
#include "TelephonyService/Replay/CaptureWriter.h"

#include "Platform/TelephonyIdentifiers.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <string>

namespace vantorel {
namespace {

TEST(CaptureWriterTest, HeaderIsMagicVersionLengthAndIdentifier) {
    const Bytes header = CaptureWriter::headerBytes("abc");
    const Bytes expected{'V', 'N', 'T', 'R', 'L', 'C', 'A', 'P',  // magic
                         1, 0, 0, 0,                               // version 1, u32 LE
                         3, 0, 0, 0,                               // identifier length
                         'a', 'b', 'c'};
    EXPECT_EQ(header, expected);
}

TEST(CaptureWriterTest, MessageIsTimeIdLengthAndData) {
    const Bytes message = CaptureWriter::messageBytes(0x0102030405060708, -2, Bytes{0xAA, 0xBB});
    const Bytes expected{0x08, 0x07, 0x06, 0x05, 0x04, 0x03, 0x02, 0x01,  // time, u64 LE
                         0xFE, 0xFF, 0xFF, 0xFF,                          // id -2 as u32
                         0x02, 0x00, 0x00, 0x00,                          // length
                         0xAA, 0xBB};
    EXPECT_EQ(message, expected);
}

TEST(CaptureWriterTest, FileHoldsHeaderThenMessagesInOrder) {
    QTemporaryDir dir;
    ASSERT_TRUE(dir.isValid());
    const std::string path = dir.filePath("x.vcap").toStdString();
    std::string error;
    {
        auto writer = CaptureWriter::create(path, kTSLogChannelTechnology_Morvek_UTRAN2, &error);
        ASSERT_TRUE(writer) << error;
        EXPECT_TRUE(writer->write(10, 0, Bytes{1, 2, 3}));
        EXPECT_TRUE(writer->write(20, 0, Bytes{}));
        EXPECT_EQ(writer->messagesWritten(), 2u);
    }
    QFile file(QString::fromStdString(path));
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QByteArray all = file.readAll();
    Bytes expected = CaptureWriter::headerBytes(kTSLogChannelTechnology_Morvek_UTRAN2);
    for (const Bytes& m : {CaptureWriter::messageBytes(10, 0, Bytes{1, 2, 3}), CaptureWriter::messageBytes(20, 0, Bytes{})})
        expected.insert(expected.end(), m.begin(), m.end());
    EXPECT_EQ(Bytes(all.begin(), all.end()), expected);
}

TEST(CaptureWriterTest, UnwritablePathGivesAnErrorNamingIt) {
    const std::string path = "/nonexistent-dir-of-vantorel/x.vcap";
    std::string error;
    EXPECT_FALSE(CaptureWriter::create(path, "t", &error));
    EXPECT_EQ(error.rfind(path + ": ", 0), 0u) << error;
}

TEST(CaptureWriterTest, NowIsMicrosecondsSince1970) {
    // 2023-11-14 and 2100-01-01 in microseconds: a sanity window for the clock.
    const int64_t now = CaptureWriter::nowMicros();
    EXPECT_GT(now, 1700000000LL * 1000000);
    EXPECT_LT(now, 4102444800LL * 1000000);
}

}  // namespace
}  // namespace vantorel
