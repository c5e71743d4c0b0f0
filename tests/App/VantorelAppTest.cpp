// Tests for VantorelApp on real widgets offscreen against a scriptable telephony service: the status line, the update walk over the pane stack, the RSSI preference, the save screen.
#include "App/VantorelApp.h"

#include "App/NavigationController.h"
#include "App/VantorelCell.h"
#include "App/VantorelSaveViewController.h"
#include "Model/VantorelModel.h"
#include "PaneTestSupport.h"
#include "Platform/DiagnosticLogDirectory.h"
#include "Platform/Preferences.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Array.h"
#include "support/EventLoopWait.h"
#include "support/FakeTelephonyService.h"

#include <QFile>
#include <QLabel>
#include <QPointer>
#include <QTableWidget>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <functional>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

class VantorelAppTest : public ::testing::Test {
protected:
    QTemporaryDir settings;
    FakeTelephonyService service;

    void SetUp() override {
        Preferences::setDirectory(settings.path().toStdString());
        Preferences::setInternalInstallMarker(settings.filePath("no-marker").toStdString());
    }
    void TearDown() override {
        Preferences::setDirectory("");
        Preferences::setInternalInstallMarker("");
    }
    std::unique_ptr<VantorelApp> launch() {
        VantorelApp::Options options;
        options.source.service = service.name();
        options.allowSave = true;
        auto app = std::make_unique<VantorelApp>(options);
        std::string error;
        EXPECT_TRUE(app->applicationDidFinishLaunching(&error)) << error;
        return app;
    }
    // Sends `record` and waits until the panes were refreshed with it.
    void update(VantorelApp& app, const Bytes& record) {
        ASSERT_TRUE(waitUntil([&] { return app.model()->isRunning(); }, 3000));
        service.send(record);
        ASSERT_TRUE(waitUntil([&] { return app.navigationController()->panes()[0]->status().rfind("Updated ", 0) == 0; }, 3000));
        spin(100);  // two more ticks: the record's display reaches the panes
    }
    // Packet Data / PDP Context Info with `contexts` entries, each with a QoS dictionary.
    static Bytes pdpRecord(int contexts) {
        auto list = Array::create();
        for (int i = 0; i < contexts; ++i) list->append(panetest::dict({{"QoS", panetest::dict({{"Traffic Class", "Interactive"}})}}));
        return RecordBuilder::extraPropertyList(2, Value(list));
    }
};

}  // namespace

TEST_F(VantorelAppTest, TheRootReadsConnectingUntilTheFirstUpdateThenConnectingDotsWhenTheChannelIsDownAndTheSaveScreenOpensOnce) {
    auto app = launch();
    VantorelPaneController* root = app->navigationController()->topPane();
    EXPECT_EQ(root->status(), "Connecting");
    EXPECT_TRUE(root->isLoading());
    update(*app, pdpRecord(1));
    EXPECT_FALSE(root->isLoading());
    app->model()->destroyPorts();
    app->updateViewControllerFromModel();
    EXPECT_EQ(root->status(), "Connecting...");
    EXPECT_TRUE(root->isLoading());

    app->showSaveView();  // the save screen opens once
    VantorelSaveViewController* first = app->saveViewController();
    ASSERT_TRUE(first);
    app->showSaveView();
    EXPECT_EQ(app->saveViewController(), first);
    DiagnosticLogDirectory::setOverride(settings.filePath("logs").toStdString());
    first->savePressed();
    const std::string path = first->lastWritePath();
    app->closeSaveView();
    EXPECT_EQ(app->saveViewController(), nullptr);
    EXPECT_EQ(app->navigationController()->topPane()->status(), "Saved " + path);  // for a few seconds
    DiagnosticLogDirectory::setOverride("");
}

TEST_F(VantorelAppTest, WhenADeeperPanesBranchVanishesTheStackPopsToThePaneBelowIt) {
    auto app = launch();
    update(*app, pdpRecord(2));
    NavigationController& nav = *app->navigationController();
    for (const char* name : {"Packet Data", "PDP Context Info", "1", "QoS"})
        nav.topPane()->didSelectRowAtIndexPath(panetest::rowOf(*nav.topPane(), name));
    QPointer<VantorelPaneController> qos = nav.topPane();
    ASSERT_EQ(qos->path(), "/Packet Data/PDP Context Info/1/QoS");
    const NodeRef qosNode = qos->node();

    service.send(pdpRecord(1));  // context 1 goes away
    ASSERT_TRUE(waitUntil([&] { return nav.panes().size() == 3; }, 3000));
    EXPECT_EQ(nav.topPane()->path(), "/Packet Data/PDP Context Info");
    EXPECT_EQ(nav.topPane()->node()->childNodes()->size(), 1u);  // reloaded
    if (qos) {
        EXPECT_EQ(qos->node(), qosNode);  // not reloaded before it went
    }
}

TEST_F(VantorelAppTest, EveryPaneGreysWhenItsValuesGoStaleAndTheStatusSaysSinceWhen) {
    auto failed = Dictionary::create();
    failed->set("State", "Failed");
    failed->set("Problem", "device /dev/ttyUSB0: the device went away");
    const struct {
        const char* what;
        std::function<void()> happen;
        std::string status;  // how the status line starts
    } rows[] = {
        {"the modem unplugged", [&] { service.notify("BackendStateChanged", Value(failed)); },
         "no data since "},
        {"the service lost", [&] { service.closeChannelPort(); }, "disconnected since "},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        auto app = launch();
        update(*app, pdpRecord(1));
        NavigationController& nav = *app->navigationController();
        nav.topPane()->didSelectRowAtIndexPath(panetest::rowOf(*nav.topPane(), "Packet Data"));
        ASSERT_EQ(nav.panes().size(), 2u);
        if (std::string(row.what) == "the service lost") service.setBehaviour({.channelErrorCode = 5});  // stays lost
        row.happen();
        ASSERT_TRUE(waitUntil([&] { return nav.topPane()->status().rfind(row.status, 0) == 0; }, 3000))
            << nav.topPane()->status();
        for (VantorelPaneController* pane : nav.panes()) {
            EXPECT_TRUE(pane->isStale()) << pane->path();
            for (int row = 0; row < pane->numberOfRowsInSection(); ++row) EXPECT_FALSE(pane->cellAtRow(row)->isEnabled());
        }
        service.setBehaviour(FakeServiceBehaviour());
        app.reset();
    }
}

TEST_F(VantorelAppTest, TheStatusLineShowsTheMessagesTheServiceDropped) {
    auto app = launch();
    update(*app, pdpRecord(1));
    auto info = Dictionary::create();
    info->set("Dropped", Value::integer(1087244));
    service.notifyChannel("ChannelStatus", Value(info));
    EXPECT_TRUE(waitUntil([&] {
        return app->navigationController()->topPane()->status().find(" \u00b7 1087244 messages dropped") != std::string::npos;
    }, 3000)) << app->navigationController()->topPane()->status();
}

TEST_F(VantorelAppTest, ASourceThatCannotStartOrAServiceNobodyRunsIsSaidInTheWindow) {
    QTemporaryDir dir;
    QFile empty(dir.filePath("empty.bin"));
    ASSERT_TRUE(empty.open(QIODevice::WriteOnly));
    empty.close();
    const std::string nobody = uniquePortName("nobody");
    const struct {
        const char* what;
        MonitorLauncher::Source source;
        bool launches;
        std::string says;  // in the status line and the root pane's middle
    } rows[] = {
        {"a replay the service refuses", {.replay = empty.fileName().toStdString()}, false, "empty.bin"},
        {"a service nobody runs", {.service = nobody}, true, "Connecting... nothing serves port " + nobody},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        VantorelApp app(VantorelApp::Options{row.source, false});
        std::string error;
        EXPECT_EQ(app.applicationDidFinishLaunching(&error), row.launches);
        VantorelPaneController* root = app.navigationController()->topPane();
        ASSERT_TRUE(waitUntil([&] { return root->status().find(row.says) != std::string::npos; }, 3000)) << root->status();
        if (!row.launches) EXPECT_EQ(root->status(), error);
        EXPECT_FALSE(root->isLoading() && !row.launches);
        EXPECT_EQ(root->placeholderLabel()->text().toStdString(), root->status());
        EXPECT_TRUE(root->placeholderLabel()->isVisibleTo(root));
        EXPECT_FALSE(root->tableView()->isVisibleTo(root));
        app.applicationWillTerminate();
    }
}
