// EmulatorBackend: scenario lookup by technology and the tick timer of the emulated modem.
#include "TelephonyService/EmulatorBackend.h"

#include "Platform/StringFormat.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Emulator/CDMAScenario.h"
#include "TelephonyService/Emulator/GSMScenario.h"
#include "TelephonyService/Emulator/IFXScenario.h"
#include "TelephonyService/Emulator/LTEScenario.h"
#include "TelephonyService/Emulator/UTRANScenario.h"

namespace vantorel {

EmulatorBackend::EmulatorBackend(std::unique_ptr<EmulatorScenario> scenario, QObject* parent)
    : ModemBackend(parent), scenario_(std::move(scenario)) {
    timer_.setTimerType(Qt::PreciseTimer);
    connect(&timer_, &QTimer::timeout, this, &EmulatorBackend::tick);
}

EmulatorBackend::~EmulatorBackend() = default;

std::unique_ptr<EmulatorScenario> EmulatorBackend::scenarioFor(const std::string& technology, std::string* error,
                                                               uint64_t seed) {
    const std::optional<std::string> identifier = technologyIdentifier(technology, error);
    if (!identifier) return nullptr;
    // Every known technology has a scenario; technologyIdentifier() rejected the rest.
    if (*identifier == kTSLogChannelTechnology_IFX) return std::make_unique<IFXScenario>(seed);
    if (*identifier == kTSLogChannelTechnology_Morvek_GSM) return std::make_unique<GSMScenario>(seed);
    if (*identifier == kTSLogChannelTechnology_Morvek_CDMA) return std::make_unique<CDMAScenario>(seed);
    if (*identifier == kTSLogChannelTechnology_Morvek_LTE) return std::make_unique<LTEScenario>(seed);
    return std::make_unique<UTRANScenario>(seed);  // kTSLogChannelTechnology_Morvek_UTRAN2, the one left
}

std::string EmulatorBackend::availableScenarios() {
    return "cdma, gsm, ifx, lte, utran";
}

std::string EmulatorBackend::technology() const {
    return scenario_->technology();
}

std::string EmulatorBackend::source() const {
    return "emulator " + TechnologyNames::displayName(technology());
}

std::string EmulatorBackend::description() const {
    return StringFormat::format("emulator (%s scenario, seed %llu, tick %lld ms)",
                                TechnologyNames::shortName(scenario_->technology()).c_str(),
                                static_cast<unsigned long long>(scenario_->seed()),
                                static_cast<long long>(scenario_->tickInterval().count()));
}

void EmulatorBackend::start() {
    if (state() == State::Streaming) return;
    setState(State::Streaming);
    // Tick 0 from the event loop right away, then the interval (set in tick()).
    timer_.start(0);
}

void EmulatorBackend::stop() {
    timer_.stop();
    setState(State::Idle);
}

void EmulatorBackend::tick() {
    if (state() != State::Streaming) return;
    const int interval = static_cast<int>(scenario_->tickInterval().count());
    if (timer_.interval() != interval) timer_.setInterval(interval);
    const std::vector<Bytes> records = scenario_->recordsForTick(nextTick_++);
    for (const Bytes& record : records) {
        emitMessage(0, record);
        // A slot may have stopped us (the service shutting down).
        if (state() != State::Streaming) return;
    }
}

}  // namespace vantorel
