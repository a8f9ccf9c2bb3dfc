// SPDX-License-Identifier: BSD-2-Clause
// Every allocation of a storm of handles and tables fails once; the library stays usable.
#include <malloc.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <iostream>
#include <new>
#include <sstream>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "core/IndexedTable.h"
#include "core/ListenerTable.h"
#include "core/RecyclingPool.h"
#include "core/ReferenceCounter.h"
#include "core/kvlvector.h"

namespace {

constexpr long kNone = -1;
long s_untilFailure = kNone; ///< allocations that succeed before one fails
long s_blocks = 0;           ///< allocated and not freed
long s_largeBlocks = 0;      ///< those of at least kLarge bytes
constexpr std::size_t kLarge = 4096;

/// A `FailingAllocation` lets one allocation fail while it exists, after `successes` that succeed.
class FailingAllocation {
  public:
    explicit FailingAllocation(long successes) { s_untilFailure = successes; }
    ~FailingAllocation() { s_untilFailure = kNone; }
    FailingAllocation(FailingAllocation const&) = delete;
    FailingAllocation& operator=(FailingAllocation const&) = delete;

    bool failed() const { return s_untilFailure == kNone; }
};

/// While a `NoAddressSpace` exists, the system refuses mappings. Not with a sanitizer, which needs
/// some itself; with one, all lists of identifiers come from the heap.
class NoAddressSpace {
  public:
    NoAddressSpace() {
        getrlimit(RLIMIT_AS, &m_before);
        rlimit const none{0, m_before.rlim_max};
#ifndef KVLOAM_NO_POOL
        setrlimit(RLIMIT_AS, &none);
#else
        static_cast<void>(none);
#endif
    }
    ~NoAddressSpace() {
        setrlimit(RLIMIT_AS, &m_before);
    }
    NoAddressSpace(NoAddressSpace const&) = delete;
    NoAddressSpace& operator=(NoAddressSpace const&) = delete;

  private:
    rlimit m_before{};
};

void* allocate(std::size_t size, std::size_t alignment) {
    if (s_untilFailure != kNone && s_untilFailure-- == 0) throw std::bad_alloc();
    void* block = nullptr;
    if (posix_memalign(&block, alignment, size) != 0) throw std::bad_alloc();
    ++s_blocks;
    if (malloc_usable_size(block) >= kLarge) ++s_largeBlocks;
    return block;
}

void release(void* block) noexcept {
    if (block != nullptr) --s_blocks;
    if (malloc_usable_size(block) >= kLarge) --s_largeBlocks;
    std::free(block); // NOLINT(cppcoreguidelines-no-malloc)
}

} // namespace

void* operator new(std::size_t size) {
    return allocate(size, alignof(std::max_align_t));
}
void* operator new(std::size_t size, std::align_val_t alignment) {
    return allocate(size, static_cast<std::size_t>(alignment));
}
void operator delete(void* block) noexcept {
    release(block);
}
void operator delete(void* block, std::size_t /*size*/) noexcept {
    release(block);
}
void operator delete(void* block, std::align_val_t /*alignment*/) noexcept {
    release(block);
}
void operator delete(void* block, std::size_t /*size*/, std::align_val_t /*alignment*/) noexcept {
    release(block);
}

namespace {

/// More handles than the pool has recycled identifier lists, so that some handle allocates.
constexpr int kMoreThanAreRecycled = 20000;

int s_alive = 0;

class Counted : public Object {
  public:
    Counted() : Object(true) { ++s_alive; }
    ~Counted() override { --s_alive; }
};

using Handle = ReferenceCounter<Counted>;

Handle made() {
    return {new Counted};
}

/// Handles of so many objects that the reference table grows when a few more are made.
std::vector<Handle> almostTooMany() {
    constexpr int kEnough = 506;
    std::vector<Handle> handles;
    handles.reserve(kEnough);
    while (ReferenceTable::get_instance()->referenced_objects() < kEnough)
        handles.push_back(made());
    return handles;
}

bool isUsable(std::vector<Handle> const& kept) {
    ReferenceTable& table = *ReferenceTable::get_instance();
    auto const number = static_cast<int>(kept.size());
    for (Handle const& handle : kept) {
        ReferenceInfo const* const record = table.get_refinfo(handle.get());
        if (record == nullptr || record->count() != 1) return false;
    }
    if (table.referenced_objects() != number || s_alive != number) return false;
    {
        std::vector<Handle> more;
        for (int i = 0; i < 600; ++i)
            more.push_back(made());
        if (table.referenced_objects() != number + 600) return false;
    }
    return table.referenced_objects() == number && s_alive == number;
}

enum Outcome : int { NothingFailed, Failed, Unusable };

/// Runs `storm` with one failing allocation, after `successes` others, and examines the library.
template <class Storm>
Outcome outcomeOf(Storm const& storm, long successes, std::vector<Handle> const& kept) {
    long const blocks = s_blocks;
    long const largeBlocks = s_largeBlocks;
    bool failed = false;
    {
        FailingAllocation const failing(successes);
        try {
            storm();
        } catch (std::bad_alloc const&) { // the table grows later when it finds no memory
        }
        failed = failing.failed();
    }
#ifdef KVLOAM_NO_POOL
    // The table keeps a segment of buckets that it has got, and a list of its segments.
    if (s_blocks != blocks + 2 * (s_largeBlocks - largeBlocks)) return Unusable; // one has leaked
#else
    static_cast<void>(blocks); // the pool keeps blocks
    static_cast<void>(largeBlocks);
#endif
    if (!isUsable(kept)) return Unusable;
    return failed ? Failed : NothingFailed;
}

/// Fails each allocation of `storm`, each in a new process, whose pool is empty and whose reference
/// table has not grown.
template <class Storm>
void failEachAllocationOf(Storm const& storm, long atLeast) {
    std::vector<Handle> const kept = almostTooMany();
    for (long successes = 0;; ++successes) {
        pid_t const child = fork();
        ASSERT_NE(child, -1);
        if (child == 0) _exit(outcomeOf(storm, successes, kept));
        int status = 0;
        ASSERT_EQ(waitpid(child, &status, 0), child);
        ASSERT_TRUE(WIFEXITED(status)) << "allocation " << successes << " ended the process";
        ASSERT_NE(WEXITSTATUS(status), Unusable) << "allocation " << successes;
        if (WEXITSTATUS(status) == NothingFailed) {
            EXPECT_GE(successes, atLeast) << "the storm hardly allocates";
            return;
        }
        ASSERT_EQ(WEXITSTATUS(status), Failed) << "allocation " << successes;
    }
}

TEST(AllocationFailureTest, HandlesSurviveTheFailureOfAnyAllocation) {
    failEachAllocationOf(
        [] {
            std::vector<Handle> handles;
            for (int i = 0; i < 12; ++i)
                handles.push_back(made());
            std::vector<Handle> const copies = handles;
            for (Handle const& handle : copies)
                Handle const again(handle.get());
            Handle moved(std::move(handles.back()));
            handles.back() = moved;
            handles.front() = std::move(moved);
        },
        45);
}

TEST(AllocationFailureTest, NewObjectThatNoHandleCanTakeIsDeleted) {
    std::vector<Handle> others;
    others.reserve(kMoreThanAreRecycled);
    EXPECT_THROW(
        {
            for (int i = 0; i < kMoreThanAreRecycled; ++i) {
                auto* const object = new Counted;
                FailingAllocation const failing(0);
                others.emplace_back(object);
            }
        },
        std::bad_alloc);
    EXPECT_EQ(s_alive, static_cast<int>(others.size()));
}

TEST(AllocationFailureTest, ObjectWithAHandleOutlivesTheFailureToMakeAnother) {
    Handle const handle = made();
    std::vector<Handle> others;
    others.reserve(kMoreThanAreRecycled);
    EXPECT_THROW(
        {
            NoAddressSpace const noSpace;
            FailingAllocation const failing(0);
            for (int i = 0; i < kMoreThanAreRecycled; ++i)
                others.emplace_back(handle.get());
        },
        std::bad_alloc);
    EXPECT_EQ(s_alive, 1);
    EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(handle.get())->count(),
              static_cast<int>(others.size()) + 1);
}

TEST(AllocationFailureTest, TablesSurviveTheFailureOfAnyAllocation) {
    class Listener final : public EventListener {};
    failEachAllocationOf(
        [] {
            ReferenceCounter<IndexedTable<int, Handle>> const table(new IndexedTable<int, Handle>);
            ReferenceCounter<kvlvector<Handle>> const vector(new kvlvector<Handle>);
            ListenerTable listeners;
            Listener listener;
            listeners.AddListener(&listener);
            for (int i = 0; i < 8; ++i) {
                enter_at_next_index(*table.get(), made());
                vector->push_back(table->entries().begin()->second);
            }
            table->remove((*vector.get())[3]);
        },
        45);
}

TEST(AllocationFailureTest, IndexThatCouldNotBeEnteredIsHandedOutNext) {
    IndexedTable<int, Handle> table;
    Handle const thing = made();
    EXPECT_EQ(enter_at_next_index(table, thing), 1);
    Handle argument = thing;
    EXPECT_THROW(
        {
            FailingAllocation const failing(0);
            static_cast<void>(enter_at_next_index(table, std::move(argument)));
        },
        std::bad_alloc);
    EXPECT_EQ(table.last_index(), 1);
    EXPECT_EQ(enter_at_next_index(table, thing), 2);
}

TEST(AllocationFailureTest, DumpThatFindsNoMemoryWritesNothing) {
    class OwnTable : public ReferenceTable {
      public:
        OwnTable() = default;
    };
    OwnTable table;
    Counted object;
    table.create_refinfo(&object);
    long successes = 0;
    for (bool fails = true; fails; ++successes) {
        std::ostringstream text;
        auto* const before = std::cout.rdbuf(text.rdbuf());
        try {
            FailingAllocation const failing(successes);
            fails = false;
            table.dump();
        } catch (std::bad_alloc const&) {
            fails = true;
        }
        std::cout.rdbuf(before);
        if (fails) {
            EXPECT_EQ(text.str(), "") << "allocation " << successes;
        }
        EXPECT_EQ(table.referenced_objects(), 1);
    }
    EXPECT_GT(successes, 3);
    table.destroy_refcount(&object);
}

class GrowingTableTest : public testing::Test {
  protected:
    /// Enough for a few segments of buckets.
    static constexpr std::size_t kObjects = 4000;

    class OwnTable : public ReferenceTable {
      public:
        OwnTable() = default;
    };

    GrowingTableTest() : m_addresses(kObjects) {}

    /// The table looks only at the address.
    Object* object(std::size_t i) { return reinterpret_cast<Object*>(&m_addresses[i]); }

    void removeAll(ReferenceTable& table) {
        for (std::size_t i = 0; i < kObjects; ++i)
            table.destroy_refcount(object(i));
    }

    std::vector<std::max_align_t> m_addresses;
};

TEST_F(GrowingTableTest, EntriesAreKeptWhicheverAllocationOfAGrowthFails) {
    bool failed = true;
    int refused = 0;
    for (long successes = 0; failed; ++successes) {
        OwnTable table;
        {
            FailingAllocation const failing(successes);
            for (std::size_t i = 0; i < kObjects; ++i)
                try {
                    table.create_refinfo(object(i));
                } catch (std::bad_alloc const&) {
                    ++refused;
                    table.create_refinfo(object(i));
                }
            failed = failing.failed();
        }
        ASSERT_EQ(table.referenced_objects(), static_cast<int>(kObjects));
        for (std::size_t i = 0; i < kObjects; ++i)
            ASSERT_NE(table.get_refinfo(object(i)), nullptr) << i;
        removeAll(table);
        ASSERT_EQ(table.referenced_objects(), 0);
    }
    EXPECT_GT(refused, 0) << "no new record has met the failure";
}

TEST_F(GrowingTableTest, MemoryOfAGrowthIsFreedWhenTheObjectsGo) {
    OwnTable table;
    long const before = s_largeBlocks;
    for (std::size_t i = 0; i < kObjects; ++i)
        table.create_refinfo(object(i));
    EXPECT_GE(s_largeBlocks, before + 7);
    removeAll(table);
    EXPECT_EQ(s_largeBlocks, before);
}

} // namespace
