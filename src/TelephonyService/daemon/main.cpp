// vantorel-telephonyd: the telephony service as a program of its own, on the modem emulator, a recorded stream or a real modem (docs/protocol.md).
#include "Platform/QuitOnSignal.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyServiceConnection.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/TelephonyService.h"

#include <QCommandLineParser>
#include <QCoreApplication>
#include <QFileInfo>

#include <cstdio>
#include <string>

using namespace vantorel;

namespace {

int fail(const std::string& text) {
    std::fprintf(stderr, "vantorel-telephonyd: %s\n", text.c_str());
    return 1;
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName(QStringLiteral("vantorel-telephonyd"));

    const QString names = QString::fromStdString(TechnologyNames::listing());
    QCommandLineParser parser;
    parser.setApplicationDescription(QStringLiteral(
        "Vantorel's telephony service: answers GetTechnology, applies each log channel's log mask and streams "
        "the modem's records, from the modem emulator, a recorded stream or a real modem's DIAG port."));
    parser.addHelpOption();
    const QCommandLineOption emulate(QStringLiteral("emulate"),
                                     QStringLiteral("Run the modem emulator for TECH (scenarios: %1).")
                                         .arg(QString::fromStdString(EmulatorBackend::availableScenarios())),
                                     QStringLiteral("TECH"));
    const QCommandLineOption replay(QStringLiteral("replay"),
                                    QStringLiteral("Replay FILE: a capture, a QXDM DLF or a QMDL / mi2log file."),
                                    QStringLiteral("FILE"));
    const QCommandLineOption device(
        QStringLiteral("device"),
        QStringLiteral("Read a modem's DIAG port live: a serial port (/dev/ttyUSB0), a character device "
                       "(/dev/wwan0qcdm0) or tcp:HOST:PORT (a phone-side bridge). The log mask follows the clients; "
                       "logging is switched off again when the last client leaves and at exit (docs/devices.md)."),
        QStringLiteral("PATH"));
    const QCommandLineOption recordQmdl(
        QStringLiteral("record-qmdl"),
        QStringLiteral("With --device: also write the raw DIAG stream to FILE as a QMDL file (readable by SCAT and "
                       "MobileInsight). An existing FILE is refused unless --force is given."),
        QStringLiteral("FILE"));
    const QCommandLineOption speed(QStringLiteral("speed"),
                                   QStringLiteral("Replay pace: 1 as recorded, 2 twice as fast, 0 as fast as the "
                                                  "client takes it (default 1). Recorded pauses over 10 s are cut to 10 s."),
                                   QStringLiteral("X"), QStringLiteral("1"));
    const QCommandLineOption loop(QStringLiteral("loop"), QStringLiteral("Start the replay over at its end."));
    const QCommandLineOption technology(
        QStringLiteral("technology"),
        QStringLiteral("The technology of a replayed file or of the --device modem, over what their "
                       "serving-cell records say (default: learnt from those records): %1.").arg(names),
        QStringLiteral("TECH"));
    const QCommandLineOption record(
        QStringLiteral("record"),
        QStringLiteral("Write every message the modem produces to FILE, as a capture, from the start whether or not a "
                       "client is connected; each message is on disk as soon as it is written. An existing FILE is "
                       "refused and left untouched (exit 2) unless --force is given."),
        QStringLiteral("FILE"));
    const QCommandLineOption force(QStringLiteral("force"), QStringLiteral("Let --record replace an existing FILE."));
    const QCommandLineOption port(QStringLiteral("port"),
                                  QStringLiteral("The service's well-known port: a name in this user's runtime directory "
                                                 "or an absolute socket path (default %1).")
                                      .arg(QString::fromStdString(TelephonyServiceConnection::defaultServiceName())),
                                  QStringLiteral("NAME"));
    const QCommandLineOption allowGroup(
        QStringLiteral("allow-group"),
        QStringLiteral("Serve the members of the group NAME too (a lab service shared by a group; needs --port /PATH "
                       "in a directory the group can reach). Without it only this user and root are served."),
        QStringLiteral("NAME"));
    const QCommandLineOption verbose(QStringLiteral("verbose"), QStringLiteral("Mirror the system log to stderr."));
    parser.addOptions({emulate, replay, device, speed, loop, technology, record, recordQmdl, force, port, allowGroup, verbose});
    parser.process(app);  // --help and unknown options end here

    if (!parser.positionalArguments().isEmpty())
        return fail("unexpected argument " + parser.positionalArguments().first().toStdString() + " (see --help)");
    if (parser.isSet(emulate) + parser.isSet(replay) + parser.isSet(device) != 1)
        return fail("give exactly one of --emulate TECH, --replay FILE and --device PATH");
    if (parser.isSet(emulate) && (parser.isSet(speed) || parser.isSet(loop) || parser.isSet(technology)))
        return fail("--speed, --loop and --technology apply to --replay (and --technology to --device) only");
    if (parser.isSet(device) && (parser.isSet(speed) || parser.isSet(loop)))
        return fail("--speed and --loop apply to --replay only: a modem runs at its own pace");
    if (parser.isSet(recordQmdl) && !parser.isSet(device)) return fail("--record-qmdl applies to --device only");
    if (parser.isSet(force) && !parser.isSet(record) && !parser.isSet(recordQmdl))
        return fail("--force applies to --record and --record-qmdl only");
    // Checked before anything starts; the writer's exclusive create still guards a file that appears meanwhile.
    for (const QCommandLineOption* option : {&record, &recordQmdl}) {
        const QFileInfo file(parser.value(*option));
        if (parser.isSet(*option) && !parser.isSet(force) && (file.exists() || file.isSymLink())) {
            std::fprintf(stderr, "vantorel-telephonyd: %s exists already; it is left as it is (--force replaces it)\n",
                         parser.value(*option).toLocal8Bit().constData());
            return 2;
        }
    }

    TelephonyServiceOptions options;
    options.emulate = parser.value(emulate).toStdString();
    options.replay = parser.value(replay).toStdString();
    options.device = parser.value(device).toStdString();
    options.recordQmdl = parser.value(recordQmdl).toStdString();
    options.technology = parser.value(technology).toStdString();
    options.loop = parser.isSet(loop);
    options.record = parser.value(record).toStdString();
    options.replaceRecording = parser.isSet(force);
    options.portName = parser.value(port).toStdString();
    options.allowGroup = parser.value(allowGroup).toStdString();
    bool speedOk = false;
    options.speed = parser.value(speed).toDouble(&speedOk);
    if (!speedOk || options.speed < 0)
        return fail("--speed " + parser.value(speed).toStdString() + ": give a number, 0 or more");
    SystemLog::setMirrorToStderr(parser.isSet(verbose));

    const QuitOnSignal quitOnSignal;  // SIGINT / SIGTERM end app.exec() below

    TelephonyService service(options);
    service.setStatusCallback([](const std::string& line) { std::fprintf(stderr, "vantorel-telephonyd: %s\n", line.c_str()); });
    std::string error;
    if (!service.start(&error)) return fail(error);
    std::fprintf(stderr, "vantorel-telephonyd: %s\n", service.startupLine().c_str());

    const int status = app.exec();
    service.stop();
    const TelephonyService::Counters c = service.counters();
    std::fprintf(stderr,
                 "vantorel-telephonyd: stopped: %llu messages sent, %llu dropped (clients too slow), %llu recorded, %llu "
                 "channels served, %llu malformed frames, %llu connections refused, %llu closed over a buffer limit, "
                 "%llu refused (another user's)\n",
                 static_cast<unsigned long long>(c.messagesSent), static_cast<unsigned long long>(c.messagesDropped),
                 static_cast<unsigned long long>(c.messagesRecorded), static_cast<unsigned long long>(c.channelsServed),
                 static_cast<unsigned long long>(c.malformedFrames), static_cast<unsigned long long>(c.refusedPeers),
                 static_cast<unsigned long long>(c.overLimitPeers), static_cast<unsigned long long>(c.foreignPeers));
    return status;
}
