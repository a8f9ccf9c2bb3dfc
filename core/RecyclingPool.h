// SPDX-License-Identifier: BSD-2-Clause
// Recycles constructed objects: a small cache in each thread, which exchanges batches with a
// central stock.
//
// Programs make and drop millions of handles, and each owns an identifier list of 2.6 KB. With
// lists that stay constructed, that costs two pointer moves. The batches return objects to the
// thread that makes handles when another thread drops them (events, bulk copies).
//
// Sanitizer builds use the heap directly, so that a use after free is detected.
#pragma once

#include <cstddef>
#include <cstdint>
#include <mutex>
#include <new>

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define KVLOAM_NO_POOL 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define KVLOAM_NO_POOL 1
#endif
#endif

namespace KVL {

/// A `RecyclingPool` hands out objects of type `T` and takes them back. There is one for each type;
/// its state is static and never destroyed, because threads may outlive all static destructors. `T`
/// must be default-constructible. `give` requires an object in the state in which `take` returns
/// it. Thread-safe.
template <class T>
class RecyclingPool {
  public:
#ifdef KVLOAM_NO_POOL
    static void reserve() {}
    static T* take() {
        return new T;
    }
    static void give(T* object) {
        delete object;
    }
#else
    /// Has the thread's next `take` need no memory, unless the thread is ending: allocates before
    /// the caller takes a lock.
    static void reserve() {
        if (s_cache.head == nullptr) [[unlikely]]
            give(refill());
    }

    static T* take() {
        Cache& cache = s_cache;
        Block* block = cache.head;
        if (block == nullptr) [[unlikely]]
            return refill();
        cache.head = block->next;
        --cache.count;
        // Blocks from another thread are not in the cache; the next one is needed soon.
        __builtin_prefetch(cache.head, 1);
        return block->object();
    }

    static void give(T* object) {
        Cache& cache = s_cache;
        Block* const block = blockOf(object);
        if (cache.count >= cache.limit) [[unlikely]] {
            giveToFull(block);
            return;
        }
        put(cache, block);
    }

  private:
    /// Aligned so that the links and the beginning of the object share a cache line: recycling a
    /// list touches no other line.
    struct alignas(64) Block {
        Block* next = nullptr;
        Block* nextBatch = nullptr; ///< in a batch's first block: the next batch in the stock
        std::int32_t batchSize = 0; ///< in a batch's first block
        alignas(T) unsigned char storage[sizeof(T)];

        Block() { new (storage) T; }
        ~Block() { object()->~T(); }
        Block(Block const&) = delete;
        Block& operator=(Block const&) = delete;
        T* object() { return std::launder(reinterpret_cast<T*>(storage)); }
    };

    static constexpr std::int32_t kBatch = 64;
    static constexpr std::int32_t kCacheLimit = 2 * kBatch;
    /// The stock returns further blocks to the heap.
    static constexpr std::int32_t kStockLimit = 32768;

    struct Cache {
        Block* head = nullptr;
        std::int32_t count = 0;
        std::int32_t limit = 0; ///< 0 before the thread's first use of it, and when the thread ends
        bool ended = false;
    };

    /// Returns the thread's cache to the stock when the thread ends.
    struct Drain {
        ~Drain() {
            Cache& cache = s_cache;
            cache.limit = 0;
            cache.ended = true;
            if (cache.head != nullptr) stock(cache.head, cache.count);
            cache.head = nullptr;
            cache.count = 0;
        }
    };

    static Block* blockOf(T* object) {
        auto* storage = reinterpret_cast<unsigned char*>(object);
        return reinterpret_cast<Block*>(storage - offsetof(Block, storage));
    }

    static void put(Cache& cache, Block* block) {
        block->next = cache.head;
        cache.head = block;
        ++cache.count;
    }

    static void open(Cache& cache) {
        if (cache.ended || cache.limit != 0) return;
        static thread_local Drain drain;
        static_cast<void>(&drain);
        cache.limit = kCacheLimit;
    }

    [[gnu::noinline]] static T* refill() {
        Cache& cache = s_cache;
        open(cache);
        if (cache.limit != 0) {
            std::scoped_lock const guard(s_mutex);
            if (s_stock != nullptr) {
                Block* batch = s_stock;
                s_stock = batch->nextBatch;
                s_stocked -= batch->batchSize;
                cache.head = batch->next;
                cache.count = batch->batchSize - 1;
                return batch->object();
            }
        }
        return (new Block)->object();
    }

    [[gnu::noinline]] static void giveToFull(Block* block) {
        Cache& cache = s_cache;
        open(cache);
        if (cache.limit == 0) { // the thread is ending
            delete block;
            return;
        }
        if (cache.count >= cache.limit) {
            Block* const batch = cache.head;
            Block* last = batch;
            for (std::int32_t i = 1; i < kBatch; ++i)
                last = last->next;
            cache.head = last->next;
            cache.count -= kBatch;
            last->next = nullptr;
            stock(batch, kBatch);
        }
        put(cache, block);
    }

    static void stock(Block* batch, std::int32_t size) {
        {
            std::scoped_lock const guard(s_mutex);
            if (s_stocked + size <= kStockLimit) {
                batch->batchSize = size;
                batch->nextBatch = s_stock;
                s_stock = batch;
                s_stocked += size;
                return;
            }
        }
        while (batch != nullptr) {
            Block* next = batch->next;
            delete batch;
            batch = next;
        }
    }

    [[gnu::tls_model("initial-exec")]] static inline constinit thread_local Cache s_cache{};
    static inline constinit std::mutex s_mutex{};
    static inline constinit Block* s_stock = nullptr;
    static inline constinit std::int32_t s_stocked = 0;
#endif
};

} // namespace KVL
