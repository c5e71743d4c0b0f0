// StdoutToStderr: while it lives, standard output goes to standard error, so that lines the spec sends to standard output (Part 3.3's "Deallocing ClassIndex") stay out of the CLI's data output.
#pragma once

namespace vantorel {

class StdoutToStderr {
public:
    StdoutToStderr();
    ~StdoutToStderr();
    StdoutToStderr(const StdoutToStderr&) = delete;
    StdoutToStderr& operator=(const StdoutToStderr&) = delete;

private:
    int saved_ = -1;
};

}  // namespace vantorel
