// TerminalRawMode: the terminal in raw, non-echo input on the alternate screen while the terminal view runs, given back on every way out.
#pragma once

namespace vantorel {

// While an instance lives, the terminal on `fd` sends each key as it is pressed and
// does not echo it; the view draws on the alternate screen without a cursor. The
// destructor gives the terminal back as it was; so do exit(), and the signals that
// end or stop the process (the handler restores, then the signal takes its default
// course). Ctrl-C stays a signal (SIGINT), which the programs end on cleanly.
class TerminalRawMode {
public:
    explicit TerminalRawMode(int fd);
    ~TerminalRawMode();
    TerminalRawMode(const TerminalRawMode&) = delete;
    TerminalRawMode& operator=(const TerminalRawMode&) = delete;

    bool active() const { return active_; }

private:
    bool active_ = false;
};

}  // namespace vantorel
