// SerialDiagPort: a modem's DIAG port as a device node: a USB serial tty in raw mode, or a character device read as it is.
#pragma once

#include "TelephonyService/Device/DiagPort.h"

#include <sys/types.h>

#include <string>
#include <vector>

class QSocketNotifier;

namespace vantorel {

class SerialDiagPort : public DiagPort {
    Q_OBJECT
public:
    struct Holder {
        pid_t pid = 0;
        std::string program;  // the process's name (/proc/PID/comm)
    };

    // Opens the node non-blocking with O_NOCTTY; a tty is put in raw mode (no echo, no line
    // discipline, 8 bits, no CR/LF translation) and locked against other openers (TIOCEXCL).
    // Refused when another process has the node open: it would take the modem's replies.
    static std::unique_ptr<DiagPort> open(const std::string& path, std::string* error);
    ~SerialDiagPort() override;

    bool write(ByteView bytes) override;
    void discardPending() override;
    bool isTty() const { return tty_; }

    // The other processes that have `path` open, from /proc/*/fd (those this user may see).
    static std::vector<Holder> holders(const std::string& path);
    // Puts an open tty in raw mode; false with errno set when it is not a tty.
    static bool makeRaw(int fd);

private:
    SerialDiagPort(std::string path, int fd, bool tty);
    void readAvailable();
    void flushWrites();
    void lost(const std::string& why);

    int fd_;
    bool tty_;
    bool closed_ = false;
    QSocketNotifier* readNotifier_ = nullptr;
    QSocketNotifier* writeNotifier_ = nullptr;
    Bytes pendingWrite_;
};

}  // namespace vantorel
