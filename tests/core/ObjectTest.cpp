// SPDX-License-Identifier: BSD-2-Clause
// Objects: the lock and the interface identifiers.
#include <thread>

#include <gtest/gtest.h>

#include "core/Object.h"

namespace {

TEST(ObjectTest, LockOfANonLockableObjectSaysSoAndReturnsNinetyNine) {
    Object object(false);
    testing::internal::CaptureStdout();
    EXPECT_EQ(object.lock(), 99);
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "Attempting to lock a non-lockable object...\n");
}

TEST(ObjectTest, UnlockOfANonLockableObjectSaysSoAndReturnsNinetyNine) {
    Object object(false);
    testing::internal::CaptureStdout();
    EXPECT_EQ(object.unlock(), 99);
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "Attempting to unlock a non-lockable object...\n");
}

TEST(ObjectTest, HolderMayLockALockableObjectAgain) {
    Object object(true);
    EXPECT_EQ(object.lock(), 0);
    EXPECT_EQ(object.lock(), 0);
    EXPECT_EQ(object.unlock(), 0);
    EXPECT_EQ(object.unlock(), 0);
}

TEST(ObjectTest, UnlockByAThreadThatDoesNotHoldTheLockIsRefused) {
    Object object(true);
    ASSERT_EQ(object.lock(), 0);
    int result = -1;
    std::thread([&] { result = object.unlock(); }).join();
    EXPECT_EQ(result, 4);
    EXPECT_EQ(object.unlock(), 0);
}

TEST(ObjectTest, NewObjectAnswersToTheRootIdentifierOnly) {
    Object object(false);
    EXPECT_TRUE(object.interfaces()->is_element(KVL::IID("6Object")));
    EXPECT_FALSE(object.interfaces()->is_element(KVL::IID()));
}

TEST(ObjectTest, IdentifiersOfADeletedObjectDoNotShowUpInALaterOne) {
    // Lists are recycled; an identifier that one object added must not reach the next object.
    for (int round = 0; round < 3; ++round) {
        Object object(false);
        EXPECT_FALSE(object.interfaces()->is_element(KVL::IID("7Feature")));
        object.interfaces()->add(KVL::IID("7Feature"));
        EXPECT_TRUE(object.interfaces()->is_element(KVL::IID("7Feature")));
    }
}

TEST(ObjectTest, EveryObjectHasItsOwnList) {
    Object first(false);
    Object second(false);
    first.interfaces()->add(KVL::IID("7Feature"));
    EXPECT_FALSE(second.interfaces()->is_element(KVL::IID("7Feature")));
}

TEST(ObjectTest, FullListHasRoomForThirtyOneMoreThanTheRoot) {
    Object object(false);
    for (int i = 0; i < 40; ++i)
        object.interfaces()->add(KVL::IID(std::to_string(i).c_str()));
    EXPECT_TRUE(object.interfaces()->is_element(KVL::IID("30")));
    EXPECT_FALSE(object.interfaces()->is_element(KVL::IID("31")));
}

} // namespace
