// MonitorLauncher: starts the monitor (VantorelModel) on a chosen source: an in-process service running the emulator or a replay, or a running service by name.
#pragma once

#include "TelephonyService/TelephonyServiceThread.h"

#include <memory>
#include <optional>
#include <string>

class QCommandLineParser;

namespace vantorel {

class ApplicationObject;
class VantorelModel;

class MonitorLauncher {
public:
    static constexpr int kJoinWaitMs = 2000;

    struct Source {
        std::string emulate;     // --emulate TECH
        std::string replay;      // --replay FILE
        std::string service;     // --service NAME: a running vantorel-telephonyd
        std::string device;      // --device PATH: a modem's DIAG port (tty, character device, tcp:HOST:PORT)
        std::string technology;  // --technology TECH (else the serving-cell records tell)
        double speed = 1.0;
        bool loop = false;
    };

    // --emulate, --replay, --device, --service, --technology, --speed, --loop.
    static void addOptions(QCommandLineParser& parser);
    // The source the options name; with none of --emulate/--replay/--service, the
    // embedded default: the emulator's UTRAN scenario. Empty with *error on bad use:
    // two sources, --technology/--speed/--loop without --replay, a --technology other
    // than the one a replayed capture names.
    static std::optional<Source> sourceFrom(const QCommandLineParser& parser, std::string* error);

    MonitorLauncher();
    ~MonitorLauncher();

    // Starts the in-process service when the source needs one (on its own thread),
    // creates the model for `application` and queues restartMonitor on the event
    // loop. False with *error when the service cannot start.
    //
    // A modem has one service (DeviceLock): for a --device that another process's service
    // holds, no service is started; the model joins that one as one more client (as
    // --service does), so that the monitor already watching never notices. When the holder
    // does not answer within kJoinWaitMs, start() fails with one line naming it. When the
    // holder ends, the joined monitor's next connection attempt takes the device over.
    bool start(const Source& source, ApplicationObject* application, std::string* error);
    VantorelModel* model() const { return model_.get(); }
    // "emulator (UTRAN (TD-SCDMA))", "replay of FILE", "device PATH", "service NAME".
    std::string description() const { return description_; }

private:
    // Starts the in-process service for the source; false with *error.
    bool startService(const Source& source, std::string* error);
    // The port of the device's service: another process's that answers, else one started
    // here; none with *error (a holder that does not answer, a device that cannot be opened).
    std::optional<std::string> deviceService(const Source& source, std::string* error, int joinWaitMs = kJoinWaitMs);

    std::unique_ptr<TelephonyServiceThread> service_;
    std::unique_ptr<VantorelModel> model_;
    std::string description_;
};

}  // namespace vantorel
