// MonitorClock: the system clock by default, or the one clock a program installed.
#include "Model/MonitorClock.h"

namespace vantorel {

namespace {

const MonitorClock gSystemClock;
const MonitorClock* gInstalled = nullptr;

}  // namespace

const MonitorClock& MonitorClock::current() { return gInstalled ? *gInstalled : gSystemClock; }

void MonitorClock::install(const MonitorClock* clock) { gInstalled = clock; }

}  // namespace vantorel
