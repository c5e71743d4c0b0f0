// StatusText: the status line's texts, the same in the window's panes and in the terminal view.
#pragma once

#include "Model/SourceStatus.h"

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

    // The whole status line for a stream's state: "Connecting...", "Connecting... nothing
    // serves port lab; trying again every 5 s", "Updated ... · replay x.qmdl · recorded
    // 22:01:09 · 45%", "disconnected since 22:03:00 · service NAME", "no data since
    // 22:03:00: device ...: the device went away · device ...", "replay finished: 120
    // messages, 80 for this decoder · replay x.qmdl", or why the decoder has read nothing
    // and which --technology would; "· N messages dropped" before the source when the
    // service dropped any for this monitor.
    static std::string line(const SourceStatus& status);
    // True when the values on screen no longer follow the stream: the channel is lost, the
    // backend failed after sending data (an unplugged or hung-up modem), or the stream froze.
    static bool isStale(const SourceStatus& status);
};

}  // namespace vantorel
