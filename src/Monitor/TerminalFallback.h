// TerminalFallback: whether `vantorel` can open a window, or why it shows the terminal view instead.
#pragma once

#include <optional>
#include <string>

namespace vantorel {

class TerminalFallback {
public:
    // The platforms to give Qt after an X display answered: xcb, and should the server
    // refuse Qt's own connection after all (it went away or was resetting), offscreen
    // instead of the process abort Qt makes of a platform that cannot start. A program
    // that gets "offscreen" shows the terminal view.
    static constexpr const char* kPlatforms = "xcb;offscreen";

    TerminalFallback() = default;
    ~TerminalFallback() { release(); }
    TerminalFallback(const TerminalFallback&) = delete;
    TerminalFallback& operator=(const TerminalFallback&) = delete;

    // Why there is no window to open ("no display (DISPLAY and WAYLAND_DISPLAY are
    // unset)", "display :99 does not answer", "display :99 refuses connections: ..."), or
    // nothing when there is one. An explicit QT_QPA_PLATFORM or a WAYLAND_DISPLAY is left
    // to Qt; an X display is asked first, since Qt aborts the process when it cannot reach
    // it. The X connection that answered is held until release(): an X server whose last
    // client leaves resets, and refuses connections meanwhile, so the probe's own close
    // must not come before Qt's connection.
    std::optional<std::string> check(int timeoutMs = 1500);
    // True when check() found an X display and holds a connection to it.
    bool holdsDisplay() const { return held_ >= 0; }
    void release();

    // Whether the X server of `display` (":0", ":1.0", "unix:0", "host:10.0",
    // "/path/to/socket:0") accepts a connection: its reply to the connection setup says
    // success within `timeoutMs`. A connection closed without a reply (a server resetting
    // as its last client left) is tried again until then. *why: why not; *connection:
    // the open connection when it does (else it is closed).
    static bool displayAnswers(const std::string& display, int timeoutMs, std::string* why = nullptr,
                               int* connection = nullptr);

private:
    int held_ = -1;
};

}  // namespace vantorel
