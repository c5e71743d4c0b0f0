// Tests the live-modem path against the fake DIAG modem on a pseudo-terminal: the handshake and log mask, faults a modem or a wrong port shows, unplugging, a move to another technology, session after session with measurements, one service per modem, and the programs end to end.
#include "Model/ApplicationObject.h"
#include "Model/DisplayPath.h"
#include "Model/VantorelModel.h"
#include "Monitor/MonitorLauncher.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Device/DeviceBackend.h"
#include "TelephonyService/Device/DiagSession.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/ReplayBackend.h"
#include "TelephonyService/ServiceTestSupport.h"
#include "fakediag/FakeDiagModem.h"
#include "support/FastMonitorClock.h"

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <set>

namespace vantorel {
namespace {

using servicetest::morvekRecord;
using testing::waitUntil;

Bytes hex(const char* text) {
    Bytes out;
    for (const QString& b : QString(text).split(' ', Qt::SkipEmptyParts)) out.push_back(static_cast<uint8_t>(b.toUInt(nullptr, 16)));
    return out;
}

// The given records again and again, one every 10 ms.
std::unique_ptr<ModemBackend> looping(const std::vector<uint16_t>& codes) {
    std::vector<Bytes> records;
    std::vector<int64_t> times;
    for (uint16_t code : codes) {
        records.push_back(morvekRecord(code, 0, {1, 2, 3, 4}));
        times.push_back(1700000000000000 + int64_t(times.size()) * 10000);
    }
    return std::make_unique<ReplayBackend>(servicetest::streamOf(records, times), 1.0, true, "test");
}

std::vector<std::unique_ptr<ModemBackend>> sources(std::vector<std::vector<uint16_t>> each) {
    std::vector<std::unique_ptr<ModemBackend>> list;
    for (const auto& codes : each) list.push_back(looping(codes));
    return list;
}

// A device backend on the fake modem, with the codes its records carried.
struct Host {
    DeviceBackend backend;
    std::multiset<uint16_t> codes;
    Host(const std::string& path, const std::string& technology) : backend(path, technology) {
        QObject::connect(&backend, &ModemBackend::messageReady, [this](int32_t, const Bytes& data) {
            if (const auto kind = LogMask::classify(data)) codes.insert(kind->code);
        });
    }
    bool streaming(int ms = 3000) {
        return waitUntil([&] { return backend.state() == ModemBackend::State::Streaming; }, ms);
    }
};

const std::vector<Bytes> kClearing = {hex("60 00"), hex("73 00 00 00 00 00 00 00"), hex("7D 05 00 00 00 00 00 00")};

TEST(FakeDiagModem, AnswersAsAModemAndKeepsTheMaskItWasGiven) {
    DiagResponder modem;
    struct Row {
        const char* what;
        Bytes request;
        Bytes replyStart;
        std::function<bool(const DiagResponder&)> after;
    };
    Bytes lteMask = DiagCommand::setMask(0xB, 0x400, {0x0C2, 0x301});  // asks for more items than the modem has
    Bytes shortMask = DiagCommand::setMask(0xB, 0x300, {0x0C1});
    shortMask.pop_back();
    const std::vector<Row> rows = {
        {"unknown opcode", hex("4B 0F 00 00"), hex("13 4B 0F 00 00"), nullptr},
        {"unknown log-configuration op", hex("73 00 00 00 07 00 00 00"), hex("14 73 00 00 00 07"), nullptr},
        {"set-mask one byte short", shortMask, hex("15 73"), [](auto& m) { return !m.logging(); }},
        {"ranges", DiagCommand::logConfig(1), hex("73 00 00 00 01 00 00 00 00 00 00 00 00 00 00 00 00 10 00 00"), nullptr},
        {"set-mask beyond the items is clamped", lteMask, hex("73 00 00 00 03 00 00 00 00 00 00 00 0B 00 00 00 00 03"),
         [](auto& m) { return m.enabled(0xB0C2) && !m.enabled(0xB301) && !m.enabled(0xB0C1); }},
        {"a second set-mask replaces the first", DiagCommand::setMask(0xB, 0x300, {0x0C1}), hex("73"),
         [](auto& m) { return m.enabled(0xB0C1) && !m.enabled(0xB0C2); }},
        {"an equipment without items", DiagCommand::setMask(2, 8, {1}), hex("73 00 00 00 03 00 00 00 02 00 00 00"),
         [](auto& m) { return !m.enabled(0x2001) && m.enabled(0xB0C1); }},
        {"op 0 clears every mask", DiagCommand::logConfig(0), hex("73 00 00 00 00 00 00 00 00 00 00 00"),
         [](auto& m) { return !m.logging(); }},
    };
    for (const Row& row : rows) {
        const Bytes reply = modem.answer(row.request);
        ASSERT_GE(reply.size(), row.replyStart.size()) << row.what;
        EXPECT_EQ(Bytes(reply.begin(), reply.begin() + long(row.replyStart.size())), row.replyStart) << row.what;
        if (row.after) {
            EXPECT_TRUE(row.after(modem)) << row.what;
        }
    }
    // What a host reads from the version and build-ID replies.
    EXPECT_GE(modem.answer(DiagCommand::version()).size(), 47u);
    EXPECT_EQ(DiagCommand::buildIdOf(modem.answer(DiagCommand::buildId())), "VANTOREL.FAKEDIAG.1.0");
}

TEST(LiveModem, TheHandshakeEnablesTheWantedCodesOnlyAndStoppingLeavesTheModemQuiet) {
    FakeDiagModem modem(sources({{0xB0C2, 0xB0C0, 0x7130}}), {});
    std::string error;
    ASSERT_TRUE(modem.open(&error)) << error;
    Host host(modem.path(), "");
    host.backend.setLogCodes(std::set<uint16_t>{0xB0C2, 0x7130});
    host.backend.start();
    ASSERT_TRUE(host.streaming()) << host.backend.problem();
    EXPECT_EQ(host.backend.session()->buildId(), "VANTOREL.FAKEDIAG.1.0");
    // The clients' codes, and every technology's serving-cell codes to learn where the modem is.
    for (uint16_t code : {0xB0C2, 0x7130, 0xB0C1, 0x4127, 0x5134, 0x119C, 0x1183, 0xD0E2})
        EXPECT_TRUE(modem.responder().enabled(code)) << std::hex << code;
    EXPECT_FALSE(modem.responder().enabled(0xB0C0));
    ASSERT_TRUE(waitUntil([&] { return host.codes.count(0xB0C2) >= 3 && host.codes.count(0x7130) >= 3; }));
    EXPECT_EQ(host.codes.count(0xB0C0), 0u);

    // A change of the clients' codes is a change of the modem's mask, not a new handshake;
    // the serving-cell codes stay.
    const size_t before = modem.requests().size();
    host.backend.setLogCodes(std::set<uint16_t>{0xB0C0});
    ASSERT_TRUE(waitUntil([&] { return modem.responder().enabled(0xB0C0) && !modem.responder().enabled(0x7130); }));
    EXPECT_TRUE(modem.responder().enabled(0xB0C2));
    EXPECT_LE(modem.requests().size() - before, 2u) << "only equipments 0xB and 7 change";

    // A client back while the modem is still answering the clearing sequence: the port opens
    // anew once the modem has answered, with the whole handshake.
    host.backend.stop();
    host.backend.start();
    ASSERT_TRUE(host.streaming()) << host.backend.problem();
    EXPECT_TRUE(modem.responder().enabled(0xB0C0));
    EXPECT_TRUE(modem.responder().logging());

    host.backend.stop();
    host.backend.finishStopping(3000);
    EXPECT_FALSE(modem.responder().logging());
    EXPECT_EQ(host.backend.session(), nullptr) << "the port is closed once the modem answered";
    ASSERT_GE(modem.requests().size(), 3u);
    EXPECT_EQ(std::vector<Bytes>(modem.requests().end() - 3, modem.requests().end()), kClearing);
    EXPECT_EQ(std::vector<Bytes>(modem.requests().begin(), modem.requests().begin() + 3), kClearing)
        << "a session starts by clearing what an older one left";
}

TEST(LiveModem, ModemFaultsAreSurvivedAndAPortThatIsNotDiagIsNamed) {
    using F = FakeDiagModem::Fault;
    struct Row {
        const char* what;
        std::set<F> faults;
        std::function<void(FakeDiagModem::Options&)> more;
        std::function<void(Host&)> check;  // null: the handshake fails as a wrong port's does
    };
    auto flowing = [](Host& host) { EXPECT_TRUE(waitUntil([&] { return host.codes.count(0xB0C2) >= 3; })); };
    const std::vector<Row> rows = {
        {"bytes one at a time", {F::Trickle}, nullptr, flowing},
        {"a partial first frame",
         {F::PartialFirstFrame},
         nullptr,
         [&](Host& host) {
             flowing(host);
             const DiagSession::Counters& c = host.backend.session()->counters();
             EXPECT_EQ(c.badCrc + c.malformed, 0u) << "the tail of an older frame is dropped, not counted";
         }},
        {"debug messages before each reply",
         {F::Unsolicited},
         nullptr,
         [&](Host& host) {
             flowing(host);
             EXPECT_GE(host.backend.session()->counters().notLog, 6u);
         }},
        {"bad CRCs",
         {F::BadCrc},
         nullptr,
         [&](Host& host) {
             flowing(host);
             EXPECT_TRUE(waitUntil([&] { return host.backend.session()->counters().badCrc >= 2; }));
             EXPECT_GE(host.backend.session()->counters().retransmits, 1u);
         }},
        {"dual-SIM frames", {}, [](auto& o) { o.subscription = 2; }, flowing},
        {"over TCP, as a phone-side bridge forwards it", {}, [](auto& o) { o.tcpPort = 0; }, flowing},
        {"a code beyond the modem's items",
         {},
         [](auto& o) { o.itemCounts[0xB] = 0x0C2; },
         [](Host& host) {
             ASSERT_EQ(host.backend.session()->refusals().size(), 1u);
             EXPECT_EQ(host.backend.session()->refusals()[0].code, 0xB0C2);
             EXPECT_TRUE(host.backend.session()->enabledCodes().count(0xB0C1));
         }},
        {"no reply at all", {F::NoReply}, nullptr, nullptr},
        {"an AT command port", {F::Garbage}, nullptr, nullptr},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.what);
        FakeDiagModem::Options options;
        options.faults = row.faults;
        if (row.more) row.more(options);
        FakeDiagModem modem(sources({{0xB0C2, 0xB0C1}}), options);
        std::string error;
        ASSERT_TRUE(modem.open(&error)) << error;
        Host host(modem.path(), "lte");
        host.backend.setLogCodes(std::set<uint16_t>{0xB0C2, 0xB0C1});
        host.backend.start();
        if (!row.check) {
            ASSERT_TRUE(waitUntil([&] { return host.backend.state() == ModemBackend::State::Failed; }, 4000));
            EXPECT_EQ(host.backend.problem(),
                      "no DIAG reply from " + modem.path() + " within 2 s: is this the diagnostic interface?");
            continue;
        }
        ASSERT_TRUE(host.streaming(4000)) << host.backend.problem();
        row.check(host);
    }
}

TEST(LiveModem, AnUnpluggedModemIsOpenedAgainWhenItComesBack) {
    QTemporaryDir dir;
    FakeDiagModem::Options options;
    options.link = dir.filePath("diag").toStdString();
    options.vanishAfter = std::chrono::milliseconds(300);
    options.backAfter = std::chrono::milliseconds(500);
    FakeDiagModem modem(sources({{0xB0C2}}), options);
    std::string error;
    ASSERT_TRUE(modem.open(&error)) << error;
    std::vector<std::string> lines;  // before the host: its stop at the end still reports
    Host host(options.link, "lte");
    std::vector<ModemBackend::State> states;
    QObject::connect(&host.backend, &ModemBackend::stateChanged, [&](ModemBackend::State s) { states.push_back(s); });
    QObject::connect(&host.backend, &ModemBackend::statusLine, [&](const std::string& line) { lines.push_back(line); });
    host.backend.setLogCodes(std::set<uint16_t>{0xB0C2});
    host.backend.start();
    ASSERT_TRUE(host.streaming());
    ASSERT_TRUE(waitUntil([&] { return host.backend.state() == ModemBackend::State::Failed; }));
    EXPECT_FALSE(host.backend.problem().empty());
    ASSERT_TRUE(waitUntil([&] { return host.backend.state() == ModemBackend::State::Streaming; }, 6000));
    const size_t seen = host.codes.count(0xB0C2);
    EXPECT_TRUE(waitUntil([&] { return host.codes.count(0xB0C2) > seen; }));
    EXPECT_EQ(std::count(modem.requests().begin(), modem.requests().end(), DiagCommand::logConfig(1)), 2)
        << "the whole handshake again";
    const std::string away = "device " + options.link + ": the device hung up; trying again every 3 s";
    EXPECT_EQ(std::count(lines.begin(), lines.end(), away), 1) << "the status line says why while the phone is away";
    EXPECT_EQ(states.front(), ModemBackend::State::Streaming);
    host.backend.stop();
}

class CountingApplication : public ApplicationObject {
public:
    void updateViewControllerFromModel() override { ++updates; }
    int updates = 0;
};

TEST(LiveModem, TheMonitorFollowsTheModemToAnotherTechnologyAndKeepsItsHistory) {
    testing::FastMonitorClock::installed();
    FakeDiagModem::Options options;
    options.switchEvery = std::chrono::milliseconds(0);
    // An LTE phone (MIB and serving cell) falling back to WCDMA (cell identity).
    FakeDiagModem modem(sources({{0xB0C1, 0xB0C2}, {0x4127}}), options);
    std::string error;
    ASSERT_TRUE(modem.open(&error)) << error;
    CountingApplication app;
    MonitorLauncher launcher;
    MonitorLauncher::Source source;
    source.device = modem.path();
    ASSERT_TRUE(launcher.start(source, &app, &error)) << error;
    VantorelModel& model = *launcher.model();
    ASSERT_TRUE(waitUntil([&] { return app.updates > 0 && modem.streaming(); }, 5000));
    EXPECT_EQ(model.sourceStatus().decoderTechnology, kTSLogChannelTechnology_Morvek_LTE);
    model.topLevelNodes();  // a display, and its history entry
    const ArrayRef before = model.state().get("History").asArray();
    ASSERT_TRUE(before && !before->empty());
    const size_t entries = before->size();

    modem.switchTechnology();
    ASSERT_TRUE(waitUntil([&] { return model.sourceStatus().decoderTechnology == kTSLogChannelTechnology_Morvek_GSM; },
                          5000));
    const ArrayRef after = model.state().get("History").asArray();
    ASSERT_TRUE(after);
    EXPECT_GE(after->size(), entries);
    EXPECT_TRUE(waitUntil([&] { return modem.responder().enabled(0x4127) && modem.responder().enabled(0x5134); }));
}

// ---- The programs, as a user runs them ----------------------------------------------

struct Program {
    QProcess process;
    explicit Program(const char* path, const QStringList& args) {
        process.start(path, args);
        EXPECT_TRUE(process.waitForStarted(5000)) << path;
    }
    ~Program() {
        if (process.state() != QProcess::NotRunning) {
            process.kill();
            process.waitForFinished(5000);
        }
    }
    void terminate() {
        process.terminate();
        EXPECT_TRUE(process.waitForFinished(10000));
    }
    // Waits until the program's standard error (all of it so far, kept in `said`) holds text.
    bool says(const std::string& text, int ms) {
        return waitUntil(
            [&] {
                said += process.readAllStandardError().toStdString();
                return said.find(text) != std::string::npos;
            },
            ms);
    }
    std::string said;
};

// The last requests the fake modem was sent (its --requests file), joined by " | ".
std::string lastRequests(const QString& file, int count) {
    QFile sent(file);
    if (!sent.open(QIODevice::ReadOnly)) return {};
    const QStringList lines = QString::fromUtf8(sent.readAll()).trimmed().split('\n');
    return lines.mid(std::max(0, int(lines.size()) - count)).join(" | ").toStdString();
}
const std::string kClearingLines = "60 00 | 73 00 00 00 00 00 00 00 | 7D 05 00 00 00 00 00 00";

// The display as `decode` prints it: from "Technology:" up to the end of that tree.
std::string displayOf(const std::string& text) {
    const size_t start = text.rfind("Technology:");
    if (start == std::string::npos) return {};
    const size_t end = text.find("\n\n", start);
    std::string tree = text.substr(start, end == std::string::npos ? std::string::npos : end - start);
    while (!tree.empty() && tree.back() == '\n') tree.pop_back();
    if (const size_t cut = tree.find("\nDeallocing"); cut != std::string::npos) tree.resize(cut);
    return tree;
}

std::string decode(const QStringList& args) {
    QProcess cli;
    cli.start(VANTOREL_CLI_PROGRAM, QStringList{"decode", "--technology", "lte"} + args);
    cli.waitForFinished(30000);
    return displayOf(cli.readAllStandardOutput().toStdString());
}

TEST(LiveModemPrograms, ACaptureThroughTheFakeModemShowsWhatDecodeShowsAndTheModemIsLeftQuiet) {
    QTemporaryDir dir;
    const QString capture = QString::fromStdString(servicetest::capturePath("qmdl_example.qmdl"));
    const QString requests = dir.filePath("requests"), qmdl = dir.filePath("live.qmdl");
    const QString port = QString::fromStdString(testing::uniquePortName("fakediag"));

    Program fake(VANTOREL_FAKEDIAG_PROGRAM, {capture, "--speed", "0", "--once", "--requests", requests});
    ASSERT_TRUE(fake.process.waitForReadyRead(5000));
    const QString terminal = QString::fromUtf8(fake.process.readLine()).trimmed();
    ASSERT_TRUE(terminal.startsWith("/dev/pts/")) << terminal.toStdString();
    Program service(VANTOREL_TELEPHONYD_PROGRAM,
                    {"--device", terminal, "--technology", "lte", "--record-qmdl", qmdl, "--port", port});
    ASSERT_TRUE(service.says("listening on", 5000)) << service.said;
    Program watch(VANTOREL_CLI_PROGRAM, {"watch", "--service", port});

    ASSERT_TRUE(fake.says("the recording has ended", 20000)) << fake.said;
    const std::string expected = decode({capture});
    ASSERT_FALSE(expected.empty());
    std::string shown;
    EXPECT_TRUE(waitUntil(
        [&] {
            shown += watch.process.readAllStandardOutput().toStdString();
            return displayOf(shown) == expected;
        },
        10000))
        << displayOf(shown);

    watch.terminate();
    service.terminate();  // SIGTERM, as Ctrl-C
    // The modem may still be reading the last request when the host has gone.
    EXPECT_TRUE(waitUntil([&] { return lastRequests(requests, 3) == kClearingLines; }, 3000)) << lastRequests(requests, 3);
    EXPECT_EQ(decode({qmdl}), expected) << "the raw stream the service recorded decodes as the capture did";
    fake.terminate();
    EXPECT_TRUE(fake.says("logging off at exit", 1000)) << fake.said;
}

// The window and the terminal view run the service in-process: ending them ends logging too.
TEST(LiveModemPrograms, AMonitorWithItsOwnServiceLeavesTheModemQuietWhenItEnds) {
    QTemporaryDir dir;
    const QString requests = dir.filePath("requests");
    Program fake(VANTOREL_FAKEDIAG_PROGRAM, {"--emulate", "lte", "--requests", requests});
    ASSERT_TRUE(fake.process.waitForReadyRead(5000));
    const QString terminal = QString::fromUtf8(fake.process.readLine()).trimmed();
    Program watch(VANTOREL_CLI_PROGRAM, {"watch", "--device", terminal});
    ASSERT_TRUE(fake.says("logging on", 10000)) << fake.said;
    watch.terminate();
    EXPECT_TRUE(fake.says("logging off", 3000)) << fake.said;
    // The modem may still be reading the last request when the host has gone.
    EXPECT_TRUE(waitUntil([&] { return lastRequests(requests, 3) == kClearingLines; }, 3000)) << lastRequests(requests, 3);
}

// The fake modem program's terminal, from the first line it prints.
QString terminalOf(Program& fake) {
    if (!fake.process.waitForReadyRead(5000)) return {};
    return QString::fromUtf8(fake.process.readLine()).trimmed();
}

// Session after session on the LTE modem, each a monitor started afresh as a user does: each
// must show measurements, not only the serving cell. The monitor's start command reaches the
// service at any moment of the service's own handshake with the modem, and must always end
// up in the modem's mask.
TEST(LiveModemPrograms, EverySessionOnTheLteModemShowsMeasurements) {
    constexpr int kSessions = 12;
    testing::FastMonitorClock::installed();
    Program fake(VANTOREL_FAKEDIAG_PROGRAM, {"--emulate", "lte"});
    const QString terminal = terminalOf(fake);
    ASSERT_TRUE(terminal.startsWith("/dev/pts/")) << terminal.toStdString();
    // The serving cell's RSRP, idle or connected (the emulated radio goes on between sessions).
    const std::vector<std::string> rsrp = {"/Serving Cell/Serving Cell Measurements/Measured RSRP",
                                           "/Serving Cell/Connected mode LTE Intra-frequency Measurement/Serving Filtered RSRP"};
    int measured = 0;
    std::string failures;
    for (int session = 0; session < kSessions; ++session) {
        CountingApplication app;
        std::string error;
        {
            MonitorLauncher launcher;
            MonitorLauncher::Source source;
            source.device = terminal.toStdString();
            ASSERT_TRUE(launcher.start(source, &app, &error)) << error;
            VantorelModel& model = *launcher.model();
            if (waitUntil(
                    [&] {
                        return std::any_of(rsrp.begin(), rsrp.end(), [&](const std::string& path) {
                            const std::string* text = DisplayPath::leafText(path, model.pathIndex());
                            return text && *text != "-";
                        });
                    },
                    8000))
                ++measured;
            else
                failures += " " + std::to_string(session);
        }
        // The next session starts on a quiet modem, as after Ctrl-C.
        ASSERT_TRUE(fake.says("logging off", 5000)) << fake.said;
        fake.said.clear();
    }
    EXPECT_EQ(measured, kSessions) << "sessions without a measured RSRP:" << failures;
}

// A modem has one service: a second monitor on the same device joins the first one's service
// as a client, and the first never notices it come or go; the service alone is refused with
// the holder named.
TEST(LiveModemPrograms, ASecondProgramOnAHeldDeviceJoinsItsServiceOrIsRefusedNamingTheHolder) {
    QTemporaryDir dir;
    const QString requests = dir.filePath("requests");
    Program fake(VANTOREL_FAKEDIAG_PROGRAM, {"--emulate", "lte", "--requests", requests});
    const QString terminal = terminalOf(fake);
    ASSERT_TRUE(terminal.startsWith("/dev/pts/")) << terminal.toStdString();
    Program first(VANTOREL_CLI_PROGRAM, {"watch", "--device", terminal});
    ASSERT_TRUE(fake.says("logging on", 10000)) << fake.said;
    const std::string holder = "vantorel-cli (pid " + std::to_string(first.process.processId()) + ")";
    // Another name of the same terminal is the same device.
    const QString link = dir.filePath("modem");
    ASSERT_TRUE(QFile::link(terminal, link));

    struct Row {
        const char* what;
        const char* program;
        QStringList args;
        std::string says;  // on its standard error
        bool joins;        // else it ends at once, refused
    };
    const std::vector<Row> rows = {
        {"the terminal view, through a link",
         VANTOREL_CLI_PROGRAM,
         {"watch", "--device", link},
         "device " + link.toStdString() + ", with the service of " + holder,
         true},
        {"the service alone",
         VANTOREL_TELEPHONYD_PROGRAM,
         {"--device", terminal, "--port", QString::fromStdString(testing::uniquePortName("second"))},
         terminal.toStdString() + " is in use by " + holder + ", whose service listens on port vantorel.embedded.",
         false},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.what);
        Program second(row.program, row.args);
        ASSERT_TRUE(second.says(row.says, 10000)) << second.said;
        if (row.joins) {
            std::string shown;
            EXPECT_TRUE(waitUntil(
                [&] {
                    shown += second.process.readAllStandardOutput().toStdString();
                    return shown.find("Measured RSRP") != std::string::npos;
                },
                10000))
                << "the second monitor shows the modem's records";
            second.terminate();
        } else {
            EXPECT_TRUE(second.process.waitForFinished(5000));
            EXPECT_NE(second.process.exitCode(), 0);
        }
        first.process.readAllStandardOutput();
        std::string shown;
        EXPECT_TRUE(waitUntil(
            [&] {
                shown += first.process.readAllStandardOutput().toStdString();
                return shown.find("Measured RSRP") != std::string::npos;
            },
            6000))
            << "the first monitor goes on showing records";
    }
    EXPECT_EQ(fake.said.find("logging off"), std::string::npos) << fake.said;
    QFile sent(requests);
    ASSERT_TRUE(sent.open(QIODevice::ReadOnly));
    EXPECT_EQ(QString::fromUtf8(sent.readAll()).split('\n').count("60 00"), 1) << "one handshake, no clearing under the first";
}

}  // namespace
}  // namespace vantorel
