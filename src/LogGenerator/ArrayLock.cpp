// ArrayLock: the shared lock between the sections' list rewrites and the display tree builder.
#include "LogGenerator/ArrayLock.h"

#include <mutex>

namespace vantorel {

namespace {
// `initialize`: created on first use (function-local statics), counter 0.
std::recursive_mutex& theMutex() {
    static std::recursive_mutex m;
    return m;
}
// One counter for the whole process, not per thread and not atomic: deliberate, the
// sections and the tree builder that take the lock all run on one thread.
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

}  // namespace vantorel
