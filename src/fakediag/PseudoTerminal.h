// PseudoTerminal: the modem's end of a pseudo-terminal: the host opens the other end as it would a USB serial port.
#pragma once

#include "fakediag/ModemLink.h"

#include <memory>
#include <string>

class QSocketNotifier;

namespace vantorel {

// The terminal is left as the kernel makes it (cooked, echoing), as a freshly plugged serial
// port is: the host must put it in raw mode itself. The modem's side keeps the other end
// open too, so the terminal lives on between the host's sessions and reading it never
// fails while no host is attached.
class PseudoTerminal : public ModemLink {
    Q_OBJECT
public:
    // A new terminal; when link is not empty, it is made a symbolic link to the terminal
    // (an older symbolic link there is replaced, any other file refused). Null with *error.
    static std::unique_ptr<PseudoTerminal> open(const std::string& link, std::string* error);
    // Closes both ends (the host then reads an error, as from an unplugged device) and removes the link.
    ~PseudoTerminal() override;

    // /dev/pts/N
    std::string path() const override { return path_; }

protected:
    size_t put(const uint8_t* data, size_t size) override;
    void waitWritable(bool on) override;

private:
    PseudoTerminal(int master, int slave, std::string path, std::string link);
    void readAvailable();

    int master_;
    int slave_;
    std::string path_;
    std::string link_;
    QSocketNotifier* readNotifier_ = nullptr;
    QSocketNotifier* writeNotifier_ = nullptr;
};

}  // namespace vantorel
