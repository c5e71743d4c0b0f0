// Tests that message ports belong to their user: a second user's squatter (a process running as nobody, or a socket or directory given to nobody) neither blocks, answers nor reaches our ports, and the sockets a killed process left are cleared at the next start.
#include "Platform/LocalMessagePort.h"
#include "Platform/MessagePortFrame.h"
#include "Platform/PortDirectory.h"
#include "Platform/RemoteMessagePort.h"
#include "support/EventLoopWait.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <grp.h>
#include <poll.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

namespace vantorel {
namespace {

using testing::uniquePortName;
using testing::waitUntil;

constexpr uid_t kNobody = 65534;
constexpr gid_t kNogroup = 65534;

#define SKIP_UNLESS_ROOT() \
    if (::geteuid() != 0) GTEST_SKIP() << "needs root, to act as a second user"

sockaddr_un addressOf(const std::string& path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    return address;
}

// Sets (with nullopt: unsets) an environment variable until the end of the scope.
struct ScopedEnv {
    ScopedEnv(const char* name, std::optional<std::string> value)
        : name(name), old(std::getenv(name) ? std::optional<std::string>(std::getenv(name)) : std::nullopt) {
        value ? ::setenv(name, value->c_str(), 1) : ::unsetenv(name);
    }
    ~ScopedEnv() { old ? ::setenv(name, old->c_str(), 1) : ::unsetenv(name); }
    const char* name;
    std::optional<std::string> old;
};

// A forked process running as uid/gid (a second user's, on raw sockets: no Vantorel code)
// that does `body` with a fresh Unix socket and exits with what it returns.
template <typename Body>
pid_t forkAs(uid_t uid, gid_t gid, Body body) {
    const pid_t pid = ::fork();
    if (pid == 0) ::_exit(::setgroups(0, nullptr) || ::setgid(gid) || ::setuid(uid) ? 9 : body(::socket(AF_UNIX, SOCK_STREAM, 0)));
    return pid;
}

// Processes listening on a path, never answering; killed (SIGKILL: the socket file stays) at the latest at the end.
struct Listeners {
    std::vector<pid_t> pids;
    std::vector<std::string> paths;
    pid_t add(const std::string& path, uid_t uid, gid_t gid) {
        paths.push_back(path);
        const sockaddr_un address = addressOf(path);
        pids.push_back(forkAs(uid, gid, [&](int fd) {
            if (::bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address) || ::listen(fd, 8)) return 1;
            while (true) ::pause();
        }));
        waitUntil([&] { return QFileInfo::exists(QString::fromStdString(path)); });
        return pids.back();
    }
    void kill(pid_t pid) {
        ::kill(pid, SIGKILL);
        ::waitpid(pid, nullptr, 0);
        pids.erase(std::find(pids.begin(), pids.end(), pid));
    }
    ~Listeners() {
        while (!pids.empty()) kill(pids.back());
        for (const std::string& path : paths) ::unlink(path.c_str());
    }
};

// A socket file nobody listens on, as a killed process leaves it.
void leaveStaleSocket(const std::string& path, uid_t owner) {
    const sockaddr_un address = addressOf(path);
    const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
    ASSERT_EQ(::bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0) << path;
    ::close(fd);
    ASSERT_EQ(::chown(path.c_str(), owner, static_cast<gid_t>(-1)), 0);
}

// A request from a process running as uid/gid: 0 when it got a reply, 1 when its connection was closed.
int requestAs(const std::string& path, uid_t uid, gid_t gid) {
    const sockaddr_un address = addressOf(path);
    const Bytes frame = MessagePortFrame{MessagePortFrame::Kind::Request, 5, Bytes{'?'}}.encode();
    const pid_t pid = forkAs(uid, gid, [&](int fd) {
        if (::connect(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address) ||
            ::write(fd, frame.data(), frame.size()) < 0)
            return 2;
        pollfd readable{fd, POLLIN, 0};
        char byte = 0;
        return ::poll(&readable, 1, 3000) == 1 && ::read(fd, &byte, 1) == 1 ? 0 : 1;
    });
    int status = -1;
    waitUntil([&] { return ::waitpid(pid, &status, WNOHANG) == pid; }, 5000);  // the port is served meanwhile
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(PortOwner, ASecondUsersSquatterIsRefusedWhereverItSitsAndNeverAnswersInOurPlace) {
    SKIP_UNLESS_ROOT();
    struct Scene {
        Scene() { ::chmod(dir.path().toLocal8Bit().constData(), 01777); }  // the squatters may reach into it, as into /tmp
        QTemporaryDir dir;
        std::vector<std::unique_ptr<ScopedEnv>> env;
        Listeners squatters;
        std::string at(const std::string& name) const { return dir.filePath(QString::fromStdString(name)).toStdString(); }
        std::string theirs(const std::string& name) const {  // a directory another user made
            ::mkdir(at(name).c_str(), 0777);
            ::chown(at(name).c_str(), kNobody, kNogroup);
            return at(name);
        }
    };
    const std::string uid = std::to_string(::geteuid());
    const std::vector<std::tuple<const char*, std::function<std::string(Scene&)>, std::string>> rows = {
        // what, set-up returning the port's name, the start of the refusal ("" for none)
        {"a squatter under the name in the shared temporary directory", [](Scene& s) {
             const std::string name = uniquePortName("squatted");
             s.squatters.add(QDir::tempPath().toStdString() + "/" + name, kNobody, kNogroup);
             return name;
         }, ""},
        {"the runtime directory under TMPDIR made first by another user", [&](Scene& s) {
             s.env.push_back(std::make_unique<ScopedEnv>("XDG_RUNTIME_DIR", std::nullopt));
             s.env.push_back(std::make_unique<ScopedEnv>("TMPDIR", s.dir.path().toStdString()));
             s.theirs("vantorel-" + uid);
             return uniquePortName("dir");
         }, "the directory @/vantorel-" + uid + " belongs to uid 65534"},
        {"XDG_RUNTIME_DIR of another user", [](Scene& s) {
             s.env.push_back(std::make_unique<ScopedEnv>("XDG_RUNTIME_DIR", s.theirs("xdg")));
             return uniquePortName("xdg");
         }, "XDG_RUNTIME_DIR @/xdg belongs to uid 65534"},
        {"another user's live socket under an absolute name", [](Scene& s) {
             s.squatters.add(s.theirs("open") + "/live", kNobody, kNogroup);
             return s.at("open/live");
         }, "the directory @/open belongs to uid 65534"},
        {"another user's live socket in a directory of ours", [](Scene& s) {
             s.squatters.add(s.at("live"), kNobody, kNogroup);
             return s.at("live");
         }, "the socket @/live belongs to uid 65534"},
        {"a socket under an absolute name in a directory others can rename in", [](Scene& s) {
             ::mkdir(s.at("open").c_str(), 0777);
             ::chmod(s.at("open").c_str(), 0777);  // no sticky bit
             return s.at("open/port");
         }, "the directory @/open is writable by other users"},
        {"another user's stale socket", [](Scene& s) {
             leaveStaleSocket(s.at("stale"), kNobody);
             return s.at("stale");
         }, "the socket @/stale belongs to uid 65534"},
    };
    for (const auto& [what, setUp, refusal] : rows) {
        SCOPED_TRACE(what);
        Scene scene;
        const std::string name = setUp(scene);
        LocalMessagePort::CreateFailure failure;
        const auto port = LocalMessagePort::create(name, {}, &failure);
        const auto remote = RemoteMessagePort::lookup(name, 300);
        if (refusal.empty()) {
            ASSERT_TRUE(port && remote) << failure.reason;
            EXPECT_EQ(remote->socketPath(), port->socketPath());
            EXPECT_TRUE(waitUntil([&] { return port->hadConnection(); }));  // ours took the connection
            continue;
        }
        std::string expected = refusal;
        expected.replace(expected.find('@'), 1, scene.dir.path().toStdString());
        EXPECT_TRUE(!port && failure.foreign && !failure.nameInUse);
        EXPECT_EQ(failure.reason.rfind(expected, 0), 0u) << failure.reason;
        EXPECT_FALSE(remote);  // no port of ours, and none of theirs either
    }
}

TEST(PortOwner, APortServesItsUserAndRootAndAnotherUserOnlyThroughTheGroupItIsSharedWith) {
    SKIP_UNLESS_ROOT();
    QTemporaryDir dir;
    ::chmod(dir.path().toLocal8Bit().constData(), 01777);  // as /tmp: anyone may add, nobody may swap
    const group* daemonGroup = ::getgrnam("daemon");  // a group nobody is not in
    ASSERT_TRUE(daemonGroup);
    const std::vector<std::tuple<const char*, uid_t, std::optional<gid_t>, int>> rows = {
        // peer, its uid (gid the same), the group the port is shared with, requestAs(): 0 answered, 1 closed
        {"another user", kNobody, std::nullopt, 1},
        {"another user, the port shared with its group", kNobody, kNogroup, 0},
        {"another user, the port shared with a group it is not in", kNobody, daemonGroup->gr_gid, 1},
        {"root", 0, std::nullopt, 0},
    };
    for (const auto& [what, uid, sharedWith, outcome] : rows) {
        SCOPED_TRACE(what);
        int requests = 0;
        auto port = LocalMessagePort::create(dir.filePath(uniquePortName("peer").c_str()).toStdString(),
                                             [&](int32_t, const Bytes&) {
                                                 ++requests;
                                                 return std::optional<Bytes>(Bytes(1, 'x'));
                                             });
        std::string error;
        ASSERT_TRUE(port && (!sharedWith || port->shareWithGroup(*sharedWith, &error))) << error;
        ::chmod(port->socketPath().c_str(), 0666);  // whoever may open the file, the peer's credentials decide
        EXPECT_EQ(requestAs(port->socketPath(), uid, uid), outcome);
        EXPECT_EQ(requests, 1 - outcome);
        EXPECT_EQ(port->foreignPeers(), static_cast<uint64_t>(outcome));
    }
}

TEST(PortOwner, SocketsAKilledProcessLeftInTheRuntimeDirectoryAreClearedAtTheNextStart) {
    SKIP_UNLESS_ROOT();
    QTemporaryDir xdg;
    const ScopedEnv runtime("XDG_RUNTIME_DIR", xdg.path().toStdString());
    const std::string directory = xdg.filePath("vantorel").toStdString();
    ASSERT_EQ(::mkdir(directory.c_str(), 0700), 0);
    enum Kind { Killed, Live, OtherUsersStale, PlainFile };
    const std::vector<std::tuple<std::string, Kind, bool>> files = {  // name, what is there, survives
        {"vantorel.telephony.channel.4242.7", Killed, false},
        {"VantorelApp.0b6f1c2e-killed", Killed, false},
        {"vantorel.telephony", Killed, true},  // taken over by the service below
        {"VantorelApp.5d1e7a90-running", Live, true},
        {"VantorelApp.left-by-nobody", OtherUsersStale, true},
        {"notes.txt", PlainFile, true},
    };
    Listeners processes;
    for (const auto& [name, kind, survives] : files) {
        const std::string path = directory + "/" + name;
        if (kind == Killed) processes.kill(processes.add(path, ::geteuid(), ::getegid()));
        if (kind == Live) processes.add(path, ::geteuid(), ::getegid());
        if (kind == OtherUsersStale) leaveStaleSocket(path, kNobody);
        if (kind == PlainFile) QFile(QString::fromStdString(path)).open(QIODevice::WriteOnly);
    }
    LocalMessagePort::CreateFailure failure;
    const auto service = LocalMessagePort::create("vantorel.telephony", {}, &failure);  // the service starting again
    ASSERT_TRUE(service) << failure.reason;
    for (const auto& [name, kind, survives] : files)
        EXPECT_EQ(QFileInfo::exists(QString::fromStdString(directory + "/" + name)), survives) << name;
    EXPECT_TRUE(RemoteMessagePort::lookup("vantorel.telephony", 300));
    EXPECT_TRUE(RemoteMessagePort::lookup("VantorelApp.5d1e7a90-running", 300));
}

}  // namespace
}  // namespace vantorel
