// EmulatorBackend: the modem backend that runs an EmulatorScenario on a timer, one tick per scenario interval.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"
#include "TelephonyService/ModemBackend.h"

#include <QTimer>

#include <chrono>
#include <memory>
#include <string>

namespace vantorel {

// start() runs tick 0 from the event loop at once, then one tick per interval; the
// records of tick n are emitted together, in the scenario's order. Ticks go on
// counting across stop() / start() (a modem does not rewind). Pausing is ignored:
// a live modem does not wait for its listener.
class EmulatorBackend : public ModemBackend {
    Q_OBJECT
public:
    // Ticks come every scenario->tickInterval().
    explicit EmulatorBackend(std::unique_ptr<EmulatorScenario> scenario, QObject* parent = nullptr);
    ~EmulatorBackend() override;

    // The scenario for a technology name (ifx, gsm, cdma, lte, utran, any case) or full
    // identifier; null with *error set when the name is unknown.
    static std::unique_ptr<EmulatorScenario> scenarioFor(const std::string& technology, std::string* error,
                                                         uint64_t seed = 1);
    // "cdma, gsm, ifx, lte, utran", the names scenarioFor() knows.
    static std::string availableScenarios();

    std::string technology() const override;
    std::string description() const override;
    // "emulator <technology as people name it>"
    std::string source() const override;
    void start() override;
    void stop() override;

private:
    void tick();

    std::unique_ptr<EmulatorScenario> scenario_;
    QTimer timer_;
    uint64_t nextTick_ = 0;
};

}  // namespace vantorel
