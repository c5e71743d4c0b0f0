// FakeDiagModem: a DIAG modem in software on a pseudo-terminal or a TCP port: answers the host's requests, streams the log packets its mask lets out, and plays the faults real modems and wrong ports show.
#pragma once

#include "PropertyList/Value.h"
#include "fakediag/DiagResponder.h"

#include <QObject>
#include <QTimer>

#include <chrono>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

namespace vantorel {

class ModemBackend;
class ModemLink;

// The log packets come from modem backends (a recorded stream, an emulator scenario): each
// ordinary record they produce becomes a DIAG log packet (10 00 <len> <DLF record>, inside
// a dual-SIM wrapper when a subscription is set) and goes out HDLC-framed when the mask
// enables its code. The radio runs while logging is on: the current backend starts once the
// host's mask changes have settled (kSettle after the last request that left a bit set)
// and stops when the last bit is cleared, so a recording plays from its start for each
// host session. With several backends, the modem moves from one to the next every
// switchEvery (an LTE phone falling back to 3G and back).
class FakeDiagModem : public QObject {
    Q_OBJECT
public:
    static constexpr std::chrono::milliseconds kSettle{200};

    enum class Fault {
        Trickle,            // every byte written on its own
        PartialFirstFrame,  // the tail of an older frame before each reply to 60 (a host's first request)
        BadCrc,             // every 4th log packet and every 4th reply with a spoilt CRC
        Unsolicited,        // debug messages (plain and dual-SIM) before each reply
        NoReply,            // requests taken, never answered
        Garbage,            // every request answered with an AT port's "ERROR" line
    };
    // "trickle", "partial-first-frame", "bad-crc", "unsolicited", "no-reply", "garbage".
    static std::optional<Fault> faultNamed(const std::string& name);
    static std::string faultNames();

    struct Options {
        std::string link;  // a symbolic link kept pointing at the current terminal
        int tcpPort = -1;  // 0 or more: serve 127.0.0.1:tcpPort (0: any free port) instead of a terminal
        DiagResponder::ItemCounts itemCounts = DiagResponder::defaultItemCounts();
        std::string buildId = "VANTOREL.FAKEDIAG.1.0";
        std::set<Fault> faults;
        std::optional<uint32_t> subscription;  // wrap log packets as this dual-SIM subscription's
        std::chrono::milliseconds switchEvery{30000};  // 0: only switchTechnology() moves it
        // The terminal (or TCP port) closes once, after logging has been on this long (0:
        // never), and a new one opens backAfter later (negative: never), as an unplugged and
        // replugged phone.
        std::chrono::milliseconds vanishAfter{0};
        std::chrono::milliseconds backAfter{-1};
    };
    struct Counters {
        uint64_t requests = 0;
        uint64_t badRequests = 0;   // frames from the host with a bad CRC or cut
        uint64_t logPackets = 0;    // sent
        uint64_t notEnabled = 0;    // records whose code the mask kept back
        uint64_t hostBehind = 0;    // frames dropped, the host not reading
    };

    FakeDiagModem(std::vector<std::unique_ptr<ModemBackend>> sources, Options options, QObject* parent = nullptr);
    ~FakeDiagModem() override;

    // Opens the terminal or the TCP port; false with *error.
    bool open(std::string* error);
    // What a host opens: the symbolic link when there is one, else linkPath().
    std::string path() const;
    // The terminal or "tcp:127.0.0.1:PORT" now (empty while unplugged).
    std::string linkPath() const;
    // Closes the link now, as an unplugged modem; with backAfter >= 0, a new one follows.
    void vanish();
    // Moves the modem to its next source (technology) now.
    void switchTechnology();

    const std::vector<Bytes>& requests() const { return requests_; }
    const DiagResponder& responder() const { return responder_; }
    const Counters& counters() const { return counters_; }
    bool streaming() const { return streaming_; }

signals:
    // What the modem does, for people: "logging on: 0xB: 12 items", "now on GSM/UMTS".
    void statusLine(const std::string& line);
    // A terminal or TCP port opened (at open() and when the modem comes back).
    void linkOpened(const std::string& path);
    void requestReceived(const vantorel::Bytes& request);

private:
    bool openLink(std::string* error);
    void onRequest(ByteView request);
    void updateLogging();
    void startRadio();
    void stopRadio();
    void onRecord(const Bytes& record);
    // Frames and writes a body; spoil: a wrong CRC.
    bool send(ByteView body, bool spoil = false);
    bool has(Fault fault) const { return options_.faults.count(fault) > 0; }

    std::vector<std::unique_ptr<ModemBackend>> sources_;
    size_t current_ = 0;
    Options options_;
    DiagResponder responder_;
    std::unique_ptr<ModemLink> link_;
    std::vector<Bytes> requests_;
    Counters counters_;
    bool streaming_ = false;
    uint64_t replies_ = 0;
    std::string mask_;  // the mask summary last told
    QTimer settle_;
    QTimer switch_;
    QTimer vanish_;
    QTimer back_;
};

}  // namespace vantorel
