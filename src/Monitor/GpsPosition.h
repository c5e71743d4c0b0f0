// GpsPosition: the receiver's position from a running gpsd, read without blocking the event loop; nothing when there is no gpsd or no fix.
#pragma once

#include "Monitor/SignalCsvWriter.h"

#include <QObject>

#include <chrono>
#include <memory>
#include <optional>
#include <string>

class QSocketNotifier;
class QTimer;
struct gps_data_t;

namespace vantorel {

// Connects to gpsd (localhost:2947 unless told otherwise), asks for its JSON watch
// stream and reads it when the socket is readable. A missing gpsd is one log line and
// a new attempt every kRetryInterval; a gpsd that goes away is the same. The position
// holds while the latest report has a 2D or 3D fix and is younger than kFixLifetime.
class GpsPosition : public QObject {
    Q_OBJECT
public:
    static constexpr std::chrono::seconds kRetryInterval{10};
    static constexpr std::chrono::seconds kFixLifetime{10};

    explicit GpsPosition(std::string host = "localhost", std::string port = "2947", QObject* parent = nullptr);
    ~GpsPosition() override;

    // The first connection attempt (a local connect: refused at once without gpsd).
    void start();
    bool isConnected() const { return data_ != nullptr; }
    std::optional<SignalCsvWriter::Position> position() const;

private:
    void connectToGpsd();
    void readReports();
    void disconnect(const char* why);

    std::string host_;
    std::string port_;
    std::unique_ptr<gps_data_t> data_;
    QSocketNotifier* notifier_ = nullptr;
    QTimer* retry_ = nullptr;
    bool unavailableLogged_ = false;
    std::optional<SignalCsvWriter::Position> position_;
    std::chrono::steady_clock::time_point positionAt_;
};

}  // namespace vantorel
