// TerminalRawMode: termios raw mode with the saved settings restored from the destructor, atexit and signal handlers.
#include "Monitor/TerminalRawMode.h"

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <termios.h>
#include <unistd.h>

namespace vantorel {

namespace {

// Plain globals: the signal handlers read them, and only async-signal-safe calls
// (tcsetattr, write, sigaction, raise) touch them there.
int gFd = -1;
termios gSaved{};
volatile sig_atomic_t gRaw = 0;
constexpr char kEnter[] = "\x1b[?1049h\x1b[?25l";  // alternate screen, cursor hidden
constexpr char kLeave[] = "\x1b[?25h\x1b[?1049l";  // cursor shown, main screen back
constexpr int kEndingSignals[] = {SIGHUP, SIGQUIT, SIGABRT, SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGPIPE, SIGTSTP};

void restore() {
    if (!gRaw) return;
    gRaw = 0;
    ::tcsetattr(gFd, TCSAFLUSH, &gSaved);
    [[maybe_unused]] ssize_t n = ::write(STDOUT_FILENO, kLeave, sizeof kLeave - 1);
}

void enterRaw() {
    termios raw = gSaved;
    raw.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO | IEXTEN);  // ISIG stays: Ctrl-C, Ctrl-Z
    raw.c_iflag &= ~static_cast<tcflag_t>(IXON | ICRNL);
    raw.c_cc[VMIN] = 1;
    raw.c_cc[VTIME] = 0;
    if (::tcsetattr(gFd, TCSAFLUSH, &raw) != 0) return;
    gRaw = 1;
    [[maybe_unused]] ssize_t n = ::write(STDOUT_FILENO, kEnter, sizeof kEnter - 1);
}

void onContinue(int);

void onEndingSignal(int signal) {
    restore();
    struct sigaction action{};
    action.sa_handler = SIG_DFL;
    ::sigaction(signal, &action, nullptr);
    if (signal == SIGTSTP) {
        // Stopped: the shell gets its terminal back; raw again when continued.
        struct sigaction cont{};
        cont.sa_handler = onContinue;
        ::sigaction(SIGCONT, &cont, nullptr);
    }
    ::raise(signal);
}

void onContinue(int) {
    struct sigaction action{};
    action.sa_handler = onEndingSignal;
    ::sigaction(SIGTSTP, &action, nullptr);
    if (gFd >= 0) enterRaw();
}

void setHandlers(void (*handler)(int)) {
    struct sigaction action{};
    action.sa_handler = handler;
    for (int signal : kEndingSignals) ::sigaction(signal, &action, nullptr);
}

}  // namespace

TerminalRawMode::TerminalRawMode(int fd) {
    if (gFd >= 0 || ::tcgetattr(fd, &gSaved) != 0) return;
    gFd = fd;
    static const bool atExit = std::atexit(restore) == 0;
    (void)atExit;
    setHandlers(onEndingSignal);
    enterRaw();
    active_ = gRaw != 0;
}

TerminalRawMode::~TerminalRawMode() {
    if (gFd < 0) return;
    setHandlers(SIG_DFL);
    ::signal(SIGCONT, SIG_DFL);
    restore();
    gFd = -1;
}

}  // namespace vantorel
