// Tests for `vantorel-cli decode` and `vantorel-cli info` on a capture of the emulator's UTRAN stream and on the real captures.
#include "cli/DecodeCommand.h"
#include "cli/InfoCommand.h"

#include "support/ScenarioCapture.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <QTemporaryDir>
#include "support/CommandOutput.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

// A capture of 60 ticks of the UTRAN scenario (seed 1), then a message id the model drops.
std::string writeUtranCapture(const QTemporaryDir& dir) {
    const std::string path = dir.filePath("utran.vcap").toStdString();
    vantorel::testing::writeUtranCapture(path, 1, 60, 1000, 5);
    return path;
}

using Output = vantorel::testing::CommandOutput;

Output runDecode(const QStringList& args) { return vantorel::testing::runCommand(&DecodeCommand::run, args); }

}  // namespace

TEST(DecodeCommand, DecodesACaptureToJsonWithNothingElseOnStandardOutput) {
    QTemporaryDir dir;
    const std::string path = writeUtranCapture(dir);
    Output r = runDecode({"--format", "json", QString::fromStdString(path)});
    ASSERT_EQ(r.code, 0) << r.err;
    QJsonParseError error;
    QJsonDocument doc = QJsonDocument::fromJson(QByteArray::fromStdString(r.out), &error);
    ASSERT_EQ(error.error, QJsonParseError::NoError) << r.out;
    const QJsonObject serving = doc.object()["1;Serving Cell"].toObject();
    EXPECT_NE(serving["RRC Info"].toObject()["State"].toString(), "-");
    EXPECT_EQ(serving["Serving Cell Info"].toObject()["Local Area Code"].toString(), "23071");
    EXPECT_NE(r.err.find("1 skipped (message id not 0)"), std::string::npos) << r.err;
    EXPECT_NE(r.err.find("Deallocing ClassIndex"), std::string::npos);  // Part 3.3's line, kept out of the data
}

TEST(DecodeCommand, TreeFormatShowsTheDisplayAsThePanesDo) {
    QTemporaryDir dir;
    const std::string path = writeUtranCapture(dir);
    Output r = runDecode({QString::fromStdString(path)});
    ASSERT_EQ(r.code, 0) << r.err;
    EXPECT_EQ(r.out.rfind("Technology: UTRAN (TD-SCDMA)\nServing Cell\n  RRC Info\n    State: ", 0), 0u) << r.out;
    EXPECT_NE(r.out.find("  Neighbor Cell List\n    0\n      UARFCN: "), std::string::npos);
}

TEST(DecodeCommand, AQmdlFileWithoutTechnologySaysTechnologyIsNeeded) {
    Output r = runDecode({VANTOREL_CAPTURES_DIR "/qmdl_example.qmdl"});
    EXPECT_EQ(r.code, 1);
    EXPECT_NE(r.err.find("does not say its technology: add --technology (ifx, gsm, cdma, lte, utran)"),
              std::string::npos);
}

TEST(DecodeCommand, BadOptionsAndMissingFilesAreClearErrors) {
    EXPECT_EQ(runDecode({"--format", "yaml", "x"}).code, 2);
    EXPECT_EQ(runDecode({"--technology", "wimax", "x"}).code, 2);
    Output missing = runDecode({"--technology", "utran", "/nonexistent/file.qmdl"});
    EXPECT_EQ(missing.code, 1);
    EXPECT_NE(missing.err.find("/nonexistent/file.qmdl"), std::string::npos);
}

TEST(DecodeCommand, RealCaptureDecodesWithoutASanitizerReportAndCountsItsBadFrame) {
    Output r = runDecode({"--technology", "utran", VANTOREL_CAPTURES_DIR "/cmcc.mi2log"});
    EXPECT_EQ(r.code, 0) << r.err;
    EXPECT_NE(r.err.find("5483 messages read, 0 skipped (message id not 0), 1 bad frames"), std::string::npos) << r.err;
}

TEST(InfoCommand, AccountsForEveryFrameOfTheRealCaptures) {
    Output r = vantorel::testing::runCommand(
        &InfoCommand::run, {VANTOREL_CAPTURES_DIR "/qmdl_example.qmdl", VANTOREL_CAPTURES_DIR "/sprint.mi2log"});
    const std::string& out = r.out;
    EXPECT_EQ(r.code, 0) << r.err;
    EXPECT_NE(out.find("QMDL, technology unknown, 336 messages"), std::string::npos) << out;
    EXPECT_NE(out.find("frames 345, log packets 336, other packets 9, bad CRC 0, malformed 0, truncated 0"),
              std::string::npos);
    EXPECT_NE(out.find("0x7130  17"), std::string::npos);
    EXPECT_NE(out.find("QMDL, technology unknown, 47087 messages"), std::string::npos);
    EXPECT_NE(out.find("bad CRC 1"), std::string::npos);
}
