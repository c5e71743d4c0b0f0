// TerminalFallback: the X display probe: a socket connection and the X11 connection setup, both under a time limit.
#include "Monitor/TerminalFallback.h"

#include "Platform/TerminalText.h"

#include <QByteArray>
#include <QDir>
#include <QFile>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <netdb.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace vantorel {

namespace {

using Clock = std::chrono::steady_clock;

int remainingMs(Clock::time_point deadline) {
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
    return left > 0 ? static_cast<int>(left) : 0;
}

// A non-blocking connect finished within the deadline; the socket is then blocking.
bool connectWithin(int fd, const sockaddr* address, socklen_t length, Clock::time_point deadline) {
    ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) | O_NONBLOCK);
    if (::connect(fd, address, length) != 0) {
        if (errno != EINPROGRESS && errno != EAGAIN) return false;
        pollfd p{fd, POLLOUT, 0};
        if (::poll(&p, 1, remainingMs(deadline)) != 1) return false;
        int error = 0;
        socklen_t size = sizeof error;
        if (::getsockopt(fd, SOL_SOCKET, SO_ERROR, &error, &size) != 0 || error != 0) return false;
    }
    return true;
}

int connectUnix(const std::string& path, bool abstract, Clock::time_point deadline) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    const size_t offset = abstract ? 1 : 0;  // Linux's abstract names start with a zero byte
    if (path.size() + offset >= sizeof address.sun_path) return -1;
    std::memcpy(address.sun_path + offset, path.data(), path.size());
    const int fd = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0) return -1;
    const auto length = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + offset + path.size() + (abstract ? 0 : 1));
    if (connectWithin(fd, reinterpret_cast<const sockaddr*>(&address), length, deadline)) return fd;
    ::close(fd);
    return -1;
}

int connectTcp(const std::string& host, int port, Clock::time_point deadline) {
    addrinfo hints{};
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_NUMERICSERV;
    addrinfo* found = nullptr;
    if (::getaddrinfo(host.c_str(), std::to_string(port).c_str(), &hints, &found) != 0) return -1;
    int fd = -1;
    for (addrinfo* a = found; a && fd < 0 && remainingMs(deadline) > 0; a = a->ai_next) {
        fd = ::socket(a->ai_family, a->ai_socktype | SOCK_CLOEXEC, a->ai_protocol);
        if (fd >= 0 && !connectWithin(fd, a->ai_addr, a->ai_addrlen, deadline)) {
            ::close(fd);
            fd = -1;
        }
    }
    ::freeaddrinfo(found);
    return fd;
}

// The MIT-MAGIC-COOKIE-1 for display `number` from the Xauthority file, if any.
// Entries: family (2 bytes), then address, number, name and data, each a 2-byte
// big-endian length and the bytes.
QByteArray cookie(const std::string& number) {
    const char* file = std::getenv("XAUTHORITY");
    QFile f(file && *file ? QString::fromLocal8Bit(file) : QDir::homePath() + "/.Xauthority");
    if (!f.open(QIODevice::ReadOnly)) return {};
    const QByteArray all = f.read(1 << 20);
    qsizetype at = 0;
    auto field = [&](QByteArray* out) {
        if (at + 2 > all.size()) return false;
        const int length = (static_cast<unsigned char>(all[at]) << 8) | static_cast<unsigned char>(all[at + 1]);
        if (at + 2 + length > all.size()) return false;
        *out = all.mid(at + 2, length);
        at += 2 + length;
        return true;
    };
    QByteArray address, entryNumber, name, data;
    while (at + 2 <= all.size()) {
        at += 2;  // family
        if (!field(&address) || !field(&entryNumber) || !field(&name) || !field(&data)) break;
        if (name == "MIT-MAGIC-COOKIE-1" && (entryNumber.isEmpty() || entryNumber.toStdString() == number)) return data;
    }
    return {};
}

// The X11 connection setup and the first bytes of the server's reply: byte 0 is 0
// (Failed), 1 (Success) or 2 (Authenticate); a Failed reply has its reason's length in
// byte 1 and the reason from byte 8, an Authenticate reply its reason from byte 8 to
// the 4-byte units counted by bytes 6-7. Only Success lets a client in. A forwarding
// proxy with nothing behind it (an SSH session whose client has no X server), and an X
// server that resets, accept the connection and close it without a reply: Closed.
enum class Setup { Success, Refused, Closed, Silent };

Setup setup(int fd, const std::string& number, Clock::time_point deadline, std::string* why) {
    const QByteArray auth = cookie(number);
    const QByteArray name = auth.isEmpty() ? QByteArray() : QByteArray("MIT-MAGIC-COOKIE-1");
    auto pad = [](QByteArray b) { return b + QByteArray((4 - b.size() % 4) % 4, '\0'); };
    QByteArray request;
    request += 'l';  // little-endian byte order
    request += '\0';
    for (int v : {11, 0, static_cast<int>(name.size()), static_cast<int>(auth.size()), 0})  // version, lengths, pad
        request += static_cast<char>(v & 0xff), request += static_cast<char>(v >> 8);
    request += pad(name) + pad(auth);
    ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) & ~O_NONBLOCK);
    if (::send(fd, request.constData(), static_cast<size_t>(request.size()), MSG_NOSIGNAL) != request.size())
        return Setup::Closed;
    // The fixed 8 bytes, then up to 255 of the reason: what has come by the deadline.
    unsigned char reply[8 + 255];
    size_t got = 0;
    while (got < 8) {
        pollfd p{fd, POLLIN, 0};
        if (::poll(&p, 1, remainingMs(deadline)) != 1) return Setup::Silent;
        const ssize_t n = ::recv(fd, reply + got, sizeof reply - got, 0);
        if (n <= 0) return Setup::Closed;
        got += static_cast<size_t>(n);
    }
    if (reply[0] == 1) return Setup::Success;
    const size_t length = reply[0] == 0 ? reply[1] : (reply[6] | reply[7] << 8) * 4u;
    while (got < 8 + std::min<size_t>(length, 255)) {
        pollfd p{fd, POLLIN, 0};
        if (::poll(&p, 1, std::min(remainingMs(deadline), 200)) != 1) break;
        const ssize_t n = ::recv(fd, reply + got, sizeof reply - got, 0);
        if (n <= 0) break;
        got += static_cast<size_t>(n);
    }
    std::string reason(reinterpret_cast<const char*>(reply) + 8, std::min(got - 8, length));
    while (!reason.empty() && (reason.back() == '\0' || reason.back() == '\n')) reason.pop_back();
    if (why) *why = reason.empty() ? std::string(reply[0] == 0 ? "refused" : "asks for an authentication Qt cannot give")
                                   : TerminalText::visible(reason);
    return Setup::Refused;
}

}  // namespace

bool TerminalFallback::displayAnswers(const std::string& display, int timeoutMs, std::string* why, int* connection) {
    const auto deadline = Clock::now() + std::chrono::milliseconds(timeoutMs);
    std::string ignored;
    if (!why) why = &ignored;
    *why = "does not answer";
    const size_t colon = display.rfind(':');
    if (colon == std::string::npos) return false;
    const std::string host = display.substr(0, colon);
    std::string number = display.substr(colon + 1);
    number = number.substr(0, number.find('.'));
    if (number.empty() || number.size() > 5 || number.find_first_not_of("0123456789") != std::string::npos) return false;
    const int n = std::stoi(number);
    if (!host.empty() && host[0] != '/' && host != "unix" && !host.ends_with("/unix") && n > 65535 - 6000) return false;
    auto connect = [&]() {
        if (!host.empty() && host[0] == '/') return connectUnix(display, false, deadline);  // a socket path (launchd)
        if (host.empty() || host == "unix" || host.ends_with("/unix")) {
            const std::string path = "/tmp/.X11-unix/X" + number;
            const int fd = connectUnix(path, false, deadline);
            return fd >= 0 ? fd : connectUnix(path, true, deadline);
        }
        return connectTcp(host.front() == '[' && host.back() == ']' ? host.substr(1, host.size() - 2) : host, 6000 + n,
                          deadline);
    };
    // A connection closed at once is tried again, a little later each time, until the deadline.
    for (int pause = 10;; pause = std::min(pause * 2, 200)) {
        const int fd = connect();
        if (fd < 0) return false;
        const Setup answer = setup(fd, number, deadline, why);
        if (answer == Setup::Success && connection) {
            *connection = fd;
        } else {
            ::close(fd);
        }
        if (answer == Setup::Success) return true;
        if (answer == Setup::Refused) {
            *why = "refuses connections: " + *why;
            return false;
        }
        if (answer == Setup::Silent || remainingMs(deadline) <= pause) return false;
        ::usleep(static_cast<useconds_t>(pause) * 1000);
    }
}

std::optional<std::string> TerminalFallback::check(int timeoutMs) {
    release();
    auto set = [](const char* variable) {
        const char* value = std::getenv(variable);
        return value && *value ? std::optional<std::string>(value) : std::nullopt;
    };
    if (set("QT_QPA_PLATFORM") || set("WAYLAND_DISPLAY")) return std::nullopt;
    const auto display = set("DISPLAY");
    if (!display) return "no display (DISPLAY and WAYLAND_DISPLAY are unset)";
    std::string why;
    if (displayAnswers(*display, timeoutMs, &why, &held_)) return std::nullopt;
    return "display " + TerminalText::visible(*display) + " " + why;
}

void TerminalFallback::release() {
    if (held_ >= 0) ::close(held_);
    held_ = -1;
}

}  // namespace vantorel
