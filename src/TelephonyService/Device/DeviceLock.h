// DeviceLock: one service per modem: an exclusive lock on a file named after the device, saying which process holds the device and on which port its service listens.
#pragma once

#include <sys/types.h>

#include <memory>
#include <optional>
#include <string>

namespace vantorel {

// Two services on one DIAG port take each other's replies and switch logging off under each
// other; the service that opens a device therefore holds this lock for its whole life (also
// while no client streams and the port itself is closed). The lock is flock(2) on
// <directory>/locks/device-<key>.lock, which the kernel releases when the holder dies, so a lock
// file left behind by a crash never blocks anyone. Its content, written by the holder:
//
//   <pid>\n<program>\n<service port name>\n
//
// so that a second monitor for the same device can join that service as one more client
// instead of opening the port again, or name the holder when it cannot.
//
// The key: the canonical path of a device node (a /dev/serial/by-id/ link and its tty are one
// device), or the tcp:HOST:PORT text; percent-encoded into one file name. The directory:
// $XDG_RUNTIME_DIR/vantorel, else <tmp>/vantorel-<uid> (made mode 0700; one the user does not
// own is not used).
class DeviceLock {
public:
    struct Holder {
        pid_t pid = 0;
        std::string program;      // "vantorel-cli", "vantorel-telephonyd"
        std::string servicePort;  // the holder's well-known service port
    };

    // The lock file for a --device value (its directory made if need be); empty with *error.
    static std::string lockPathFor(const std::string& device, std::string* error);

    // Takes the device's lock for this process, naming `servicePort` as where it serves.
    // Null when it cannot: with *heldBy set when another service holds it (waiting briefly
    // for a holder that is still writing its name), else with *error.
    static std::unique_ptr<DeviceLock> acquire(const std::string& device, const std::string& servicePort,
                                               std::optional<Holder>* heldBy, std::string* error);
    // Who holds the device's lock now, without taking it; none when nobody does.
    static std::optional<Holder> holder(const std::string& device);

    // "/dev/ttyUSB0 is in use by vantorel-cli (pid 4242), whose service listens on port P"
    static std::string describe(const std::string& device, const Holder& holder);

    ~DeviceLock();  // releases the lock and removes the file
    DeviceLock(const DeviceLock&) = delete;
    DeviceLock& operator=(const DeviceLock&) = delete;

private:
    DeviceLock(int fd, std::string path) : fd_(fd), path_(std::move(path)) {}
    int fd_;
    std::string path_;
};

}  // namespace vantorel
