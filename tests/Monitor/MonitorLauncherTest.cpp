// End-to-end tests of the monitor wiring: an in-process service replaying a capture or running the emulator, the model, the UTRAN decoder, and the terminal view's rows.
#include "Monitor/MonitorLauncher.h"

#include "Model/VantorelModel.h"
#include "Monitor/TerminalView.h"
#include "support/EventLoopWait.h"
#include "support/FastMonitorClock.h"
#include "support/ScenarioCapture.h"

#include <QCommandLineParser>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <cstdio>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

std::optional<MonitorLauncher::Source> parse(const QStringList& args, std::string* error) {
    QCommandLineParser parser;
    MonitorLauncher::addOptions(parser);
    parser.process(QStringList{"watch"} + args);
    return MonitorLauncher::sourceFrom(parser, error);
}

}  // namespace

TEST(MonitorLauncher, AReplayedCaptureReachesTheTerminalViewThroughServiceModelAndDecoder) {
    FastMonitorClock::installed();
    QTemporaryDir dir;
    const std::string path = dir.filePath("utran.vcap").toStdString();
    writeUtranCapture(path, 3, 40, 500);
    std::string error;
    auto source = parse({"--replay", QString::fromStdString(path), "--speed", "0"}, &error);
    ASSERT_TRUE(source) << error;
    std::FILE* out = std::tmpfile();
    TerminalView view(out);
    MonitorLauncher launcher;
    ASSERT_TRUE(launcher.start(*source, &view, &error)) << error;
    view.setModel(launcher.model());
    // At speed 0 the whole capture streams at once: the header ends up saying so.
    ASSERT_TRUE(waitUntil([&] { return view.refreshes() >= 1 && view.screen().find("\n    Local Area Code: 23071\n") != std::string::npos &&
                                       view.screen().rfind("Vantorel - replay finished", 0) == 0; }, 10000));
    const std::string screen = view.screen();
    EXPECT_EQ(screen.rfind("Vantorel - replay finished: 112 messages, 112 for this decoder · replay utran.vcap - 112 messages decoded", 0), 0u) << screen;
    EXPECT_NE(screen.find(" messages decoded\n\nTechnology: UTRAN (TD-SCDMA)\n"), std::string::npos) << screen;
    EXPECT_NE(screen.find("\n    0: UARFCN "), std::string::npos) << screen;  // a list entry on one line, named fields
    std::fclose(out);
}

TEST(MonitorLauncher, TheEmbeddedDefaultIsTheUTRANEmulatorAndBadSourcesAreClearErrors) {
    std::string error;
    EXPECT_EQ(parse({}, &error)->emulate, "utran");
    EXPECT_FALSE(parse({"--emulate", "utran", "--service", "x"}, &error));
    EXPECT_EQ(error, "choose one of --emulate, --replay, --device and --service");
    EXPECT_FALSE(parse({"--speed", "fast"}, &error));
    MonitorLauncher launcher;
    EXPECT_FALSE(launcher.start(*parse({"--emulate", "wimax"}, &error), nullptr, &error));
    EXPECT_NE(error.find("unknown technology \"wimax\""), std::string::npos) << error;
}

TEST(MonitorLauncher, OptionsThatContradictOrShapeNoReplayAreErrors) {
    QTemporaryDir dir;
    const QString capture = dir.filePath("utran.vcap");
    writeUtranCapture(capture.toStdString(), 1, 1, 1000);
    const struct {
        QStringList args;
        const char* says;  // empty: accepted
    } rows[] = {
        {{"--speed", "2"}, "--speed applies to a replay: add --replay FILE"},
        {{"--emulate", "lte", "--loop"}, "--loop applies to a replay: add --replay FILE"},
        {{"--service", "x", "--technology", "lte"}, "--technology applies to a replay: add --replay FILE"},
        {{"--replay", capture, "--technology", "lte"}, "is a UTRAN (TD-SCDMA) capture: --technology lte contradicts it"},
        {{"--replay", capture, "--technology", "wimax"}, "unknown technology 'wimax'"},
        {{"--replay", capture, "--technology", "utran", "--speed", "2", "--loop"}, ""},
    };
    for (const auto& row : rows) {
        std::string error;
        EXPECT_EQ(parse(row.args, &error).has_value(), !*row.says) << row.says;
        EXPECT_NE(error.find(row.says), std::string::npos) << error;
    }
}
