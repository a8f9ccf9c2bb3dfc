// SPDX-License-Identifier: BSD-2-Clause
// The list of listeners behind add-listener and notify-listeners operations.
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "core/Event.h"

/// A `ListenerTable` is a list of listeners in the order of addition, without duplicates. It does
/// not own them. Unsynchronised, except for `version()`: the table's owner guards it.
class KVLOAM_API ListenerTable {
  public:
    ListenerTable() = default;
    virtual ~ListenerTable();
    ListenerTable(ListenerTable const&) = delete;
    ListenerTable& operator=(ListenerTable const&) = delete;

    /// Appends `listener` unless the table has it already. Returns 0.
    virtual int AddListener(EventListener* listener);
    /// Returns 0, or 1 when `listener` is not in the table.
    virtual int RemoveListener(EventListener* listener);
    /// The first listener; null when the table is empty.
    virtual EventListener* GetFirstListener();
    /// The listener after `listener`; null when it is the last one or is not in the table. A
    /// listener that removes itself therefore ends a walk.
    virtual EventListener* GetNextListener(EventListener* listener);

    /// The number of changes so far. Thread-safe.
    std::uint32_t version() const { return m_version.load(std::memory_order_acquire); }

  private:
    std::vector<EventListener*> m_listeners;
    std::atomic<std::uint32_t> m_version{0};
};

/// Calls `call(listener)` for every listener, from first to last. The walk follows changes: a
/// listener that is added meanwhile is called too, and a listener that removes itself ends the
/// walk. `guard` may be null; otherwise it is locked while the table is read, and never during a
/// call.
template <class Listener, class Call>
void for_each_listener(ListenerTable& table, Object* guard, Call const& call) {
    // Read a few listeners at a time; they stay valid as long as the table does not change.
    std::array<EventListener*, 8> ahead;
    std::size_t count = 0;
    std::uint32_t version = 0;
    auto const readAfter = [&](EventListener* last) {
        version = table.version();
        count = 0;
        EventListener* next =
            last == nullptr ? table.GetFirstListener() : table.GetNextListener(last);
        while (next != nullptr && count < ahead.size()) {
            ahead[count++] = next;
            next = table.GetNextListener(next);
        }
    };
    auto const readGuarded = [&](EventListener* last) {
        if (guard == nullptr) return readAfter(last);
        ObjectGuard const held(*guard);
        readAfter(last);
    };
    readGuarded(nullptr);
    for (std::size_t i = 0; i < count;) {
        EventListener* const listener = ahead[i++];
        call(static_cast<Listener*>(listener));
        if (i == ahead.size() || table.version() != version) {
            readGuarded(listener);
            i = 0;
        }
    }
}
