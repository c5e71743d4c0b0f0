// Tests `vantorel-cli decode --csv`: rows on the recorded 2 s ticks of real captures, chosen keys, and option misuse.
#include "cli/DecodeCommand.h"

#include "support/CommandOutput.h"

#include <QDateTime>
#include <QElapsedTimer>
#include <QFileInfo>
#include <QProcess>
#include <QThread>
#include <QFile>
#include <QRegularExpression>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using vantorel::testing::CommandOutput;

namespace {

CommandOutput decode(const QStringList& args) { return vantorel::testing::runCommand(&vantorel::DecodeCommand::run, args); }

QStringList csvLines(const QString& path) {
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) return {};
    return QString::fromUtf8(file.readAll()).split("\r\n", Qt::SkipEmptyParts);
}

const QString kCaptures = VANTOREL_CAPTURES_DIR;

}  // namespace

TEST(SignalCsv, AReplayGivesOneRowPerRecordedTickWithTheSignalColumns) {
    QTemporaryDir dir;
    const QString out = dir.filePath("cmcc.csv");
    CommandOutput run = decode({"--technology", "lte", "--csv", out, kCaptures + "/cmcc.mi2log"});
    ASSERT_EQ(run.code, 0) << run.err;
    const QStringList lines = csvLines(out);
    ASSERT_GT(lines.size(), 1000);  // 2 h 48 min of recording with gaps
    // The serving cell's identity first, then the values with their units.
    EXPECT_TRUE(lines[0].startsWith("time,/Serving Cell/Serving Cell Info/Physical Cell ID,/Serving Cell/Serving Cell "
                                    "Info/Download Frequency,/Serving Cell/Serving Cell Measurements/Measured RSRP (dBm),"))
        << lines[0].toStdString();
    EXPECT_TRUE(lines.filter(QRegularExpression("^[^,]*,337,37900,")).size() > 100) << "the cell each row is of";
    const qsizetype columns = lines[0].count(',');
    qint64 previous = 0;
    for (const QString& line : lines.mid(1)) {
        const QDateTime time = QDateTime::fromString(line.section(',', 0, 0), Qt::ISODateWithMs);
        ASSERT_TRUE(time.isValid()) << line.toStdString();
        ASSERT_EQ(line.count(','), columns);
        // Ticks 2 s apart from the first message (02:11:40.985), rising.
        ASSERT_EQ((time.toMSecsSinceEpoch() - 1438395100985) % 2000, 0) << line.toStdString();
        ASSERT_GT(time.toMSecsSinceEpoch(), previous);
        previous = time.toMSecsSinceEpoch();
    }
    EXPECT_EQ(lines[1].section(',', 0, 0), "2015-08-01T02:11:42.985Z");

    // A capture with measurements fills the RSRP column; chosen keys replace the defaults, a
    // header copied from a CSV (the key and its unit) names its key.
    const QString measured = dir.filePath("measured.csv");
    run = decode({"--technology", "lte", "--csv", measured, "--csv-keys",
                  "/Serving Cell/Serving Cell Measurements/Measured RSRP (dBm), /No Such/[A=1,B=2]/Key",
                  kCaptures + "/offline_log_example.mi2log"});
    ASSERT_EQ(run.code, 0) << run.err;
    EXPECT_EQ(csvLines(measured),
              (QStringList{"time,/Serving Cell/Serving Cell Measurements/Measured RSRP (dBm),\"/No Such/[A=1,B=2]/Key\"",
                           "2016-03-23T21:55:50.881Z,-96.56,"}));
    EXPECT_NE(run.err.find("--csv-keys (their columns are empty):\n  /No Such/[A=1,B=2]/Key\n"), std::string::npos) << run.err;
}

TEST(SignalCsv, SeveralCapturesGiveTheRowsOfEachAndAFastReplayWatchedGivesTheRowsOfItsRecording) {
    QTemporaryDir dir;
    // cmcc's recorded time lies after qmdl_example's: time goes back between the files.
    const QStringList files = {kCaptures + "/cmcc.mi2log", kCaptures + "/qmdl_example.qmdl"};
    // The rows' times (the values differ: the second file starts from the display the first left).
    auto times = [](const QStringList& lines) {
        QStringList out;
        for (const QString& line : lines.mid(1)) out += line.section(',', 0, 0);
        return out;
    };
    QStringList each;
    for (const QString& file : files) {
        const QString out = dir.filePath(QFileInfo(file).fileName() + ".csv");
        ASSERT_EQ(decode({"--csv", out, file}).code, 0) << file.toStdString();
        each += times(csvLines(out));
    }
    const QString both = dir.filePath("both.csv");
    ASSERT_EQ(decode({"--csv", both, files[0], files[1]}).code, 0);
    const QStringList together = times(csvLines(both));
    EXPECT_EQ(together.size(), each.size());
    EXPECT_TRUE(together == each);

    // The replay as fast as the monitor takes it, one row per tick of the recording.
    const QString decoded = dir.filePath(QFileInfo(files[0]).fileName() + ".csv"), watched = dir.filePath("watched.csv");
    const QStringList expected = csvLines(decoded);
    QProcess cli;
    cli.start(VANTOREL_CLI_PROGRAM, {"watch", "--replay", files[0], "--speed", "0", "--csv", watched});
    QElapsedTimer clock;
    clock.start();
    while (csvLines(watched).size() < expected.size() && clock.elapsed() < 90000) QThread::msleep(200);
    QThread::msleep(500);  // nothing more comes
    cli.terminate();
    ASSERT_TRUE(cli.waitForFinished(10000));
    const QStringList rows = csvLines(watched);
    EXPECT_EQ(rows.size(), expected.size());
    EXPECT_TRUE(rows == expected) << (rows.isEmpty() ? "" : rows.last().toStdString()) << "\n"
                                  << (expected.isEmpty() ? "" : expected.last().toStdString());
}

TEST(SignalCsv, MisuseIsRefusedBeforeDecoding) {
    const std::pair<QStringList, const char*> rows[] = {
        {{"--csv-keys", "/a"}, "--csv-keys needs --csv FILE"},
        {{"--csv", "/nonexistent/dir/out.csv"}, "/nonexistent/dir/out.csv: "},
        {{"--csv", "/tmp/unused.csv", "--csv-keys", " , "}, "--csv-keys names no key"},
    };
    for (const auto& [args, error] : rows) {
        CommandOutput run = decode(args + QStringList{"--technology", "lte", kCaptures + "/cmcc.mi2log"});
        EXPECT_EQ(run.code, 2);
        EXPECT_NE(run.err.find(error), std::string::npos) << run.err;
    }
}
