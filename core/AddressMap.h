// SPDX-License-Identifier: BSD-2-Clause
// A hash map from object addresses, in one flat array.
#pragma once

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace KVL {

/// An `AddressMap` maps addresses to `Value`s, which are pointers. The reference table is searched
/// for every handle made from a plain pointer; linear probing in one array finds an entry in a
/// cache line or two. The null address is never a key. Unsynchronised.
template <class Value>
class AddressMap {
  public:
    AddressMap() { resize(kSmallest); }

    std::size_t size() const { return m_size; }

    /// The value at `key`, or null.
    Value find(void const* key) const { return m_slots[slotFor(key)].value; }

    /// The value at `key`; when there is none, inserts what `make()` returns. When memory runs out
    /// or `make()` throws, the entries are what they were.
    template <class Make>
    Value find_or_insert(void const* key, Make const& make) {
        std::size_t i = slotFor(key);
        if (m_slots[i].key == key) return m_slots[i].value;
        if (m_size >= m_mask / 2) [[unlikely]] {
            grow();
            i = slotFor(key);
        }
        Value const value = make();
        m_slots[i] = {key, value};
        ++m_size;
        return value;
    }

    /// Removes `key` and returns its value; null when it is not in the map.
    Value erase(void const* key) {
        std::size_t hole = home(key);
        while (m_slots[hole].key != key) {
            if (m_slots[hole].key == nullptr) return nullptr;
            hole = (hole + 1) & m_mask;
        }
        Value const value = m_slots[hole].value;
        // Entries behind the hole move up unless that would put them before their home.
        for (std::size_t i = (hole + 1) & m_mask; m_slots[i].key != nullptr; i = (i + 1) & m_mask) {
            if (((i - home(m_slots[i].key)) & m_mask) < ((i - hole) & m_mask)) continue;
            m_slots[hole] = m_slots[i];
            hole = i;
        }
        m_slots[hole] = {};
        --m_size;
        return value;
    }

    /// Removes all entries. Needs no memory.
    void clear() {
        std::fill(m_slots.begin(), m_slots.end(), Slot());
        m_size = 0;
    }

    /// All entries, in no particular order.
    std::vector<std::pair<void const*, Value>> entries() const {
        std::vector<std::pair<void const*, Value>> all;
        all.reserve(m_size);
        for (Slot const& slot : m_slots)
            if (slot.key != nullptr) all.emplace_back(slot.key, slot.value);
        return all;
    }

  private:
    /// Large enough that the few entries that two threads add and remove seldom share a cache line.
    static constexpr std::size_t kSmallest = 1024;

    struct Slot {
        void const* key = nullptr;
        Value value = nullptr;
    };

    std::size_t home(void const* key) const {
        // Fibonacci hashing: the top bits of the product spread aligned addresses evenly.
        auto const address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(key));
        return static_cast<std::size_t>((address * 0x9E3779B97F4A7C15U) >> m_shift);
    }

    /// The slot that holds `key`, or the free slot where it belongs.
    std::size_t slotFor(void const* key) const {
        std::size_t i = home(key);
        while (m_slots[i].key != key && m_slots[i].key != nullptr)
            i = (i + 1) & m_mask;
        return i;
    }

    /// Replaces the array by an empty one of `capacity`, a power of two. Returns the former one.
    std::vector<Slot> resize(std::size_t capacity) {
        std::vector<Slot> slots(capacity); // first: when this fails, nothing has changed
        m_mask = capacity - 1;
        m_shift = 64 - std::countr_zero(capacity);
        return std::exchange(m_slots, std::move(slots));
    }

    void grow() {
        for (Slot const& slot : resize(2 * m_slots.size()))
            if (slot.key != nullptr) m_slots[slotFor(slot.key)] = slot;
    }

    std::size_t m_size = 0; ///< first, so that an owner's lock before it can share its cache line
    std::vector<Slot> m_slots;
    std::size_t m_mask = 0;
    int m_shift = 64;
};

} // namespace KVL
