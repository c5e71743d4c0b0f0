// MonitorLauncher: the monitor on an embedded or external telephony service; an in-process service runs on a thread of its own so that the model's blocking requests can be answered.
#include "Monitor/MonitorLauncher.h"

#include "Model/VantorelModel.h"
#include "Platform/TechnologyNames.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/Replay/CaptureReader.h"

#include <QCommandLineParser>
#include <QFileInfo>
#include <QMetaObject>

#include <unistd.h>

namespace vantorel {

void MonitorLauncher::addOptions(QCommandLineParser& parser) {
    const QString techs = QString::fromStdString(TechnologyNames::listing());
    parser.addOption({"emulate",
                      "Run the built-in modem emulator for TECH (scenarios: " +
                          QString::fromStdString(EmulatorBackend::availableScenarios()) + "; default utran).",
                      "TECH"});
    parser.addOption({"replay", "Replay a recorded stream: QXDM DLF, QMDL/mi2log or a Vantorel capture.", "FILE"});
    parser.addOption({"device",
                      "Watch a modem live on its DIAG port: /dev/ttyUSB0, a character device such as\n"
                      "/dev/wwan0qcdm0, or tcp:HOST:PORT (docs/devices.md).",
                      "PATH"});
    parser.addOption({"service", "Watch a running vantorel-telephonyd listening on port NAME.", "NAME"});
    parser.addOption({"technology",
                      "Technology of a replay or of the --device modem (default: learnt from the\n"
                      "serving-cell records, following the modem when it moves) (" + techs + ").",
                      "TECH"});
    parser.addOption({"speed", "Replay pace: 1 = as recorded, 2 = twice as fast, 0 = as fast as taken.", "X", "1"});
    parser.addOption({"loop", "Start the replay again at its end."});
}

std::optional<MonitorLauncher::Source> MonitorLauncher::sourceFrom(const QCommandLineParser& parser,
                                                                    std::string* error) {
    Source s;
    s.emulate = parser.value("emulate").toStdString();
    s.replay = parser.value("replay").toStdString();
    s.service = parser.value("service").toStdString();
    s.device = parser.value("device").toStdString();
    s.technology = parser.value("technology").toStdString();
    s.loop = parser.isSet("loop");
    bool ok = false;
    s.speed = parser.value("speed").toDouble(&ok);
    if (!ok || s.speed < 0) {
        *error = "--speed takes a number of 0 or more (1 = as recorded, 0 = as fast as taken)";
        return std::nullopt;
    }
    const int chosen = !s.emulate.empty() + !s.replay.empty() + !s.service.empty() + !s.device.empty();
    if (chosen > 1) {
        *error = "choose one of --emulate, --replay, --device and --service";
        return std::nullopt;
    }
    // Options that only shape a replay mean nothing without one: say so rather than ignore them.
    if (s.replay.empty()) {
        for (const char* option : {"technology", "speed", "loop"}) {
            if (!parser.isSet(option) || (!s.device.empty() && std::string(option) == "technology")) continue;
            *error = std::string("--") + option + " applies to a replay: add --replay FILE";
            return std::nullopt;
        }
    }
    if (!s.technology.empty()) {
        const auto id = TechnologyNames::identifierFor(s.technology);
        if (!id) {
            *error = "unknown technology '" + s.technology + "' (" + TechnologyNames::listing() + ")";
            return std::nullopt;
        }
        // A capture says its technology; another one on the command line is a contradiction.
        const Capture capture = s.replay.empty() ? Capture() : CaptureReader::readFile(s.replay);
        if (capture.ok() && !capture.technology.empty() && capture.technology != *id) {
            *error = s.replay + " is a " + TechnologyNames::displayName(capture.technology) +
                     " capture: --technology " + s.technology + " contradicts it";
            return std::nullopt;
        }
    }
    if (chosen == 0) s.emulate = "utran";  // the embedded default
    return s;
}

MonitorLauncher::MonitorLauncher() = default;

MonitorLauncher::~MonitorLauncher() {
    model_.reset();  // closes the ports before the service goes
    if (service_) service_->stop();
}

bool MonitorLauncher::start(const Source& source, ApplicationObject* application, std::string* error) {
    std::string serviceName = source.service;
    if (source.service.empty()) {
        TelephonyServiceOptions options;
        options.portName = "vantorel.embedded." + std::to_string(getpid());
        options.emulate = source.emulate;
        options.replay = source.replay;
        options.device = source.device;
        options.technology = source.technology;
        options.speed = source.speed;
        options.loop = source.loop;
        service_ = std::make_unique<TelephonyServiceThread>(options);
        if (!service_->start(error)) return false;
        serviceName = service_->portName();
        const auto emulated = TechnologyNames::identifierFor(source.emulate);
        description_ = !source.replay.empty()   ? "replay of " + source.replay
                       : !source.device.empty() ? "device " + source.device
                                                : "emulator (" + (emulated ? TechnologyNames::displayName(*emulated)
                                                                         : source.emulate) + ")";
    } else {
        description_ = "service " + source.service;
    }
    model_ = std::make_unique<VantorelModel>(application, serviceName);
    VantorelModel* model = model_.get();
    // The status line names the source: known here for the in-process service; a running
    // service names its own in its notifications.
    if (!source.replay.empty())
        model->setSource("replay " + QFileInfo(QString::fromStdString(source.replay)).fileName().toStdString(), true, true);
    else if (!source.device.empty())
        model->setSource("device " + source.device, false, true);
    else if (!source.emulate.empty())
        model->setSource("emulator " + TechnologyNames::displayName(TechnologyNames::identifierFor(source.emulate)
                                                                      .value_or(source.emulate)),
                         false, true);
    else
        model->setSource("service " + source.service, false, false);
    QMetaObject::invokeMethod(model, [model] { model->restartMonitor(); }, Qt::QueuedConnection);
    return true;
}

}  // namespace vantorel
