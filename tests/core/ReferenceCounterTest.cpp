// SPDX-License-Identifier: BSD-2-Clause
// Handles: one count per object, however the handles were made.
#include <functional>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "core/ReferenceCounter.h"

namespace {

/// An object that notes its deletion.
class Tracked : public Object {
  public:
    explicit Tracked(bool& deleted) : Object(false), m_deleted(deleted) { m_deleted = false; }
    ~Tracked() override { m_deleted = true; }

  private:
    bool& m_deleted;
};

class ReferenceCounterTest : public testing::Test {
  protected:
    static ReferenceTable& table() { return *ReferenceTable::get_instance(); }
    /// The count in the table; 0 for an object without handles.
    static int count(Object* object) {
        ReferenceInfo const* const record = table().get_refinfo(object);
        return record == nullptr ? 0 : record->count();
    }

    bool m_deleted = false;
};

using Handle = ReferenceCounter<Tracked>;

TEST_F(ReferenceCounterTest, HandlesMadeIndependentlyFromOnePointerShareTheCount) {
    auto* object = new Tracked(m_deleted);
    {
        Handle const first(object);
        {
            Handle const second(object);
            EXPECT_EQ(count(object), 2);
        }
        EXPECT_EQ(count(object), 1);
        EXPECT_FALSE(m_deleted);
    }
    EXPECT_TRUE(m_deleted);
}

TEST_F(ReferenceCounterTest, CopiesCount) {
    Handle const first(new Tracked(m_deleted));
    Handle const second(first);
    Handle third;
    third = second;
    EXPECT_EQ(count(first.get()), 3);
    EXPECT_EQ(first.get(), third.get());
}

TEST_F(ReferenceCounterTest, LastHandleDeletesTheObject) {
    auto* first = new Handle(new Tracked(m_deleted));
    auto* second = new Handle(*first);
    delete first;
    EXPECT_FALSE(m_deleted);
    delete second;
    EXPECT_TRUE(m_deleted);
}

TEST_F(ReferenceCounterTest, TableEntryIsGoneBeforeTheDestructorRuns) {
    class Asking : public Object {
      public:
        explicit Asking(int& seen) : Object(false), m_seen(seen) {}
        ~Asking() override { m_seen = count(this); }

      private:
        int& m_seen;
    };
    int seen = -1;
    {
        ReferenceCounter<Asking> const handle(new Asking(seen));
        EXPECT_EQ(count(handle.get()), 1);
    }
    EXPECT_EQ(seen, 0);
}

TEST_F(ReferenceCounterTest, AssigningAnEmptyHandleToTheOnlyOneDeletesTheObject) {
    Handle handle(new Tracked(m_deleted));
    Handle const empty;
    handle = empty;
    EXPECT_TRUE(m_deleted);
    EXPECT_EQ(handle.get(), nullptr);
    EXPECT_EQ(empty.get(), nullptr);
}

TEST_F(ReferenceCounterTest, SelfAssignmentOfTheOnlyHandleDeletesTheObject) {
    Handle handle(new Tracked(m_deleted));
    Handle const& same = handle;
    handle = same;
    EXPECT_TRUE(m_deleted);
    EXPECT_EQ(handle.get(), nullptr);
}

TEST_F(ReferenceCounterTest, SelfAssignmentOfOneOfTwoHandlesKeepsTheObject) {
    Handle handle(new Tracked(m_deleted));
    Handle const other(handle);
    Handle const& same = handle;
    handle = same;
    EXPECT_FALSE(m_deleted);
    EXPECT_EQ(handle.get(), other.get());
    EXPECT_EQ(count(other.get()), 2);
}

TEST_F(ReferenceCounterTest, AssignmentReleasesItsObjectFirst) {
    bool otherDeleted = false;
    Handle handle(new Tracked(m_deleted));
    Handle const other(new Tracked(otherDeleted));
    handle = other;
    EXPECT_TRUE(m_deleted);
    EXPECT_FALSE(otherDeleted);
    EXPECT_EQ(count(other.get()), 2);
}

TEST_F(ReferenceCounterTest, MoveTakesOverAndLeavesTheSourceEmpty) {
    Handle source(new Tracked(m_deleted));
    Tracked* const object = source.get();
    Handle const target(std::move(source));
    EXPECT_EQ(source.get(),
              nullptr); // NOLINT(bugprone-use-after-move): that it is empty is promised
    EXPECT_EQ(target.get(), object);
    EXPECT_EQ(count(object), 1);
}

TEST_F(ReferenceCounterTest, MoveAssignmentReleasesTheFormerObject) {
    bool otherDeleted = false;
    Handle handle(new Tracked(m_deleted));
    handle = Handle(new Tracked(otherDeleted));
    EXPECT_TRUE(m_deleted);
    EXPECT_FALSE(otherDeleted);
    EXPECT_EQ(count(handle.get()), 1);
}

TEST_F(ReferenceCounterTest, MoveAssignmentPromisesNotToThrowButConstructionDoesNot) {
    static_assert(!std::is_nothrow_move_constructible_v<Handle>);
    static_assert(std::is_nothrow_move_assignable_v<Handle>);
    Handle handle(new Tracked(m_deleted));
    Handle other;
    other = std::move(handle);
    EXPECT_EQ(count(other.get()), 1);
}

TEST_F(ReferenceCounterTest, VectorOfHandlesGrowsWithoutChangingCounts) {
    Handle const handle(new Tracked(m_deleted));
    std::vector<Handle> handles;
    for (int i = 0; i < 100; ++i)
        handles.push_back(handle);
    EXPECT_EQ(count(handle.get()), 101);
    handles.clear();
    EXPECT_EQ(count(handle.get()), 1);
}

TEST_F(ReferenceCounterTest, EmptyHandleHasNoObject) {
    EXPECT_EQ(Handle().get(), nullptr);
    EXPECT_EQ(Handle(nullptr).get(), nullptr);
    EXPECT_EQ(Handle(Handle()).get(), nullptr);
}

TEST_F(ReferenceCounterTest, ObjectIsReadWithoutWaitingForTheRecordsLock) {
    Handle const handle(new Tracked(m_deleted));
    ReferenceInfo* const record = table().get_refinfo(handle.get());
    record->lock();
    Tracked* read = nullptr;
    std::thread([&] { read = handle.unlocked(); }).join();
    record->unlock();
    EXPECT_EQ(read, handle.get());
    EXPECT_EQ(Handle().unlocked(), nullptr);
}

TEST_F(ReferenceCounterTest, HandleIsEmptyWhenTheDestructorOfItsObjectRuns) {
    class Asking : public Object {
      public:
        Asking() : Object(false) {}
        ~Asking() override {
            *m_empty = m_handle->get() == nullptr && m_handle->unlocked() == nullptr;
        }
        ReferenceCounter<Asking>* m_handle = nullptr;
        bool* m_empty = nullptr;
    };
    bool empty = false;
    {
        ReferenceCounter<Asking> handle(new Asking);
        handle->m_handle = &handle;
        handle->m_empty = &empty;
    }
    EXPECT_TRUE(empty);
}

TEST_F(ReferenceCounterTest, EmptyHandleMakesNoEntry) {
    int const before = table().referenced_objects();
    Handle const empty;
    Handle const copy(empty);
    EXPECT_EQ(table().referenced_objects(), before);
}

TEST_F(ReferenceCounterTest, ReleaseOfAnEmptyHandleDoesNothing) {
    Handle empty;
    empty.release();
    EXPECT_EQ(empty.get(), nullptr);
}

TEST_F(ReferenceCounterTest, HandleItselfHasNoLock) {
    Handle handle;
    testing::internal::CaptureStdout();
    EXPECT_EQ(handle.lock(), 99);
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "Attempting to lock a non-lockable object...\n");
}

TEST_F(ReferenceCounterTest, HandleCountsObjectsBehindAVirtualBase) {
    class Virtual : public virtual Object {
      public:
        explicit Virtual(bool& deleted) : m_deleted(deleted) {}
        ~Virtual() override { m_deleted = true; }

      private:
        bool& m_deleted;
    };
    auto* object = new Virtual(m_deleted);
    {
        ReferenceCounter<Virtual> const first(object);
        ReferenceCounter<Object> const second(object);
        EXPECT_EQ(count(object), 2);
    }
    EXPECT_TRUE(m_deleted);
}

using ReferenceCounterDeathTest = ReferenceCounterTest;

TEST_F(ReferenceCounterDeathTest, ArrowOnAnEmptyHandleAborts) {
    Handle const empty;
    EXPECT_EXIT(static_cast<void>(empty.operator->()), testing::KilledBySignal(SIGABRT),
                "^FATAL! ReferenceCounter operator-> returns NULL\nCalling abort\n");
}

} // namespace
