// SPDX-License-Identifier: BSD-2-Clause
#include "core/HandleLists.h"

#ifndef KVLOAM_NO_POOL

#include <algorithm>
#include <cstddef>
#include <mutex>
#include <new>

#include "core/ListFile.h"

namespace KVL {

namespace {

constexpr std::int32_t kBatch = 64;
constexpr std::int32_t kCacheLimit = 2 * kBatch;

/// How many lists are mapped at a time. So many fill whole pages where a pointer has 8 bytes.
constexpr std::size_t kMapped = 256;

ListPlace appendLists() {
    return ListFile::instance().append(kMapped * sizeof(HandleList), [](void* block) {
        for (std::size_t i = 0; i < kMapped; ++i)
            new (static_cast<HandleList*>(block) + i) HandleList;
    });
}

/// Lists on their way from one thread to another.
struct Batch {
    Batch* next = nullptr;
    std::int32_t count = 0;
    IIDList* lists[kBatch];
};

/// The `Stock` is what all threads share. Never destroyed, because threads may outlive all static
/// destructors. Thread-safe.
class Stock {
  public:
    /// Fills `to` with up to `kBatch` lists and returns their number, which is not 0. Throws
    /// `std::bad_alloc`.
    std::int32_t take(IIDList** to) {
        std::scoped_lock const guard(m_mutex);
        if (Batch* const batch = m_batches) {
            m_batches = batch->next;
            std::int32_t const count = batch->count;
            std::copy_n(batch->lists, count, to);
            delete batch;
            return count;
        }
        if (m_next == m_end) {
            m_next = static_cast<HandleList*>(ListFile::map(m_place));
            m_end = m_next == nullptr ? nullptr : m_next + kMapped;
        }
        if (m_next == nullptr) {
            *to = new HandleList;
            return 1;
        }
        for (std::int32_t i = 0; i < kBatch; ++i)
            to[i] = std::launder(m_next++);
        return kBatch;
    }

    /// Takes over at most `kBatch` lists. When memory runs out they are lost, which costs address
    /// space only.
    void give(IIDList** lists, std::int32_t count) {
        auto* const batch = new (std::nothrow) Batch;
        if (batch == nullptr) return;
        batch->count = count;
        std::copy_n(lists, count, batch->lists);
        std::scoped_lock const guard(m_mutex);
        batch->next = m_batches;
        m_batches = batch;
    }

  private:
    std::mutex m_mutex;
    Batch* m_batches = nullptr;
    ListPlace const m_place = appendLists();
    HandleList* m_next = nullptr; ///< of those mapped last, the first that was never handed out
    HandleList* m_end = nullptr;
};
static_assert(kMapped % kBatch == 0);

Stock& stock() {
    static auto* const instance = new Stock;
    return *instance;
}

} // namespace

/// Returns the thread's cache to the stock when the thread ends.
struct HandleLists::Drain {
    ~Drain() {
        Cache& cache = s_cache;
        cache.limit = 0;
        cache.ended = true;
        for (; cache.count > 0; cache.count -= std::min(cache.count, kBatch))
            stock().give(cache.lists + cache.count - std::min(cache.count, kBatch),
                         std::min(cache.count, kBatch));
        delete[] cache.lists;
        cache.lists = nullptr;
    }
};

void HandleLists::open(Cache& cache) {
    if (cache.ended || cache.limit != 0) return;
    cache.lists = new (std::nothrow) IIDList*[kCacheLimit];
    if (cache.lists == nullptr) return;
    static thread_local Drain drain;
    static_cast<void>(&drain);
    cache.limit = kCacheLimit;
}

IIDList* HandleLists::refill() {
    Cache& cache = s_cache;
    open(cache);
    if (cache.limit != 0) {
        cache.count = stock().take(cache.lists);
        return cache.lists[--cache.count];
    }
    // The thread is ending: what it does not need goes back at once.
    IIDList* lists[kBatch] = {};
    std::int32_t const count = stock().take(lists);
    if (count > 1) stock().give(lists + 1, count - 1);
    return lists[0];
}

void HandleLists::giveToFull(IIDList* list) {
    Cache& cache = s_cache;
    open(cache);
    if (cache.limit == 0) {
        stock().give(&list, 1);
        return;
    }
    if (cache.count >= cache.limit) {
        cache.count -= kBatch;
        stock().give(cache.lists + cache.count, kBatch);
    }
    cache.lists[cache.count++] = list;
}

} // namespace KVL

#endif
