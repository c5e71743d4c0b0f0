// StdoutToStderr: a scoped redirection of file descriptor 1 to 2.
#include "cli/StdoutToStderr.h"

#include <cstdio>
#include <unistd.h>

namespace vantorel {

StdoutToStderr::StdoutToStderr() {
    std::fflush(stdout);
    saved_ = ::dup(STDOUT_FILENO);
    if (saved_ >= 0) ::dup2(STDERR_FILENO, STDOUT_FILENO);
}

StdoutToStderr::~StdoutToStderr() {
    std::fflush(stdout);
    if (saved_ >= 0) {
        ::dup2(saved_, STDOUT_FILENO);
        ::close(saved_);
    }
}

}  // namespace vantorel
