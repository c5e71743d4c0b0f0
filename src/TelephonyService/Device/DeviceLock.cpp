// DeviceLock: the per-device lock file (flock) with the holder's pid, program and service port.
#include "TelephonyService/Device/DeviceLock.h"

#include "Platform/PortDirectory.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/Device/TcpDiagPort.h"

#include <QByteArray>
#include <QFileInfo>
#include <QThread>
#include <QUrl>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace vantorel {

namespace {

// How long a holder may take between taking the lock and writing its name.
constexpr int kHolderWriteWaitMs = 1000;
constexpr int kRetryStepMs = 20;

std::string keyOf(const std::string& device) {
    std::string key = device;
    if (device.rfind(TcpDiagPort::kScheme, 0) != 0) {
        const QFileInfo info(QString::fromStdString(device));
        const QString canonical = info.canonicalFilePath();
        key = (canonical.isEmpty() ? info.absoluteFilePath() : canonical).toStdString();
    }
    return QUrl::toPercentEncoding(QString::fromStdString(key)).toStdString();
}

// The holder's three lines; none while it is still writing them.
std::optional<DeviceLock::Holder> readHolder(int fd) {
    char buffer[1024];
    const ssize_t n = ::pread(fd, buffer, sizeof buffer - 1, 0);
    if (n <= 0) return std::nullopt;
    const QList<QByteArray> lines = QByteArray(buffer, int(n)).split('\n');
    if (lines.size() < 4) return std::nullopt;  // three lines and what follows the last newline
    bool numeric = false;
    DeviceLock::Holder holder;
    holder.pid = static_cast<pid_t>(lines[0].toLong(&numeric));
    if (!numeric || holder.pid <= 0) return std::nullopt;
    holder.program = lines[1].toStdString();
    holder.servicePort = lines[2].toStdString();
    return holder;
}

bool alive(pid_t pid) { return ::kill(pid, 0) == 0 || errno == EPERM; }

// Reads the holder of a lock held by someone else, waiting a little for one still writing.
std::optional<DeviceLock::Holder> heldBy(int fd, const std::string& path) {
    for (int waited = 0;; waited += kRetryStepMs) {
        // Unlinked: its holder has left (it unlinks before it unlocks); the name is free.
        struct stat st {};
        if (::fstat(fd, &st) == 0 && st.st_nlink == 0) return std::nullopt;
        if (const auto holder = readHolder(fd); holder && alive(holder->pid)) return holder;
        // Free after all (a holder that just left, or one only looking): nobody to name.
        if (::flock(fd, LOCK_SH | LOCK_NB) == 0) {
            ::flock(fd, LOCK_UN);
            return std::nullopt;
        }
        if (waited >= kHolderWriteWaitMs) return DeviceLock::Holder{0, "another program (" + path + ")", ""};
        QThread::msleep(kRetryStepMs);
    }
}

}  // namespace

std::string DeviceLock::lockPathFor(const std::string& device, std::string* error) {
    const std::string dir = PortDirectory::path(error);
    if (dir.empty()) return std::string();
    // A folder of their own: no port name in the runtime directory can take a lock's place.
    const std::string locks = dir + "/locks";
    if (::mkdir(locks.c_str(), 0700) != 0 && errno != EEXIST) {
        if (error) *error = StringFormat::format("cannot make %s: %s", locks.c_str(), std::strerror(errno));
        return std::string();
    }
    return locks + "/device-" + keyOf(device) + ".lock";
}

std::unique_ptr<DeviceLock> DeviceLock::acquire(const std::string& device, const std::string& servicePort,
                                                std::optional<Holder>* heldByOther, std::string* error) {
    const std::string path = lockPathFor(device, error);
    if (path.empty()) return nullptr;
    for (int waited = 0;; waited += kRetryStepMs) {
        const int fd = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
        if (fd < 0) {
            *error = StringFormat::format("cannot open the lock file %s: %s", path.c_str(), std::strerror(errno));
            return nullptr;
        }
        if (::flock(fd, LOCK_EX | LOCK_NB) == 0) {
            // A holder that left unlinks the file it locked: a lock on that one would be no lock.
            struct stat locked {}, named {};
            if (::fstat(fd, &locked) != 0 || ::stat(path.c_str(), &named) != 0 || locked.st_ino != named.st_ino ||
                locked.st_dev != named.st_dev) {
                ::close(fd);
                continue;
            }
            const std::string content = StringFormat::format("%d\n%s\n%s\n", int(::getpid()),
                                                             program_invocation_short_name, servicePort.c_str());
            if (::ftruncate(fd, 0) != 0 || ::pwrite(fd, content.data(), content.size(), 0) != ssize_t(content.size())) {
                *error = StringFormat::format("cannot write the lock file %s: %s", path.c_str(), std::strerror(errno));
                ::close(fd);
                return nullptr;
            }
            return std::unique_ptr<DeviceLock>(new DeviceLock(fd, path));
        }
        const int err = errno;
        if (err != EWOULDBLOCK) {
            *error = StringFormat::format("cannot lock %s: %s", path.c_str(), std::strerror(err));
            ::close(fd);
            return nullptr;
        }
        std::optional<Holder> holder = heldBy(fd, path);
        ::close(fd);
        if (holder) {
            *heldByOther = std::move(holder);
            return nullptr;
        }
        if (waited >= kHolderWriteWaitMs) {
            *error = path + ": locked, but by nobody who says so";
            return nullptr;
        }
        QThread::msleep(kRetryStepMs);
    }
}

std::optional<DeviceLock::Holder> DeviceLock::holder(const std::string& device) {
    std::string error;
    const std::string path = lockPathFor(device, &error);
    if (path.empty()) return std::nullopt;
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (fd < 0) return std::nullopt;
    std::optional<Holder> holder;
    if (::flock(fd, LOCK_SH | LOCK_NB) == 0)
        ::flock(fd, LOCK_UN);
    else
        holder = heldBy(fd, path);
    ::close(fd);
    return holder;
}

std::string DeviceLock::describe(const std::string& device, const Holder& holder) {
    std::string text = StringFormat::format("%s is in use by %s", device.c_str(), holder.program.c_str());
    if (holder.pid > 0) text += StringFormat::format(" (pid %d)", int(holder.pid));
    if (!holder.servicePort.empty())
        text += StringFormat::format(", whose service listens on port %s: watch it with --service %s",
                                     holder.servicePort.c_str(), holder.servicePort.c_str());
    return text;
}

DeviceLock::~DeviceLock() {
    // Unlinked while still locked: whoever opens the name next makes a new file.
    ::unlink(path_.c_str());
    ::close(fd_);
}

}  // namespace vantorel
