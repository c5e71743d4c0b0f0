// CommandOutput: a command's exit code and captured output (GoogleTest's stdout/stderr capture).
#include "support/CommandOutput.h"

#include <gtest/gtest.h>

namespace vantorel::testing {

CommandOutput runCommand(int (*command)(const QStringList&), const QStringList& args) {
    ::testing::internal::CaptureStdout();
    ::testing::internal::CaptureStderr();
    const int code = command(args);
    std::string out = ::testing::internal::GetCapturedStdout();
    return {code, std::move(out), ::testing::internal::GetCapturedStderr()};
}

}  // namespace vantorel::testing
