// MonitorLauncher: the monitor on an embedded or external telephony service; an in-process service runs on a thread of its own so that the model's blocking requests can be answered.
#include "Monitor/MonitorLauncher.h"

#include "Model/VantorelModel.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "TelephonyService/Device/DeviceLock.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/Replay/CaptureReader.h"

#include <QCommandLineParser>
#include <QElapsedTimer>
#include <QFileInfo>
#include <QMetaObject>
#include <QThread>

#include <unistd.h>

namespace vantorel {

namespace {

// Whether a service listens on `port`, waiting up to timeoutMs for one that is still starting.
bool serviceAnswers(const std::string& port, int timeoutMs) {
    if (port.empty()) return false;
    QElapsedTimer waited;
    waited.start();
    for (;;) {
        if (RemoteMessagePort::lookup(port, 250)) return true;
        if (waited.hasExpired(timeoutMs)) return false;
        QThread::msleep(50);
    }
}

}  // namespace

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

bool MonitorLauncher::startService(const Source& source, std::string* error) {
    TelephonyServiceOptions options;
    options.portName = "vantorel.embedded." + std::to_string(getpid());
    options.emulate = source.emulate;
    options.replay = source.replay;
    options.device = source.device;
    options.technology = source.technology;
    options.speed = source.speed;
    options.loop = source.loop;
    service_ = std::make_unique<TelephonyServiceThread>(options);
    if (service_->start(error)) return true;
    service_.reset();
    return false;
}

std::optional<std::string> MonitorLauncher::deviceService(const Source& source, std::string* error, int joinWaitMs) {
    // The device's service may be another monitor's: join it rather than take the port from
    // under it. Tried again when another monitor took the device meanwhile.
    for (int attempt = 0;; ++attempt) {
        if (const std::optional<DeviceLock::Holder> holder = DeviceLock::holder(source.device)) {
            if (!serviceAnswers(holder->servicePort, joinWaitMs)) {
                DeviceLock::Holder named = *holder;
                named.servicePort.clear();  // no advice to watch a service that does not answer
                *error = DeviceLock::describe(source.device, named) + ", whose service does not answer";
                return std::nullopt;
            }
            description_ = StringFormat::format("device %s, with the service of %s (pid %d)", source.device.c_str(),
                                                holder->program.c_str(), int(holder->pid));
            return holder->servicePort;
        }
        if (startService(source, error)) {
            description_ = "device " + source.device;
            return service_->portName();
        }
        if (attempt >= 2 || !DeviceLock::holder(source.device)) return std::nullopt;
    }
}

bool MonitorLauncher::start(const Source& source, ApplicationObject* application, std::string* error) {
    std::string serviceName = source.service;
    if (!source.device.empty()) {
        const std::optional<std::string> name = deviceService(source, error);
        if (!name) return false;
        serviceName = *name;
    } else if (source.service.empty()) {
        if (!startService(source, error)) return false;
        serviceName = service_->portName();
        const auto emulated = TechnologyNames::identifierFor(source.emulate);
        description_ = !source.replay.empty() ? "replay of " + source.replay
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
    if (!source.device.empty() && !service_) {
        // Joined: when the holder ends, its service goes; the next connection attempt takes
        // the device over (or joins whoever took it first).
        model->setServiceResolver([this, source, joined = serviceName] {
            if (service_) return service_->portName();
            std::string why;
            // On the event loop: one look, no waiting; the model's retry timer waits.
            const std::optional<std::string> name = deviceService(source, &why, 0);
            if (!name) {
                SystemLog::log(SystemLog::kError, "Device %s: %s", source.device.c_str(), why.c_str());
                return joined;
            }
            if (service_) SystemLog::log(SystemLog::kNotice, "Device %s: the service that held it ended; this monitor "
                                         "runs the device's service now", source.device.c_str());
            return *name;
        });
    }
    QMetaObject::invokeMethod(model, [model] { model->restartMonitor(); }, Qt::QueuedConnection);
    return true;
}

}  // namespace vantorel
