// SPDX-License-Identifier: BSD-2-Clause
// Handles shared, copied and dropped by many threads lose no count.
#include <atomic>
#include <barrier>
#include <cstddef>
#include <cstdint>
#include <iostream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "core/ReferenceCounter.h"

namespace {

std::atomic<int> s_alive{0};

class Counted : public Object {
  public:
    Counted() : Object(false) { ++s_alive; }
    ~Counted() override { --s_alive; }
};

using Handle = ReferenceCounter<Counted>;

class HandleThreadsTest : public testing::Test {
  protected:
    static constexpr int kThreads = 4;

    /// Runs `body(thread)` on all threads, which start at the same time.
    template <class Body>
    static void together(Body const& body) {
        std::barrier begin(kThreads);
        std::vector<std::thread> threads;
        for (int i = 0; i < kThreads; ++i)
            threads.emplace_back([&, i] {
                begin.arrive_and_wait();
                body(i);
            });
        for (auto& thread : threads)
            thread.join();
    }

    void SetUp() override { m_before = ReferenceTable::get_instance()->referenced_objects(); }
    void TearDown() override {
        EXPECT_EQ(s_alive, 0);
        EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), m_before);
    }

    int m_before = 0;
};

TEST_F(HandleThreadsTest, CopiesOfOneObjectOnManyThreadsLoseNoCount) {
    {
        Handle const shared(new Counted);
        together([&](int) {
            std::vector<Handle> copies;
            for (int i = 0; i < 20000; ++i) {
                copies.push_back(shared);
                if (i % 100 == 99) copies.clear();
            }
        });
        EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(shared.get())->count(), 1);
        EXPECT_EQ(s_alive, 1);
    }
}

TEST_F(HandleThreadsTest, HandlesMadeFromThePointerOnManyThreadsLoseNoCount) {
    {
        Handle const shared(new Counted);
        together([&](int) {
            for (int i = 0; i < 20000; ++i) {
                Handle const again(shared.get());
                EXPECT_EQ(again.get(), shared.get());
            }
        });
        EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(shared.get())->count(), 1);
    }
}

TEST_F(HandleThreadsTest, FirstHandlesOfOneNewObjectOnManyThreadsShareOneRecord) {
    for (int round = 0; round < 200; ++round) {
        auto* object = new Counted;
        std::vector<Handle> handles(kThreads);
        together([&](int thread) { handles[static_cast<std::size_t>(thread)] = Handle(object); });
        EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(object)->count(), kThreads);
    }
}

TEST_F(HandleThreadsTest, ObjectsMadeOnOneThreadAreDeletedByOthers) {
    constexpr int kObjects = 8000;
    std::vector<Handle> handles;
    handles.reserve(kObjects);
    for (int i = 0; i < kObjects; ++i)
        handles.emplace_back(new Counted);
    EXPECT_EQ(s_alive, kObjects);
    together([&](int thread) {
        for (auto i = static_cast<std::size_t>(thread); i < handles.size(); i += kThreads)
            handles[i] = Handle();
    });
}

TEST_F(HandleThreadsTest, LastDropOnAnyThreadDeletesTheObject) {
    for (int round = 0; round < 200; ++round) {
        std::vector<Handle> handles(kThreads, Handle(new Counted));
        together([&](int thread) { handles[static_cast<std::size_t>(thread)] = Handle(); });
        EXPECT_EQ(s_alive, 0);
    }
}

TEST_F(HandleThreadsTest, HandlesOfAThreadThatEndsAreDroppedCleanly) {
    // The handle in thread storage is dropped after the thread's cache of recycled lists is gone.
    for (int round = 0; round < 20; ++round)
        std::thread([] {
            static thread_local Handle late;
            late = Handle(new Counted);
        }).join();
    EXPECT_EQ(s_alive, 0);
}

class TableThreadsTest : public HandleThreadsTest {
  protected:
    class OwnTable : public ReferenceTable {
      public:
        OwnTable() = default;
    };

    OwnTable m_table;
};

TEST_F(TableThreadsTest, TableThatGrowsAndShrinksOnManyThreadsLosesNoEntry) {
    constexpr std::size_t kObjects = 5000;
    std::vector<std::vector<std::max_align_t>> addresses(kThreads);
    for (auto& some : addresses)
        some.resize(kObjects);
    auto const object = [&](int thread, std::size_t i) { // the table looks only at the address
        return reinterpret_cast<Object*>(&addresses[static_cast<std::size_t>(thread)][i]);
    };
    for (int round = 0; round < 3; ++round) {
        together([&](int thread) {
            for (std::size_t i = 0; i < kObjects; ++i) {
                ReferenceInfo* const record = m_table.create_refinfo(object(thread, i));
                ASSERT_NE(m_table.get_refinfo(object(thread, i / 2)), nullptr);
                ASSERT_EQ(record->count(), 0);
            }
        });
        EXPECT_EQ(m_table.referenced_objects(), kThreads * static_cast<int>(kObjects));
        together([&](int thread) {
            for (std::size_t i = 0; i < kObjects; ++i) {
                m_table.destroy_refcount(object(thread, i));
                ASSERT_EQ(m_table.get_refinfo(object(thread, i)), nullptr);
            }
        });
        EXPECT_EQ(m_table.referenced_objects(), 0);
    }
}

TEST_F(TableThreadsTest, DumpShowsWhatStaysOnceWhileOtherObjectsComeAndGo) {
    std::vector<Counted> stay(300);
    for (Counted& object : stay)
        m_table.create_refinfo(&object);
    std::atomic<bool> end{false};
    std::thread others([&] {
        std::vector<Counted> come(1000);
        while (!end) {
            for (Counted& object : come)
                m_table.create_refinfo(&object);
            for (Counted& object : come)
                m_table.destroy_refcount(&object);
        }
    });
    for (int round = 0; round < 3; ++round) {
        std::ostringstream text;
        auto* const before = std::cout.rdbuf(text.rdbuf());
        m_table.dump();
        std::cout.rdbuf(before);
        std::string const lines = text.str();
        for (Counted const& object : stay) {
            std::string const address =
                " 0x" + std::to_string(reinterpret_cast<std::uintptr_t>(&object)) + '[';
            std::size_t const found = lines.find(address);
            EXPECT_NE(found, std::string::npos);
            EXPECT_EQ(lines.find(address, found + 1), std::string::npos);
        }
    }
    end = true;
    others.join();
    for (Counted& object : stay)
        m_table.destroy_refcount(&object);
    stay.clear();
}

} // namespace
