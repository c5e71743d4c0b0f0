// DiagnosticLogDirectory: where snapshots go, $XDG_STATE_HOME/vantorel/DiagnosticLogs unless overridden, created on demand.
#pragma once

#include <string>

namespace vantorel {

// The directory snapshots are saved to; Linux has no fixed place for it, so the XDG state home is used.
// Which path wins, first match:
//   1. the environment variable VANTOREL_DIAGNOSTIC_LOGS, when set and not empty;
//   2. the directory given to setOverride (tests);
//   3. $XDG_STATE_HOME/vantorel/DiagnosticLogs, when XDG_STATE_HOME is an absolute
//      path (the XDG base-directory rules ignore a relative one);
//   4. $HOME/.local/state/vantorel/DiagnosticLogs.
class DiagnosticLogDirectory {
public:
    static constexpr const char* kEnvironmentVariable = "VANTOREL_DIAGNOSTIC_LOGS";

    // The directory, without a trailing slash; it need not exist yet.
    static std::string path();
    // Steps 3 and 4 alone: what path() gives with no variable and no override.
    static std::string defaultPath();

    // Points the directory somewhere else; an empty text removes the override.
    static void setOverride(const std::string& dir);

    // Creates path() with every missing parent (QDir::mkpath). False, with the reason
    // in *error when error is not null, when it is not a directory afterwards.
    static bool ensureExists(std::string* error);
};

}  // namespace vantorel
