// CommandOutput: runs a vantorel-cli command in-process and captures its exit code, standard output and standard error, for the cli tests.
#pragma once

#include <QStringList>
#include <gtest/gtest.h>

#include <string>

namespace vantorel::testing {

struct CommandOutput {
    int code;
    std::string out;
    std::string err;
};

// `command` is a command's run function (DecodeCommand::run, SnapshotCommand::run, ...).
inline CommandOutput runCommand(int (*command)(const QStringList&), const QStringList& args) {
    ::testing::internal::CaptureStdout();
    ::testing::internal::CaptureStderr();
    const int code = command(args);
    std::string out = ::testing::internal::GetCapturedStdout();
    return {code, std::move(out), ::testing::internal::GetCapturedStderr()};
}

}  // namespace vantorel::testing
