// DecodeCommand: `vantorel-cli decode`: feeds recorded messages to a decoder exactly as the model does and prints the display.
#pragma once

#include <QStringList>

namespace vantorel {

class DecodeCommand {
public:
    // args: the words after "decode". Returns the process exit code.
    static int run(const QStringList& args);
};

}  // namespace vantorel
