// Screenshots (PNG) of the window for a person to look at, under build/<dir>/screenshots/: the emulator streaming (root and a drilled-down pane), a replay finished, and a lost service with its stale rows.
#include "App/NavigationController.h"
#include "App/VantorelApp.h"
#include "Model/VantorelModel.h"
#include "PaneTestSupport.h"
#include "Platform/Preferences.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Dictionary.h"
#include "support/EventLoopWait.h"
#include "support/FakeTelephonyService.h"

#include <QDir>
#include <QMainWindow>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

void shoot(VantorelApp& app, const char* file) {
    QDir().mkpath(VANTOREL_SCREENSHOT_DIR);
    spin(300);
    EXPECT_TRUE(app.window()->grab().save(QDir(VANTOREL_SCREENSHOT_DIR).filePath(file), "PNG"));
}

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
