// ArrayLock: Part 3.3's shared array lock.
#include "LogGenerator/ArrayLock.h"

namespace vantorel {

namespace {
// `initialize`: created on first use (function-local statics), counter 0.
std::recursive_timed_mutex& theMutex() {
    static std::recursive_timed_mutex m;
    return m;
}
// One counter for the whole process, not per thread, not atomic (as stated).
uint8_t gCounter = 0;
}  // namespace

void ArrayLock::lockArray() {
    theMutex().lock();
    gCounter = static_cast<uint8_t>(gCounter + 1);
}

void ArrayLock::unlockArray() {
    gCounter = static_cast<uint8_t>(gCounter - 1);
    if (gCounter != 0) return;
    theMutex().unlock();
}

uint8_t ArrayLock::counter() { return gCounter; }

std::recursive_timed_mutex& ArrayLock::mutexForTesting() { return theMutex(); }

}  // namespace vantorel
