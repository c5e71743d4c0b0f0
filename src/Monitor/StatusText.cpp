// StatusText: the "Updated ... at ..." line, one date pattern for every view.
#include "Monitor/StatusText.h"

namespace vantorel {

std::string StatusText::updated(const QDateTime& at) {
    return at.toString(QStringLiteral("'Updated' yyyy-MM-dd 'at' HH:mm:ss")).toStdString();
}

}  // namespace vantorel
