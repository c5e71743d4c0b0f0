// Tests for VantorelApp on real widgets offscreen against a scriptable telephony service: the status line, the update walk over the pane stack, the RSSI preference, the save screen.
#include "App/VantorelApp.h"

#include "App/NavigationController.h"
#include "App/VantorelSaveViewController.h"
#include "Model/VantorelModel.h"
#include "PaneTestSupport.h"
#include "Platform/DiagnosticLogDirectory.h"
#include "Platform/Preferences.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Array.h"
#include "support/EventLoopWait.h"
#include "support/FakeTelephonyService.h"

#include <QPointer>
#include <QTemporaryDir>
#include <gtest/gtest.h>

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
