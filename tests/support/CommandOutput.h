// CommandOutput: runs a vantorel-cli command in-process and captures its exit code, standard output and standard error, for the cli tests.
#pragma once

#include <QStringList>

#include <string>

namespace vantorel::testing {

struct CommandOutput {
    int code;
    std::string out;
    std::string err;
};

// `command` is a command's run function (DecodeCommand::run, SnapshotCommand::run, ...).
CommandOutput runCommand(int (*command)(const QStringList&), const QStringList& args);

}  // namespace vantorel::testing
