// SPDX-License-Identifier: BSD-2-Clause
// The listeners behind every pair of add-listener and notify-listeners operations.
#pragma once

#include <vector>

#include "core/Event.h"

/// Listeners in the order of addition, each once. They are not owned. Not synchronised: the table's
/// owner guards it.
class KVLOAM_API ListenerTable {
  public:
    ListenerTable() = default;
    virtual ~ListenerTable();
    ListenerTable(ListenerTable const&) = delete;
    ListenerTable& operator=(ListenerTable const&) = delete;

    /// Appends `listener` unless it is in the table already. Returns 0.
    virtual int AddListener(EventListener* listener);
    /// Returns 0, or 1 when `listener` is not in the table.
    virtual int RemoveListener(EventListener* listener);
    /// Null for an empty table.
    virtual EventListener* GetFirstListener();
    /// Null when `listener` is the last one or is not in the table, so that a listener that removes
    /// itself ends a walk.
    virtual EventListener* GetNextListener(EventListener* listener);

  private:
    std::vector<EventListener*> m_listeners;
};

/// Calls `call(listener)` for every listener, from first to last. The walk is live: a listener
/// added meanwhile is called too. `guard`, where there is one, is locked for each step of the walk,
/// never during a call.
template <class Listener, class Call>
void for_each_listener(ListenerTable& table, Object* guard, Call const& call) {
    auto const step = [&](EventListener* last) {
        if (guard != nullptr) guard->lock();
        EventListener* const next =
            last == nullptr ? table.GetFirstListener() : table.GetNextListener(last);
        if (guard != nullptr) guard->unlock();
        return next;
    };
    for (EventListener* listener = step(nullptr); listener != nullptr; listener = step(listener))
        call(static_cast<Listener*>(listener));
}
