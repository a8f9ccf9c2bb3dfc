// SPDX-License-Identifier: BSD-2-Clause
// Interface identifiers and the list of them.
#include <memory>
#include <string>

#include <gtest/gtest.h>

#include "core/IID.h"

namespace {

using KVL::IID;
using KVL::IIDList;

IID numbered(int i) {
    return IID(("name" + std::to_string(i)).c_str());
}

TEST(IIDTest, DefaultIdentifierIsTheEmptyText) {
    EXPECT_STREQ(IID().tostring(), "");
}

TEST(IIDTest, ShortNameIsKept) {
    EXPECT_STREQ(IID("6Object").tostring(), "6Object");
}

TEST(IIDTest, NameOfEightyCharactersIsKept) {
    std::string const name(80, 'x');
    EXPECT_EQ(IID(name.c_str()).tostring(), name);
}

TEST(IIDTest, NameOfEightyOneCharactersBecomesUnknown) {
    EXPECT_STREQ(IID(std::string(81, 'x').c_str()).tostring(), "<<unknown>>");
}

TEST(IIDTest, NameOfAHundredCharactersBecomesUnknown) {
    EXPECT_STREQ(IID(std::string(100, 'x').c_str()).tostring(), "<<unknown>>");
}

TEST(IIDTest, IdentifiersAreEqualWhenTheirTextsAre) {
    EXPECT_TRUE(IID("6Object") == IID("6Object"));
    EXPECT_FALSE(IID("6Object") == IID("7Feature"));
    EXPECT_FALSE(IID("6Object") == IID());
}

TEST(IIDTest, CopyIsIndependent) {
    IID first("6Object");
    IID second(first);
    first = IID("7Feature");
    EXPECT_STREQ(second.tostring(), "6Object");
    EXPECT_STREQ(first.tostring(), "7Feature");
}

TEST(IIDListTest, AddedIdentifierIsAnElement) {
    IIDList list;
    list.add(IID("6Object"));
    EXPECT_TRUE(list.is_element(IID("6Object")));
    EXPECT_FALSE(list.is_element(IID("7Feature")));
}

TEST(IIDListTest, IdentifierAddedTwiceTakesOnePlace) {
    IIDList list;
    list.add(numbered(0));
    list.add(numbered(0));
    for (int i = 1; i < IIDList::kCapacity; ++i)
        list.add(numbered(i));
    EXPECT_TRUE(list.is_element(numbered(IIDList::kCapacity - 1)));
}

TEST(IIDListTest, ThirtyThirdIdentifierIsDropped) {
    IIDList list;
    for (int i = 0; i < 33; ++i)
        list.add(numbered(i));
    EXPECT_TRUE(list.is_element(numbered(31)));
    EXPECT_FALSE(list.is_element(numbered(32)));
}

TEST(IIDListTest, EmptyIdentifierIsNoElementUnlessAdded) {
    IIDList list;
    list.add(IID("6Object"));
    EXPECT_FALSE(list.is_element(IID()));
    list.add(IID());
    EXPECT_TRUE(list.is_element(IID()));
}

TEST(IIDListTest, CloneHoldsTheSameAndIsIndependent) {
    IIDList list;
    for (int i = 0; i < 5; ++i)
        list.add(numbered(i));
    std::unique_ptr<IIDList> const clone(list.clone());
    for (int i = 0; i < 5; ++i)
        EXPECT_TRUE(clone->is_element(numbered(i)));
    list.add(numbered(5));
    EXPECT_FALSE(clone->is_element(numbered(5)));
    clone->add(numbered(6));
    EXPECT_FALSE(list.is_element(numbered(6)));
}

TEST(IIDListTest, CloneOfAFullListIsFull) {
    IIDList list;
    for (int i = 0; i < 32; ++i)
        list.add(numbered(i));
    std::unique_ptr<IIDList> const clone(list.clone());
    clone->add(numbered(32));
    EXPECT_FALSE(clone->is_element(numbered(32)));
    EXPECT_TRUE(clone->is_element(numbered(31)));
}

} // namespace
