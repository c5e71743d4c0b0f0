// SystemLog: syslog with the monitor's priorities, a stderr mirror and an observer for the test capture.
#include "Platform/SystemLog.h"

#include "Platform/StringFormat.h"
#include "Platform/TerminalText.h"

#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <mutex>
#include <syslog.h>
#include <unistd.h>

namespace vantorel {

namespace {
std::atomic<bool> gMirror{false};
std::mutex gObserverMutex;
SystemLog::Observer gObserver;
std::once_flag gOpenOnce;
// Without a syslog socket every syslog(3) call tries (and fails) to connect again:
// four system calls per line. Lines then go only to the mirror and the observer.
bool gHaveSyslog = false;
}  // namespace

void SystemLog::log(int priority, const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string line = StringFormat::vformat(format, args);
    va_end(args);
    write(priority, line);
}

void SystemLog::write(int priority, const std::string& line) {
    if (priority != kConsole) {
        std::call_once(gOpenOnce, [] {
            gHaveSyslog = ::access("/dev/log", W_OK) == 0;
            if (gHaveSyslog) openlog("vantorel", LOG_PID, LOG_USER);
        });
        if (gHaveSyslog) syslog(priority, "%s", line.c_str());
    }
    if (gMirror.load()) {
        // Log lines quote what the modem sent and the mirror is usually a terminal:
        // controls are shown, not obeyed. A line's own final newline is dropped, as
        // syslog drops it.
        std::string_view text(line);
        while (!text.empty() && text.back() == '\n') text.remove_suffix(1);
        std::fprintf(stderr, "vantorel[%d]: %s\n", priority, TerminalText::visible(text).c_str());
    }
    std::lock_guard<std::mutex> lock(gObserverMutex);
    if (gObserver) gObserver(priority, line);
}

void SystemLog::setMirrorToStderr(bool on) { gMirror.store(on); }
bool SystemLog::mirrorToStderr() { return gMirror.load(); }

void SystemLog::setObserver(Observer observer) {
    std::lock_guard<std::mutex> lock(gObserverMutex);
    gObserver = std::move(observer);
}

}  // namespace vantorel
