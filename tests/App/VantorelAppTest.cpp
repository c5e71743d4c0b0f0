// Tests for VantorelApp (Part 1.1) on real widgets offscreen, against a telephony service on its own thread; the model's 5 s and 2 s scaled by 1/50.
#include "App/VantorelApp.h"

#include "App/NavigationController.h"
#include "App/VantorelPaneController.h"
#include "App/VantorelSaveViewController.h"
#include "Model/VantorelModel.h"
#include "Platform/Preferences.h"
#include "Platform/RecordBuilder.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/EventLoopWait.h"
#include "support/FakeTelephonyService.h"

#include <QDir>
#include <QMainWindow>
#include <QPointer>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

// Records the keys of Preferences::shellPreferencesChanged while it lives.
class ShellChanges {
public:
    ShellChanges() {
        connection_ = QObject::connect(&Preferences::instance(), &Preferences::shellPreferencesChanged,
                                       [this](const QString& key) { keys.push_back(key.toStdString()); });
    }
    ~ShellChanges() { QObject::disconnect(connection_); }
    std::vector<std::string> keys;

private:
    QMetaObject::Connection connection_;
};

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
    std::unique_ptr<VantorelApp> launch(bool allowSave = false) {
        VantorelApp::Options options;
        options.source.service = service.name();
        options.allowSave = allowSave;
        options.timeScale = 0.02;
        auto app = std::make_unique<VantorelApp>(options);
        std::string error;
        EXPECT_TRUE(app->applicationDidFinishLaunching(&error)) << error;
        return app;
    }
    // Waits until the model is running and one update reached the panes.
    void waitForUpdate(VantorelApp& app, const Bytes& record) {
        ASSERT_TRUE(waitUntil([&] { return app.model()->isRunning(); }, 3000));
        const std::string before = app.updateMessage();
        service.send(record);
        ASSERT_TRUE(waitUntil([&] { return app.updateMessage() != before && app.updateMessage() != "Connecting..."; }, 3000));
    }
    static Bytes pdpRecord(int contexts) {
        auto list = Array::create();
        for (int i = 0; i < contexts; ++i) {
            auto qos = Dictionary::create();
            qos->set("Traffic Class", "Interactive");
            auto pdp = Dictionary::create();
            pdp->set("APN", i == 0 ? "cmnet" : "cmwap");
            pdp->set("QoS", Value(qos));
            list->append(Value(pdp));
        }
        return RecordBuilder::extraPropertyList(2, Value(list));
    }
    static VantorelPaneController* pushChild(NavigationController& nav, const std::string& name) {
        VantorelPaneController* top = nav.topPane();
        const auto* children = top->node()->childNodes();
        for (size_t row = 0; row < children->size(); ++row)
            if ((*children)[row]->displayName() == name) {
                top->didSelectRowAtIndexPath(static_cast<int>(row));
                return nav.topPane();
            }
        ADD_FAILURE() << "no row " << name << " in " << top->path();
        return nullptr;
    }
};

}  // namespace

TEST_F(VantorelAppTest, WithHSShowGSMRSSIAlreadyTrueNothingIsWrittenAtLaunchOrAtExit) {
    Preferences::setOwnBool(Preferences::kShowGSMRSSI, true);
    ShellChanges changed;
    auto app = launch();
    EXPECT_FALSE(app->unsetRSSI());
    app->applicationWillTerminate();
    EXPECT_TRUE(changed.keys.empty());
    EXPECT_FALSE(Preferences::shellBool(Preferences::kShowGSMRSSI).has_value());
}

TEST_F(VantorelAppTest, WithoutTheRSSIPreferenceTheShellShowsItWhileRunningAndNotAfter) {
    ShellChanges changed;
    auto app = launch();
    EXPECT_TRUE(app->unsetRSSI());
    EXPECT_EQ(Preferences::shellBool(Preferences::kShowGSMRSSI), true);
    app->applicationWillTerminate();
    EXPECT_EQ(Preferences::shellBool(Preferences::kShowGSMRSSI), false);
    EXPECT_EQ(changed.keys, (std::vector<std::string>{"HSShowGSMRSSI", "HSShowGSMRSSI"}));
}

TEST_F(VantorelAppTest, TheRootPanesTitleIsVantorelWhileThereIsNoTreeYet) {
    auto app = launch();
    ASSERT_TRUE(app->navigationController());
    EXPECT_EQ(app->navigationController()->topPane()->title(), "Vantorel");
    EXPECT_EQ(app->navigationController()->topPane()->path(), "/");
}

TEST_F(VantorelAppTest, TheFirstPaneReadsConnectingUntilTheFirstUpdate) {
    auto app = launch();
    VantorelPaneController* root = app->navigationController()->topPane();
    EXPECT_EQ(root->status(), "Connecting");
    EXPECT_TRUE(root->isLoading());
    EXPECT_EQ(app->updateMessage(), "Connecting...");
    waitForUpdate(*app, pdpRecord(1));
    EXPECT_EQ(root->status().rfind("Updated ", 0), 0u) << root->status();
    EXPECT_FALSE(root->isLoading());
}

TEST_F(VantorelAppTest, TheStatusLineReadsConnectingWheneverTheChannelIsDown) {
    auto app = launch();
    waitForUpdate(*app, pdpRecord(1));
    app->model()->destroyPorts();  // the channel is down
    app->updateViewControllerFromModel();
    VantorelPaneController* root = app->navigationController()->topPane();
    EXPECT_EQ(root->status(), "Connecting...");
    EXPECT_TRUE(root->isLoading());
}

TEST_F(VantorelAppTest, WhenADeeperPanesPathVanishesTheStackPopsToItsParentAndPanesAboveAreNotReloaded) {
    auto app = launch();
    waitForUpdate(*app, pdpRecord(2));
    NavigationController& nav = *app->navigationController();
    pushChild(nav, "Packet Data");
    pushChild(nav, "PDP Context Info");
    pushChild(nav, "1");
    QPointer<VantorelPaneController> qos = pushChild(nav, "QoS");
    ASSERT_TRUE(qos);
    EXPECT_EQ(qos->path(), "/Packet Data/PDP Context Info/1/QoS");
    const NodeRef qosNode = qos->node();

    service.send(pdpRecord(1));  // context 1 goes away
    ASSERT_TRUE(waitUntil([&] { return nav.panes().size() == 3; }, 3000));
    EXPECT_EQ(nav.topPane()->path(), "/Packet Data/PDP Context Info");
    EXPECT_EQ(nav.topPane()->node()->childNodes()->size(), 1u);
    if (qos) {
        EXPECT_EQ(qos->node(), qosNode);  // not reloaded before it went
    }
}

TEST_F(VantorelAppTest, PushedPanesShowTheirStatusAndTheSaveScreenOpensOnceAndCloses) {
    auto app = launch(true);
    waitForUpdate(*app, pdpRecord(1));
    app->showSaveView();
    VantorelSaveViewController* first = app->saveViewController();
    ASSERT_TRUE(first);
    app->showSaveView();
    EXPECT_EQ(app->saveViewController(), first);
    app->closeSaveView();
    EXPECT_EQ(app->saveViewController(), nullptr);
}
