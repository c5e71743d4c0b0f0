// Preferences: QSettings for the two preference domains of Part 1.1.
#include "Platform/Preferences.h"

#include <QDir>
#include <QFileInfo>
#include <QSettings>
#include <QStandardPaths>

#include <mutex>

namespace vantorel {

namespace {
std::mutex gMutex;
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
    std::lock_guard<std::mutex> lock(gMutex);
    if (!gDirectory.empty()) return gDirectory;
    return QDir(QStandardPaths::writableLocation(QStandardPaths::GenericConfigLocation))
        .filePath("vantorel")
        .toStdString();
}

void Preferences::setDirectory(const std::string& dir) {
    std::lock_guard<std::mutex> lock(gMutex);
    gDirectory = dir;
}

void Preferences::setInternalInstallMarker(const std::string& path) {
    std::lock_guard<std::mutex> lock(gMutex);
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
    std::string marker;
    {
        std::lock_guard<std::mutex> lock(gMutex);
        marker = gMarker;
    }
    return QFileInfo::exists(QString::fromStdString(marker));
}

}  // namespace vantorel
