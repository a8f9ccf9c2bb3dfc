// SPDX-License-Identifier: BSD-2-Clause
// Locks: kinds and codes.
#include <cerrno>
#include <thread>

#include <gtest/gtest.h>

#include "platform/KVLLockable_pthread.h"

namespace {

/// The result of `call` on another thread.
template <class Call>
int onAnotherThread(Call const& call) {
    int result = -1;
    std::thread([&] { result = call(); }).join();
    return result;
}

TEST(KVLLockableTest, UnlockOfAnErrorCheckLockByAnotherThreadIsRefused) {
    KVLLockable_pthread lock(ErrorCheckLock);
    ASSERT_EQ(lock.lock(), KVLLockOk);
    EXPECT_EQ(onAnotherThread([&] { return lock.unlock(); }), 4);
    EXPECT_EQ(lock.unlock(), KVLLockOk);
}

TEST(KVLLockableTest, TrylockOfALockHeldByAnotherThreadIsBusy) {
    for (LockType const type : {ErrorCheckLock, RecursiveLock, NormalLock}) {
        KVLLockable_pthread lock(type);
        ASSERT_EQ(lock.lock(), KVLLockOk);
        EXPECT_EQ(onAnotherThread([&] { return lock.trylock(); }), 1) << "type " << type;
        EXPECT_EQ(lock.unlock(), KVLLockOk);
    }
}

TEST(KVLLockableTest, TrylockOfAFreeLockTakesIt) {
    KVLLockable_pthread lock(NormalLock);
    EXPECT_EQ(lock.trylock(), KVLLockOk);
    EXPECT_EQ(onAnotherThread([&] { return lock.trylock(); }), KVLLockBusy);
    EXPECT_EQ(lock.unlock(), KVLLockOk);
}

TEST(KVLLockableTest, SecondLockOfAnErrorCheckLockByItsOwnerIsADeadlock) {
    KVLLockable_pthread lock(ErrorCheckLock);
    ASSERT_EQ(lock.lock(), KVLLockOk);
    EXPECT_EQ(lock.lock(), 2);
    EXPECT_EQ(lock.unlock(), KVLLockOk);
}

TEST(KVLLockableTest, RecursiveLockIsHeldUntilAsManyUnlocksAsLocks) {
    KVLLockable_pthread lock(RecursiveLock);
    ASSERT_EQ(lock.lock(), 0);
    EXPECT_EQ(lock.lock(), 0);
    EXPECT_EQ(lock.unlock(), 0);
    EXPECT_EQ(onAnotherThread([&] { return lock.trylock(); }), KVLLockBusy);
    EXPECT_EQ(lock.unlock(), 0);
    EXPECT_EQ(onAnotherThread([&] { return lock.trylock() + lock.unlock(); }), 0);
}

TEST(KVLLockableTest, UnknownTypeMakesADefaultMutex) {
    KVLLockable_pthread lock(static_cast<LockType>(17));
    EXPECT_EQ(lock.lock(), KVLLockOk);
    EXPECT_EQ(onAnotherThread([&] { return lock.trylock(); }), KVLLockBusy);
    EXPECT_EQ(lock.unlock(), KVLLockOk);
}

TEST(KVLLockableTest, GetErrorMapsEachResultToItsCode) {
    KVLLockable_pthread lock(NormalLock);
    EXPECT_EQ(lock.GetError(0), 0);
    EXPECT_EQ(lock.GetError(EBUSY), 1);
    EXPECT_EQ(lock.GetError(EDEADLK), 2);
    EXPECT_EQ(lock.GetError(EINVAL), 3);
    EXPECT_EQ(lock.GetError(EPERM), 4);
    EXPECT_EQ(lock.GetError(12345), 99);
}

TEST(KVLLockableTest, ErrorTextNamesTheCondition) {
    EXPECT_EQ(KVLLockable_pthread::GetErrorText(0), "");
    EXPECT_EQ(KVLLockable_pthread::GetErrorText(EBUSY),
              "KVLLockable_pthread: mutex is busy, continuing...");
    EXPECT_EQ(KVLLockable_pthread::GetErrorText(EDEADLK),
              "KVLLockable_pthread: mutex already exists in this thread, deadlock avoided...");
    EXPECT_EQ(KVLLockable_pthread::GetErrorText(EINVAL),
              "KVLLockable_pthread: mutex has not been initialized, action denied...");
    EXPECT_EQ(KVLLockable_pthread::GetErrorText(EPERM),
              "KVLLockable_pthread: mutex is not owned by calling thread, action denied...");
    EXPECT_EQ(KVLLockable_pthread::GetErrorText(12345),
              "KVLLockable_pthread: unkown error condition: 12345");
}

TEST(KVLLockableTest, OperationsGoThroughGetErrorOfASubclass) {
    class Renumbered : public KVLLockable_pthread {
      public:
        Renumbered() : KVLLockable_pthread(NormalLock) {}
        int GetError(int result) override { return result == 0 ? 1000 : 1001; }
    };
    Renumbered lock;
    EXPECT_EQ(lock.lock(), 1000);
    EXPECT_EQ(onAnotherThread([&] { return lock.trylock(); }), 1001);
    EXPECT_EQ(lock.unlock(), 1000);
}

TEST(KVLLockableTest, ImplMutexIsTheMutexThatIsLocked) {
    KVLLockable_pthread lock(NormalLock);
    ASSERT_EQ(pthread_mutex_lock(lock.get_impl_mutex()), 0);
    EXPECT_EQ(onAnotherThread([&] { return lock.trylock(); }), KVLLockBusy);
    EXPECT_EQ(lock.unlock(), KVLLockOk);
}

} // namespace
