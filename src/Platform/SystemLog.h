// SystemLog: the system log (syslog with priorities 3, 4 and 16, a stderr mirror, a test capture).
#pragma once

#include <functional>
#include <string>

namespace vantorel {

class SystemLog {
public:
    // The priorities the monitor logs with. Dlf is the DLF writer's value 16 (user
    // facility, emergency level), passed to syslog as it stands.
    static constexpr int kError = 3;
    static constexpr int kWarning = 4;
    static constexpr int kNotice = 5;
    static constexpr int kDlf = 16;
    // Lines for the platform's console log (the decoders' "Display Dict = ..." dumps): not sent
    // to syslog, only mirrored and captured.
    static constexpr int kConsole = -1;

    // printf-style: object placeholders ("%@") are written as "%s" with the text.
    static void log(int priority, const char* format, ...) __attribute__((format(printf, 2, 3)));
    static void write(int priority, const std::string& line);

    // --verbose: every line is also written to stderr.
    static void setMirrorToStderr(bool on);
    static bool mirrorToStderr();

    // Observer used by SystemLogCapture; one at a time, nullptr to remove.
    using Observer = std::function<void(int priority, const std::string& line)>;
    static void setObserver(Observer observer);
};

}  // namespace vantorel
