// UTRANLogGenerator: the UTRAN decoder's template choice and class index.
#include "LogGenerator/UTRAN/UTRANLogGenerator.h"

#include "LogGenerator/UTRAN/UTRANClassIndex.h"
#include "Platform/ResourceBundle.h"
#include "Platform/SystemLog.h"

#include <QFileInfo>
#include <QString>

namespace vantorel {

std::unique_ptr<LogGenerator> UTRANLogGenerator::generator() {
    const std::vector<std::string> paths = ResourceBundle::pathsForResourcesOfType("plist");
    for (const std::string& path : paths) {
        const QString p = QString::fromStdString(path);
        if (!p.contains(QStringLiteral("UTRAN"), Qt::CaseInsensitive)) continue;
        // The template name: the path's last component without its extension.
        const std::string name = QFileInfo(p).completeBaseName().toStdString();
        std::unique_ptr<LogGenerator> g(new UTRANLogGenerator(name, std::make_unique<UTRANClassIndex>()));
        SystemLog::log(SystemLog::kError, "Created UTRANLogGenerator object");
        return g;
    }
    return std::unique_ptr<LogGenerator>(new UTRANLogGenerator());
}

}  // namespace vantorel
