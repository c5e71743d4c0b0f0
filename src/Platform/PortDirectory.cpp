// PortDirectory: the user's own directory of message-port sockets, ownership checks, and removing sockets that killed processes left (docs/protocol.md).
#include "Platform/PortDirectory.h"

#include "Platform/PeerCredentials.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

#include <QDir>
#include <QLocalSocket>

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <mutex>
#include <optional>
#include <set>
#include <sstream>

namespace vantorel {

namespace {

// How long a socket file's listener may take to accept a probe. A live port accepts at
// once (the kernel queues the connection); a socket nobody listens on refuses at once.
constexpr int kProbeTimeoutMs = 500;

std::string notOurs(const char* what, const std::string& path, uid_t owner) {
    return StringFormat::format("%s %s belongs to %s, not to this user", what, path.c_str(),
                                PeerCredentials::describeUser(owner).c_str());
}

// The directory must be this user's and closed to everyone else; made when missing. A
// symbolic link is refused: whoever could place it chose where our sockets would go.
std::string ownDirectory(const std::string& directory) {
    struct stat st {};
    if (::lstat(directory.c_str(), &st) != 0) {
        if (errno != ENOENT) return directory + ": " + std::strerror(errno);
        if (::mkdir(directory.c_str(), 0700) != 0 && errno != EEXIST)
            return StringFormat::format("cannot make %s: %s", directory.c_str(), std::strerror(errno));
        if (::lstat(directory.c_str(), &st) != 0) return directory + ": " + std::strerror(errno);
    }
    if (!S_ISDIR(st.st_mode)) return directory + " is not a directory";
    if (st.st_uid != ::geteuid()) return notOurs("the directory", directory, st.st_uid);
    if ((st.st_mode & 077) != 0 && ::chmod(directory.c_str(), 0700) != 0)
        return StringFormat::format("cannot close %s to other users: %s", directory.c_str(), std::strerror(errno));
    return "";
}

// Where the runtime directory is, or why XDG_RUNTIME_DIR cannot hold it.
std::string runtimeDirectory(std::string* error) {
    const char* xdg = std::getenv("XDG_RUNTIME_DIR");
    if (!xdg || !*xdg)
        return QDir::cleanPath(QDir::tempPath()).toStdString() + StringFormat::format("/vantorel-%u", ::geteuid());
    const std::string base = QDir::cleanPath(QString::fromLocal8Bit(xdg)).toStdString();
    struct stat st {};
    if (base.front() != '/') {
        *error = "XDG_RUNTIME_DIR (" + base + ") is not an absolute path";
    } else if (::stat(base.c_str(), &st) != 0 || !S_ISDIR(st.st_mode)) {
        *error = "XDG_RUNTIME_DIR (" + base + ") is not a directory";
    } else if (st.st_uid != ::geteuid()) {
        *error = notOurs("XDG_RUNTIME_DIR", base, st.st_uid) + " (unset it, or set it to a directory of your own)";
    } else if ((st.st_mode & 022) != 0) {
        *error = "XDG_RUNTIME_DIR (" + base + ") is writable by other users";
    } else {
        return base + "/vantorel";
    }
    return "";
}

// The paths of the Unix sockets bound now (/proc/net/unix: "Num RefCount Protocol Flags
// Type St Inode Path"); none when it cannot be read. A socket is bound from bind() on,
// before it listens: a port being made is never taken for stale.
std::optional<std::set<std::string>> boundSocketPaths() {
    std::ifstream table("/proc/net/unix");
    if (!table) return std::nullopt;
    std::set<std::string> paths;
    std::string line;
    std::getline(table, line);  // the header
    while (std::getline(table, line)) {
        std::istringstream fields(line);
        std::string field, path;
        for (int i = 0; i < 7 && fields >> field; ++i) {}
        std::getline(fields >> std::ws, path);
        if (!path.empty() && path.front() == '/') paths.insert(path);
    }
    return paths;
}

}  // namespace

std::string PortDirectory::path(std::string* error) {
    std::string why;
    const std::string directory = runtimeDirectory(&why);
    if (why.empty()) why = ownDirectory(directory);
    if (!why.empty()) {
        if (error) *error = why;
        return "";
    }
    // Once per directory and process: the sockets a killed process left there.
    static std::mutex mutex;
    static std::set<std::string> swept;
    // Held through the sweep: a port another thread of this process binds meanwhile waits
    // for it, rather than being taken for stale between its bind and its listen.
    const std::lock_guard<std::mutex> lock(mutex);
    if (swept.insert(directory).second) removeStaleSockets(directory);
    return directory;
}

std::string PortDirectory::socketPathFor(const std::string& name, std::string* error) {
    if (!name.empty() && name.front() == '/') return name;
    const std::string directory = path(error);
    return directory.empty() ? "" : directory + "/" + name;
}

std::string PortDirectory::foreignDirectory(const std::string& directory) {
    struct stat st {};
    if (::stat(directory.c_str(), &st) != 0) return "";
    if (st.st_uid != ::geteuid() && st.st_uid != 0) return notOurs("the directory", directory, st.st_uid);
    // Where others may rename or replace files, a socket's name could be swapped for a link
    // to another file before it is given to a group: only the sticky bit prevents that.
    if ((st.st_mode & (S_IWGRP | S_IWOTH)) && !(st.st_mode & S_ISVTX))
        return "the directory " + directory + " is writable by other users";
    return "";
}

int PortDirectory::removeStaleSockets(const std::string& directory, const std::string& prefix) {
    const std::optional<std::set<std::string>> bound = boundSocketPaths();
    const QStringList names = QDir(QString::fromStdString(directory))
                                  .entryList(QDir::AllEntries | QDir::System | QDir::Hidden | QDir::NoDotAndDotDot);
    int removed = 0;
    for (const QString& entry : names) {
        const std::string name = entry.toStdString();
        if (name.rfind(prefix, 0) != 0) continue;
        const std::string file = directory + "/" + name;
        struct stat st {};
        if (::lstat(file.c_str(), &st) != 0 || !S_ISSOCK(st.st_mode) || st.st_uid != ::geteuid()) continue;
        if (bound && bound->count(file)) continue;
        // Only a socket that refuses a connection is stale; one that is slow to answer is kept.
        QLocalSocket probe;
        probe.connectToServer(QString::fromStdString(file));
        const bool live = probe.waitForConnected(kProbeTimeoutMs);
        const bool refused = !live && probe.error() == QLocalSocket::ConnectionRefusedError;
        probe.abort();
        if (!refused) continue;
        // A port bound since the list was read refuses until it listens: read it again.
        const std::optional<std::set<std::string>> boundNow = boundSocketPaths();
        if (boundNow && boundNow->count(file)) continue;
        if (::unlink(file.c_str()) == 0) ++removed;
    }
    if (removed > 0)
        SystemLog::log(SystemLog::kNotice, "Message ports: %d stale sockets left by stopped processes removed from %s",
                       removed, directory.c_str());
    return removed;
}

}  // namespace vantorel
