// DeviceBackend: a live DIAG modem behind the telephony service.
#include "TelephonyService/Device/DeviceBackend.h"

#include "Platform/LogCodes.h"
#include "Platform/ServingCellCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "TelephonyService/Device/DiagPort.h"
#include "TelephonyService/Device/DiagSession.h"

#include <QEventLoop>

#include <map>

namespace vantorel {

namespace {

std::string codeList(const std::set<uint16_t>& codes) {
    std::string text;
    for (uint16_t code : codes) text += StringFormat::format("%s0x%04X", text.empty() ? "" : ", ", code);
    return text.empty() ? "none" : text;
}

}  // namespace

DeviceBackend::DeviceBackend(std::string device, std::string technology, QObject* parent)
    : ModemBackend(parent), device_(std::move(device)), technology_(std::move(technology)),
      fixedTechnology_(!technology_.empty()) {
    reopenTimer_.setSingleShot(true);
    connect(&reopenTimer_, &QTimer::timeout, this, [this] {
        if (!running_ || session_) return;
        std::string error;
        if (!openPort(&error)) {
            if (error != problem_) report("cannot open the modem: " + error + "; trying again");
            problem_ = error;
            scheduleReopen();
        }
    });
    watchdog_.setInterval(1000);
    connect(&watchdog_, &QTimer::timeout, this, &DeviceBackend::checkRecords);
}

DeviceBackend::~DeviceBackend() {
    stop();
    finishStopping(kClearTimeoutMs + 500);
    if (session_) disconnect(session_.get(), nullptr, this, nullptr);
    if (port_) disconnect(port_.get(), nullptr, this, nullptr);
    session_.reset();  // it reads the port
    port_.reset();
}

const std::set<uint16_t>& DeviceBackend::servingCellCodes() { return ServingCellCodes::codes(); }

std::string DeviceBackend::technologyOfServingCell(uint16_t code) { return ServingCellCodes::technologyOf(code); }

bool DeviceBackend::recordQmdl(const std::string& path, bool replace, std::string* error) {
    auto file = std::make_unique<QFile>(QString::fromStdString(path));
    const QIODevice::OpenMode mode = QIODevice::WriteOnly | QIODevice::Unbuffered |
                                     (replace ? QIODevice::Truncate : QIODevice::NewOnly);
    if (!file->open(mode)) {
        if (error)
            *error = StringFormat::format("%s: %s", path.c_str(),
                                          file->exists() && !replace ? "exists already; it is left as it is (--force replaces it)"
                                                                     : file->errorString().toStdString().c_str());
        return false;
    }
    qmdl_ = std::move(file);
    return true;
}

std::string DeviceBackend::technology() const {
    return technology_.empty() ? TechnologyNames::identifierFor(kDefaultTechnology).value_or("") : technology_;
}

std::string DeviceBackend::description() const {
    return StringFormat::format("DIAG modem on %s, technology %s", device_.c_str(),
                                fixedTechnology_ ? "as given" : "from its serving-cell records");
}

std::string DeviceBackend::source() const { return "device " + device_; }

std::optional<std::set<uint16_t>> DeviceBackend::wantedCodes() const {
    if (!clientCodes_) return std::nullopt;
    std::set<uint16_t> codes = *clientCodes_;
    if (!fixedTechnology_) codes.insert(servingCellCodes().begin(), servingCellCodes().end());
    return codes;
}

void DeviceBackend::report(const std::string& line) {
    SystemLog::log(SystemLog::kNotice, "Device %s: %s", device_.c_str(), line.c_str());
    emit statusLine("device " + device_ + ": " + line);
}

void DeviceBackend::start() {
    if (running_) return;
    running_ = true;
    if (clearing_) return;  // the open follows the clearing sequence
    std::string error;
    if (!openPort(&error)) {
        problem_ = error;
        SystemLog::log(SystemLog::kError, "Device %s: cannot open the modem: %s", device_.c_str(), error.c_str());
        setState(State::Failed);
        scheduleReopen();
    }
}

bool DeviceBackend::openPort(std::string* error) {
    port_ = DiagPort::open(device_, error);
    if (!port_) return false;
    session_ = std::make_unique<DiagSession>(port_.get());
    connect(port_.get(), &DiagPort::closed, this, [this](const std::string& why) { lost(why); });
    if (qmdl_)
        connect(port_.get(), &DiagPort::received, this, [this](const Bytes& bytes) {
            if (qmdl_ && qmdl_->write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size())) !=
                             static_cast<qint64>(bytes.size())) {
                report("QMDL recording stopped: " + qmdl_->errorString().toStdString());
                qmdl_.reset();
            }
        });
    connect(session_.get(), &DiagSession::record, this, &DeviceBackend::onRecord);
    connect(session_.get(), &DiagSession::failed, this, [this](const std::string& why) {
        // From inside the session's own callback: the port is closed from the event loop.
        QMetaObject::invokeMethod(this, [this, why] { lost(why); }, Qt::QueuedConnection);
    });
    connect(session_.get(), &DiagSession::ready, this, [this] {
        problem_.clear();
        recordsThisOpen_ = 0;
        warnedNoRecord_ = false;
        readySince_.start();
        watchdog_.start();
        std::string line = StringFormat::format("DIAG handshake done%s%s; log codes enabled: %s",
                                                session_->buildId().empty() ? "" : ", build ",
                                                session_->buildId().c_str(),
                                                session_->allEnabled() ? "all" : codeList(session_->enabledCodes()).c_str());
        if (!session_->refusals().empty()) {
            std::set<uint16_t> refused;
            for (const auto& r : session_->refusals()) refused.insert(r.code);
            line += "; refused: " + codeList(refused);
        }
        report(line);
        setState(State::Streaming);
    });
    report("opened; DIAG handshake");
    session_->open(wantedCodes());
    return true;
}

void DeviceBackend::closePort() {
    watchdog_.stop();
    if (session_) disconnect(session_.get(), nullptr, this, nullptr);
    if (port_) disconnect(port_.get(), nullptr, this, nullptr);
    // Deleted from the event loop: this may run inside one of their signals.
    if (session_) session_.release()->deleteLater();
    if (port_) port_.release()->deleteLater();
}

void DeviceBackend::lost(const std::string& why) {
    if (!running_ || !port_) return;
    problem_ = why;
    report(why + "; trying again every " + std::to_string(kReopenInterval.count() / 1000) + " s");
    closePort();
    setState(State::Failed);
    scheduleReopen();
}

void DeviceBackend::scheduleReopen() {
    if (running_) reopenTimer_.start(kReopenInterval);
}

void DeviceBackend::stop() {
    if (!running_) return;
    running_ = false;
    reopenTimer_.stop();
    watchdog_.stop();
    if (session_ && !clearing_) {
        const DiagSession::Counters c = session_->counters();
        clearing_ = true;
        // The modem is left as it was found: no logging, no events, no debug messages.
        session_->clear(kClearTimeoutMs, [this, c](bool answered) {
            report(StringFormat::format(
                "%s; %llu log packets forwarded, dropped: %llu bad CRC, %llu malformed or over-long, %llu not log "
                "packets, %llu of codes not enabled",
                answered ? "logging switched off" : "the modem did not confirm that logging is off",
                static_cast<unsigned long long>(c.logPackets), static_cast<unsigned long long>(c.badCrc),
                static_cast<unsigned long long>(c.malformed), static_cast<unsigned long long>(c.notLog),
                static_cast<unsigned long long>(c.unsubscribed)));
            clearing_ = false;
            closePort();
            if (qmdl_) qmdl_->flush();
            emit cleared();
            // A client came back meanwhile: the modem is opened anew.
            if (running_) {
                running_ = false;
                start();
            }
        });
    } else if (!clearing_) {
        closePort();
        if (qmdl_) qmdl_->flush();
    }
    setState(State::Idle);
}

void DeviceBackend::finishStopping(int timeoutMs) {
    if (!clearing_) return;
    QEventLoop loop;
    QTimer deadline;
    deadline.setSingleShot(true);
    connect(&deadline, &QTimer::timeout, &loop, &QEventLoop::quit);
    connect(this, &DeviceBackend::cleared, &loop, &QEventLoop::quit);
    deadline.start(timeoutMs);
    loop.exec();
}

void DeviceBackend::setLogCodes(const std::optional<std::set<uint16_t>>& codes) {
    if (codes == clientCodes_) return;
    clientCodes_ = codes;
    if (session_) session_->setCodes(wantedCodes());
}

void DeviceBackend::onRecord(const Bytes& record, uint16_t code, std::optional<uint32_t> subscription) {
    ++recordsThisOpen_;
    if (subscription && subscriptions_.insert(*subscription).second)
        report(StringFormat::format("records of SIM subscription %u", *subscription));
    if (!fixedTechnology_) {
        const std::string technology = technologyOfServingCell(code);
        if (!technology.empty() && technology != technology_) {
            const std::string before = technology_;
            technology_ = technology;
            report(before.empty() ? "the modem is on " + TechnologyNames::displayName(technology)
                                  : "the modem moved from " + TechnologyNames::displayName(before) + " to " +
                                        TechnologyNames::displayName(technology));
            emit technologyChanged();
        }
    }
    emitMessage(0, record);  // message id 0: a record, as from every backend
}

void DeviceBackend::checkRecords() {
    if (!session_ || !session_->isReady() || warnedNoRecord_ || recordsThisOpen_ > 0) return;
    if (!readySince_.hasExpired(std::chrono::duration_cast<std::chrono::milliseconds>(kNoRecordWait).count())) return;
    warnedNoRecord_ = true;
    std::set<uint16_t> refused;
    for (const auto& r : session_->refusals()) refused.insert(r.code);
    report(StringFormat::format(
        "no log record in %lld s: enabled %s; refused by the modem: %s (is the radio on? see docs/devices.md)",
        static_cast<long long>(kNoRecordWait.count()),
        session_->allEnabled() ? "all codes" : codeList(session_->enabledCodes()).c_str(), codeList(refused).c_str()));
}

}  // namespace vantorel
