// ModemBackend: the abstract modem behind the telephony service: a technology, a state, and a stream of messages.
#pragma once

#include "PropertyList/Value.h"

#include <QObject>

#include <cstdint>
#include <optional>
#include <set>
#include <string>

namespace vantorel {

// A backend plays the modem: it reports one technology identifier ("GetTechnology"),
// and between start() and stop() emits messageReady for every message the modem
// sends (a Morvek-channel record, an IFX message, or whatever junk the modem makes),
// in order, on the thread the backend lives in. stateChanged follows every change of
// state(). A backend that can wait (a replay) sends nothing while paused (the service's
// flow control); a live modem (the emulator) does not wait.
class ModemBackend : public QObject {
    Q_OBJECT
public:
    enum class State { Idle, Streaming, Finished, Failed };
    // "Idle", "Streaming", "Finished", "Failed" (the "State" of BackendStateChanged).
    static const char* stateName(State state);

    explicit ModemBackend(QObject* parent = nullptr);
    ~ModemBackend() override;

    // The technology identifier (TelephonyIdentifiers.h) the modem reports.
    virtual std::string technology() const = 0;
    // One line for status output: "emulator (...)", "replay of ...".
    virtual std::string description() const = 0;
    // Where the messages come from, for people: "emulator LTE", "replay sprint.mi2log".
    virtual std::string source() const = 0;
    // Messages in the whole stream (a replay); none for a live modem.
    virtual std::optional<uint64_t> totalMessages() const { return std::nullopt; }
    // Microseconds since 1970 of the last message sent, as its recording says (a
    // replay of a file that carries times); none otherwise.
    virtual std::optional<int64_t> recordedTime() const { return std::nullopt; }

    State state() const { return state_; }
    // Starts streaming (from the beginning after Idle or Finished); no-op while Streaming.
    virtual void start() = 0;
    // Stops streaming; the state becomes Idle.
    virtual void stop() = 0;
    // Waits, running this thread's event loop at most timeoutMs, until what a stop() set off
    // has ended (a live modem's clearing sequence answered), so that the backend can go.
    virtual void finishStopping(int timeoutMs) { (void)timeoutMs; }

    // The ordinary log codes the streaming channels want (all: at least one wants every
    // code); a backend that talks to a real modem sets the modem's log mask from it.
    virtual void setLogCodes(const std::optional<std::set<uint16_t>>& codes) { (void)codes; }
    // True for a backend that must run from the service's start (a modem whose technology
    // is learnt from its stream before any client asks).
    virtual bool startsWithService() const { return false; }
    // What went wrong last, for people ("no DIAG reply from ..."); empty when all is well.
    virtual std::string problem() const { return {}; }

    void setPaused(bool paused);
    bool isPaused() const { return paused_; }

    // Messages emitted since construction, and since the last change to Streaming.
    uint64_t messagesEmitted() const { return emitted_; }
    uint64_t messagesThisRun() const { return emittedThisRun_; }

    // The identifier for a technology name (ifx, gsm, cdma, lte, utran, any case) or a
    // full identifier; empty with *error set ("unknown technology ...") otherwise.
    static std::optional<std::string> technologyIdentifier(const std::string& name, std::string* error);

signals:
    void messageReady(int32_t messageId, const vantorel::Bytes& data);
    void stateChanged(vantorel::ModemBackend::State state);
    // technology() now answers differently (a modem that moved to another radio technology).
    void technologyChanged();
    // A replay's display tick on its recorded time (RecordedTicks): the messages emitted
    // since the last one make up the display at recordedMs (none: the stream has no times).
    void displayTick(std::optional<int64_t> recordedMs);
    // A line for the service's status output ("device ...: 12 log codes enabled").
    void statusLine(const std::string& line);

protected:
    void setState(State state);
    void emitMessage(int32_t messageId, const Bytes& data);
    // Called after the paused flag changed.
    virtual void pausedChanged() {}

private:
    State state_ = State::Idle;
    bool paused_ = false;
    uint64_t emitted_ = 0;
    uint64_t emittedThisRun_ = 0;
};

}  // namespace vantorel
