// SPDX-License-Identifier: BSD-2-Clause
// Indexed tables, shareable vectors and listener tables.
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "core/IndexedTable.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"
#include "core/TableWalk.h"
#include "core/kvlvector.h"

namespace {

class Thing : public Object {
  public:
    Thing() : Object(false) {}
};

using Handle = ReferenceCounter<Thing>;
using Table = IndexedTable<int, Handle>;

class IndexedTableTest : public testing::Test {
  protected:
    Handle enter() {
        Handle thing(new Thing);
        enter_at_next_index(m_table, thing);
        return thing;
    }
    std::vector<int> walk() {
        std::vector<int> indices;
        for (int i = m_table.first_index(); i != 0; i = m_table.next_index(i))
            indices.push_back(i);
        return indices;
    }

    Table m_table;
};

TEST_F(IndexedTableTest, EmptyTableHasNoFirstIndex) {
    EXPECT_EQ(m_table.first_index(), 0);
}

TEST_F(IndexedTableTest, EmptyTableAnswersAnEmptyHandle) {
    EXPECT_EQ(m_table[5].get(), nullptr);
    EXPECT_EQ(m_table.first_index(), 0) << "asking inserted something";
}

TEST_F(IndexedTableTest, NothingCanBeRemovedFromAnEmptyTable) {
    EXPECT_FALSE(m_table.remove(Handle(new Thing)));
}

TEST_F(IndexedTableTest, IndicesCountFromOne) {
    enter();
    enter();
    enter();
    EXPECT_EQ(walk(), (std::vector{1, 2, 3}));
}

TEST_F(IndexedTableTest, NextIndexIsZeroAtTheHighestIndex) {
    enter();
    enter();
    EXPECT_EQ(m_table.next_index(2), 0);
}

TEST_F(IndexedTableTest, NextIndexIsZeroWhenTheIndexIsAbsent) {
    enter();
    Handle const second = enter();
    enter();
    m_table.remove(second);
    EXPECT_EQ(m_table.next_index(2), 0);
    EXPECT_EQ(m_table.next_index(0), 0);
    EXPECT_EQ(m_table.next_index(-1), 0);
}

TEST_F(IndexedTableTest, RemovedIndexIsNotHandedOutAgain) {
    enter();
    m_table.remove(enter());
    enter();
    EXPECT_EQ(walk(), (std::vector{1, 3}));
}

TEST_F(IndexedTableTest, RemoveTakesTheFirstEntryOfTheObject) {
    Handle const thing = enter();
    enter_at_next_index(m_table, thing);
    EXPECT_TRUE(m_table.remove(thing));
    EXPECT_EQ(walk(), (std::vector{2}));
    EXPECT_TRUE(m_table.remove(thing));
    EXPECT_FALSE(m_table.remove(thing));
}

TEST_F(IndexedTableTest, RemoveComparesObjectsNotHandles) {
    Handle const thing = enter();
    EXPECT_TRUE(m_table.remove(Handle(thing.get())));
}

TEST_F(IndexedTableTest, SubscriptAnswersTheEntryItself) {
    Handle const thing = enter();
    EXPECT_EQ(m_table[1].get(), thing.get());
    Handle const other(new Thing);
    m_table[1] = other;
    EXPECT_EQ(m_table[1].get(), other.get());
}

TEST_F(IndexedTableTest, StepsOfAWalkCopyEntriesAndEndEmpty) {
    Handle const first = enter();
    Handle const second = enter();
    EXPECT_EQ(KVL::first_entry(m_table).get(), first.get());
    EXPECT_EQ(KVL::entry_at(m_table, 2).get(), second.get());
    EXPECT_EQ(KVL::entry_at(m_table, 3).get(), nullptr);
    EXPECT_EQ(KVL::entry_after(m_table, 1).get(), second.get());
    EXPECT_EQ(KVL::entry_after(m_table, 2).get(), nullptr);
    EXPECT_EQ(KVL::entry_after(m_table, 0).get(), nullptr);
    EXPECT_EQ(KVL::index_of(m_table, second), 2);
    EXPECT_EQ(KVL::index_of(m_table, Handle(new Thing)), 0);
}

TEST_F(IndexedTableTest, StepsOfAWalkAnswerTheEmptyValueWhenItWasAssigned) {
    enter();
    Handle const other(new Thing);
    m_table[5] = other; // absent: this is the table's empty value
    EXPECT_EQ(KVL::entry_at(m_table, 7).get(), other.get());
    EXPECT_EQ(KVL::entry_after(m_table, 1).get(), other.get());
}

TEST_F(IndexedTableTest, TableIsLockable) {
    EXPECT_EQ(m_table.lock(), 0);
    EXPECT_EQ(m_table.first_index(), 0);
    EXPECT_EQ(m_table.unlock(), 0);
}

TEST_F(IndexedTableTest, WalkContinuesWhenAnEarlierEntryIsRemoved) {
    Handle const first = enter();
    enter();
    enter();
    int const second = m_table.next_index(m_table.first_index());
    m_table.remove(first);
    EXPECT_EQ(m_table.next_index(second), 3);
}

TEST_F(IndexedTableTest, WalkEndsWhenItsOwnEntryIsRemoved) {
    enter();
    Handle const second = enter();
    enter();
    int const index = m_table.next_index(m_table.first_index());
    EXPECT_EQ(m_table[index].get(), second.get());
    m_table.remove(second);
    EXPECT_EQ(m_table[index].get(), nullptr);
    EXPECT_EQ(m_table.next_index(index), 0);
}

TEST_F(IndexedTableTest, WalkMeetsEntriesThatTheHolderOfTheLockErasesAndEnters) {
    for (int i = 0; i < 5; ++i)
        enter();
    EXPECT_EQ(m_table.next_index(2), 3);
    m_table.lock();
    m_table.entries().erase(3);
    m_table.entries().erase(m_table.entries().find(4));
    m_table.unlock();
    EXPECT_EQ(m_table.next_index(2), 5);
    enter();
    EXPECT_EQ(walk(), (std::vector{1, 2, 5, 6}));
    m_table.entries().clear();
    EXPECT_EQ(m_table[5].get(), nullptr);
    EXPECT_EQ(m_table.first_index(), 0);
}

TEST_F(IndexedTableTest, HolderOfTheLockEntersByTheMapsOwnOperations) {
    Handle const thing(new Thing);
    ObjectGuard const guard(m_table);
    auto& entries = m_table.entries();
    entries[4] = thing;
    EXPECT_TRUE(entries.emplace(2, thing).second);
    EXPECT_FALSE(entries.insert({2, Handle()}).second);
    EXPECT_TRUE(entries.insert({7, thing}).second);
    EXPECT_EQ(walk(), (std::vector{2, 4, 7}));
    EXPECT_EQ(entries.lower_bound(3)->first, 4);
    EXPECT_EQ(entries.upper_bound(4)->first, 7);
    EXPECT_EQ(m_table[2].get(), thing.get());
}

TEST_F(IndexedTableTest, RangeThatTheHolderOfTheLockErasesIsNotFoundAgain) {
    for (int i = 0; i < 5; ++i)
        enter();
    ObjectGuard const guard(m_table);
    auto& entries = m_table.entries();
    EXPECT_EQ(m_table.next_index(2), 3); // the table remembers where it found 2
    entries.erase(entries.lower_bound(2), entries.lower_bound(4));
    EXPECT_EQ(m_table[2].get(), nullptr);
    EXPECT_EQ(m_table[3].get(), nullptr);
    EXPECT_EQ(walk(), (std::vector{1, 4, 5}));
}

TEST_F(IndexedTableTest, DestructorOfARemovedObjectMayUseTheTable) {
    class Asking : public Object {
      public:
        Asking(int& seen, IndexedTable<int, ReferenceCounter<Asking>>& table)
            : Object(false), m_seen(seen), m_table(table) {}
        ~Asking() override { m_seen = m_table.first_index(); }

      private:
        int& m_seen;
        IndexedTable<int, ReferenceCounter<Asking>>& m_table;
    };
    int seen = -1;
    IndexedTable<int, ReferenceCounter<Asking>> table;
    auto* asking = new Asking(seen, table);
    enter_at_next_index(table, ReferenceCounter<Asking>(asking));
    table.remove(ReferenceCounter<Asking>(asking));
    EXPECT_EQ(seen, 0);
}

TEST(KvlvectorTest, KeepsElementsInOrder) {
    ReferenceCounter<kvlvector<Handle>> const shared(new kvlvector<Handle>);
    Handle const first(new Thing);
    Handle const second(new Thing);
    shared->push_back(first);
    shared->push_back(second);
    ASSERT_EQ(shared->size(), 2U);
    EXPECT_EQ((*shared.get())[0].get(), first.get());
    EXPECT_EQ((*shared.get())[1].get(), second.get());
}

TEST(KvlvectorTest, DropsItsElementsWithItself) {
    Handle const thing(new Thing);
    {
        ReferenceCounter<kvlvector<Handle>> const shared(new kvlvector<Handle>);
        shared->push_back(thing);
        EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(thing.get())->count(), 2);
    }
    EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(thing.get())->count(), 1);
}

TEST(KvlvectorTest, HasNoLock) {
    kvlvector<int> vector;
    testing::internal::CaptureStdout();
    EXPECT_EQ(vector.lock(), 99);
    testing::internal::GetCapturedStdout();
}

class Listener final : public EventListener {};

class ListenerTableTest : public testing::Test {
  protected:
    std::vector<EventListener*> walk() {
        std::vector<EventListener*> seen;
        for (auto* l = m_table.GetFirstListener(); l != nullptr; l = m_table.GetNextListener(l))
            seen.push_back(l);
        return seen;
    }

    ListenerTable m_table;
    Listener m_one, m_two, m_three;
};

TEST_F(ListenerTableTest, EmptyTableHasNoFirstListener) {
    EXPECT_EQ(m_table.GetFirstListener(), nullptr);
}

TEST_F(ListenerTableTest, ListenersStayInTheOrderOfAddition) {
    EXPECT_EQ(m_table.AddListener(&m_two), 0);
    EXPECT_EQ(m_table.AddListener(&m_one), 0);
    EXPECT_EQ(walk(), (std::vector<EventListener*>{&m_two, &m_one}));
}

TEST_F(ListenerTableTest, ListenerAddedTwiceIsThereOnce) {
    EXPECT_EQ(m_table.AddListener(&m_one), 0);
    EXPECT_EQ(m_table.AddListener(&m_one), 0);
    EXPECT_EQ(walk(), (std::vector<EventListener*>{&m_one}));
}

TEST_F(ListenerTableTest, RemovalKeepsTheOrderOfTheOthers) {
    for (auto* l : {&m_one, &m_two, &m_three})
        m_table.AddListener(l);
    EXPECT_EQ(m_table.RemoveListener(&m_two), 0);
    EXPECT_EQ(walk(), (std::vector<EventListener*>{&m_one, &m_three}));
}

TEST_F(ListenerTableTest, RemovalOfAnAbsentListenerAnswersOne) {
    EXPECT_EQ(m_table.RemoveListener(&m_one), 1);
    m_table.AddListener(&m_one);
    EXPECT_EQ(m_table.RemoveListener(&m_one), 0);
    EXPECT_EQ(m_table.RemoveListener(&m_one), 1);
}

TEST_F(ListenerTableTest, NextOfTheLastListenerIsNull) {
    m_table.AddListener(&m_one);
    EXPECT_EQ(m_table.GetNextListener(&m_one), nullptr);
}

TEST_F(ListenerTableTest, NextOfAnAbsentListenerIsNull) {
    m_table.AddListener(&m_one);
    EXPECT_EQ(m_table.GetNextListener(&m_two), nullptr);
}

TEST_F(ListenerTableTest, ListenerThatRemovesItselfEndsTheWalk) {
    for (auto* l : {&m_one, &m_two, &m_three})
        m_table.AddListener(l);
    std::vector<EventListener*> called;
    for_each_listener<Listener>(m_table, nullptr, [&](Listener* listener) {
        called.push_back(listener);
        if (listener == &m_two) m_table.RemoveListener(listener);
    });
    EXPECT_EQ(called, (std::vector<EventListener*>{&m_one, &m_two}));
}

TEST_F(ListenerTableTest, ListenerAddedDuringAWalkIsCalled) {
    m_table.AddListener(&m_one);
    std::vector<EventListener*> called;
    for_each_listener<Listener>(m_table, nullptr, [&](Listener* listener) {
        called.push_back(listener);
        m_table.AddListener(&m_two);
    });
    EXPECT_EQ(called, (std::vector<EventListener*>{&m_one, &m_two}));
}

TEST_F(ListenerTableTest, WalkDoesNotHoldTheGuardDuringACall) {
    class Guard : public Object {
      public:
        Guard() : Object(true) {}
        using Object::lockable;
    };
    Guard guard;
    m_table.AddListener(&m_one);
    int result = -1;
    for_each_listener<Listener>(m_table, &guard, [&](Listener*) {
        std::thread([&] {
            result = guard.lockable()->trylock();
            if (result == 0) guard.unlock();
        }).join();
    });
    EXPECT_EQ(result, 0);
}

} // namespace
