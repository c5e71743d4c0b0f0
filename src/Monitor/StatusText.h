// StatusText: the status line's texts, the same in the window's panes and in the terminal view.
#pragma once

#include <QDateTime>

#include <string>

namespace vantorel {

class StatusText {
public:
    // The root pane's text from launch until the first update reaches it (no dots,
    // on purpose: the first screen is told apart from a lost channel).
    static constexpr const char* kFirstConnecting = "Connecting";
    // Whenever the channel is down.
    static constexpr const char* kConnecting = "Connecting...";

    // "Updated 2016-06-28 at 22:01:10": when the last new data was shown.
    static std::string updated(const QDateTime& at);
};

}  // namespace vantorel
