// ModemBackend: state, pause flag and message counting shared by the service's modem backends.
#include "TelephonyService/ModemBackend.h"

#include "Platform/StringFormat.h"
#include "Platform/TechnologyNames.h"

namespace vantorel {

const char* ModemBackend::stateName(State state) {
    switch (state) {
    case State::Idle: return "Idle";
    case State::Streaming: return "Streaming";
    case State::Finished: return "Finished";
    case State::Failed: return "Failed";
    }
    return "Unknown";
}

std::optional<std::string> ModemBackend::technologyIdentifier(const std::string& name, std::string* error) {
    std::optional<std::string> identifier = TechnologyNames::identifierFor(name);
    if (!identifier && error)
        *error = StringFormat::format("unknown technology \"%s\" (names: %s, or a full identifier such as %s)",
                                      name.c_str(), TechnologyNames::listing().c_str(),
                                      TechnologyNames::identifierFor("utran").value_or("").c_str());
    return identifier;
}

ModemBackend::ModemBackend(QObject* parent) : QObject(parent) {}

ModemBackend::~ModemBackend() = default;

void ModemBackend::setPaused(bool paused) {
    if (paused == paused_) return;
    paused_ = paused;
    pausedChanged();
}

void ModemBackend::setState(State state) {
    if (state == state_) return;
    state_ = state;
    if (state == State::Streaming) emittedThisRun_ = 0;
    emit stateChanged(state);
}

void ModemBackend::emitMessage(int32_t messageId, const Bytes& data) {
    ++emitted_;
    ++emittedThisRun_;
    emit messageReady(messageId, data);
}

}  // namespace vantorel
