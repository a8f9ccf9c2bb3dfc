// SPDX-License-Identifier: BSD-2-Clause
// The identifier lists of objects whose classes have identifiers.
#include <memory>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "board/Interface.h"
#include "core/RecyclingPool.h"
#include "tests/support/AnonymousMemory.h"
#include "tests/support/BareInterface.h"

namespace {

using Plain = BareInterface<KVL::Interface>;
using Interfaces = std::vector<std::unique_ptr<Plain>>;

/// More than are mapped at a time.
constexpr int kMany = 500;

Interfaces interfaces(int count) {
    Interfaces all;
    for (int i = 0; i < count; ++i)
        all.push_back(std::make_unique<Plain>());
    return all;
}

/// Whether `object` answers to what every interface answers to, and to nothing else.
bool isAsMade(Object const& object) {
    KVL::IIDList const* const list = object.interfaces();
    return list->is_element(KVL::IID("6Object")) && list->is_element(KVL::Interface::iid()) &&
           !list->is_element(KVL::IID()) && !list->is_element(KVL::IID("7Feature"));
}

TEST(ListKindsTest, EveryObjectHasAListOfItsOwn) {
    Interfaces const all = interfaces(kMany);
    std::set<KVL::IIDList const*> lists;
    for (auto const& interface : all) {
        EXPECT_TRUE(isAsMade(*interface));
        lists.insert(interface->interfaces());
    }
    EXPECT_EQ(lists.size(), all.size());
}

TEST(ListKindsTest, ListHasRoomForAllIdentifiersWithoutChangingOthers) {
    Interfaces const all = interfaces(kMany);
    KVL::IIDList& list = *all[kMany / 2]->interfaces();
    for (int i = 0; i < KVL::IIDList::kCapacity; ++i)
        list.add(KVL::IID(("name" + std::to_string(i)).c_str()));
    EXPECT_TRUE(list.is_element(KVL::IID("name29")));
    EXPECT_FALSE(list.is_element(KVL::IID("name30")));
    for (auto const& interface : all)
        EXPECT_FALSE(interface.get() != all[kMany / 2].get() &&
                     interface->interfaces()->is_element(KVL::IID("name0")));
}

TEST(ListKindsTest, IdentifierThatOneObjectWasGivenIsGoneWhenItsListIsUsedAgain) {
    interfaces(kMany).at(kMany / 2)->interfaces()->add(KVL::IID("7Feature"));
    for (auto const& interface : interfaces(2 * kMany))
        EXPECT_TRUE(isAsMade(*interface));
}

/// An interface with an identifier that it has before its base class adds its own.
class Early : public virtual Object {
  public:
    Early() { interfaces()->add(KVL::IID("5Early")); }
};
class EarlyInterface final : public Early, public Plain {};

TEST(ListKindsTest, IdentifierThatAProgramAddedFirstStays) {
    EarlyInterface const interface;
    EXPECT_TRUE(isAsMade(interface));
    EXPECT_TRUE(interface.interfaces()->is_element(KVL::IID("5Early")));
    EXPECT_FALSE(Plain().interfaces()->is_element(KVL::IID("5Early")));
}

TEST(ListKindsTest, ThreadsMakeAndDropObjectsAtTheSameTime) {
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread)
        threads.emplace_back([thread] {
            KVL::IID const own(("thread" + std::to_string(thread)).c_str());
            for (int round = 0; round < 20; ++round) {
                Interfaces const all = interfaces(kMany / 10);
                for (auto const& interface : all) {
                    EXPECT_TRUE(isAsMade(*interface));
                    EXPECT_FALSE(interface->interfaces()->is_element(own));
                    interface->interfaces()->add(own);
                }
            }
        });
    for (std::thread& thread : threads)
        thread.join();
}

TEST(ListKindsTest, ObjectsNeedHardlyAnyMemoryForTheirLists) {
#ifdef KVLOAM_NO_POOL
    GTEST_SKIP() << "with a sanitizer, lists come from the heap";
#else
    constexpr int kObjects = 10000;
    Interfaces all;
    all.reserve(kObjects);
    interfaces(1);
    long const before = anonymousMemory();
    for (int i = 0; i < kObjects; ++i)
        all.push_back(std::make_unique<Plain>());
    // An object and its lock themselves need a fraction of a list.
    EXPECT_LT(anonymousMemory() - before, kObjects * long{sizeof(KVL::IIDList)} / 5);
#endif
}

} // namespace
