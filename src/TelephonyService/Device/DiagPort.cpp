// DiagPort: picks the transport a --device value names.
#include "TelephonyService/Device/DiagPort.h"

#include "TelephonyService/Device/SerialDiagPort.h"
#include "TelephonyService/Device/TcpDiagPort.h"

namespace vantorel {

DiagPort::DiagPort(std::string name) : name_(std::move(name)) {}

DiagPort::~DiagPort() = default;

std::unique_ptr<DiagPort> DiagPort::open(const std::string& device, std::string* error) {
    if (device.rfind(TcpDiagPort::kScheme, 0) == 0) return TcpDiagPort::open(device, error);
    return SerialDiagPort::open(device, error);
}

}  // namespace vantorel
