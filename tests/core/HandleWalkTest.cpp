// SPDX-License-Identifier: BSD-2-Clause
// Walks over handles in a vector, and searches by name and by object.
#include <cstring>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "core/HandleWalk.h"

namespace {

class Named : public Object {
  public:
    explicit Named(std::string name) : Object(false), m_name(std::move(name)) {}
    virtual int GetName(char* name) {
        std::strcpy(name, m_name.c_str());
        return 0;
    }

  private:
    std::string m_name;
};

using Handle = ReferenceCounter<Named>;

class HandleWalkTest : public testing::Test {
  protected:
    Handle named(char const* name) { return m_handles.emplace_back(new Named(name)); }
    Handle find(char const* name) {
        return KVL::find_named(
            KVL::first_in(m_handles), [this](Handle const& handle) { return next(handle); }, name);
    }
    Handle next(Handle const& handle) {
        ++m_steps;
        return KVL::next_in(m_handles, handle);
    }

    std::vector<Handle> m_handles;
    int m_steps = 0;
};

TEST_F(HandleWalkTest, EmptyVectorHasNoFirstHandle) {
    EXPECT_EQ(KVL::first_in(m_handles).get(), nullptr);
}

TEST_F(HandleWalkTest, WalkFollowsTheVectorToItsEnd) {
    Handle const first = named("a");
    Handle const second = named("b");
    EXPECT_EQ(KVL::first_in(m_handles).get(), first.get());
    EXPECT_EQ(next(first).get(), second.get());
    EXPECT_EQ(next(second).get(), nullptr);
}

TEST_F(HandleWalkTest, NextOfAnObjectOutsideTheVectorIsEmpty) {
    named("a");
    named("b");
    EXPECT_EQ(next(Handle(new Named("a"))).get(), nullptr);
    EXPECT_EQ(next(Handle()).get(), nullptr);
}

TEST_F(HandleWalkTest, NextOfAnObjectThatIsThereTwiceFollowsItsFirstHandle) {
    Handle const twice = named("a");
    Handle const second = named("b");
    m_handles.push_back(twice);
    named("c");
    EXPECT_EQ(next(twice).get(), second.get());
}

TEST_F(HandleWalkTest, SearchStopsAtTheFirstOfTheName) {
    named("a");
    Handle const wanted = named("b");
    named("b");
    EXPECT_EQ(find("b").get(), wanted.get());
    EXPECT_EQ(m_steps, 1);
}

TEST_F(HandleWalkTest, SearchForAnUnknownNameIsEmptyAtTheEndOfTheWalk) {
    named("a");
    named("b");
    EXPECT_EQ(find("ab").get(), nullptr);
    EXPECT_EQ(m_steps, 2);
}

TEST_F(HandleWalkTest, SearchReadsLongNames) {
    std::string const name(255, 'n');
    Handle const wanted = named(name.c_str());
    EXPECT_EQ(find(name.c_str()).get(), wanted.get());
}

TEST_F(HandleWalkTest, WalkPastAllEndsWithAnEmptyHandle) {
    for (char const* name : {"a", "b", "c"})
        named(name);
    Handle const end = KVL::past_all(KVL::first_in(m_handles),
                                     [this](Handle const& handle) { return next(handle); });
    EXPECT_EQ(end.get(), nullptr);
    EXPECT_EQ(m_steps, 3);
}

TEST_F(HandleWalkTest, ObjectIsFoundAtTheFirstHandleThatRefersToIt) {
    named("a");
    Handle const twice = named("b");
    m_handles.push_back(twice);
    EXPECT_EQ(KVL::find_object(m_handles, twice.get()), m_handles.begin() + 1);
}

TEST_F(HandleWalkTest, ObjectWithoutAHandleInTheVectorIsNotFound) {
    named("a");
    Handle const other(new Named("a"));
    EXPECT_EQ(KVL::find_object(m_handles, other.get()), m_handles.end());
}

TEST_F(HandleWalkTest, ObjectIsFoundAmongTheEntriesOfAMap) {
    std::map<int, Handle> entries;
    entries[3] = named("a");
    entries[5] = named("b");
    EXPECT_EQ(KVL::find_object(entries, entries[5].get())->first, 5);
    EXPECT_EQ(KVL::find_object(entries, Handle(new Named("b")).get()), entries.end());
}

} // namespace
