// SPDX-License-Identifier: BSD-2-Clause
// The identifier lists of handles: whole lists that need hardly any memory.
#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <memory>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "core/RecyclingPool.h"
#include "core/ReferenceCounter.h"
#include "tests/support/AnonymousMemory.h"

namespace {

using Handle = ReferenceCounter<Object>;
using Handles = std::vector<std::unique_ptr<Handle>>;

/// More than a thread keeps for itself, and more than are mapped at a time.
constexpr int kMany = 2000;

Handles emptyHandles(int count) {
    Handles handles;
    for (int i = 0; i < count; ++i)
        handles.push_back(std::make_unique<Handle>());
    return handles;
}

bool isPristine(Object const& object) {
    KVL::IIDList const* const list = object.interfaces();
    return list->is_element(KVL::IID("6Object")) && !list->is_element(KVL::IID()) &&
           !list->is_element(KVL::IID("7Feature"));
}

#ifndef KVLOAM_NO_POOL
/// The descriptor of the file of which lists are copies; -1: there is none.
int listFile() {
    for (auto const& entry : std::filesystem::directory_iterator("/proc/self/fd")) {
        std::error_code ignored;
        if (read_symlink(entry, ignored).string().find("kvloam-lists") != std::string::npos)
            return std::atoi(entry.path().filename().c_str());
    }
    return -1;
}
#endif

TEST(HandleListsTest, EveryHandleHasAListOfItsOwn) {
    Handles const handles = emptyHandles(kMany);
    std::set<KVL::IIDList const*> lists;
    for (auto const& handle : handles) {
        EXPECT_TRUE(isPristine(*handle));
        lists.insert(handle->interfaces());
    }
    EXPECT_EQ(lists.size(), handles.size());
}

TEST(HandleListsTest, ListOfAHandleHasRoomForAllIdentifiersWithoutChangingOthers) {
    Handles const handles = emptyHandles(kMany);
    KVL::IIDList& list = *handles[kMany / 2]->interfaces();
    for (int i = 0; i < KVL::IIDList::kCapacity; ++i)
        list.add(KVL::IID(("name" + std::to_string(i)).c_str()));
    EXPECT_TRUE(list.is_element(KVL::IID("name30")));
    EXPECT_FALSE(list.is_element(KVL::IID("name31")));
    for (auto const& handle : handles)
        EXPECT_FALSE(handle.get() != handles[kMany / 2].get() &&
                     handle->interfaces()->is_element(KVL::IID("name0")));
}

TEST(HandleListsTest, IdentifierThatAHandleWasGivenIsGoneWhenItsListIsUsedAgain) {
    emptyHandles(kMany).at(kMany / 2)->interfaces()->add(KVL::IID("7Feature"));
    for (auto const& handle : emptyHandles(2 * kMany))
        EXPECT_TRUE(isPristine(*handle));
}

TEST(HandleListsTest, ListsThatOneThreadGivesBackServeOthers) {
#ifdef KVLOAM_NO_POOL
    GTEST_SKIP() << "with a sanitizer, lists come from the heap";
#else
    Handles handles = emptyHandles(kMany);
    std::set<KVL::IIDList const*> lists;
    for (auto const& handle : handles)
        lists.insert(handle->interfaces());
    std::thread([&] { handles.clear(); }).join();
    int again = 0;
    for (auto const& handle : emptyHandles(kMany))
        again += lists.contains(handle->interfaces()) ? 1 : 0;
    EXPECT_GT(again, kMany / 2);
#endif
}

TEST(HandleListsTest, HandlesNeedHardlyAnyMemoryForTheirLists) {
#ifdef KVLOAM_NO_POOL
    GTEST_SKIP() << "with a sanitizer, lists come from the heap";
#else
    constexpr int kHandles = 20000;
    Handles handles;
    handles.reserve(kHandles);
    emptyHandles(1);
    long const before = anonymousMemory();
    for (int i = 0; i < kHandles; ++i)
        handles.push_back(std::make_unique<Handle>());
    EXPECT_LT(anonymousMemory() - before, kHandles * long{sizeof(KVL::IIDList)} / 10);
    // Nor does it cost memory to drop them.
    handles.clear();
    EXPECT_LT(anonymousMemory() - before, kHandles * long{sizeof(KVL::IIDList)} / 10);
#endif
}

#ifndef KVLOAM_NO_POOL
/// Replaces the library's descriptor, as a program may that closes all descriptors, and makes
/// handles.
[[noreturn]] void makeHandlesWithAForeignDescriptor() {
    emptyHandles(1);
    int const file = listFile();
    int const other = open("/proc/self/exe", O_RDONLY | O_CLOEXEC);
    if (file < 0 || dup2(other, file) != file) std::exit(2);
    for (auto const& handle : emptyHandles(kMany))
        if (!isPristine(*handle)) std::exit(1);
    std::exit(0);
}
#endif

TEST(HandleListsDeathTest, HandlesAreMadeThoughTheProgramHasReplacedTheDescriptor) {
#ifdef KVLOAM_NO_POOL
    GTEST_SKIP() << "with a sanitizer, lists come from the heap";
#else
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_EXIT(makeHandlesWithAForeignDescriptor(), testing::ExitedWithCode(0), "");
#endif
}

} // namespace
