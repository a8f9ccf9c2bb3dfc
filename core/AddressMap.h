// SPDX-License-Identifier: BSD-2-Clause
// A hash map from object addresses that grows and shrinks in small steps.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace KVL {

/// An `AddressMap` is a hash map of entries, which it does not own. An `Entry` has a field `key`,
/// the address by which it is found, and a field `next`, which links the entries of one bucket.
/// Adding and removing entries therefore needs no memory. The null address is never a key.
///
/// Beyond the first segment of buckets, it has two to four buckets for each entry. When entries are
/// added or removed, a few buckets are split or merged (linear hashing), so that no operation takes
/// long, whatever the size. The owner provides further segments and frees them, so that it can
/// allocate without the lock that it holds otherwise. When it provides none, buckets hold more
/// entries.
///
/// Unsynchronised.
template <class Entry>
class AddressMap {
  public:
    static constexpr std::uint32_t kSegmentSize = 1024;
    struct Segment {
        Entry* buckets[kSegmentSize] = {};
    };

    AddressMap() = default;
    ~AddressMap() = default;
    AddressMap(AddressMap const&) = delete;
    AddressMap& operator=(AddressMap const&) = delete;

    std::uint32_t size() const { return m_size; }
    std::uint32_t buckets() const { return m_buckets; }

    /// The entry at `key`, or null.
    Entry* find(void const* key) {
        Entry* entry = bucket(bucketOf(key));
        while (entry != nullptr && entry->key != key)
            entry = entry->next;
        return entry;
    }

    /// Adds `entry`. Requires that the map has no entry at its key.
    void insert(Entry* entry) {
        put(entry);
        ++m_size;
        if (wantsBuckets()) [[unlikely]]
            split();
    }

    /// Removes the entry at `key` and returns it; null when there is none.
    Entry* erase(void const* key) {
        Entry*& first = bucket(bucketOf(key));
        Entry* before = nullptr;
        Entry* entry = first;
        for (; entry != nullptr && entry->key != key; entry = entry->next)
            before = entry;
        if (entry == nullptr) return nullptr;
        (before == nullptr ? first : before->next) = entry->next;
        --m_size;
        return entry;
    }

    /// Whether the map would grow if it had another segment.
    bool wantsSegment() const { return wantsBuckets() && m_buckets == capacity(); }
    /// Takes over `segment`, and grows, if the map wants one. When memory runs out, nothing
    /// changes.
    void provide(std::unique_ptr<Segment>& segment) {
        if (!wantsSegment()) return;
        m_segments.push_back(nullptr);
        m_segments.back() = std::move(segment);
        split();
    }

    /// Merges a few buckets if there are too many for the entries. Returns a segment that is no
    /// longer used, or null. To be called after an entry was removed.
    std::unique_ptr<Segment> shrink() {
        if (m_size >= m_buckets / 4 || m_buckets == kSegmentSize) [[likely]]
            return nullptr;
        merge();
        if (m_segments.empty() || m_buckets > capacity() - kSegmentSize) return nullptr;
        std::unique_ptr<Segment> unused = std::move(m_segments.back());
        m_segments.pop_back();
        return unused;
    }

    /// Calls `visit(entry)` for each entry of the bucket `index`, which is below `buckets()`.
    template <class Visit>
    void visit(std::uint32_t index, Visit const& visit) {
        for (Entry const* entry = bucket(index); entry != nullptr; entry = entry->next)
            visit(*entry);
    }

  private:
    /// The buckets that one operation splits or merges at most. While entries are only removed,
    /// four keep up; while they are only added, two do.
    static constexpr int kStep = 4;

    std::uint32_t bucketOf(void const* key) const {
        // Fibonacci hashing spreads aligned addresses evenly over the top bits of the product. Of
        // the bucket's number, the lowest bits must be the best: they tell buckets apart at all
        // sizes.
        auto const address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(key));
        auto const hash =
            static_cast<std::uint32_t>(__builtin_bswap64(address * 0x9E3779B97F4A7C15U));
        std::uint32_t const index = hash & m_mask;
        if (index >= m_buckets) [[unlikely]] // not split off yet
            return index & (m_mask >> 1);
        return index;
    }

    Entry*& bucket(std::uint32_t index) {
        if (index < kSegmentSize) [[likely]]
            return m_first.buckets[index];
        return m_segments[index / kSegmentSize - 1]->buckets[index % kSegmentSize];
    }

    std::size_t capacity() const { return (m_segments.size() + 1) * kSegmentSize; }
    bool wantsBuckets() const { return m_size > m_buckets / 2; }

    void put(Entry* entry) {
        Entry*& first = bucket(bucketOf(entry->key));
        entry->next = first;
        first = entry;
    }

    void putAll(Entry* entry) {
        while (entry != nullptr)
            put(std::exchange(entry, entry->next));
    }

    void split() {
        for (int i = 0; i < kStep && wantsBuckets() && m_buckets < capacity(); ++i) {
            std::uint32_t const added = m_buckets;
            resize(added + 1);
            putAll(std::exchange(bucket(added & (m_mask >> 1)), nullptr));
        }
    }

    void merge() {
        for (int i = 0; i < kStep && m_buckets > kSegmentSize; ++i) {
            Entry* const entries = std::exchange(bucket(m_buckets - 1), nullptr);
            resize(m_buckets - 1);
            putAll(entries);
        }
    }

    void resize(std::uint32_t buckets) {
        m_buckets = buckets;
        m_mask = std::bit_ceil(buckets) - 1;
    }

    // First what every search and every change needs, so that an owner's lock before it can share
    // the cache line.
    std::uint32_t m_size = 0;
    std::uint32_t m_mask = kSegmentSize - 1; ///< as many bits as the last bucket's number has
    std::uint32_t m_buckets = kSegmentSize;
    std::vector<std::unique_ptr<Segment>> m_segments; ///< but the first
    Segment m_first; ///< large enough that the entries of two threads seldom share a cache line
};

} // namespace KVL
