// DeviceBackend: the modem backend on a real modem's DIAG port: opens it, sets the log mask the clients want, forwards log packets, follows the modem across technologies, and leaves the modem quiet.
#pragma once

#include "TelephonyService/ModemBackend.h"

#include <QElapsedTimer>
#include <QFile>
#include <QTimer>

#include <chrono>
#include <memory>
#include <optional>
#include <set>
#include <string>

namespace vantorel {

class DiagPort;
class DiagSession;

// The technology: --technology when given; otherwise the one whose serving-cell record came
// last (servingCellCodes()), which the backend always asks the modem for; before the first
// one, kDefaultTechnology (most modems in use are on LTE; a wrong guess is corrected by the
// first serving-cell record, and technologyChanged() tells the monitors, whose decoders follow). The
// mobility records 0x7130-0x7150 belong to several technologies and decide nothing.
//
// Life: start() opens the port (an error there fails the start at once: the user typed a
// wrong path) and runs the handshake; records then flow (Streaming). stop() sends the
// clearing sequence and closes the port (Idle). A port that goes away, or a handshake that
// fails, leaves the backend Failed with problem() saying why, and the open is tried again
// every kReopenInterval until it works: replugging the phone resumes the stream. A handshake
// that works but brings no record for kNoRecordWait says which codes were enabled and which
// the modem refused.
class DeviceBackend : public ModemBackend {
    Q_OBJECT
public:
    static constexpr std::chrono::milliseconds kReopenInterval{3000};
    static constexpr std::chrono::seconds kNoRecordWait{10};
    static constexpr int kClearTimeoutMs = 1500;
    static constexpr const char* kDefaultTechnology = "lte";

    // technology: an identifier, or empty to learn it from the modem. qmdlPath: when not
    // empty, every byte the modem sends is appended to it as it comes (a QMDL file).
    DeviceBackend(std::string device, std::string technology, QObject* parent = nullptr);
    ~DeviceBackend() override;  // stop()

    // Opens the QMDL file (exclusive create unless replace); false with *error.
    bool recordQmdl(const std::string& path, bool replace, std::string* error);

    // The technology from the modem's serving-cell records, empty for other codes.
    static std::string technologyOfServingCell(uint16_t code);
    static const std::set<uint16_t>& servingCellCodes();

    std::string technology() const override;
    std::string description() const override;
    // "device /dev/ttyUSB0"
    std::string source() const override;
    void start() override;
    // Sends the clearing sequence and closes the port once the modem has answered it (or
    // kClearTimeoutMs has passed); the state is Idle at once. A start() meanwhile opens the
    // port again after that.
    void stop() override;
    void finishStopping(int timeoutMs) override;
    void setLogCodes(const std::optional<std::set<uint16_t>>& codes) override;
    bool startsWithService() const override { return true; }
    std::string problem() const override { return problem_; }

    // The codes asked of the modem now: the clients' and the serving-cell codes (all: every code).
    std::optional<std::set<uint16_t>> wantedCodes() const;
    const DiagSession* session() const { return session_.get(); }

signals:
    // The clearing sequence of a stop() has ended.
    void cleared();

private:
    bool openPort(std::string* error);
    void closePort();
    void lost(const std::string& why);
    void scheduleReopen();
    void onRecord(const Bytes& record, uint16_t code, std::optional<uint32_t> subscription);
    void checkRecords();
    void report(const std::string& line);

    std::string device_;
    std::string technology_;
    bool fixedTechnology_;
    std::optional<std::set<uint16_t>> clientCodes_ = std::set<uint16_t>{};
    std::unique_ptr<DiagPort> port_;
    std::unique_ptr<DiagSession> session_;
    QTimer reopenTimer_;
    QTimer watchdog_;
    QElapsedTimer readySince_;
    uint64_t recordsThisOpen_ = 0;
    bool warnedNoRecord_ = false;
    bool running_ = false;  // between start() and stop()
    bool clearing_ = false;  // the clearing sequence of a stop() is under way
    std::string problem_;
    std::set<uint32_t> subscriptions_;  // dual-SIM subscription ids seen
    std::unique_ptr<QFile> qmdl_;
};

}  // namespace vantorel
