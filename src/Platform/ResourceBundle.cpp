// ResourceBundle: the application's property-list resources through Qt's resource system.
#include "Platform/ResourceBundle.h"

#include "Platform/SystemLog.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QDir>
#include <QFile>


namespace vantorel {

namespace {
const char* const kDefaultDirectory = ":/templates";
// Set and read on the main thread only: the decoders load their templates there.
std::string gDirectory = kDefaultDirectory;
}  // namespace

std::string ResourceBundle::directory() {
    return gDirectory;
}

void ResourceBundle::setDirectory(const std::string& dir) {
    gDirectory = dir.empty() ? kDefaultDirectory : dir;
}

std::vector<std::string> ResourceBundle::pathsForResourcesOfType(const std::string& extension) {
    QDir dir(QString::fromStdString(directory()));
    const QStringList names = dir.entryList({QStringLiteral("*.") + QString::fromStdString(extension)},
                                            QDir::Files, QDir::Name);
    std::vector<std::string> paths;
    for (const QString& n : names) paths.push_back(dir.filePath(n).toStdString());
    return paths;
}

std::optional<Value> ResourceBundle::loadPropertyList(const std::string& name, const std::string& extension) {
    QFile file(QDir(QString::fromStdString(directory())).filePath(QString::fromStdString(name + "." + extension)));
    if (!file.open(QIODevice::ReadOnly)) return std::nullopt;
    QByteArray contents = file.readAll();
    auto result = PropertyListSerialization::read(
        ByteView(reinterpret_cast<const uint8_t*>(contents.constData()), static_cast<size_t>(contents.size())));
    if (!result) {
        SystemLog::log(SystemLog::kError, "Resource %s.%s is not a property list: %s", name.c_str(),
                       extension.c_str(), result.error.c_str());
        return std::nullopt;
    }
    return result.value;
}

}  // namespace vantorel
