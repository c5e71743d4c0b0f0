// Preferences: QSettings files for the program's own domain and the home-screen shell's domain.
#include "Platform/Preferences.h"

#include <QDir>
#include <QFileInfo>
#include <QSettings>
#include <QStandardPaths>


namespace vantorel {

namespace {
// Set and read on the main thread only (the window and its tests).
std::string gDirectory;
std::string gMarker = Preferences::kInternalInstallMarker;

QString domainFile(const char* domain) {
    return QDir(QString::fromStdString(Preferences::directory())).filePath(QString::fromUtf8(domain) + ".ini");
}

std::optional<bool> readBool(const char* domain, const char* key) {
    QSettings settings(domainFile(domain), QSettings::IniFormat);
    if (!settings.contains(key)) return std::nullopt;
    return settings.value(key).toBool();
}
}  // namespace

Preferences& Preferences::instance() {
    static Preferences notifier;
    return notifier;
}

std::string Preferences::directory() {
    if (!gDirectory.empty()) return gDirectory;
    return QDir(QStandardPaths::writableLocation(QStandardPaths::GenericConfigLocation))
        .filePath("vantorel")
        .toStdString();
}

void Preferences::setDirectory(const std::string& dir) {
    gDirectory = dir;
}

void Preferences::setInternalInstallMarker(const std::string& path) {
    gMarker = path.empty() ? kInternalInstallMarker : path;
}

std::optional<bool> Preferences::ownBool(const char* key) { return readBool("vantorel", key); }

void Preferences::setOwnBool(const char* key, bool value) {
    QSettings settings(domainFile("vantorel"), QSettings::IniFormat);
    settings.setValue(key, value);
    settings.sync();
}

std::optional<bool> Preferences::shellBool(const char* key) { return readBool("homescreen", key); }

void Preferences::writeShellBool(const char* key, bool value) {
    {
        QSettings settings(domainFile("homescreen"), QSettings::IniFormat);
        settings.setValue(key, value);
        settings.sync();
    }
    emit instance().shellPreferencesChanged(QString::fromUtf8(key));
}

bool Preferences::internalInstallMarkerExists() {
    return QFileInfo::exists(QString::fromStdString(gMarker));
}

}  // namespace vantorel
