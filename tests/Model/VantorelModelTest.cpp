// Tests for VantorelModel against a scriptable telephony service on its own thread: start-up failures and the retry, the display tick, invalidation and restart.
#include "Model/VantorelModel.h"

#include "Model/ApplicationObject.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/FakeTelephonyService.h"
#include "support/FastMonitorClock.h"

#include <QElapsedTimer>
#include <gtest/gtest.h>

#include <functional>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

class CountingApplication : public ApplicationObject {
public:
    void updateViewControllerFromModel() override { ++updates; }
    int updates = 0;
};

class VantorelModelTest : public ::testing::Test {
protected:
    VantorelModelTest() { FastMonitorClock::installed(); }

    FakeTelephonyService service;
    CountingApplication app;
    SystemLogCapture capture;

    std::unique_ptr<VantorelModel> runningModel() {
        auto model = std::make_unique<VantorelModel>(&app, service.name());
        model->startMonitor();
        EXPECT_TRUE(model->isRunning());
        return model;
    }
    int count(const std::string& line) { return capture.count(SystemLog::kError, line); }
    // 0xD0E0: byte 13 validity = 1, byte 14 the RRC mode.
    static Bytes rrcRecord(uint8_t mode) { return RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, mode).build(); }
};

}  // namespace

TEST_F(VantorelModelTest, EachFailedStartLogsWhyAndRetriesAfterTheDelayUntilTheServiceAnswers) {
    const struct {
        FakeServiceBehaviour spoilt;
        const char* line;
    } rows[] = {
        {{.channelErrorCode = 12}, "_TSServerConnectionNetworkMonitorCreateLogChannel returns error: 12!"},
        {{.emptyPortName = true}, "Could not create a log channel (TS returned null port)!"},
        {{.technology = "kTSLogChannelTechnology_Morvek_WiMAX"}, "No log generator technology works"},
        {{.answerWithPlist = false}, " ***** Could not parse reply to GetTechnology; cannot configure"},
        {{.answerHasTechnology = false}, " ***** Reply to GetTechnology had no answer; cannot configure"},
        {{.answerGetTechnology = false}, " ***** Could not send the GetTechnology command (got error=-2)"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        service.setBehaviour(row.spoilt);
        capture.clear();
        VantorelModel model(&app, service.name());
        QElapsedTimer sinceFailure;
        model.startMonitor();
        sinceFailure.start();
        EXPECT_EQ(count(row.line), 1);
        EXPECT_FALSE(model.isConnected());  // the failed ports are closed again
        service.setBehaviour(FakeServiceBehaviour());
        ASSERT_TRUE(waitUntil([&] { return model.isRunning(); }, 3000));
        EXPECT_GE(sinceFailure.elapsed(), FastMonitorClock::kRetry.count() - 5);
    }
    VantorelModel orphan(&app, uniquePortName("nobody"));  // no service at all
    orphan.startMonitor();
    EXPECT_EQ(count("Could not create TSServerConnection"), 1);
    ASSERT_TRUE(waitUntil([&] { return count("Could not create TSServerConnection") >= 3; }, 3000));
}

TEST_F(VantorelModelTest, EachStartSendsTheDecodersStartCommandFromAFreshReceivePort) {
    auto model = runningModel();
    model->startMonitor();  // running already: nothing happens
    EXPECT_EQ(service.channelsCreated(), 1);
    model->restartMonitor();
    ASSERT_TRUE(waitUntil([&] { return service.startCommands().size() == 2; }, 2000));
    EXPECT_EQ(*service.startCommands()[1].asDictionary()->get("SetState").asString(), "Streaming");
    ASSERT_EQ(service.clientPortNames().size(), 2u);
    EXPECT_NE(service.clientPortNames()[0], service.clientPortNames()[1]);
}

TEST_F(VantorelModelTest, OnlyMessageIdZeroReachesTheDecoderAndATickRefreshesOnlyAfterNewData) {
    auto model = runningModel();
    NodeRef first = model->topLevelNodes();
    spin(200);  // five ticks, no data
    EXPECT_EQ(app.updates, 0);
    EXPECT_EQ(model->topLevelNodes(), first);  // the cached tree

    ASSERT_TRUE(service.send(rrcRecord(3), 7));
    ASSERT_TRUE(service.send(rrcRecord(2), 0));
    ASSERT_TRUE(waitUntil([&] { return app.updates == 1; }, 2000));
    EXPECT_EQ(model->messagesDecoded(), 1u);
    EXPECT_NE(model->topLevelNodes(), first);
    for (int i = 0; i < 20; ++i) service.send(rrcRecord(3));
    ASSERT_TRUE(waitUntil([&] { return app.updates >= 2; }, 2000));
    spin(200);
    EXPECT_EQ(app.updates, 2);  // many messages, one refresh
}

TEST_F(VantorelModelTest, AServiceNotificationRefreshesWithoutWaitingForTheTick) {
    FastMonitorClock& clock = FastMonitorClock::installed();
    clock.tick = std::chrono::seconds(60);
    auto model = runningModel();
    clock.tick = FastMonitorClock::kTick;
    int ticks = 0;
    QObject::connect(model.get(), &VantorelModel::displayTicked, [&] { ++ticks; });
    model->updateWithData(rrcRecord(1));
    service.notify("BackendStateChanged");
    EXPECT_TRUE(waitUntil([&] { return app.updates == 1; }, 2000));
    // Samples keep the timer's pace: the data the notification showed is sampled at the next tick, once.
    EXPECT_EQ(ticks, 0);
    model->refresh();  // the display timer's tick
    model->refresh();
    EXPECT_EQ(ticks, 1);
}

TEST_F(VantorelModelTest, ClosingThePortsOnPurposeNeverRestartsButLosingThemAlwaysDoes) {
    auto model = runningModel();
    model->destroyPorts();
    spin(300);
    EXPECT_EQ(service.channelsCreated(), 1);

    model->startMonitor();
    ASSERT_TRUE(service.send(rrcRecord(2)));  // a peer counts once it has sent a frame
    ASSERT_TRUE(waitUntil([&] { return model->messagesDecoded() == 1; }, 2000));
    service.dropClient();  // the receive port is invalidated from outside
    ASSERT_TRUE(waitUntil([&] { return service.channelsCreated() == 3 && model->isRunning(); }, 3000));

    service.closeChannelPort();  // the send port dies: noticed at the next tick
    ASSERT_TRUE(waitUntil([&] { return service.channelsCreated() == 4 && model->isRunning(); }, 3000));
}

TEST_F(VantorelModelTest, ARestartKeepsTheHistoryAndTheNewDecoderBuildsADisplayOfItsOwn) {
    auto model = runningModel();
    service.send(rrcRecord(3));
    ASSERT_TRUE(waitUntil([&] { return app.updates == 1; }, 2000));
    model->topLevelNodes();  // builds the display and the history entry
    ASSERT_TRUE(model->state().get("History").asArray());
    const Value history = model->state().get("History").deepCopy();

    model->restartMonitor();
    EXPECT_EQ(model->state().get("History"), history);
    // Two refreshes: the first builds the new display, the second shows the record.
    for (int refresh = 2; refresh <= 3; ++refresh) {
        service.send(rrcRecord(2));
        ASSERT_TRUE(waitUntil([&] { return app.updates >= refresh; }, 2000));
        model->topLevelNodes();
    }
    NodeRef state = model->nodeAtPath("/Serving Cell/RRC Info/State");
    EXPECT_TRUE(state && *state->value() == "Cell Fach");
}

TEST_F(VantorelModelTest, TheSourceStateFollowsTheBackendAndALostChannelAtOnce) {
    using Phase = SourceStatus::Phase;
    FastMonitorClock& clock = FastMonitorClock::installed();
    auto model = runningModel();
    model->setSource("service vt", false, false);
    auto info = Dictionary::create();
    auto codes = Array::create();
    codes->append(Value(kTSLogChannelTechnology_Morvek_LTE));
    info->set("State", "Streaming");
    info->set("Source", "replay lte.qmdl");
    info->set("Sent", Value::integer(40));
    info->set("Total", Value::integer(80));
    info->set("LogTechnologies", Value(codes));
    service.notify("BackendStateChanged", Value(info));
    ASSERT_TRUE(waitUntil([&] { return model->sourceStatus().sent == 40; }, 2000));
    EXPECT_EQ(model->sourceStatus().source, "replay lte.qmdl");
    EXPECT_FALSE(model->sourceStatus().noRecordForDecoder);

    // Ten seconds of LTE records for the UTRAN decoder: reported, and the view told.
    const int updates = app.updates;
    clock.frozen = std::chrono::system_clock::now() + VantorelModel::kNoRecordWait + std::chrono::seconds(1);
    ASSERT_TRUE(waitUntil([&] { return app.updates > updates; }, 2000));
    EXPECT_TRUE(model->sourceStatus().noRecordForDecoder);
    clock.frozen.reset();

    service.send(rrcRecord(3));
    ASSERT_TRUE(waitUntil([&] { return model->messagesDecoded() == 1; }, 2000));
    spin(300);  // the record's refresh is over
    const int beforeEnd = app.updates;
    info->set("State", "Finished");
    service.notify("BackendStateChanged", Value(info));
    ASSERT_TRUE(waitUntil([&] { return model->sourceStatus().phase == Phase::Finished; }, 2000));
    EXPECT_EQ(model->sourceStatus().forDecoder, 1u);
    // The end of the stream refreshes the view by itself, with no new data.
    EXPECT_TRUE(waitUntil([&] { return app.updates > beforeEnd; }, 2000));

    service.setBehaviour({.channelErrorCode = 5});  // the service will not take us back
    service.closeChannelPort();
    ASSERT_TRUE(waitUntil([&] { return model->sourceStatus().phase == Phase::Disconnected; }, 2000));
    EXPECT_TRUE(model->sourceStatus().disconnectedAt.isValid());
    spin(300);  // retries fail: still stale
    EXPECT_EQ(model->sourceStatus().phase, Phase::Disconnected);
}

TEST_F(VantorelModelTest, ValuesShownGoStaleWhenTheStreamFreezesOrTheModemGoesAwayButNotBeforeAnyCame) {
    using Phase = SourceStatus::Phase;
    FastMonitorClock& clock = FastMonitorClock::installed();
    auto failed = Dictionary::create();
    failed->set("State", "Failed");
    failed->set("Problem", "device /dev/ttyUSB0: the device went away");
    const struct {
        const char* what;
        bool recordFirst;
        std::function<void()> happen;
        bool frozen;
        const char* problem;
    } rows[] = {
        {"a frozen stream", true, [&] { clock.frozen = std::chrono::system_clock::now() + VantorelModel::kFrozenWait + std::chrono::seconds(1); },
         true, ""},
        {"an unplugged modem", true, [&] { service.notify("BackendStateChanged", Value(failed)); }, false,
         "device /dev/ttyUSB0: the device went away"},
        {"a source that failed before sending", false, [&] { service.notify("BackendStateChanged", Value(failed)); },
         false, "device /dev/ttyUSB0: the device went away"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        auto model = runningModel();
        if (row.recordFirst) {
            service.send(rrcRecord(3));
            ASSERT_TRUE(waitUntil([&] { return model->messagesDecoded() == 1; }, 2000));
        }
        const int updates = app.updates;
        spin(100);
        EXPECT_FALSE(model->sourceStatus().frozen);  // records came a moment ago
        row.happen();
        ASSERT_TRUE(waitUntil([&] { return app.updates > updates && model->sourceStatus().backendProblem == row.problem; }, 2000));
        const SourceStatus status = model->sourceStatus();
        EXPECT_EQ(status.phase, Phase::Streaming);
        EXPECT_EQ(status.frozen, row.frozen);
        EXPECT_EQ(status.lastDataAt.isValid(), row.recordFirst);  // what the stale line says "no data since"
        clock.frozen.reset();
        if (!row.recordFirst) continue;
        service.send(rrcRecord(2));  // data again: no longer frozen
        ASSERT_TRUE(waitUntil([&] { return !model->sourceStatus().frozen && model->messagesDecoded() == 2; }, 2000));
    }
}

TEST_F(VantorelModelTest, TheRecordsTheServiceDroppedAddUpOverItsChannels) {
    auto model = runningModel();
    auto dropped = [](int64_t n) {
        auto info = Dictionary::create();
        info->set("Dropped", Value::integer(n));
        return Value(info);
    };
    service.notifyChannel("ChannelStatus", dropped(1200));
    ASSERT_TRUE(waitUntil([&] { return model->sourceStatus().dropped == 1200; }, 2000));
    service.notifyChannel("SomethingElse", dropped(99999));  // not ours
    service.notifyChannel("ChannelStatus", dropped(-5));     // nonsense
    service.notifyChannel("ChannelStatus", dropped(1300));
    ASSERT_TRUE(waitUntil([&] { return model->sourceStatus().dropped == 1300; }, 2000));
    service.closeChannelPort();  // a new channel, whose service counts from zero
    ASSERT_TRUE(waitUntil([&] { return service.channelsCreated() == 2 && model->isRunning(); }, 3000));
    service.notifyChannel("ChannelStatus", dropped(7));
    EXPECT_TRUE(waitUntil([&] { return model->sourceStatus().dropped == 1307; }, 2000));
}

TEST_F(VantorelModelTest, AStartThatKeepsFailingSaysWhyAndGoesOnTrying) {
    const std::string nobody = uniquePortName("nobody");
    const struct {
        std::string port;
        FakeServiceBehaviour spoilt;
        std::string problem;
    } rows[] = {
        {nobody, {}, "nothing serves port " + nobody},
        {service.name(), {.channelErrorCode = 3}, "the service on port " + service.name() + " could not start its source"},
        {service.name(), {.technology = "kTSLogChannelTechnology_Morvek_WiMAX"},
         "the service on port " + service.name() + " did not tell a technology this monitor decodes"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.problem);
        service.setBehaviour(row.spoilt);
        capture.clear();
        app.updates = 0;
        VantorelModel model(&app, row.port);
        model.startMonitor();
        EXPECT_EQ(model.sourceStatus().connectProblem, "");  // one failure may be a service still starting
        ASSERT_TRUE(waitUntil([&] { return app.updates > 0; }, 2000));  // the view is told at once
        EXPECT_EQ(model.sourceStatus().connectProblem, row.problem);
        EXPECT_EQ(model.sourceStatus().retryDelay, FastMonitorClock::kRetry);
        const int attempts = count("Could not create the ports necessary") + count("No log generator technology works");
        EXPECT_TRUE(waitUntil([&] {
            return count("Could not create the ports necessary") + count("No log generator technology works") > attempts + 1;
        }, 2000));
        EXPECT_EQ(app.updates, 1);  // the same cause is said once
        if (row.port != service.name()) continue;
        service.setBehaviour(FakeServiceBehaviour());
        ASSERT_TRUE(waitUntil([&] { return model.isRunning(); }, 3000));
        EXPECT_EQ(model.sourceStatus().connectProblem, "");
    }
}
