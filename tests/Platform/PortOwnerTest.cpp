// Tests that message ports belong to their user: a second user's squatter (a process running as nobody, or a socket or directory given to nobody) neither blocks, answers nor reaches our ports, and the sockets a killed process left are cleared at the next start.
#include "Platform/LocalMessagePort.h"
#include "Platform/MessagePortFrame.h"
#include "Platform/PortDirectory.h"
#include "Platform/RemoteMessagePort.h"
#include "support/EventLoopWait.h"

#include <QDir>
#include <QFile>
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

#include <cstdlib>
#include <functional>
#include <memory>
#include <optional>
#include <tuple>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using testing::uniquePortName;
using testing::waitUntil;

constexpr uid_t kNobody = 65534;
constexpr gid_t kNogroup = 65534;

#define SKIP_UNLESS_ROOT() \
    if (::geteuid() != 0) GTEST_SKIP() << "needs root, to act as a second user"

Bytes bytesOf(const std::string& s) { return Bytes(s.begin(), s.end()); }

sockaddr_un addressOf(const std::string& path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    return address;
}

// Sets (or, with nullopt, unsets) an environment variable until the end of the scope.
class ScopedEnv {
public:
    ScopedEnv(const char* name, std::optional<std::string> value) : name_(name) {
        if (const char* old = std::getenv(name)) old_ = old;
        value ? ::setenv(name, value->c_str(), 1) : ::unsetenv(name);
    }
    ~ScopedEnv() { old_ ? ::setenv(name_, old_->c_str(), 1) : ::unsetenv(name_); }

private:
    const char* name_;
    std::optional<std::string> old_;
};

// A forked process that listens on `path` as uid/gid and accepts without answering: a
// second user's squatter (no Vantorel program), or with our uid a process to SIGKILL.
class Listener {
public:
    Listener(const std::string& path, uid_t uid, gid_t gid) : path_(path) {
        const sockaddr_un address = addressOf(path);
        pid_ = ::fork();
        if (pid_ == 0) {
            const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
            if (::setgroups(0, nullptr) != 0 || ::setgid(gid) != 0 || ::setuid(uid) != 0 ||
                ::bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 || ::listen(fd, 8) != 0)
                ::_exit(1);
            while (true) ::pause();
        }
        struct stat st {};
        waitUntil([&] { return ::lstat(path.c_str(), &st) == 0; });
    }
    ~Listener() {
        kill();
        ::unlink(path_.c_str());
    }
    // SIGKILL: the socket file stays behind, nobody listening on it.
    void kill() {
        if (pid_ <= 0) return;
        ::kill(pid_, SIGKILL);
        ::waitpid(pid_, nullptr, 0);
        pid_ = 0;
    }

private:
    std::string path_;
    pid_t pid_ = 0;
};

// A socket file nobody listens on, as a killed process leaves it.
void leaveStaleSocket(const std::string& path, uid_t owner) {
    const sockaddr_un address = addressOf(path);
    const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
    ASSERT_EQ(::bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0) << path;
    ::close(fd);
    ASSERT_EQ(::chown(path.c_str(), owner, static_cast<gid_t>(-1)), 0);
}

// A forked client running as uid/gid sends a request to the socket at `path`; its exit
// status says what came back: 0 a reply, 1 the connection closed, 2 no connection.
int requestAs(const std::string& path, uid_t uid, gid_t gid) {
    const sockaddr_un address = addressOf(path);
    const Bytes frame = MessagePortFrame{MessagePortFrame::Kind::Request, 5, bytesOf("who")}.encode();
    const pid_t pid = ::fork();
    if (pid == 0) {
        const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
        if (::setgroups(0, nullptr) != 0 || ::setgid(gid) != 0 || ::setuid(uid) != 0 ||
            ::connect(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
            ::_exit(2);
        if (::write(fd, frame.data(), frame.size()) < 0) ::_exit(1);
        pollfd readable{fd, POLLIN, 0};
        char byte = 0;
        ::_exit(::poll(&readable, 1, 3000) == 1 && ::read(fd, &byte, 1) == 1 ? 0 : 1);
    }
    int status = -1;
    waitUntil([&] { return ::waitpid(pid, &status, WNOHANG) == pid; }, 5000);  // the port is served meanwhile
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(PortOwner, ASecondUsersSquatterIsRefusedWhereverItSitsAndNeverAnswersInOurPlace) {
    SKIP_UNLESS_ROOT();
    struct Scene {
        QTemporaryDir dir;
        std::vector<std::unique_ptr<ScopedEnv>> env;
        std::vector<std::unique_ptr<Listener>> squatters;
        std::string at(const char* name) const { return dir.filePath(name).toStdString(); }
        std::string mkdirOwnedBy(const std::string& path, uid_t owner) const {
            ::mkdir(path.c_str(), 0777);
            ::chown(path.c_str(), owner, static_cast<gid_t>(-1));
            return path;
        }
    };
    struct Row {
        const char* what;
        std::function<std::string(Scene&)> setUp;  // returns the port's name
        std::string refusal;  // empty: our port is made and our lookup reaches it
    };
    const std::string uid = std::to_string(::geteuid());
    const std::vector<Row> rows = {
        {"a squatter listening under the name in the shared temporary directory",
         [](Scene& s) {
             const std::string name = uniquePortName("squatted");
             s.squatters.push_back(std::make_unique<Listener>(QDir::tempPath().toStdString() + "/" + name, kNobody, kNogroup));
             return name;
         }, ""},
        {"the runtime directory under TMPDIR made first by another user",
         [&](Scene& s) {
             s.env.push_back(std::make_unique<ScopedEnv>("XDG_RUNTIME_DIR", std::nullopt));
             s.env.push_back(std::make_unique<ScopedEnv>("TMPDIR", s.dir.path().toStdString()));
             s.mkdirOwnedBy(s.at("vantorel-") + uid, kNobody);
             return uniquePortName("dir");
         }, "the directory @/vantorel-" + uid + " belongs to uid 65534"},
        {"XDG_RUNTIME_DIR of another user",
         [](Scene& s) {
             s.env.push_back(std::make_unique<ScopedEnv>("XDG_RUNTIME_DIR", s.mkdirOwnedBy(s.at("xdg"), kNobody)));
             return uniquePortName("xdg");
         }, "XDG_RUNTIME_DIR @/xdg belongs to uid 65534"},
        {"another user's live socket under an absolute name",
         [](Scene& s) {
             ::chmod(s.dir.path().toLocal8Bit().constData(), 0777);
             s.squatters.push_back(std::make_unique<Listener>(s.at("live"), kNobody, kNogroup));
             return s.at("live");
         }, "the socket @/live belongs to uid 65534"},
        {"another user's stale socket under an absolute name",
         [](Scene& s) {
             leaveStaleSocket(s.at("stale"), kNobody);
             return s.at("stale");
         }, "the socket @/stale belongs to uid 65534"},
        {"an absolute name in another user's directory",
         [](Scene& s) { return s.mkdirOwnedBy(s.at("theirs"), kNobody) + "/port"; },
         "the directory @/theirs belongs to uid 65534"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.what);
        Scene scene;
        const std::string name = row.setUp(scene);
        LocalMessagePort::CreateFailure failure;
        const auto port = LocalMessagePort::create(name, {}, &failure);
        auto remote = RemoteMessagePort::lookup(name, 300);
        if (row.refusal.empty()) {
            ASSERT_TRUE(port) << failure.reason;
            ASSERT_TRUE(remote);
            EXPECT_EQ(remote->socketPath(), port->socketPath());
            EXPECT_TRUE(waitUntil([&] { return port->hadConnection(); }));  // ours took the connection
            continue;
        }
        std::string expected = row.refusal;
        expected.replace(expected.find('@'), 1, scene.dir.path().toStdString());
        EXPECT_FALSE(port);
        EXPECT_TRUE(failure.foreign);
        EXPECT_FALSE(failure.nameInUse);
        EXPECT_EQ(failure.reason.rfind(expected, 0), 0u) << failure.reason;
        EXPECT_FALSE(remote);  // no port of ours, and none of theirs either
    }
}

TEST(PortOwner, APortServesItsUserAndRootAndAnotherUserOnlyThroughTheGroupItIsSharedWith) {
    SKIP_UNLESS_ROOT();
    QTemporaryDir dir;
    ::chmod(dir.path().toLocal8Bit().constData(), 0777);
    const group* daemonGroup = ::getgrnam("daemon");  // a group nobody is not in
    ASSERT_TRUE(daemonGroup);
    struct Row {
        const char* what;
        uid_t uid;
        gid_t gid;
        std::optional<gid_t> sharedWith;
        int outcome;  // requestAs(): 0 answered, 1 closed
    };
    const std::vector<Row> rows = {
        {"another user", kNobody, kNogroup, std::nullopt, 1},
        {"another user, the port shared with its group", kNobody, kNogroup, kNogroup, 0},
        {"another user, the port shared with a group it is not in", kNobody, kNogroup, daemonGroup->gr_gid, 1},
        {"root", 0, 0, std::nullopt, 0},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.what);
        int requests = 0;
        auto port = LocalMessagePort::create(dir.filePath(uniquePortName("peer").c_str()).toStdString(),
                                             [&](int32_t, const Bytes&) -> std::optional<Bytes> {
                                                 ++requests;
                                                 return bytesOf("answer");
                                             });
        ASSERT_TRUE(port);
        std::string error;
        if (row.sharedWith) {
            ASSERT_TRUE(port->shareWithGroup(*row.sharedWith, &error)) << error;
        }
        // Whoever may open the file, the peer's credentials decide.
        ::chmod(port->socketPath().c_str(), 0666);
        EXPECT_EQ(requestAs(port->socketPath(), row.uid, row.gid), row.outcome);
        EXPECT_EQ(requests, row.outcome == 0 ? 1 : 0);
        EXPECT_EQ(port->foreignPeers(), row.outcome == 0 ? 0u : 1u);
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
        {"vantorel.telephony", Killed, false},
        {"vantorel.telephony.channel.4242.7", Killed, false},
        {"VantorelApp.0b6f1c2e-killed", Killed, false},
        {"VantorelApp.5d1e7a90-running", Live, true},
        {"VantorelApp.left-by-nobody", OtherUsersStale, true},
        {"notes.txt", PlainFile, true},
    };
    std::vector<std::unique_ptr<Listener>> processes;
    for (const auto& [name, kind, survives] : files) {
        const std::string path = directory + "/" + name;
        if (kind == Killed || kind == Live) processes.push_back(std::make_unique<Listener>(path, ::geteuid(), ::getegid()));
        if (kind == Killed) processes.back()->kill();
        if (kind == OtherUsersStale) leaveStaleSocket(path, kNobody);
        if (kind == PlainFile) QFile(QString::fromStdString(path)).open(QIODevice::WriteOnly);
    }
    // The service starting again under its well-known name.
    LocalMessagePort::CreateFailure failure;
    const auto service = LocalMessagePort::create("vantorel.telephony", {}, &failure);
    ASSERT_TRUE(service) << failure.reason;
    EXPECT_EQ(service->socketPath(), directory + "/vantorel.telephony");
    for (const auto& [name, kind, survives] : files) {
        if (name == "vantorel.telephony") continue;
        struct stat st {};
        EXPECT_EQ(::lstat((directory + "/" + name).c_str(), &st) == 0, survives) << name;
    }
    EXPECT_TRUE(RemoteMessagePort::lookup("VantorelApp.5d1e7a90-running", 300));
}

}  // namespace
}  // namespace vantorel
