// Tests for `vantorel-cli decode` and `vantorel-cli info` on a capture of the emulator's UTRAN stream and on real captures.
#include "cli/DecodeCommand.h"

#include "Platform/RecordBuilder.h"
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/CommandOutput.h"
#include "support/ScenarioCapture.h"

#include <QFile>
#include <QJsonDocument>
#include <QProcess>
#include <QJsonObject>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using vantorel::testing::CommandOutput;

namespace {

CommandOutput decode(const QStringList& args) { return vantorel::testing::runCommand(&DecodeCommand::run, args); }

}  // namespace

TEST(DecodeCommand, ACaptureDecodesToTheDisplayAsTreeOrJsonWithOnlyDataOnStandardOutput) {
    QTemporaryDir dir;
    const QString path = dir.filePath("utran.vcap");
    vantorel::testing::writeUtranCapture(path.toStdString(), 1, 60, 1000, 5);  // then one message of id 5

    CommandOutput tree = decode({path});
    ASSERT_EQ(tree.code, 0) << tree.err;
    EXPECT_EQ(tree.out.rfind("Technology: UTRAN (TD-SCDMA)\nServing Cell\n  RRC Info\n    State: ", 0), 0u) << tree.out;
    EXPECT_NE(tree.out.find("  Neighbor Cell List\n    0\n      UARFCN: "), std::string::npos);
    EXPECT_NE(tree.err.find("1 skipped (message id not 0)"), std::string::npos) << tree.err;
    EXPECT_NE(tree.err.find("Deallocing ClassIndex"), std::string::npos);  // kept out of the data
    CommandOutput twice = decode({path, path});  // files of one technology go to one decoder
    EXPECT_EQ(twice.code, 0) << twice.err;
    EXPECT_NE(twice.err.find("2 skipped"), std::string::npos) << twice.err;

    CommandOutput json = decode({"--format", "json", path});
    const QJsonObject serving = QJsonDocument::fromJson(QByteArray::fromStdString(json.out)).object()["Serving Cell"].toObject();
    EXPECT_EQ(serving["Serving Cell Info"].toObject()["Local Area Code"].toString(), "23071") << json.out;
    EXPECT_EQ(json.out.rfind("{\n    \"Technology\": \"UTRAN (TD-SCDMA)\",\n    \"Serving Cell\": {", 0), 0u) << json.out;
}

TEST(DecodeCommand, TextFromTheModemIsShownNotObeyedInTheTreeAndKeptExactInJson) {
    QTemporaryDir dir;
    const std::string path = dir.filePath("pdp.vcap").toStdString();
    std::string error;
    auto writer = CaptureWriter::create(path, kTSLogChannelTechnology_Morvek_UTRAN2, &error);
    ASSERT_TRUE(writer) << error;
    auto context = Dictionary::create();
    context->set("APN", "\x1b]0;owned\x07net\x1b[2J");
    writer->write(1, 0, RecordBuilder::extraPropertyList(2, Value(Array::of({Value(context)})), true));
    ASSERT_TRUE(writer->flush());
    CommandOutput tree = decode({QString::fromStdString(path)});
    EXPECT_NE(tree.out.find("      APN: \\x1b]0;owned\\x07net\\x1b[2J\n"), std::string::npos) << tree.out;
    EXPECT_EQ(tree.out.find('\x1b'), std::string::npos);
    CommandOutput json = decode({"--format", "json", QString::fromStdString(path)});
    EXPECT_NE(json.out.find("\"APN\": \"\\u001b]0;owned\\u0007net\\u001b[2J\""), std::string::npos) << json.out;
}

TEST(VantorelCli, CommandsAreDispatchedInfoAccountsForEveryFrameAndBadUseIsAClearError) {
    QTemporaryDir dir;
    const QString capture = dir.filePath("utran.vcap"), empty = dir.filePath("empty"), noise = dir.filePath("noise"),
                  mobility = dir.filePath("mobility.qmdl");
    vantorel::testing::writeUtranCapture(capture.toStdString(), 1, 2, 1500);
    QFile(empty).open(QIODevice::WriteOnly);
    QFile file(noise);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    uint32_t seed = 12345;
    for (int i = 0; i < 100000; ++i) file.putChar(static_cast<char>((seed = seed * 1103515245 + 12345) >> 24));
    file.close();
    // Log packets of the mobility codes alone, which no technology owns.
    QFile qmdl(mobility);
    ASSERT_TRUE(qmdl.open(QIODevice::WriteOnly));
    for (uint16_t code : {0x7130, 0x7131}) {
        const Bytes frame = DiagCommand::frame(DiagPacket::logPacketFromRecord(RecordBuilder::ordinary(code, 20).build()));
        qmdl.write(reinterpret_cast<const char*>(frame.data()), static_cast<qint64>(frame.size()));
    }
    qmdl.close();
    const QString captures = VANTOREL_CAPTURES_DIR;
    const struct {
        QStringList args;
        int code;
        const char* says;
        bool quiet = false;  // nothing on standard output
    } rows[] = {
        {{}, 2, "Usage: vantorel-cli COMMAND"},
        {{"help"}, 0, "Usage: vantorel-cli COMMAND"},
        {{"-h"}, 0, "Usage: vantorel-cli COMMAND"},
        {{"info", captures + "/qmdl_example.qmdl"}, 0, "QMDL, technology LTE, 336 messages"},
        {{"info", captures + "/cmcc.mi2log"}, 0, "frames 5500, log packets 5483, other packets 17, bad CRC 1"},
        {{"info", captures + "/cmcc.mi2log"}, 0, "\n0xB0C2  LTE RRC serving cell info  62  (version 3: 62)\n"},
        {{"info", captures + "/sprint.mi2log"}, 0, "\ntime span 1980-01-06 03:39:42.465 to 2015-08-17 01:47:59.269 UTC"},
        {{"info", mobility}, 0, "QMDL, technology unknown, 2 messages"},
        {{"info", capture}, 0, "capture, technology UTRAN (TD-SCDMA), "},
        {{"info", capture}, 0, "\ntime span 2023-11-14 22:13:20.001 to 2023-11-14 22:13:20.0"},
        {{"info", empty}, 1, "empty: no record in it", true},
        {{"info", noise}, 1, "noise: no record in it", true},
        {{"info", "/dev/zero"}, 1, "/dev/zero: is a device", true},
        {{"info", "--frames"}, 2, "Unknown option 'frames'", true},
        {{"decode", "--technology", "lte", capture}, 2, "is a UTRAN (TD-SCDMA) capture: --technology lte contradicts it"},
        {{"frobnicate"}, 2, "vantorel-cli: unknown command 'frobnicate'"},
        {{"decode", captures + "/qmdl_example.qmdl"}, 0, "Technology: LTE\n"},
        {{"decode", mobility}, 1, "no serving-cell record tells its technology: add --technology (ifx, gsm, cdma, lte, utran)", true},
        {{"decode", "--format", "yaml", "x"}, 2, "unknown --format 'yaml'"},
        {{"decode", "--technology", "wimax", "x"}, 2, "unknown technology 'wimax'"},
        {{"decode", "--csv"}, 2, "Missing value after '--csv'", true},
        {{"decode", "--technology", "utran", "/nonexistent/file.qmdl"}, 1, "/nonexistent/file.qmdl", true},
        {{"decode", "/dev/zero"}, 1, "/dev/zero: is a device", true},
        {{"decode", empty}, 1, "empty: no record in it", true},
        {{"decode", noise}, 1, "noise: no record in it", true},
        {{"decode", "--technology", "utran", captures + "/sprint.mi2log"}, 1,
         "sprint.mi2log: no record for the UTRAN (TD-SCDMA) decoder among its 47087 messages", true},
        {{"decode", "--technology", "ifx", captures + "/qmdl_example.qmdl"}, 1,
         "no record for the GSM (IFX) decoder: it could read none of these messages"},
        {{"watch", "--replay", empty}, 1, "empty: no record in it", true},
        {{"watch", "--replay", captures + "/qmdl_example.qmdl", "--sped", "0"}, 2, "Unknown option 'sped'", true},
    };
    for (const auto& row : rows) {
        QProcess cli;
        cli.start(VANTOREL_CLI_PROGRAM, row.args);
        ASSERT_TRUE(cli.waitForFinished(60000)) << row.says;
        const QByteArray out = cli.readAllStandardOutput(), err = cli.readAllStandardError();
        EXPECT_EQ(cli.exitCode(), row.code) << row.says;
        EXPECT_TRUE((out + err).contains(row.says)) << (out + err).toStdString();
        if (row.quiet) EXPECT_TRUE(out.isEmpty()) << row.says << ": " << out.toStdString();
    }
}
