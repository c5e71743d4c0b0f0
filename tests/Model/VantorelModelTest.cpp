// Tests for VantorelModel (Parts 2.1, 2.2 and the model half of 2.3) against a telephony service on local sockets on its own thread; the 5 s and 2 s constants scaled by 1/50.
#include "Model/VantorelModel.h"

#include "Model/ApplicationObject.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/FakeTelephonyService.h"

#include <QElapsedTimer>
#include <gtest/gtest.h>

#include <set>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

// 5 s → 100 ms, 2.0 s → 40 ms.
constexpr double kScale = 0.02;

class CountingApplication : public ApplicationObject {
public:
    void updateViewControllerFromModel() override { ++updates; }
    int updates = 0;
};

class VantorelModelTest : public ::testing::Test {
protected:
    FakeTelephonyService service;
    CountingApplication app;
    SystemLogCapture capture;

    std::unique_ptr<VantorelModel> makeModel() {
        return std::make_unique<VantorelModel>(&app, service.name(), kScale);
    }
    // Starts the model and waits until its display timer runs.
    std::unique_ptr<VantorelModel> runningModel() {
        auto model = makeModel();
        model->startMonitor();
        EXPECT_TRUE(model->isRunning());
        return model;
    }
    int countLines(const std::string& text) { return capture.count(SystemLog::kError, text); }
    bool anyLineStartsWith(const std::string& prefix) {
        for (const auto& l : capture.lines())
            if (l.text.rfind(prefix, 0) == 0) return true;
        return false;
    }
    static Bytes rrcRecord(uint8_t mode) {
        // 0xD0E0: byte 13 validity = 1, byte 14 the RRC mode.
        return RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, mode).build();
    }
};

}  // namespace

// ---- Part 2.1 -------------------------------------------------------------

TEST_F(VantorelModelTest, AMessageWithANonZeroMessageIdIsDroppedWithoutTouchingTheDecoder) {
    auto model = runningModel();
    ASSERT_TRUE(service.send(rrcRecord(3), 7));
    ASSERT_TRUE(service.send(rrcRecord(2), 0));
    ASSERT_TRUE(waitUntil([&] { return model->messagesDecoded() == 1; }, 2000));
    spin(100);
    EXPECT_EQ(model->messagesDecoded(), 1u);
}

TEST_F(VantorelModelTest, ClosingThePortsThroughDestroyPortsNeverLogsInvalidatedAndNeverRestarts) {
    auto model = runningModel();
    const int channels = service.channelsCreated();
    model->destroyPorts();
    spin(300);
    EXPECT_FALSE(anyLineStartsWith(" ***** INVALIDATED"));
    EXPECT_EQ(service.channelsCreated(), channels);
    EXPECT_FALSE(model->isConnected());
    EXPECT_FALSE(model->isRunning());
}

TEST_F(VantorelModelTest, AnInvalidationFromOutsideAlwaysLogsAndRestarts) {
    auto model = runningModel();
    EXPECT_EQ(service.channelsCreated(), 1);
    // A peer counts once it has sent a frame (docs/protocol.md): one record first.
    ASSERT_TRUE(service.send(rrcRecord(2)));
    ASSERT_TRUE(waitUntil([&] { return model->messagesDecoded() == 1; }, 2000));
    service.dropClient();  // the service closes its connection to our receive port
    ASSERT_TRUE(waitUntil([&] { return service.channelsCreated() == 2 && model->isRunning(); }, 3000));
    EXPECT_TRUE(anyLineStartsWith(" ***** INVALIDATED "));
}

TEST_F(VantorelModelTest, DestroyPortsOnAModelThatNeverConnectedDoesNothingAndDoesNotFail) {
    auto model = makeModel();
    model->destroyPorts();
    model->destroyPorts();
    EXPECT_FALSE(model->isConnected());
    EXPECT_TRUE(capture.lines().empty());
}

TEST_F(VantorelModelTest, TwoSuccessiveConnectionsUseTwoDifferentReceivePortNames) {
    auto model = runningModel();
    model->restartMonitor();
    ASSERT_TRUE(model->isRunning());
    auto names = service.clientPortNames();
    ASSERT_EQ(names.size(), 2u);
    EXPECT_NE(names[0], names[1]);
    for (const auto& n : names) EXPECT_EQ(n.rfind("VantorelApp.", 0), 0u) << n;
    EXPECT_EQ(names[1].size(), std::string("VantorelApp.").size() + 36);  // a UUID in its standard text form
}

TEST_F(VantorelModelTest, CreatedPortsAreLoggedAndTheChannelCountsAsConnected) {
    auto model = runningModel();
    EXPECT_TRUE(model->isConnected());
    EXPECT_TRUE(anyLineStartsWith(" ***** Created ports (send="));
    EXPECT_EQ(countLines("Starting the display update timer"), 1);
}

TEST_F(VantorelModelTest, NoServiceLogsCouldNotCreateTSServerConnectionAndRetries) {
    VantorelModel model(&app, "vantorel.test.nobody." + std::to_string(getpid()), kScale);
    model.startMonitor();
    EXPECT_EQ(countLines("Could not create TSServerConnection"), 1);
    EXPECT_EQ(countLines("Could not create the ports necessary"), 1);
    ASSERT_TRUE(waitUntil([&] { return countLines("Could not create TSServerConnection") >= 3; }, 3000));
    EXPECT_FALSE(model.isRunning());
}

TEST_F(VantorelModelTest, ALogChannelErrorIsLoggedWithItsCode) {
    FakeTelephonyService::Behaviour b;
    b.channelErrorCode = 12;
    service.setBehaviour(b);
    auto model = makeModel();
    model->startMonitor();
    EXPECT_EQ(countLines("_TSServerConnectionNetworkMonitorCreateLogChannel returns error: 12!"), 1);
    EXPECT_FALSE(model->isRunning());
}

TEST_F(VantorelModelTest, AnEmptyChannelPortNameIsLoggedAsANullPort) {
    FakeTelephonyService::Behaviour b;
    b.emptyPortName = true;
    service.setBehaviour(b);
    auto model = makeModel();
    model->startMonitor();
    EXPECT_EQ(countLines("Could not create a log channel (TS returned null port)!"), 1);
}

// ---- Part 2.2 -------------------------------------------------------------

TEST_F(VantorelModelTest, AnUnknownTechnologyIdentifierLeadsToNoLogGeneratorAndARetryEvery5sForever) {
    FakeTelephonyService::Behaviour b;
    b.technology = "kTSLogChannelTechnology_Morvek_WiMAX";
    service.setBehaviour(b);
    auto model = makeModel();
    QElapsedTimer timer;
    timer.start();
    model->startMonitor();
    EXPECT_EQ(countLines("No log generator technology works"), 1);
    EXPECT_TRUE(anyLineStartsWith("Got log generated: "));
    ASSERT_TRUE(waitUntil([&] { return countLines("No log generator technology works") >= 4; }, 5000));
    // Three retries, each no sooner than the scaled 5 s after the failure before it.
    EXPECT_GE(timer.elapsed(), 3 * 100);
    EXPECT_FALSE(model->isRunning());
    EXPECT_EQ(model->logGenerator(), nullptr);
}

TEST_F(VantorelModelTest, AModemThatNeverAnswersTheQueryCostsItsTimeoutsThenARetry) {
    FakeTelephonyService::Behaviour b;
    b.answerGetTechnology = false;
    service.setBehaviour(b);
    auto model = makeModel();
    QElapsedTimer timer;
    timer.start();
    model->startMonitor();
    const qint64 blocked = timer.elapsed();
    EXPECT_GE(blocked, 1000);  // at least the 1.0 s receive timeout, on this thread
    EXPECT_EQ(countLines(" ***** Could not send the GetTechnology command (got error=-2)"), 1);
    EXPECT_EQ(countLines("No log generator technology works"), 1);
    service.setBehaviour(FakeTelephonyService::Behaviour());
    ASSERT_TRUE(waitUntil([&] { return model->isRunning(); }, 6000));
    EXPECT_GE(service.getTechnologyRequests(), 2);
}

TEST_F(VantorelModelTest, AReplyThatIsNotAPropertyListOrHasNoAnswerIsLogged) {
    FakeTelephonyService::Behaviour b;
    b.answerWithPlist = false;
    service.setBehaviour(b);
    auto model = makeModel();
    model->startMonitor();
    EXPECT_EQ(countLines(" ***** Could not parse reply to GetTechnology; cannot configure"), 1);
    b.answerWithPlist = true;
    b.answerHasTechnology = false;
    service.setBehaviour(b);
    model->restartMonitor();
    EXPECT_EQ(countLines(" ***** Reply to GetTechnology had no answer; cannot configure"), 1);
}

TEST_F(VantorelModelTest, TheStartCommandAsksForTheDecodersCodes) {
    auto model = runningModel();
    ASSERT_TRUE(waitUntil([&] { return !service.startCommands().empty(); }, 2000));
    DictionaryRef command = service.startCommands()[0].asDictionary();
    EXPECT_EQ(*command->get("SetState").asString(), "Streaming");
    std::set<int64_t> extra;
    for (const Value& v : *command->get("SetTsExtraCodes").asArray()) extra.insert(*v.asInteger());
    EXPECT_EQ(extra, (std::set<int64_t>{0, 1, 2}));
    EXPECT_EQ(command->get("SetMorvekLogCodes").asArray()->size(), 5u);
}

TEST_F(VantorelModelTest, WithNoMessageDecodedSinceThePreviousTickATickNeitherRebuildsTheTreeNorUpdatesTheScreen) {
    auto model = runningModel();
    NodeRef first = model->topLevelNodes();
    spin(200);  // five scaled ticks, no data
    EXPECT_EQ(app.updates, 0);
    EXPECT_EQ(model->topLevelNodes(), first);  // the same cached tree

    ASSERT_TRUE(service.send(rrcRecord(2)));
    ASSERT_TRUE(waitUntil([&] { return app.updates == 1; }, 2000));
    EXPECT_NE(model->topLevelNodes(), first);
    for (int i = 0; i < 20; ++i) service.send(rrcRecord(3));
    ASSERT_TRUE(waitUntil([&] { return app.updates >= 2; }, 2000));
    spin(200);
    EXPECT_EQ(app.updates, 2);  // many messages, one refresh
}

TEST_F(VantorelModelTest, ASendPortThatDiesWhileRunningIsNoticedAtTheNextTickAndLeadsToAFullRestart) {
    auto model = runningModel();
    service.closeChannelPort();
    ASSERT_TRUE(waitUntil([&] { return anyLineStartsWith(" ***** INVALIDATED "); }, 1000));
    ASSERT_TRUE(waitUntil([&] { return service.channelsCreated() == 2 && model->isRunning(); }, 3000));
    EXPECT_GE(service.getTechnologyRequests(), 2);
}

TEST_F(VantorelModelTest, StartMonitorWhileRunningDoesNothing) {
    auto model = runningModel();
    const size_t lines = capture.lines().size();
    model->startMonitor();
    EXPECT_EQ(capture.lines().size(), lines);
    EXPECT_EQ(service.channelsCreated(), 1);
}

TEST_F(VantorelModelTest, AfterARestartTheNewDecoderFindsThePreviousStateDictionaryWithItsHistoryUntouched) {
    auto model = runningModel();
    service.send(rrcRecord(3));
    ASSERT_TRUE(waitUntil([&] { return model->messagesDecoded() == 1; }, 2000));
    model->topLevelNodes();
    model->refresh();
    model->topLevelNodes();
    ArrayRef before = model->state().get("History").asArray();
    ASSERT_TRUE(before);
    const Value snapshot = Value(before).deepCopy();
    LogGenerator* oldDecoder = model->logGenerator();

    model->restartMonitor();
    ASSERT_TRUE(model->isRunning());
    EXPECT_NE(model->logGenerator(), oldDecoder);
    EXPECT_EQ(model->state().get("History").asArray().get(), before.get());
    EXPECT_EQ(Value(model->state().get("History").asArray()), snapshot);

    // The new decoder shows new records (its sections are bound to a display of its own).
    service.send(rrcRecord(2));
    ASSERT_TRUE(waitUntil([&] { return app.updates >= 1; }, 2000));
    model->topLevelNodes();
    service.send(rrcRecord(2));
    ASSERT_TRUE(waitUntil([&] { return app.updates >= 2; }, 2000));
    NodeRef state = model->nodeAtPath("/Serving Cell/RRC Info/State");
    ASSERT_TRUE(state);
    EXPECT_EQ(*state->value(), "Cell Fach");
}

TEST_F(VantorelModelTest, AServiceNotificationSendsRefresh) {
    auto model = runningModel();
    model->updateWithData(rrcRecord(1));  // marks _updated as the receive callback would
    service.notify("BackendStateChanged");
    ASSERT_TRUE(waitUntil([&] { return app.updates == 1; }, 1000));
}

// ---- Part 2.3, model half --------------------------------------------------

TEST_F(VantorelModelTest, WithoutADecoderThereAreNoNodesAndNoSaveContents) {
    auto model = makeModel();
    EXPECT_EQ(model->topLevelNodes(), nullptr);
    EXPECT_EQ(model->nodeAtPath("/"), nullptr);
    EXPECT_TRUE(model->getSaveContents().isNull());
}

TEST_F(VantorelModelTest, NodeAtPathOfAPathThatNoLongerExistsAfterARebuildReturnsNull) {
    auto model = runningModel();
    // The first generation builds the display and returns null: a root leaf "(unknown)".
    NodeRef root = model->topLevelNodes();
    ASSERT_TRUE(root->value());
    EXPECT_EQ(*root->value(), "(unknown)");
    auto pdp = Dictionary::create();
    pdp->set("APN", "cmnet");
    service.send(RecordBuilder::extraPropertyList(2, Value(Array::of({Value(pdp), Value(pdp)}))));
    ASSERT_TRUE(waitUntil([&] { return app.updates == 1; }, 2000));
    ASSERT_TRUE(model->nodeAtPath("/Packet Data/PDP Context Info/1"));
    service.send(RecordBuilder::extraPropertyList(2, Value(Array::of({Value(pdp)}))));
    ASSERT_TRUE(waitUntil([&] { return app.updates == 2; }, 2000));
    EXPECT_EQ(model->nodeAtPath("/Packet Data/PDP Context Info/1"), nullptr);
    EXPECT_TRUE(model->nodeAtPath("/Packet Data/PDP Context Info/0"));
}

TEST_F(VantorelModelTest, SaveContentsAreTheDecodersHistoryAndDlf) {
    auto model = runningModel();
    service.send(rrcRecord(3));
    ASSERT_TRUE(waitUntil([&] { return app.updates == 1; }, 2000));
    model->topLevelNodes();
    ArrayRef contents = model->getSaveContents().asArray();
    ASSERT_TRUE(contents);
    ASSERT_GE(contents->size(), 2u);
    EXPECT_EQ(contents->at(contents->size() - 1).asDictionary()->get("Description").asString()->rfind("DLF binary (", 0),
              0u);
}
