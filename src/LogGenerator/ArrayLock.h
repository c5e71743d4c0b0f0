// ArrayLock: the process-wide recursive lock with its 8-bit nesting counter that guards the display's lists.
#pragma once

#include <cstdint>

namespace vantorel {

// lockArray acquires the mutex then counts up; unlockArray counts down and releases
// the mutex once, only when the one process-wide 8-bit counter reaches 0. A nested
// lock, lock, unlock, unlock therefore leaves the mutex held one level deep by that
// thread. Deliberate and harmless: the sections and the tree builder share one
// thread, so the level left held never blocks them.
class ArrayLock {
public:
    static void lockArray();
    static void unlockArray();

    // The nesting counter (0 when no lock is taken).
    static uint8_t counter();
};

}  // namespace vantorel
