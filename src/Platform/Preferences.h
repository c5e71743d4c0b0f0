// Preferences: the program's own settings domain and the home-screen shell's domain (QSettings), and the internal-install marker.
#pragma once

#include <QObject>

#include <optional>
#include <string>

namespace vantorel {

class Preferences : public QObject {
    Q_OBJECT
public:
    // The key of both domains that makes the shell show the signal strength as a number.
    static constexpr const char* kShowGSMRSSI = "HSShowGSMRSSI";
    // Our own setting that enables the save button on any install.
    static constexpr const char* kAllowSaveButton = "AllowSaveButton";
    // The marker only internal installs carry (the internal carrier-settings bundle).
    static constexpr const char* kInternalInstallMarker = "/etc/vantorel/internal-install";

    // The one notifier: shellPreferencesChanged is emitted on it.
    static Preferences& instance();

    // The program's own domain: <directory>/vantorel.ini.
    static std::optional<bool> ownBool(const char* key);
    static void setOwnBool(const char* key, bool value);
    // The home-screen shell's domain: <directory>/homescreen.ini. Writing synchronises
    // the domain and notifies that the shell's preferences changed for that key.
    static std::optional<bool> shellBool(const char* key);
    static void writeShellBool(const char* key, bool value);

    static bool internalInstallMarkerExists();

    // Where both domains live: $XDG_CONFIG_HOME/vantorel (~/.config/vantorel) unless
    // changed; an empty text restores the default. The marker path likewise.
    static std::string directory();
    static void setDirectory(const std::string& dir);
    static void setInternalInstallMarker(const std::string& path);

signals:
    void shellPreferencesChanged(const QString& key);
};

}  // namespace vantorel
