// ArrayLock: the process-wide recursive lock with its 8-bit nesting counter, asymmetric as Part 3.3 requires.
#pragma once

#include <cstdint>
#include <mutex>

namespace vantorel {

// lockArray acquires the mutex then counts up; unlockArray counts down and releases
// the mutex once, only when the one process-wide 8-bit counter reaches 0. A nested
// lock, lock, unlock, unlock therefore leaves the mutex held one level deep by that
// thread. Kept as stated (Part 3.3): sections and the tree builder share one thread.
class ArrayLock {
public:
    static void lockArray();
    static void unlockArray();

    // Diagnostics for tests: the counter, and the mutex itself (a test thread may
    // try_lock_for it to see whether it is held, and the holder may release it).
    static uint8_t counter();
    static std::recursive_timed_mutex& mutexForTesting();
};

}  // namespace vantorel
