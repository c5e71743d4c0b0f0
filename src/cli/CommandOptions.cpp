// CommandOptions: parses a vantorel-cli command's options the one way every command does.
#include "cli/CommandOptions.h"

#include <cstdio>

namespace vantorel {

std::optional<int> CommandOptions::parse(QCommandLineParser& parser, const QCommandLineOption& helpOption,
                                         const char* program, const QStringList& args) {
    // parse(), not process(): process() exits from inside Qt with its own code and text.
    if (!parser.parse(QStringList{QString::fromUtf8(program)} + args)) {
        std::fprintf(stderr, "%s: %s (see --help)\n", program, qPrintable(parser.errorText()));
        return 2;
    }
    if (parser.isSet(helpOption) || parser.isSet("help-all")) {
        std::fputs(qPrintable(parser.helpText()), stdout);
        return 0;
    }
    return std::nullopt;
}

}  // namespace vantorel
