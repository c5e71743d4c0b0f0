// InfoCommand: `vantorel-cli info FILE...`: format, technology, message count, counts per log code and bad frames of recorded streams.
#pragma once

#include <QStringList>

namespace vantorel {

class InfoCommand {
public:
    static int run(const QStringList& args);
};

}  // namespace vantorel
