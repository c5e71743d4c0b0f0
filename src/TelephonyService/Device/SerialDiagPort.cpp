// SerialDiagPort: opening a DIAG device node with errors a user can act on, raw mode, and non-blocking I/O from the event loop.
#include "TelephonyService/Device/SerialDiagPort.h"

#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

#include <QDir>
#include <QFileInfo>
#include <QSocketNotifier>

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <grp.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <termios.h>
#include <unistd.h>

namespace vantorel {

namespace {

constexpr size_t kReadChunk = 16384;
// Device numbers of Unix98 pseudo-terminal slaves (/dev/pts/N).
constexpr unsigned kPtySlaveMajorFirst = 136;
constexpr unsigned kPtySlaveMajorLast = 143;

std::string openError(const std::string& path, int err) {
    switch (err) {
    case ENOENT:
        return StringFormat::format(
            "%s: no such device (is the modem plugged in and its DIAG interface bound to a driver? see docs/devices.md)",
            path.c_str());
    case EACCES:
    case EPERM: {
        struct stat st {};
        std::string group = "the device's group";
        if (::stat(path.c_str(), &st) == 0)
            if (const struct group* g = ::getgrgid(st.st_gid)) group = StringFormat::format("group %s", g->gr_name);
        return StringFormat::format(
            "%s: permission denied: join %s (sudo usermod -aG %s $USER, then log in again) or install the udev rule "
            "in resources/udev (docs/devices.md)",
            path.c_str(), group.c_str(), group.rfind("group ", 0) == 0 ? group.substr(6).c_str() : "GROUP");
    }
    case EBUSY:
        return StringFormat::format("%s: the port is in use by another program (docs/devices.md)", path.c_str());
    case ENXIO:
    case ENODEV:
        return StringFormat::format("%s: the device is not there any more (unplugged?)", path.c_str());
    default:
        return StringFormat::format("%s: %s", path.c_str(), std::strerror(err));
    }
}

}  // namespace

std::vector<SerialDiagPort::Holder> SerialDiagPort::holders(const std::string& path) {
    std::vector<Holder> found;
    struct stat target {};
    if (::stat(path.c_str(), &target) != 0) return found;
    const pid_t self = ::getpid();
    const QDir proc(QStringLiteral("/proc"));
    for (const QString& entry : proc.entryList(QDir::Dirs | QDir::NoDotAndDotDot)) {
        bool numeric = false;
        const pid_t pid = entry.toInt(&numeric);
        if (!numeric || pid == self) continue;
        const QDir fds(QStringLiteral("/proc/%1/fd").arg(entry));
        for (const QString& fd : fds.entryList(QDir::System | QDir::NoDotAndDotDot)) {
            struct stat st {};
            if (::stat(fds.filePath(fd).toLocal8Bit().constData(), &st) != 0) continue;
            if (st.st_rdev != target.st_rdev || !S_ISCHR(st.st_mode)) continue;
            QFile comm(QStringLiteral("/proc/%1/comm").arg(entry));
            std::string program = "?";
            if (comm.open(QIODevice::ReadOnly)) program = comm.readAll().trimmed().toStdString();
            found.push_back({pid, program});
            break;
        }
    }
    return found;
}

bool SerialDiagPort::makeRaw(int fd) {
    struct termios tio {};
    if (::tcgetattr(fd, &tio) != 0) return false;
    ::cfmakeraw(&tio);
    tio.c_cflag |= CLOCAL | CREAD;
    tio.c_cflag &= ~static_cast<tcflag_t>(CRTSCTS);
    // VMIN 1: with O_NONBLOCK an empty port reads EAGAIN, and 0 means a hang-up (with VMIN 0
    // an empty port would read 0 as well).
    tio.c_cc[VMIN] = 1;
    tio.c_cc[VTIME] = 0;
    ::cfsetispeed(&tio, B115200);  // a USB serial port ignores the rate; a real UART wants one
    ::cfsetospeed(&tio, B115200);
    return ::tcsetattr(fd, TCSANOW, &tio) == 0;
}

std::unique_ptr<DiagPort> SerialDiagPort::open(const std::string& path, std::string* error) {
    auto fail = [&](const std::string& why) -> std::unique_ptr<DiagPort> {
        if (error) *error = why;
        return nullptr;
    };
    struct stat st {};
    if (::stat(path.c_str(), &st) != 0) return fail(openError(path, errno));
    if (S_ISDIR(st.st_mode)) return fail(path + ": a directory, not a device");
    if (S_ISREG(st.st_mode))
        return fail(path + ": a regular file, not a device (to play a recorded capture use --replay FILE)");

    const int fd = ::open(path.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
    if (fd < 0) return fail(openError(path, errno));
    const bool tty = ::isatty(fd) == 1;
    if (tty) {
        if (!makeRaw(fd)) {
            const int err = errno;
            ::close(fd);
            return fail(StringFormat::format("%s: cannot set raw mode: %s", path.c_str(), std::strerror(err)));
        }
        // Modem lines: some ports only talk with DTR up; a pty or a bare UART may refuse.
        int lines = TIOCM_DTR | TIOCM_RTS;
        ::ioctl(fd, TIOCMBIS, &lines);
        ::ioctl(fd, TIOCEXCL);
    }
    // A pseudo-terminal is a modem in software (or a bridge) whose other end holds it by
    // design; only real devices are checked for other programs.
    const bool pseudoTerminal = ::major(st.st_rdev) >= kPtySlaveMajorFirst && ::major(st.st_rdev) <= kPtySlaveMajorLast;
    const std::vector<Holder> others = pseudoTerminal ? std::vector<Holder>{} : holders(path);
    if (!others.empty()) {
        ::close(fd);
        std::string names;
        constexpr size_t kNamed = 3;
        for (size_t i = 0; i < others.size() && i < kNamed; ++i)
            names += StringFormat::format("%s%s (pid %d)", i ? ", " : "", others[i].program.c_str(), int(others[i].pid));
        if (others.size() > kNamed) names += StringFormat::format(" and %zu more", others.size() - kNamed);
        std::string advice = "stop it, or make it leave the port alone";
        for (const Holder& h : others)
            if (h.program == "ModemManager")
                advice = "ModemManager probes serial ports: install the udev rule in resources/udev that makes it "
                         "ignore this one, or stop it (sudo systemctl stop ModemManager); see docs/devices.md";
        return fail(StringFormat::format("%s is held by %s, which would take the modem's replies: %s", path.c_str(),
                                         names.c_str(), advice.c_str()));
    }
    return std::unique_ptr<DiagPort>(new SerialDiagPort(path, fd, tty));
}

SerialDiagPort::SerialDiagPort(std::string path, int fd, bool tty) : DiagPort(std::move(path)), fd_(fd), tty_(tty) {
    readNotifier_ = new QSocketNotifier(fd_, QSocketNotifier::Read, this);
    connect(readNotifier_, &QSocketNotifier::activated, this, [this] { readAvailable(); });
    writeNotifier_ = new QSocketNotifier(fd_, QSocketNotifier::Write, this);
    writeNotifier_->setEnabled(false);
    connect(writeNotifier_, &QSocketNotifier::activated, this, [this] { flushWrites(); });
}

SerialDiagPort::~SerialDiagPort() {
    readNotifier_->setEnabled(false);
    writeNotifier_->setEnabled(false);
    ::close(fd_);
}

void SerialDiagPort::lost(const std::string& why) {
    if (closed_) return;
    closed_ = true;
    readNotifier_->setEnabled(false);
    writeNotifier_->setEnabled(false);
    pendingWrite_.clear();
    emit closed(why);
}

void SerialDiagPort::readAvailable() {
    uint8_t buffer[kReadChunk];
    // At most a few chunks per turn, so a flooding modem cannot starve the event loop.
    for (int turn = 0; turn < 16 && !closed_; ++turn) {
        const ssize_t n = ::read(fd_, buffer, sizeof buffer);
        if (n > 0) {
            emit received(Bytes(buffer, buffer + n));
            continue;
        }
        if (n < 0 && errno == EINTR) continue;
        if (n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) return;
        // 0 from a tty whose other end hung up, EIO/ENXIO/ENODEV from an unplugged device.
        lost(n == 0 ? "the device hung up" : StringFormat::format("the device went away (%s)", std::strerror(errno)));
        return;
    }
}

bool SerialDiagPort::write(ByteView bytes) {
    if (closed_) return false;
    if (pendingWrite_.size() + bytes.size() > kMaxPendingWrite) return false;
    pendingWrite_.insert(pendingWrite_.end(), bytes.begin(), bytes.end());
    flushWrites();
    return !closed_;
}

void SerialDiagPort::flushWrites() {
    while (!pendingWrite_.empty() && !closed_) {
        const ssize_t n = ::write(fd_, pendingWrite_.data(), pendingWrite_.size());
        if (n > 0) {
            pendingWrite_.erase(pendingWrite_.begin(), pendingWrite_.begin() + n);
            continue;
        }
        if (n < 0 && errno == EINTR) continue;
        if (n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) break;
        lost(StringFormat::format("writing to the device failed (%s)", std::strerror(errno)));
        return;
    }
    writeNotifier_->setEnabled(!pendingWrite_.empty() && !closed_);
}

void SerialDiagPort::discardPending() {
    if (tty_) ::tcflush(fd_, TCIFLUSH);
    uint8_t buffer[kReadChunk];
    for (int turn = 0; turn < 64; ++turn)
        if (::read(fd_, buffer, sizeof buffer) <= 0) break;
}

}  // namespace vantorel
