// SPDX-License-Identifier: BSD-2-Clause
// The identifier lists of handles, and of other objects that hardly ever get an identifier.
#pragma once

#include <atomic>
#include <cstdint>
#include <typeinfo>

#include "core/IID.h"
#include "core/RecyclingPool.h"

namespace KVL {

/// A `RootedIIDList` is a list that begins with the identifier of `Object`, as every object's does.
class RootedIIDList : public IIDList {
  public:
    RootedIIDList() { add(IID("6Object")); }
};

/// A `HandleList` is a list that `HandleLists` has made, which its type shows.
class HandleList final : public RootedIIDList {};

/// `HandleLists` hands out the lists of objects that hardly ever get an identifier, and takes them
/// back. Every list is a block of its own with room for all identifiers. There are many handles,
/// and programs do not add identifiers to their lists. The lists are therefore private mappings of
/// one file in memory, and need memory of their own only when they are changed. As long as no list
/// was changed, neither `take` nor `give` accesses the memory of a list.
///
/// Each thread has a cache, which exchanges batches with a central stock. A list that was made is
/// never unmapped. Where the system refuses mappings, lists come from the heap. Sanitizer builds
/// always use the heap, so that a use after free is detected. Thread-safe.
class HandleLists {
  public:
    /// Whether `list` comes from here.
    static bool made(IIDList const* list) {
        // Only the library makes such lists, so their type is described once.
        return &typeid(*list) == &typeid(HandleList);
    }

#ifdef KVLOAM_NO_POOL
    static IIDList* take() {
        return new HandleList;
    }
    static void give(IIDList* list) {
        delete list;
    }
    static void noteChange() {}
#else
    /// A list with the identifier of `Object` alone. Throws `std::bad_alloc`.
    static IIDList* take() {
        Cache& cache = s_cache;
        if (cache.count == 0) [[unlikely]]
            return refill();
        return cache.lists[--cache.count];
    }

    static void give(IIDList* list) {
        if (s_changed.load(std::memory_order_relaxed)) [[unlikely]]
            list->shrink(1);
        Cache& cache = s_cache;
        if (cache.count >= cache.limit) [[unlikely]] {
            giveToFull(list);
            return;
        }
        cache.lists[cache.count++] = list;
    }

    /// A `HandleList` gets another identifier. From now on lists are read when they come back.
    static void noteChange() {
        s_changed.store(true, std::memory_order_relaxed);
    }

  private:
    /// All zero before the thread's first use of it.
    struct Cache {
        IIDList** lists;
        std::int32_t count;
        std::int32_t limit; ///< 0 without `lists`
        bool ended;         ///< the thread is ending
    };
    struct Drain;

    static void open(Cache& cache);
    static IIDList* refill();
    static void giveToFull(IIDList* list);

    [[gnu::tls_model("initial-exec")]] static inline constinit thread_local Cache s_cache{};
    static inline constinit std::atomic<bool> s_changed{false};
#endif
};

} // namespace KVL
