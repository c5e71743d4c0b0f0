// Tests RecordedLog: entry counting, the capped problem list, the per-code summary and the file loader's errors.
#include "TelephonyService/Replay/RecordedLog.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

namespace vantorel {
namespace {

TEST(RecordedLogTest, AddEntryCountsPacketsAndCodes) {
    RecordedLog log;
    log.addEntry(0xB0C2, 5, Bytes{1, 12, 0, 0xC2, 0xB0});
    log.addEntry(0x7130, 6, Bytes{1});
    log.addEntry(0xB0C2, 7, Bytes{1});
    EXPECT_EQ(log.logPackets, 3u);
    EXPECT_EQ(log.entries.size(), 3u);
    EXPECT_EQ(log.count(0xB0C2), 2u);
    EXPECT_EQ(log.count(0x7130), 1u);
    EXPECT_EQ(log.count(0x7131), 0u);
    EXPECT_EQ(log.entries[0].timeStamp, 5u);
    EXPECT_EQ(log.entries[0].record, (Bytes{1, 12, 0, 0xC2, 0xB0}));
}

TEST(RecordedLogTest, SummaryListsCountersThenCodesInAscendingOrder) {
    RecordedLog log;
    log.frames = 9;
    log.otherPackets = 5;
    log.badCrc = 1;
    log.addEntry(0xB0C2, 0, {});
    log.addEntry(0x7130, 0, {});
    log.addEntry(0x7130, 0, {});
    log.addProblem(0, "bad CRC frame", "bad CRC: computed 0x1234, frame carries 0x4321");
    EXPECT_EQ(log.summary(),
              "frames 9, log packets 3, other packets 5, bad CRC 1, malformed 0, truncated 0\n"
              "0x7130  2\n"
              "0xB0C2  1\n"
              "bad CRC frame at byte 0: bad CRC: computed 0x1234, frame carries 0x4321\n");
}

TEST(RecordedLogTest, ProblemTextsAreCappedButCounted) {
    RecordedLog log;
    for (size_t i = 0; i < RecordedLog::kMaxProblems + 5; ++i) {
        ++log.malformed;
        log.addProblem(i, "malformed frame", "why");
    }
    EXPECT_EQ(log.problems.size(), RecordedLog::kMaxProblems);
    EXPECT_EQ(log.problems.back(), "malformed frame at byte 99: why");
    const std::string summary = log.summary();
    EXPECT_NE(summary.find("(5 more problems not listed)\n"), std::string::npos) << summary;
}

TEST(RecordedLogTest, SummaryOfAnUnreadableFileStartsWithTheError) {
    RecordedLog log;
    log.error = "/nowhere/x.qmdl: No such file or directory";
    EXPECT_FALSE(log.ok());
    EXPECT_EQ(log.summary().rfind("error: /nowhere/x.qmdl: No such file or directory\n", 0), 0u);
}

TEST(RecordedLogTest, LoadFileReadsWholeFileOrSaysWhy) {
    QTemporaryDir dir;
    ASSERT_TRUE(dir.isValid());
    const QString path = dir.filePath("data.bin");
    QFile f(path);
    ASSERT_TRUE(f.open(QIODevice::WriteOnly));
    const char bytes[] = {0x10, 0x00, 0x7E, 0x00, static_cast<char>(0xFF)};
    ASSERT_EQ(f.write(bytes, sizeof bytes), static_cast<qint64>(sizeof bytes));
    f.close();

    std::string error;
    auto data = RecordedLog::loadFile(path.toStdString(), &error);
    ASSERT_TRUE(data);
    EXPECT_EQ(*data, (Bytes{0x10, 0x00, 0x7E, 0x00, 0xFF}));
    EXPECT_TRUE(error.empty());

    const std::string missing = dir.filePath("nope.bin").toStdString();
    EXPECT_FALSE(RecordedLog::loadFile(missing, &error));
    EXPECT_EQ(error, missing + ": No such file or directory");

    EXPECT_FALSE(RecordedLog::loadFile(dir.path().toStdString(), &error));
    EXPECT_EQ(error, dir.path().toStdString() + ": is a directory");

    // An unreadable file (not for root, who reads everything).
    ASSERT_TRUE(f.setPermissions(QFileDevice::Permissions()));
    QFile probe(path);
    if (!probe.open(QIODevice::ReadOnly)) {
        EXPECT_FALSE(RecordedLog::loadFile(path.toStdString(), &error));
        EXPECT_EQ(error, path.toStdString() + ": Permission denied");
    }
}

}  // namespace
}  // namespace vantorel
