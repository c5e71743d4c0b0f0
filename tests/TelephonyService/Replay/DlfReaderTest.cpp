// Tests DlfReader: DLF files built in the test and by Part 3.4's writer, read back; records running past the end and lengths below 12 stop reading.
#include "TelephonyService/Replay/DlfReader.h"

#include "LogGenerator/DLFAddVersionReport.h"
#include "LogGenerator/MVKLogGenerator.h"
#include "Platform/ByteReader.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Replay/DiagTestFrames.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <vector>

namespace vantorel {
namespace {

using testframes::append;

// A DLF record is a Morvek record without its type byte.
Bytes dlfOf(const Bytes& morvek) { return Bytes(morvek.begin() + 1, morvek.end()); }

Bytes versionReport() {
    Bytes out(kDLFVersionReportLength, 0);
    unsigned written = 0;
    EXPECT_EQ(DLFAddVersionReport(out.data(), kDLFVersionReportLength, &written, 1, 1, "(none)", "EXECUTABLE_NAME",
                                  "Jun 28 2016 22:01", 1467151270, -210, 0),
              0);
    EXPECT_EQ(written, kDLFVersionReportLength);
    return out;
}

const std::vector<Bytes>& sampleRecords() {
    // Morvek records: type 1 | DLF len 1..2 | code 3..4 | time stamp 5..12 | payload 13..
    static const std::vector<Bytes> k = {
        RecordBuilder::ordinary(0x7130, 20).timestamp(1000).u8(13, 0x01).u8(19, 0x7E).build(),
        RecordBuilder::ordinary(0xB0C1).timestamp(2000).build(),  // empty payload (len 12)
        RecordBuilder::ordinary(0x4116, 300).timestamp(3000).u16(13, 0xBEEF).build(),
    };
    return k;
}

Bytes sampleDlf() {
    Bytes dlf = versionReport();
    for (const Bytes& r : sampleRecords()) append(dlf, dlfOf(r));
    return dlf;
}

TEST(DlfReaderTest, BuiltDlfReadsBackWithItsVersionRecord) {
    const RecordedLog log = DlfReader::readBytes(sampleDlf());
    EXPECT_TRUE(log.ok());
    ASSERT_EQ(log.entries.size(), 4u);
    // The 161-byte version report is an entry like any other record.
    EXPECT_EQ(log.entries[0].logCode, DlfReader::kVersionReportCode);
    EXPECT_EQ(log.entries[0].timeStamp, 0u);
    EXPECT_EQ(log.entries[0].record.size(), 1u + 161u);
    EXPECT_EQ(log.entries[0].record[0], 1);
    const Bytes report = versionReport();
    EXPECT_EQ(Bytes(log.entries[0].record.begin() + 1, log.entries[0].record.end()), report);
    for (size_t i = 0; i < sampleRecords().size(); ++i) {
        SCOPED_TRACE(i);
        EXPECT_EQ(log.entries[i + 1].record, sampleRecords()[i]);
        EXPECT_EQ(log.entries[i + 1].logCode, ByteReader(sampleRecords()[i]).u16(3));
        EXPECT_EQ(log.entries[i + 1].timeStamp, 1000u * (i + 1));
    }
    EXPECT_EQ(log.logPackets, 4u);
    EXPECT_EQ(log.frames, 0u);
    EXPECT_EQ(log.count(0x1FFD), 1u);
    EXPECT_EQ(log.count(0x4116), 1u);
    EXPECT_EQ(log.malformed + log.truncated + log.badCrc, 0u);
    EXPECT_TRUE(log.problems.empty());
}

TEST(DlfReaderTest, RecordRunningPastTheEndIsReportedAndEarlierRecordsKept) {
    Bytes dlf = sampleDlf();
    const size_t lastStart = dlf.size() - (sampleRecords()[2].size() - 1);
    dlf.resize(dlf.size() - 1);  // the last record (len 299) loses its last byte
    const RecordedLog log = DlfReader::readBytes(dlf);
    ASSERT_EQ(log.entries.size(), 3u);
    EXPECT_EQ(log.entries[2].record, sampleRecords()[1]);
    EXPECT_EQ(log.truncated, 1u);
    EXPECT_EQ(log.malformed, 0u);
    ASSERT_EQ(log.problems.size(), 1u);
    EXPECT_EQ(log.problems[0], "truncated record at byte " + std::to_string(lastStart) +
                                   ": length 299 runs past the end of the file (298 bytes left)");
}

TEST(DlfReaderTest, LengthBelowTwelveStopsReadingAsMalformed) {
    Bytes dlf = versionReport();
    append(dlf, dlfOf(sampleRecords()[0]));
    const size_t badStart = dlf.size();
    // len 11 (one byte short of the header), then a good record that is not reached.
    append(dlf, Bytes{11, 0, 0x30, 0x71, 0, 0, 0, 0, 0, 0, 0});
    append(dlf, dlfOf(sampleRecords()[1]));
    const RecordedLog log = DlfReader::readBytes(dlf);
    ASSERT_EQ(log.entries.size(), 2u);
    EXPECT_EQ(log.entries[1].record, sampleRecords()[0]);
    EXPECT_EQ(log.malformed, 1u);
    EXPECT_EQ(log.truncated, 0u);
    ASSERT_EQ(log.problems.size(), 1u);
    EXPECT_EQ(log.problems[0], "malformed record at byte " + std::to_string(badStart) +
                                   ": length 11 is below the 12-byte record header");
}

TEST(DlfReaderTest, LengthZeroStopsReadingAsMalformed) {
    Bytes dlf = dlfOf(sampleRecords()[1]);
    append(dlf, Bytes(40, 0x00));  // zero padding would otherwise loop forever
    const RecordedLog log = DlfReader::readBytes(dlf);
    EXPECT_EQ(log.entries.size(), 1u);
    EXPECT_EQ(log.malformed, 1u);
}

TEST(DlfReaderTest, SingleTrailingByteIsTruncated) {
    Bytes dlf = dlfOf(sampleRecords()[0]);
    dlf.push_back(0x10);
    const RecordedLog log = DlfReader::readBytes(dlf);
    EXPECT_EQ(log.entries.size(), 1u);
    EXPECT_EQ(log.truncated, 1u);
    ASSERT_EQ(log.problems.size(), 1u);
    EXPECT_EQ(log.problems[0], "truncated record at byte 19: 1 byte left, too short for a record length");
}

TEST(DlfReaderTest, EmptyFileGivesNoEntries) {
    const RecordedLog log = DlfReader::readBytes(ByteView());
    EXPECT_TRUE(log.ok());
    EXPECT_TRUE(log.entries.empty());
    EXPECT_EQ(log.malformed + log.truncated, 0u);
}

TEST(DlfReaderTest, FileIsReadFromDiskAndMissingFileNamesPathAndReason) {
    QTemporaryDir dir;
    ASSERT_TRUE(dir.isValid());
    const QString path = dir.filePath("snapshot.dlf");
    const Bytes dlf = sampleDlf();
    QFile out(path);
    ASSERT_TRUE(out.open(QIODevice::WriteOnly));
    ASSERT_EQ(out.write(reinterpret_cast<const char*>(dlf.data()), static_cast<qint64>(dlf.size())),
              static_cast<qint64>(dlf.size()));
    out.close();
    const RecordedLog log = DlfReader::readFile(path.toStdString());
    ASSERT_TRUE(log.ok()) << log.error;
    EXPECT_EQ(log.entries.size(), 4u);

    const std::string missing = dir.filePath("missing.dlf").toStdString();
    const RecordedLog none = DlfReader::readFile(missing);
    EXPECT_FALSE(none.ok());
    EXPECT_EQ(none.error, missing + ": No such file or directory");
}

// Part 3.4's writer: one record per history entry gives a clean DLF.
TEST(DlfReaderTest, DlfFromGenerateDlfFromStateReadsBack) {
    auto history = Array::create();
    for (const Bytes& r : sampleRecords()) {
        auto entry = Dictionary::create();
        entry->set("DisplayState", Value::data(r));
        history->append(Value(entry));
    }
    auto state = Dictionary::create();
    state->set("History", Value(history));
    MVKLogGenerator generator;
    const auto dlf = generator.generateDlfFromState(*state);
    ASSERT_TRUE(dlf);
    const RecordedLog log = DlfReader::readBytes(*dlf);
    ASSERT_EQ(log.entries.size(), 4u);
    EXPECT_EQ(log.entries[0].logCode, DlfReader::kVersionReportCode);
    for (size_t i = 0; i < sampleRecords().size(); ++i) EXPECT_EQ(log.entries[i + 1].record, sampleRecords()[i]);
    EXPECT_EQ(log.malformed + log.truncated, 0u);
}

// Part 3.4 drops only the first byte of each history entry's buffer, so the second
// record of an entry keeps its type byte and the DLF cannot be framed past it.
TEST(DlfReaderTest, SecondRecordOfAHistoryEntryKeepsItsTypeByteAndStopsReading) {
    Bytes buffer = sampleRecords()[0];
    append(buffer, sampleRecords()[2]);
    auto entry = Dictionary::create();
    entry->set("DisplayState", Value::data(buffer));
    auto state = Dictionary::create();
    state->set("History", Value(Array::of({Value(entry)})));
    MVKLogGenerator generator;
    const auto dlf = generator.generateDlfFromState(*state);
    ASSERT_TRUE(dlf);
    const RecordedLog log = DlfReader::readBytes(*dlf);
    ASSERT_EQ(log.entries.size(), 2u);  // the version report and the first record
    EXPECT_EQ(log.entries[1].record, sampleRecords()[0]);
    // 01 2B 01 ... reads as length 0x2B01: past the end.
    EXPECT_EQ(log.truncated, 1u);
}

}  // namespace
}  // namespace vantorel
