// Screenshots (PNG) of the window for a person to look at, under build/<dir>/screenshots/: the emulator streaming (root and a drilled-down pane), a replay finished, a lost service with its stale rows, and ten minutes of the LTE modem as a signal plot and a neighbour table.
#include "App/ListTableView.h"
#include "App/NavigationController.h"
#include "App/SignalPlotWindow.h"
#include "App/VantorelApp.h"
#include "Model/VantorelModel.h"
#include "PaneTestSupport.h"
#include "Platform/Preferences.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/Emulator/EmulatorScenario.h"
#include "support/EventLoopWait.h"
#include "support/FastMonitorClock.h"
#include "support/FakeTelephonyService.h"

#include <QDir>
#include <QMainWindow>
#include <QTemporaryDir>
#include <QTimer>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

void shoot(QWidget* window, const char* file) {
    QDir().mkpath(VANTOREL_SCREENSHOT_DIR);
    spin(300);
    EXPECT_TRUE(window->grab().save(QDir(VANTOREL_SCREENSHOT_DIR).filePath(file), "PNG"));
}
void shoot(VantorelApp& app, const char* file) { shoot(app.window(), file); }

MonitorLauncher::Source sourceOf(const std::string& emulate, const std::string& service) {
    MonitorLauncher::Source source;
    source.emulate = emulate;
    source.service = service;
    return source;
}

struct Launched {
    explicit Launched(MonitorLauncher::Source source) : app(VantorelApp::Options{source, true}) {
        Preferences::setDirectory(settings.path().toStdString());
        std::string error;
        EXPECT_TRUE(app.applicationDidFinishLaunching(&error)) << error;
        app.window()->resize(480, 720);
    }
    ~Launched() {
        app.applicationWillTerminate();
        Preferences::setDirectory("");
    }
    QTemporaryDir settings;
    VantorelApp app;
};

}  // namespace

TEST(Screenshots, StreamingFromTheEmulatorRootPaneAndADrilledDownPane) {
    Launched launched(sourceOf("utran", ""));
    NavigationController& nav = *launched.app.navigationController();
    ASSERT_TRUE(waitUntil([&] { return nav.topPane()->numberOfRowsInSection() == 6; }, 10000));
    EXPECT_NE(nav.topPane()->status().find("emulator UTRAN (TD-SCDMA)"), std::string::npos);
    shoot(launched.app, "streaming.png");
    for (const char* name : {"Serving Cell", "Serving Cell Info"})
        nav.topPane()->didSelectRowAtIndexPath(panetest::rowOf(*nav.topPane(), name));
    ASSERT_EQ(nav.topPane()->path(), "/Serving Cell/Serving Cell Info");
    shoot(launched.app, "serving-cell-info-pane.png");
}

TEST(Screenshots, AReplayFinishedThenTheServiceLostWithItsRowsGreyed) {
    FakeTelephonyService service;
    Launched launched(sourceOf("", service.name()));
    VantorelApp& app = launched.app;
    VantorelPaneController& root = *app.navigationController()->topPane();
    ASSERT_TRUE(waitUntil([&] { return app.model()->isRunning(); }, 3000));
    for (uint8_t mode : {1, 2, 3}) service.send(RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, mode).build());
    auto info = Dictionary::create();
    info->set("State", "Finished");
    info->set("Source", "replay sprint.qmdl");
    info->set("Sent", Value::integer(3));
    info->set("Total", Value::integer(3));
    ASSERT_TRUE(waitUntil([&] { return app.model()->messagesDecoded() == 3; }, 3000));
    service.notify("BackendStateChanged", Value(info));
    ASSERT_TRUE(waitUntil([&] { return root.status() == "replay finished: 3 messages, 3 for this decoder \u00b7 replay sprint.qmdl"; }, 3000));
    shoot(app, "replay-finished.png");

    service.setBehaviour({.channelErrorCode = 5});
    service.closeChannelPort();
    ASSERT_TRUE(waitUntil([&] { return root.status().rfind("disconnected since ", 0) == 0; }, 3000));
    EXPECT_TRUE(root.isStale());
    shoot(app, "disconnected.png");
}

TEST(Screenshots, TenMinutesOfTheLTEModemAsASignalPlotWithHandoversAndANeighbourTable) {
    // The modem's scenario is played one tick per display tick on a clock that moves two
    // seconds a tick: ten minutes of plot in a few seconds.
    FakeTelephonyService service({.technology = kTSLogChannelTechnology_Morvek_LTE});
    std::string error;
    std::unique_ptr<EmulatorScenario> modem = EmulatorBackend::scenarioFor("lte", &error);
    FastMonitorClock& clock = FastMonitorClock::installed();
    clock.frozen = std::chrono::system_clock::from_time_t(1777888800);
    uint64_t tick = 0, samples = 0;
    Launched launched(sourceOf("", service.name()));
    VantorelApp& app = launched.app;
    ASSERT_TRUE(waitUntil([&] { return app.model()->isRunning(); }, 3000));
    QObject::connect(app.model(), &VantorelModel::displayTicked, &app, [&] {
        *clock.frozen += std::chrono::seconds(2);
        ++samples;
    });
    QTimer modemTicks;
    QObject::connect(&modemTicks, &QTimer::timeout, [&] {
        for (const Bytes& record : modem->recordsForTick(tick++)) service.send(record);
    });
    modemTicks.start(FastMonitorClock::kTick);
    ASSERT_TRUE(waitUntil([&] { return samples > 330; }, 60000));
    modemTicks.stop();  // no new data: no more ticks move the clock
    spin(200);

    app.showSignalPlot();
    SignalPlotWindow& plot = *app.signalPlotWindow();
    plot.resize(900, 520);
    EXPECT_FALSE(plot.shownMarks().empty());
    shoot(&plot, "signal-plot.png");

    NavigationController& nav = *app.navigationController();
    for (const char* name : {"Neighbours", "Measured Neighbor Cells"})
        nav.topPane()->didSelectRowAtIndexPath(panetest::rowOf(*nav.topPane(), name));
    nav.topPane()->setShowsTable(true);
    nav.topPane()->listTableView()->selectEntry(1);
    nav.topPane()->listTableView()->sortByColumn(1, Qt::DescendingOrder);  // strongest first
    EXPECT_GT(nav.topPane()->listTableView()->model()->rowCount(), 1);
    shoot(app, "neighbour-table.png");
    clock.frozen.reset();
}
