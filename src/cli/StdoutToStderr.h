// StdoutToStderr: while it lives, standard output goes to standard error, so that lines the decoders print on standard output (the class index's "Deallocing ClassIndex" at teardown) stay out of the CLI's data output.
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
