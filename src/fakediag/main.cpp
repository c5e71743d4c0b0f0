// vantorel-fakediag: a DIAG modem in software on a pseudo-terminal, playing a recorded capture or an emulator scenario, for demos without a phone and for tests of the live-modem path.
#include "Platform/QuitOnSignal.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/ReplayBackend.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/RecordedStream.h"
#include "fakediag/FakeDiagModem.h"

#include <QCommandLineParser>
#include <QCoreApplication>
#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <string>

using namespace vantorel;

namespace {

int fail(const std::string& text) {
    std::fprintf(stderr, "vantorel-fakediag: %s\n", text.c_str());
    return 2;
}

void say(const std::string& line) { std::fprintf(stderr, "vantorel-fakediag: %s\n", line.c_str()); }

// "0xB=0x0C2,4=1280": item counts per equipment over the defaults.
bool parseItems(const QString& text, DiagResponder::ItemCounts& counts, std::string* error) {
    for (const QString& entry : text.split(',', Qt::SkipEmptyParts)) {
        const QStringList sides = entry.split('=');
        bool equipmentOk = false, countOk = false;
        const uint equipment = sides.size() == 2 ? sides[0].trimmed().toUInt(&equipmentOk, 0) : 0;
        const uint count = sides.size() == 2 ? sides[1].trimmed().toUInt(&countOk, 0) : 0;
        if (!equipmentOk || !countOk || equipment >= DiagCommand::kEquipmentCount || count > 0x1000) {
            *error = "--items " + entry.toStdString() + ": give EQUIPMENT=COUNT, equipment 0 to 15, count 0 to 4096";
            return false;
        }
        counts[equipment] = count;
    }
    return true;
}

// "SECONDS[:BACK]" of --vanish.
bool parseVanish(const QString& text, FakeDiagModem::Options& options, std::string* error) {
    const QStringList parts = text.split(':');
    bool afterOk = false, backOk = parts.size() == 1;
    const double after = parts[0].toDouble(&afterOk);
    const double back = parts.size() == 2 ? parts[1].toDouble(&backOk) : -1;
    if (parts.size() > 2 || !afterOk || !backOk || !(after > 0) || after > 1e6 || back > 1e6 ||
        (parts.size() == 2 && !(back >= 0))) {
        *error = "--vanish " + text.toStdString() + ": give SECONDS or SECONDS:BACK, such as 20:5";
        return false;
    }
    options.vanishAfter = std::chrono::milliseconds(static_cast<int64_t>(after * 1000));
    options.backAfter = std::chrono::milliseconds(static_cast<int64_t>(back * 1000));
    return true;
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName(QStringLiteral("vantorel-fakediag"));

    QCommandLineParser parser;
    parser.setApplicationDescription(QStringLiteral(
        "A DIAG modem in software on a pseudo-terminal, for trying Vantorel's live-modem path without a phone.\n"
        "It prints the path to open on its first line of output, then answers the host's DIAG requests as a modem\n"
        "does and, while the host's log mask is set, sends the log packets of FILE (a QMDL / mi2log file, a QXDM\n"
        "DLF or a Vantorel capture, from its start for each host session, looped) or of an emulator scenario:\n"
        "\n"
        "  vantorel-fakediag ../shared/captures/qmdl_example.qmdl      # terminal 1: prints /dev/pts/N\n"
        "  vantorel --device /dev/pts/N                                # terminal 2\n"
        "\n"
        "Status lines go to standard error; Ctrl-C ends."));
    parser.addHelpOption();
    parser.addPositionalArgument(QStringLiteral("FILE"), QStringLiteral("The recorded stream to play."),
                                 QStringLiteral("[FILE]"));
    const QCommandLineOption emulate(
        QStringLiteral("emulate"),
        QStringLiteral("Play the emulator's scenario for TECH (lte, gsm, cdma, utran) instead of a file. Given twice "
                       "or more, the modem moves from one technology to the next every --switch seconds."),
        QStringLiteral("TECH"));
    const QCommandLineOption switchEvery(QStringLiteral("switch"),
                                         QStringLiteral("Seconds on each --emulate technology (default 30)."),
                                         QStringLiteral("SECONDS"), QStringLiteral("30"));
    const QCommandLineOption speed(QStringLiteral("speed"),
                                   QStringLiteral("FILE's pace: 1 as recorded, 2 twice as fast, 0 as fast as the host "
                                                  "reads (default 1). Recorded pauses over 10 s are cut to 10 s."),
                                   QStringLiteral("X"), QStringLiteral("1"));
    const QCommandLineOption once(QStringLiteral("once"), QStringLiteral("Play FILE once per session, not looped."));
    const QCommandLineOption link(QStringLiteral("link"),
                                  QStringLiteral("Keep a symbolic link at PATH pointing at the terminal, through "
                                                 "--vanish and back: a stable name, as /dev/serial/by-id gives."),
                                  QStringLiteral("PATH"));
    const QCommandLineOption tcp(QStringLiteral("tcp"),
                                 QStringLiteral("Serve the modem on TCP port PORT of 127.0.0.1 instead of a terminal "
                                                "(0: any free port), for --device tcp:127.0.0.1:PORT."),
                                 QStringLiteral("PORT"));
    const QCommandLineOption items(QStringLiteral("items"),
                                   QStringLiteral("The modem's log item counts per equipment over its defaults "
                                                  "(1=0x1000, 4=0x500, 5=0x300, 7=0x200, 0xB=0x300, 0xD=0x180), such "
                                                  "as 0xB=0x0C2 to make 0xB0C2 one item too far."),
                                   QStringLiteral("EQ=N,..."));
    const QCommandLineOption buildId(QStringLiteral("build-id"), QStringLiteral("The build ID the modem gives."),
                                     QStringLiteral("TEXT"), QStringLiteral("VANTOREL.FAKEDIAG.1.0"));
    const QCommandLineOption fault(
        QStringLiteral("fault"),
        QStringLiteral("Misbehave (repeatable): %1. trickle writes every byte on its own; partial-first-frame puts "
                       "the tail of an older frame before the reply to a host's first request; bad-crc spoils every "
                       "4th log packet and reply; unsolicited sends debug messages before each reply; no-reply "
                       "answers nothing; garbage answers as an AT command port.")
            .arg(QString::fromStdString(FakeDiagModem::faultNames())),
        QStringLiteral("NAME"));
    const QCommandLineOption dualSim(QStringLiteral("dual-sim"),
                                     QStringLiteral("Send log packets inside dual-SIM frames of subscription ID."),
                                     QStringLiteral("ID"));
    const QCommandLineOption vanish(
        QStringLiteral("vanish"),
        QStringLiteral("Close the terminal SECONDS after logging starts, as an unplugged phone; with :BACK, open a "
                       "new one BACK seconds later (use --link to keep its name)."),
        QStringLiteral("SECONDS[:BACK]"));
    const QCommandLineOption requestsFile(
        QStringLiteral("requests"), QStringLiteral("Append every request the host sends to FILE, one hex line each."),
        QStringLiteral("FILE"));
    const QCommandLineOption verbose(QStringLiteral("verbose"),
                                     QStringLiteral("Say every request on standard error too."));
    parser.addOptions({emulate, switchEvery, speed, once, link, tcp, items, buildId, fault, dualSim, vanish, requestsFile,
                       verbose});
    parser.process(app);

    const QStringList files = parser.positionalArguments();
    if (files.size() + (parser.isSet(emulate) ? 1 : 0) != 1)
        return fail("give one FILE to play, or --emulate TECH (see --help)");
    if (parser.isSet(emulate) && (parser.isSet(speed) || parser.isSet(once)))
        return fail("--speed and --once apply to a FILE: a scenario runs at the modem's own pace");

    FakeDiagModem::Options options;
    options.link = parser.value(link).toStdString();
    if (parser.isSet(tcp)) {
        bool portOk = false;
        const uint port = parser.value(tcp).toUInt(&portOk);
        if (!portOk || port > 65535) return fail("--tcp " + parser.value(tcp).toStdString() + ": give a port, 0 to 65535");
        if (parser.isSet(link)) return fail("--link names a terminal: leave it out with --tcp");
        options.tcpPort = static_cast<int>(port);
    }
    options.buildId = parser.value(buildId).toStdString();
    std::string error;
    if (parser.isSet(items) && !parseItems(parser.value(items), options.itemCounts, &error)) return fail(error);
    if (parser.isSet(vanish) && !parseVanish(parser.value(vanish), options, &error)) return fail(error);
    for (const QString& name : parser.values(fault)) {
        const auto f = FakeDiagModem::faultNamed(name.toStdString());
        if (!f) return fail("--fault " + name.toStdString() + ": one of " + FakeDiagModem::faultNames());
        options.faults.insert(*f);
    }
    if (parser.isSet(dualSim)) {
        bool ok = false;
        const uint id = parser.value(dualSim).toUInt(&ok, 0);
        if (!ok) return fail("--dual-sim " + parser.value(dualSim).toStdString() + ": give a subscription number");
        options.subscription = id;
    }
    bool ok = false;
    const double seconds = parser.value(switchEvery).toDouble(&ok);
    if (!ok || !(seconds >= 1) || seconds > 1e6) return fail("--switch: give a number of seconds, 1 or more");
    options.switchEvery = std::chrono::milliseconds(static_cast<int64_t>(seconds * 1000));

    std::vector<std::unique_ptr<ModemBackend>> sources;
    std::string playing;
    if (!files.isEmpty()) {
        const double pace = parser.value(speed).toDouble(&ok);
        if (!ok || !std::isfinite(pace) || pace < 0) return fail("--speed: give a number, 0 or more");
        const std::string path = files.first().toStdString();
        RecordedStream stream = RecordedStream::open(path);
        if (!stream.ok()) return fail(stream.error());
        const size_t packets = std::count_if(stream.messages().begin(), stream.messages().end(),
                                             [](const TimedMessage& m) { return !DiagPacket::logPacketFromRecord(m.data).empty(); });
        if (packets == 0)
            return fail(path + " holds no log record that a DIAG modem sends (" + stream.formatName() +
                        ", " + std::to_string(stream.messages().size()) + " messages)");
        const std::string name = QFileInfo(files.first()).fileName().toStdString();
        playing = StringFormat::format("%s (%zu log packets, %s%s)", name.c_str(), packets,
                                       pace == 0 ? "as fast as the host reads" : StringFormat::format("speed %g", pace).c_str(),
                                       parser.isSet(once) ? ", once" : ", looped");
        sources.push_back(std::make_unique<ReplayBackend>(std::move(stream), pace, !parser.isSet(once), name));
    }
    for (const QString& technology : parser.values(emulate)) {
        std::unique_ptr<EmulatorScenario> scenario = EmulatorBackend::scenarioFor(technology.toStdString(), &error);
        if (!scenario) return fail(error);
        if (scenario->technology() == TechnologyNames::identifierFor("ifx"))
            return fail("the IFX modem has no DIAG port: --emulate lte, gsm, cdma or utran");
        sources.push_back(std::make_unique<EmulatorBackend>(std::move(scenario)));
        playing += (playing.empty() ? "" : ", then ") + sources.back()->source();
    }

    FakeDiagModem modem(std::move(sources), options);
    QObject::connect(&modem, &FakeDiagModem::statusLine, &modem, say);
    std::unique_ptr<QFile> log;
    if (parser.isSet(requestsFile)) {
        log = std::make_unique<QFile>(parser.value(requestsFile));
        if (!log->open(QIODevice::Append | QIODevice::Unbuffered))
            return fail(parser.value(requestsFile).toStdString() + ": " + log->errorString().toStdString());
    }
    const bool sayRequests = parser.isSet(verbose);
    QObject::connect(&modem, &FakeDiagModem::requestReceived, &modem, [&log, sayRequests](const Bytes& request) {
        std::string hex;
        for (uint8_t b : request) hex += StringFormat::format("%s%02X", hex.empty() ? "" : " ", b);
        if (log) log->write((hex + "\n").c_str());
        if (sayRequests) say("request " + DiagCommand::describe(request) + ": " + hex.substr(0, 3 * 24));
    });
    bool first = true;
    QObject::connect(&modem, &FakeDiagModem::linkOpened, &modem, [&first](const std::string& path) {
        if (!first) say("plugged in again on " + path);
        first = false;
    });

    const QuitOnSignal quitOnSignal;
    if (!modem.open(&error)) return fail(error);
    std::printf("%s\n", modem.path().c_str());
    std::fflush(stdout);
    say("a DIAG modem on " + modem.path() + (options.link.empty() ? "" : " (" + modem.linkPath() + ")") +
        ", playing " + playing + "; waiting for a host: vantorel --device " + modem.path());

    const int status = app.exec();
    const FakeDiagModem::Counters& c = modem.counters();
    say(StringFormat::format("%llu requests (%llu bad frames), %llu log packets sent, %llu kept back by the log mask, "
                             "%llu dropped (host not reading); logging %s at exit",
                             static_cast<unsigned long long>(c.requests), static_cast<unsigned long long>(c.badRequests),
                             static_cast<unsigned long long>(c.logPackets), static_cast<unsigned long long>(c.notEnabled),
                             static_cast<unsigned long long>(c.hostBehind),
                             (modem.responder().logging() ? "on (" + modem.responder().maskSummary() + ")"
                                                          : std::string("off")).c_str()));
    return status;
}
