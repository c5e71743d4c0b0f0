// QuitOnSignal: self-pipe signal handling for the programs' event loops.
#include "Platform/QuitOnSignal.h"

#include <QCoreApplication>
#include <QSocketNotifier>

#include <atomic>
#include <csignal>
#include <unistd.h>

namespace vantorel {

namespace {
int gPipe[2] = {-1, -1};
std::atomic<int> gLastSignal{0};

void onSignal(int signal) {
    gLastSignal.store(signal);
    const char byte = 1;
    [[maybe_unused]] const ssize_t n = ::write(gPipe[1], &byte, 1);
}
}  // namespace

QuitOnSignal::QuitOnSignal(QObject* parent) : QObject(parent) {
    if (gPipe[0] < 0 && ::pipe(gPipe) != 0) return;  // without a pipe, signals keep their defaults
    notifier_ = new QSocketNotifier(gPipe[0], QSocketNotifier::Read, this);
    connect(notifier_, &QSocketNotifier::activated, this, [] {
        char byte = 0;
        [[maybe_unused]] const ssize_t n = ::read(gPipe[0], &byte, 1);
        QCoreApplication::quit();
    });
    std::signal(SIGINT, onSignal);
    std::signal(SIGTERM, onSignal);
}

QuitOnSignal::~QuitOnSignal() {
    std::signal(SIGINT, SIG_DFL);
    std::signal(SIGTERM, SIG_DFL);
}

int QuitOnSignal::lastSignal() { return gLastSignal.load(); }

}  // namespace vantorel
