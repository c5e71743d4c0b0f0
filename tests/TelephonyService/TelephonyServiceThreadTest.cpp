// Tests TelephonyServiceThread and TelephonyService start-up: listening on its own thread, start errors (port in use, unknown technology, no scenario, replay without technology), stop joining.
#include "TelephonyService/TelephonyServiceThread.h"

#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/ServiceTestSupport.h"

#include <QThread>
#include <gtest/gtest.h>

#include <atomic>
#include <string>

namespace vantorel {
namespace {

using servicetest::uniquePortName;

TelephonyServiceOptions emulator(const std::string& port) {
    TelephonyServiceOptions options;
    options.portName = port;
    options.emulate = "utran";
    return options;
}

std::string startError(const TelephonyServiceOptions& options) {
    TelephonyServiceThread service(options);
    std::string error;
    EXPECT_FALSE(service.start(&error));
    EXPECT_FALSE(service.isRunning());
    return error;
}

TEST(TelephonyServiceThreadTest, ServiceRunsOnItsOwnThreadAndStopJoins) {
    const std::string port = uniquePortName("service");
    TelephonyServiceThread service(emulator(port));
    std::string error;
    ASSERT_TRUE(service.start(&error)) << error;
    EXPECT_TRUE(service.isRunning());
    EXPECT_EQ(service.portName(), port);
    EXPECT_EQ(service.startupLine(), "listening on " + port +
                                         ", backend emulator (utran scenario, seed 1, tick 500 ms), technology " +
                                         kTSLogChannelTechnology_Morvek_UTRAN2);
    QThread* serviceThread = nullptr;
    ASSERT_TRUE(service.invoke([&](TelephonyService& s) {
        serviceThread = QThread::currentThread();
        EXPECT_TRUE(s.isListening());
    }));
    EXPECT_NE(serviceThread, QThread::currentThread());
    service.stop();
    EXPECT_FALSE(service.isRunning());
    EXPECT_FALSE(service.invoke([](TelephonyService&) {}));
    // The port is free again.
    TelephonyServiceThread again(emulator(port));
    EXPECT_TRUE(again.start());
}

TEST(TelephonyServiceThreadTest, StatusLinesComeFromTheServiceThread) {
    TelephonyServiceThread service(emulator(uniquePortName("service")));
    std::atomic<int> lines{0};
    std::atomic<QThread*> lineThread{nullptr};
    service.setStatusCallback([&](const std::string& line) {
        if (line.rfind("client connected: channel ", 0) != 0) return;
        lineThread = QThread::currentThread();
        ++lines;
    });
    ASSERT_TRUE(service.start());
    servicetest::TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    EXPECT_EQ(lines.load(), 1);
    QThread* serviceThread = nullptr;
    ASSERT_TRUE(service.invoke([&](TelephonyService&) { serviceThread = QThread::currentThread(); }));
    EXPECT_EQ(lineThread.load(), serviceThread);
    EXPECT_NE(lineThread.load(), QThread::currentThread());
}

TEST(TelephonyServiceThreadTest, PortNameInUseFailsToStart) {
    const std::string port = uniquePortName("service");
    TelephonyServiceThread first(emulator(port));
    ASSERT_TRUE(first.start());
    EXPECT_EQ(startError(emulator(port)),
              "cannot listen on port " + port + ": the name is in use (is another service running?)");
    EXPECT_TRUE(first.isRunning());
}

TEST(TelephonyServiceThreadTest, UnknownTechnologyFailsToStart) {
    TelephonyServiceOptions options = emulator(uniquePortName("service"));
    options.emulate = "wimax";
    EXPECT_EQ(startError(options).rfind("unknown technology \"wimax\" (names: ifx, gsm, cdma, lte, utran", 0), 0u);
}

TEST(TelephonyServiceThreadTest, TechnologyWithoutScenarioFailsToStart) {
    TelephonyServiceOptions options = emulator(uniquePortName("service"));
    options.emulate = "gsm";
    EXPECT_EQ(startError(options), "no emulator scenario for gsm yet (available: utran)");
}

TEST(TelephonyServiceThreadTest, ReplayOfAQmdlFileWithoutTechnologyFailsWithTheNames) {
    TelephonyServiceOptions options;
    options.portName = uniquePortName("service");
    options.replay = std::string(VANTOREL_CAPTURES_DIR) + "/qmdl_example.qmdl";
    EXPECT_EQ(startError(options),
              options.replay +
                  " is a QMDL file, which does not say which modem recorded it: --technology TECH is needed (names: "
                  "ifx, gsm, cdma, lte, utran)");
    options.technology = "gsm";
    TelephonyServiceThread service(options);
    std::string error;
    ASSERT_TRUE(service.start(&error)) << error;
    EXPECT_EQ(service.startupLine(),
              "listening on " + options.portName +
                  ", backend replay of qmdl_example.qmdl (QMDL, 336 messages, speed 1), technology " +
                  kTSLogChannelTechnology_Morvek_GSM);
}

TEST(TelephonyServiceThreadTest, MissingReplayFileFailsToStart) {
    TelephonyServiceOptions options;
    options.portName = uniquePortName("service");
    options.replay = "/nonexistent-vantorel.qmdl";
    EXPECT_EQ(startError(options), "/nonexistent-vantorel.qmdl: No such file or directory");
}

TEST(TelephonyServiceThreadTest, BothOrNeitherBackendFailsToStart) {
    TelephonyServiceOptions options;
    options.portName = uniquePortName("service");
    EXPECT_EQ(startError(options), "give exactly one of --emulate TECH and --replay FILE");
    options.emulate = "utran";
    options.replay = "x";
    EXPECT_EQ(startError(options), "give exactly one of --emulate TECH and --replay FILE");
}

TEST(TelephonyServiceThreadTest, UnwritableRecordFileFailsToStartAndFreesThePort) {
    TelephonyServiceOptions options = emulator(uniquePortName("service"));
    options.record = "/nonexistent-dir-of-vantorel/x.vcap";
    EXPECT_EQ(startError(options).rfind("/nonexistent-dir-of-vantorel/x.vcap: ", 0), 0u);
    options.record.clear();
    TelephonyServiceThread service(options);
    EXPECT_TRUE(service.start());
}

}  // namespace
}  // namespace vantorel
