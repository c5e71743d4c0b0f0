// DiagnosticLogDirectory: the snapshot directory under the XDG state home or an override, made with QDir::mkpath.
#include "Platform/DiagnosticLogDirectory.h"

#include <QDir>
#include <QFileInfo>

#include <cstdlib>

namespace vantorel {

namespace {
// Set and read on the main thread only (the save screen, the snapshot command and their tests).
std::string gOverride;

const char* const kSubdirectory = "/vantorel/DiagnosticLogs";

std::string environment(const char* name) {
    const char* value = std::getenv(name);
    return value ? value : "";
}

std::string withoutTrailingSlashes(std::string dir) {
    while (dir.size() > 1 && dir.back() == '/') dir.pop_back();
    return dir;
}
}  // namespace

std::string DiagnosticLogDirectory::defaultPath() {
    const std::string state = environment("XDG_STATE_HOME");
    if (!state.empty() && state.front() == '/') return withoutTrailingSlashes(state) + kSubdirectory;
    std::string home = environment("HOME");
    if (home.empty()) home = QDir::homePath().toStdString();
    return withoutTrailingSlashes(home) + "/.local/state" + kSubdirectory;
}

std::string DiagnosticLogDirectory::path() {
    const std::string fromEnvironment = environment(kEnvironmentVariable);
    if (!fromEnvironment.empty()) return withoutTrailingSlashes(fromEnvironment);
    if (!gOverride.empty()) return gOverride;
    return defaultPath();
}

void DiagnosticLogDirectory::setOverride(const std::string& dir) {
    gOverride = dir.empty() ? std::string() : withoutTrailingSlashes(dir);
}

bool DiagnosticLogDirectory::ensureExists(std::string* error) {
    const QString dir = QString::fromStdString(path());
    // mkpath answers true for an existing directory and false when a component is a
    // file or cannot be created; the check after it catches anything in between.
    if (QDir().mkpath(dir) && QFileInfo(dir).isDir()) return true;
    if (error) {
        const QFileInfo info(dir);
        *error = info.exists() ? "not a directory: " + dir.toStdString()
                               : "cannot create directory " + dir.toStdString();
    }
    return false;
}

}  // namespace vantorel
