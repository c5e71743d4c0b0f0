// DiagPort: picks the transport a --device value names.
#include "TelephonyService/Device/DiagPort.h"

#include "TelephonyService/Device/SerialDiagPort.h"
#include "TelephonyService/Device/TcpDiagPort.h"

namespace vantorel {

DiagPort::DiagPort(std::string name) : name_(std::move(name)) {}

DiagPort::~DiagPort() = default;

std::unique_ptr<DiagPort> DiagPort::open(const std::string& spec, std::string* error) {
    if (spec.rfind(TcpDiagPort::kScheme, 0) == 0) return TcpDiagPort::open(spec, error);
    return SerialDiagPort::open(spec, error);
}

}  // namespace vantorel
