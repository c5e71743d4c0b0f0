// TerminalFallback: whether `vantorel` can open a window, or why it shows the terminal view instead.
#pragma once

#include <optional>
#include <string>

namespace vantorel {

class TerminalFallback {
public:
    // Why there is no window to open ("no display (DISPLAY and WAYLAND_DISPLAY are
    // unset)", "display :99 does not answer"), or nothing when there is one. An
    // explicit QT_QPA_PLATFORM or a WAYLAND_DISPLAY is left to Qt; an X display is
    // asked first, since Qt aborts the process when it cannot reach it.
    static std::optional<std::string> reason(int timeoutMs = 1500);

    // Whether the X server of `display` (":0", ":1.0", "unix:0", "host:10.0",
    // "/path/to/socket:0") accepts a connection and answers its setup request
    // within `timeoutMs`.
    static bool displayAnswers(const std::string& display, int timeoutMs);
};

}  // namespace vantorel
