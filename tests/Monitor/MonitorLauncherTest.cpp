// End-to-end tests: an in-process service replaying a capture (or running the emulator), the model, the UTRAN decoder and the tree, shown by the terminal view.
#include "Monitor/MonitorLauncher.h"

#include "Model/VantorelModel.h"
#include "Monitor/TerminalView.h"
#include "support/EventLoopWait.h"
#include "support/ScenarioCapture.h"

#include <QCommandLineParser>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <cstdio>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

std::string readAll(std::FILE* f) {
    std::fflush(f);
    std::rewind(f);
    std::string text;
    char buf[4096];
    size_t n;
    while ((n = std::fread(buf, 1, sizeof buf, f)) > 0) text.append(buf, n);
    return text;
}

}  // namespace

TEST(MonitorLauncher, ServiceWithAReplayedCaptureModelDecoderAndTreeEndToEnd) {
    QTemporaryDir dir;
    const std::string path = dir.filePath("utran.vcap").toStdString();
    writeUtranCapture(path, 3, 40, 500);
    std::FILE* out = std::tmpfile();
    TerminalView view(out);
    MonitorLauncher launcher;
    MonitorLauncher::Source source;
    source.replay = path;
    source.speed = 0;  // as fast as the model takes it
    std::string error;
    ASSERT_TRUE(launcher.start(source, &view, &error)) << error;
    view.setModel(launcher.model());
    // Records build the display as they arrive, so the first refresh already shows them.
    ASSERT_TRUE(waitUntil(
        [&] {
            NodeRef lac = launcher.model()->nodeAtPath("/Serving Cell/Serving Cell Info/Local Area Code");
            return view.refreshes() >= 1 && lac && *lac->value() == "23071";
        },
        10000));
    const std::string screen = readAll(out);
    EXPECT_NE(screen.find("Technology: UTRAN (TD-SCDMA)"), std::string::npos) << screen;
    EXPECT_NE(screen.find("    Local Area Code: 23071"), std::string::npos) << screen;
    EXPECT_NE(screen.find(" messages decoded"), std::string::npos);
    EXPECT_NE(screen.find("Updated "), std::string::npos);
    EXPECT_TRUE(launcher.model()->isConnected());
    std::fclose(out);
}

TEST(MonitorLauncher, TheEmbeddedDefaultIsTheUTRANEmulator) {
    QCommandLineParser parser;
    MonitorLauncher::addOptions(parser);
    parser.process(QStringList{"watch"});
    std::string error;
    auto source = MonitorLauncher::sourceFrom(parser, &error);
    ASSERT_TRUE(source);
    EXPECT_EQ(source->emulate, "utran");

    std::FILE* out = std::tmpfile();
    TerminalView view(out);
    MonitorLauncher launcher;
    ASSERT_TRUE(launcher.start(*source, &view, &error)) << error;
    view.setModel(launcher.model());
    EXPECT_EQ(launcher.description(), "emulator (utran)");
    ASSERT_TRUE(waitUntil([&] { return launcher.model()->messagesDecoded() > 10; }, 10000));
    EXPECT_EQ(launcher.model()->logGenerator() != nullptr, true);
    std::fclose(out);
}

TEST(MonitorLauncher, ConflictingSourcesAndBadSpeedAreClearErrors) {
    QCommandLineParser parser;
    MonitorLauncher::addOptions(parser);
    parser.process(QStringList{"watch", "--emulate", "utran", "--service", "x"});
    std::string error;
    EXPECT_FALSE(MonitorLauncher::sourceFrom(parser, &error));
    EXPECT_EQ(error, "choose one of --emulate, --replay and --service");

    QCommandLineParser speed;
    MonitorLauncher::addOptions(speed);
    speed.process(QStringList{"watch", "--speed", "fast"});
    EXPECT_FALSE(MonitorLauncher::sourceFrom(speed, &error));

    QCommandLineParser lte;
    MonitorLauncher::addOptions(lte);
    lte.process(QStringList{"watch", "--emulate", "lte"});
    auto source = MonitorLauncher::sourceFrom(lte, &error);
    ASSERT_TRUE(source);
    TerminalView view(stderr);
    MonitorLauncher launcher;
    EXPECT_FALSE(launcher.start(*source, &view, &error));
    EXPECT_NE(error.find("no emulator scenario for lte yet (available: utran)"), std::string::npos) << error;
}
