// SPDX-License-Identifier: BSD-2-Clause
// What programs may write against the public headers: conversions, argument and return types.
#include <type_traits>

#include <gtest/gtest.h>

#include "kvloam.h"

namespace {

/// A class that hands `Object` a plain 0, as programs in C++98 style do.
class MadeWithZero : public Object {
  public:
    MadeWithZero() : Object(0) {}
};

TEST(DeclarationsTest, TextConvertsToAnInterfaceIdentifier) {
    static_assert(std::is_convertible_v<char const*, KVL::IID>);
    KVL::IIDList list;
    list.add("6Object");
    EXPECT_TRUE(list.is_element("6Object"));
    EXPECT_TRUE(KVL::IID("6Object") == "6Object");
}

TEST(DeclarationsTest, IdentifierListsTakeIdentifiersByValue) {
    static_assert(std::is_same_v<decltype(&KVL::IIDList::add), void (KVL::IIDList::*)(KVL::IID)>);
    static_assert(std::is_same_v<decltype(&KVL::IIDList::is_element),
                                 bool (KVL::IIDList::*)(KVL::IID) const>);
    KVL::IIDList list;
    void (KVL::IIDList::*const add)(KVL::IID) = &KVL::IIDList::add;
    (list.*add)("8Z7Device");
    EXPECT_TRUE(list.is_element("8Z7Device"));
}

TEST(DeclarationsTest, NumberAndTextConvertToAnAddress) {
    static_assert(std::is_convertible_v<int, KVL::IPAddress>);
    static_assert(std::is_convertible_v<char*, KVL::IPAddress>);
    char text[] = "10.1.2.3";
    KVL::IPAddress const address = text;
    EXPECT_TRUE(address == 0x0A010203);
}

TEST(DeclarationsTest, TextConvertsToAnAddressConfiguration) {
    auto const octetOf = [](KVL::IPAddressConfig const& config) {
        return config.GetAddress().octet(0);
    };
    char text[] = "10.1.2.3";
    EXPECT_EQ(octetOf(text), 10U);
}

TEST(DeclarationsTest, SchedulerIsHandedOutAsTheAbstractOne) {
    static_assert(
        std::is_same_v<decltype(ActionScheduler_pthread::GetScheduler()), ActionScheduler*>);
    EXPECT_NE(ActionScheduler_pthread::GetScheduler(), nullptr);
}

TEST(DeclarationsTest, ZeroMakesAnObjectThatIsNotLockable) {
    MadeWithZero object;
    testing::internal::CaptureStdout();
    EXPECT_EQ(object.lock(), 99);
    testing::internal::GetCapturedStdout();
}

TEST(DeclarationsTest, EntriesOfATableAreNotCopiedByAccident) {
    using Entries = std::remove_reference_t<
        decltype(std::declval<IndexedTable<int, ReferenceCounter<Board>>&>().entries())>;
    static_assert(!std::is_copy_constructible_v<Entries>);
    static_assert(!std::is_copy_assignable_v<Entries>);
    IndexedTable<int, ReferenceCounter<Board>> table;
    auto& entries = table.entries();
    entries[3] = ReferenceCounter<Board>();
    EXPECT_EQ(table.first_index(), 3);
}

} // namespace
