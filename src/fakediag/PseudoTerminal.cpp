// PseudoTerminal: a pty master with non-blocking I/O from the event loop, a bounded output queue and an optional stable link.
#include "fakediag/PseudoTerminal.h"

#include "Platform/StringFormat.h"

#include <QSocketNotifier>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace vantorel {

namespace {

constexpr size_t kReadChunk = 4096;

// Points link at target atomically (a new link renamed over the old one).
bool makeLink(const std::string& link, const std::string& target, std::string* error) {
    struct stat st {};
    if (::lstat(link.c_str(), &st) == 0 && !S_ISLNK(st.st_mode)) {
        *error = link + " exists and is not a symbolic link: it is left as it is";
        return false;
    }
    const std::string temporary = link + ".new";
    ::unlink(temporary.c_str());
    if (::symlink(target.c_str(), temporary.c_str()) != 0 || ::rename(temporary.c_str(), link.c_str()) != 0) {
        *error = StringFormat::format("cannot link %s to %s: %s", link.c_str(), target.c_str(), std::strerror(errno));
        ::unlink(temporary.c_str());
        return false;
    }
    return true;
}

}  // namespace

std::unique_ptr<PseudoTerminal> PseudoTerminal::open(const std::string& link, std::string* error) {
    const int master = ::posix_openpt(O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
    if (master < 0 || ::grantpt(master) != 0 || ::unlockpt(master) != 0) {
        *error = StringFormat::format("cannot make a pseudo-terminal: %s", std::strerror(errno));
        if (master >= 0) ::close(master);
        return nullptr;
    }
    char name[128] = {};
    if (::ptsname_r(master, name, sizeof name) != 0) {
        *error = StringFormat::format("cannot name the pseudo-terminal: %s", std::strerror(errno));
        ::close(master);
        return nullptr;
    }
    const int slave = ::open(name, O_RDWR | O_NOCTTY | O_CLOEXEC);
    if (slave < 0 || (!link.empty() && !makeLink(link, name, error))) {
        if (slave < 0) *error = StringFormat::format("cannot open %s: %s", name, std::strerror(errno));
        if (slave >= 0) ::close(slave);
        ::close(master);
        return nullptr;
    }
    return std::unique_ptr<PseudoTerminal>(new PseudoTerminal(master, slave, name, link));
}

PseudoTerminal::PseudoTerminal(int master, int slave, std::string path, std::string link)
    : master_(master), slave_(slave), path_(std::move(path)), link_(std::move(link)) {
    readNotifier_ = new QSocketNotifier(master_, QSocketNotifier::Read, this);
    connect(readNotifier_, &QSocketNotifier::activated, this, [this] { readAvailable(); });
    writeNotifier_ = new QSocketNotifier(master_, QSocketNotifier::Write, this);
    writeNotifier_->setEnabled(false);
    connect(writeNotifier_, &QSocketNotifier::activated, this, [this] { flush(); });
}

PseudoTerminal::~PseudoTerminal() {
    readNotifier_->setEnabled(false);
    writeNotifier_->setEnabled(false);
    ::close(slave_);
    ::close(master_);
    // Only our own link goes: someone may have pointed it elsewhere meanwhile.
    char target[256] = {};
    if (!link_.empty() && ::readlink(link_.c_str(), target, sizeof target - 1) > 0 && path_ == target)
        ::unlink(link_.c_str());
}

void PseudoTerminal::readAvailable() {
    uint8_t buffer[kReadChunk];
    const ssize_t n = ::read(master_, buffer, sizeof buffer);
    if (n > 0) emit received(Bytes(buffer, buffer + n));
}

size_t PseudoTerminal::put(const uint8_t* data, size_t size) {
    for (;;) {
        const ssize_t n = ::write(master_, data, size);
        if (n > 0) return static_cast<size_t>(n);
        if (n < 0 && errno == EINTR) continue;
        return 0;  // the host's input queue is full
    }
}

void PseudoTerminal::waitWritable(bool on) { writeNotifier_->setEnabled(on); }

}  // namespace vantorel
