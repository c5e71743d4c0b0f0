// Tests for ArrayLock (Part 3.3): the process-wide recursive lock with its asymmetric 8-bit counter.
#include "LogGenerator/ArrayLock.h"

#include <gtest/gtest.h>

#include <chrono>
#include <future>

using namespace vantorel;

namespace {

// Whether another thread can take the mutex within 50 ms (it releases it at once).
bool anotherThreadCanLock() {
    return std::async(std::launch::async, [] {
               auto& m = ArrayLock::mutexForTesting();
               if (!m.try_lock_for(std::chrono::milliseconds(50))) return false;
               m.unlock();
               return true;
           })
        .get();
}

}  // namespace

TEST(ArrayLock, SingleLockAndUnlockReleasesTheMutex) {
    ASSERT_TRUE(anotherThreadCanLock());
    ArrayLock::lockArray();
    EXPECT_EQ(ArrayLock::counter(), 1);
    EXPECT_FALSE(anotherThreadCanLock());
    ArrayLock::unlockArray();
    EXPECT_EQ(ArrayLock::counter(), 0);
    EXPECT_TRUE(anotherThreadCanLock());
}

TEST(ArrayLock, LockTwiceThenUnlockTwiceOnOneThreadLeavesTheMutexHeldOnce) {
    ASSERT_TRUE(anotherThreadCanLock());
    ArrayLock::lockArray();
    ArrayLock::lockArray();
    EXPECT_EQ(ArrayLock::counter(), 2);
    ArrayLock::unlockArray();
    ArrayLock::unlockArray();
    EXPECT_EQ(ArrayLock::counter(), 0);
    // Another thread's lockArray would now block: the mutex is still held one level deep.
    EXPECT_FALSE(anotherThreadCanLock());
    // This thread can still take it (recursive), and the tree keeps working.
    ArrayLock::lockArray();
    ArrayLock::unlockArray();
    EXPECT_FALSE(anotherThreadCanLock());
    // Restore the process for the other tests: release the level left behind.
    ArrayLock::mutexForTesting().unlock();
    EXPECT_TRUE(anotherThreadCanLock());
}
