// Tests RecordedStream: format detection on every real capture (QMDL), on a DLF made here, on a capture; messages, times, technology and report.
#include "TelephonyService/Replay/RecordedStream.h"

#include "LogGenerator/DLFAddVersionReport.h"
#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Replay/CaptureWriter.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/QmdlReader.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

namespace vantorel {
namespace {

// A DLF record is a Morvek record without its type byte: <len> <code> <time stamp> <payload>.
Bytes dlfRecord(uint16_t code, uint64_t timeStamp, size_t morvekLength) {
    const Bytes morvek = RecordBuilder::ordinary(code, morvekLength).timestamp(timeStamp).u8(13, 0x42).build();
    return Bytes(morvek.begin() + 1, morvek.end());
}

void append(Bytes& to, const Bytes& bytes) { to.insert(to.end(), bytes.begin(), bytes.end()); }

// A DLF as Part 3.4's writer makes it: the 161-byte version report, then the records.
Bytes dlfWithVersionReport(const std::vector<Bytes>& records) {
    Bytes out(kDLFVersionReportLength);
    unsigned written = 0;
    EXPECT_EQ(DLFAddVersionReport(out.data(), kDLFVersionReportLength, &written, 1, 2, "1.0", "vantorel", "Jan 1 2024",
                                  0, 0, 0),
              0);
    for (const Bytes& r : records) append(out, r);
    return out;
}

TEST(RecordedStreamTest, EveryRealCaptureIsQmdlWithOneMessagePerLogPacket) {
    const std::map<std::string, size_t> expected = {
        {"qmdl_example.qmdl", 336}, {"offline_log_example.mi2log", 1127}, {"cmcc.mi2log", 5483}, {"sprint.mi2log", 47087}};
    QDir dir(QStringLiteral(VANTOREL_CAPTURES_DIR));
    const QStringList files = dir.entryList({QStringLiteral("*.qmdl"), QStringLiteral("*.mi2log")}, QDir::Files);
    ASSERT_EQ(static_cast<size_t>(files.size()), expected.size());
    for (const QString& name : files) {
        SCOPED_TRACE(name.toStdString());
        const std::string path = dir.filePath(name).toStdString();
        const RecordedStream stream = RecordedStream::open(path, kTSLogChannelTechnology_Morvek_GSM);
        ASSERT_TRUE(stream.ok()) << stream.error();
        EXPECT_EQ(stream.format(), RecordedStream::Format::Qmdl);
        EXPECT_STREQ(stream.formatName(), "QMDL");
        EXPECT_EQ(stream.technology(), kTSLogChannelTechnology_Morvek_GSM);
        EXPECT_FALSE(stream.technologyFromFile());
        ASSERT_EQ(stream.messages().size(), expected.at(name.toStdString()));
        EXPECT_EQ(stream.report().logPackets, stream.messages().size());
        EXPECT_TRUE(stream.report().entries.empty());

        // Same records as QmdlReader's, timed by their DIAG time stamps.
        const RecordedLog log = QmdlReader::readFile(path);
        for (size_t i : {size_t(0), stream.messages().size() / 2, stream.messages().size() - 1}) {
            EXPECT_EQ(stream.messages()[i].data, log.entries[i].record);
            EXPECT_EQ(stream.messages()[i].timeMicros, DiagPacket::microsecondsSince1970(log.entries[i].timeStamp));
            EXPECT_EQ(stream.messages()[i].messageId, 0);
        }
    }
}

TEST(RecordedStreamTest, QmdlCarriesNoTechnologyOfItsOwn) {
    const RecordedStream stream = RecordedStream::open(std::string(VANTOREL_CAPTURES_DIR) + "/qmdl_example.qmdl");
    ASSERT_TRUE(stream.ok());
    EXPECT_TRUE(stream.technology().empty());
    EXPECT_EQ(stream.summary().rfind("QMDL, technology unknown, 336 messages\nframes 345, log packets 336,", 0), 0u)
        << stream.summary();
}

TEST(RecordedStreamTest, DlfWithVersionReportIsDetectedAsDlf) {
    const Bytes data = dlfWithVersionReport({dlfRecord(0xD00A, 0x10000, 20), dlfRecord(0xD0E0, 0x20000, 16)});
    ASSERT_EQ(RecordedStream::detect(data), RecordedStream::Format::Dlf);
    const RecordedStream stream = RecordedStream::fromBytes(data, kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_TRUE(stream.ok());
    EXPECT_STREQ(stream.formatName(), "DLF");
    EXPECT_EQ(stream.technology(), kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_EQ(stream.messages().size(), 3u);  // the version report is a record like the others
    EXPECT_EQ(stream.report().count(0x1FFD), 1u);
    EXPECT_EQ(stream.messages()[1].data, RecordBuilder::ordinary(0xD00A, 20).timestamp(0x10000).u8(13, 0x42).build());
    // 0x10000: one 1.25 ms tick after the GPS epoch.
    EXPECT_EQ(stream.messages()[1].timeMicros, DiagPacket::kGpsEpochSeconds * 1000000 + 1250);
}

TEST(RecordedStreamTest, DlfWithoutVersionReportIsDetectedWhenItsRecordsChainToTheEnd) {
    Bytes data;
    for (uint16_t code : {0xD00A, 0xD00C, 0xD0E0}) append(data, dlfRecord(code, 0, 20));
    EXPECT_EQ(RecordedStream::detect(data), RecordedStream::Format::Dlf);
    const RecordedStream stream = RecordedStream::fromBytes(data, kTSLogChannelTechnology_Morvek_UTRAN2);
    EXPECT_EQ(stream.messages().size(), 3u);

    // One byte more and the chain no longer ends exactly: not a DLF.
    data.push_back(0x7E);
    EXPECT_EQ(RecordedStream::detect(data), RecordedStream::Format::Qmdl);
    // A single record without the version report is not enough either.
    EXPECT_EQ(RecordedStream::detect(dlfRecord(0xD00A, 0, 20)), RecordedStream::Format::Qmdl);
    // A first length below the 12-byte header is not a DLF.
    EXPECT_EQ(RecordedStream::detect(Bytes{0x0B, 0x00, 0xFD, 0x1F, 0, 0, 0, 0, 0, 0, 0}), RecordedStream::Format::Qmdl);
}

TEST(RecordedStreamTest, CaptureIsDetectedAndCarriesItsTechnology) {
    QTemporaryDir dir;
    const std::string path = dir.filePath("c.vcap").toStdString();
    const Bytes extra = RecordBuilder::extra(1, 20).build();
    {
        std::string error;
        auto writer = CaptureWriter::create(path, kTSLogChannelTechnology_IFX, &error);
        ASSERT_TRUE(writer) << error;
        writer->write(111, 0, Bytes{0x05, 0x06});  // an IFX message: no Morvek record
        writer->write(222, 0, extra);
    }
    // The file's technology wins over the one passed in.
    const RecordedStream stream = RecordedStream::open(path, kTSLogChannelTechnology_Morvek_GSM);
    ASSERT_TRUE(stream.ok()) << stream.error();
    EXPECT_EQ(stream.format(), RecordedStream::Format::Capture);
    EXPECT_STREQ(stream.formatName(), "capture");
    EXPECT_EQ(stream.technology(), kTSLogChannelTechnology_IFX);
    EXPECT_TRUE(stream.technologyFromFile());
    const std::vector<TimedMessage> expected = {{111, 0, Bytes{0x05, 0x06}}, {222, 0, extra}};
    EXPECT_EQ(stream.messages(), expected);
    EXPECT_EQ(stream.report().otherPackets, 2u);
}

TEST(RecordedStreamTest, BrokenCaptureIsAnErrorNamingTheFile) {
    QTemporaryDir dir;
    const QString path = dir.filePath("v2.vcap");
    Bytes data = CaptureWriter::headerBytes("t");
    data[8] = 9;
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(reinterpret_cast<const char*>(data.data()), static_cast<qint64>(data.size()));
    file.close();
    const RecordedStream stream = RecordedStream::open(path.toStdString());
    EXPECT_FALSE(stream.ok());
    EXPECT_EQ(stream.error(), path.toStdString() + ": unsupported capture format version 9 (this reader knows 1)");
    EXPECT_TRUE(stream.messages().empty());
}

TEST(RecordedStreamTest, MissingFileIsAnError) {
    const RecordedStream stream = RecordedStream::open("/nonexistent-vantorel.qmdl");
    EXPECT_FALSE(stream.ok());
    EXPECT_EQ(stream.error(), "/nonexistent-vantorel.qmdl: No such file or directory");
}

}  // namespace
}  // namespace vantorel
