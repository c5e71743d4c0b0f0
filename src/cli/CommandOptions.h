// CommandOptions: parses a vantorel-cli command's options the one way every command does (usage errors exit 2, --help prints and exits 0).
#pragma once

#include <QCommandLineParser>
#include <QStringList>

#include <optional>

namespace vantorel {

class CommandOptions {
public:
    // Parses `args` (the words after the command) for `program` ("vantorel-cli decode").
    // Returns the exit code when the command ends here: 2 after one line naming a usage
    // error on stderr, 0 after the help text on stdout; nothing when it goes on.
    static std::optional<int> parse(QCommandLineParser& parser, const QCommandLineOption& helpOption,
                                    const char* program, const QStringList& args);
};

}  // namespace vantorel
