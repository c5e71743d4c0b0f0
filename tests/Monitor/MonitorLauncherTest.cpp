// End-to-end tests of the monitor wiring: an in-process service replaying a capture or running the emulator, the model, the UTRAN decoder, and the terminal view's rows.
#include "Monitor/MonitorLauncher.h"

#include "Model/VantorelModel.h"
#include "Monitor/TerminalView.h"
#include "Monitor/TreeFormatter.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
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
    EXPECT_EQ(launcher.description(), "replay of " + path);
    ASSERT_TRUE(waitUntil(
        [&] {
            NodeRef lac = launcher.model()->nodeAtPath("/Serving Cell/Serving Cell Info/Local Area Code");
            return view.refreshes() >= 1 && lac && *lac->value() == "23071";
        },
        10000));
    const std::string screen = view.screen();
    EXPECT_EQ(screen.rfind("Vantorel - Updated ", 0), 0u) << screen;
    EXPECT_NE(screen.find(" messages decoded\n\nTechnology: UTRAN (TD-SCDMA)\n"), std::string::npos) << screen;
    EXPECT_NE(screen.find("\n    Local Area Code: 23071\n"), std::string::npos) << screen;
    std::fclose(out);
}

TEST(MonitorLauncher, TheEmbeddedDefaultIsTheUTRANEmulatorAndBadSourcesAreClearErrors) {
    std::string error;
    auto source = parse({}, &error);
    ASSERT_TRUE(source);
    EXPECT_EQ(source->emulate, "utran");
    EXPECT_FALSE(parse({"--emulate", "utran", "--service", "x"}, &error));
    EXPECT_EQ(error, "choose one of --emulate, --replay and --service");
    EXPECT_FALSE(parse({"--speed", "fast"}, &error));
    MonitorLauncher launcher;
    EXPECT_FALSE(launcher.start(*parse({"--emulate", "lte"}, &error), nullptr, &error));
    EXPECT_NE(error.find("no emulator scenario for lte yet (available: utran)"), std::string::npos) << error;
}

TEST(TerminalView, ListsOfValuesShowOneLinePerEntryAndEmptyNodesSaySo) {
    auto entry = Dictionary::create();
    entry->set("UARFCN", "10096");
    entry->set("Cell ID", "120");
    auto sir = Dictionary::create();
    sir->set("CCTRCH ID", "1");
    sir->set("SIR", Value(Array::of({"13", "16"})));
    auto root = Dictionary::create();
    root->set("Neighbor Cell List", Value(Array::of({Value(entry)})));
    root->set("CCTRCH SIR", Value(Array::of({Value(sir)})));
    root->set("RRC Info", Value(Dictionary::create()));
    root->set("Count", Value::integer(3));
    PathDictionary paths;
    const NodeRef tree = VantorelModelNode::makeTreeFromObject(Value(root), paths);
    EXPECT_EQ(TreeFormatter::compactTree(tree),
              "Neighbor Cell List\n"
              "  0: UARFCN 10096 | Cell ID 120\n"
              "CCTRCH SIR\n"
              "  0\n"
              "    CCTRCH ID: 1\n"
              "    SIR: 13 16\n"
              "RRC Info (empty)\n"
              "Count: (unknown)\n");
    EXPECT_EQ(TreeFormatter::tree(tree).rfind("Neighbor Cell List\n  0\n    UARFCN: 10096\n    Cell ID: 120\n", 0), 0u);
}
