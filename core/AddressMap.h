// SPDX-License-Identifier: BSD-2-Clause
// A hash map from object addresses, in one flat array.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace KVL {

/// Maps addresses to `Value`s, which are pointers. The reference table is searched for every handle
/// made from a plain pointer; linear probing in one array finds an entry in a cache line or two.
/// Not synchronised. The null address is never a key.
template <class Value>
class AddressMap {
  public:
    std::size_t size() const { return m_size; }

    /// The value at `key`, or null.
    Value find(void const* key) const {
        if (m_slots.empty()) return nullptr;
        for (std::size_t i = home(key);; i = next(i)) {
            if (m_slots[i].first == key) return m_slots[i].second;
            if (m_slots[i].first == nullptr) return nullptr;
        }
    }

    /// The value at `key`; when there is none, what `make()` returns, which is put there.
    template <class Make>
    Value find_or_insert(void const* key, Make const& make) {
        if (2 * (m_size + 1) > m_slots.size()) [[unlikely]]
            grow();
        std::size_t i = home(key);
        while (m_slots[i].first != nullptr) {
            if (m_slots[i].first == key) return m_slots[i].second;
            i = next(i);
        }
        m_slots[i] = {key, make()};
        ++m_size;
        return m_slots[i].second;
    }

    /// Takes `key` out and returns its value; null when it is not in the map.
    Value erase(void const* key) {
        if (m_slots.empty()) return nullptr;
        std::size_t hole = home(key);
        while (m_slots[hole].first != key) {
            if (m_slots[hole].first == nullptr) return nullptr;
            hole = next(hole);
        }
        Value const value = m_slots[hole].second;
        // Entries behind the hole move up unless that would put them before their home.
        for (std::size_t i = next(hole); m_slots[i].first != nullptr; i = next(i)) {
            std::size_t const mask = m_slots.size() - 1;
            if (((i - home(m_slots[i].first)) & mask) >= ((i - hole) & mask)) {
                m_slots[hole] = m_slots[i];
                hole = i;
            }
        }
        m_slots[hole] = {nullptr, nullptr};
        --m_size;
        return value;
    }

    void clear() {
        m_slots.clear();
        m_size = 0;
    }

    /// All entries, in no order.
    std::vector<std::pair<void const*, Value>> entries() const {
        std::vector<std::pair<void const*, Value>> all;
        all.reserve(m_size);
        for (auto const& slot : m_slots)
            if (slot.first != nullptr) all.push_back(slot);
        return all;
    }

  private:
    std::size_t home(void const* key) const {
        // Fibonacci hashing: the top bits of the product spread aligned addresses evenly.
        auto const address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(key));
        return static_cast<std::size_t>((address * 0x9E3779B97F4A7C15U) >> m_shift);
    }
    std::size_t next(std::size_t i) const { return (i + 1) & (m_slots.size() - 1); }

    void place(void const* key, Value value) {
        std::size_t i = home(key);
        while (m_slots[i].first != nullptr)
            i = next(i);
        m_slots[i] = {key, value};
    }

    void grow() {
        std::size_t const capacity = m_slots.empty() ? 64 : 2 * m_slots.size();
        auto const old =
            std::exchange(m_slots, std::vector<std::pair<void const*, Value>>(capacity));
        m_shift = 64 - std::countr_zero(capacity);
        for (auto const& slot : old)
            if (slot.first != nullptr) place(slot.first, slot.second);
    }

    std::vector<std::pair<void const*, Value>> m_slots;
    std::size_t m_size = 0;
    int m_shift = 64;
};

} // namespace KVL
