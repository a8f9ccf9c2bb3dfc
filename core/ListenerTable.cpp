// SPDX-License-Identifier: BSD-2-Clause
#include "core/ListenerTable.h"

#include <algorithm>

ListenerTable::~ListenerTable() = default;

int ListenerTable::AddListener(EventListener* listener) {
    if (std::find(m_listeners.begin(), m_listeners.end(), listener) != m_listeners.end()) return 0;
    m_listeners.push_back(listener);
    m_version.fetch_add(1, std::memory_order_release);
    return 0;
}

int ListenerTable::RemoveListener(EventListener* listener) {
    auto const found = std::find(m_listeners.begin(), m_listeners.end(), listener);
    if (found == m_listeners.end()) return 1;
    m_listeners.erase(found);
    m_version.fetch_add(1, std::memory_order_release);
    return 0;
}

EventListener* ListenerTable::GetFirstListener() {
    return m_listeners.empty() ? nullptr : m_listeners.front();
}

EventListener* ListenerTable::GetNextListener(EventListener* listener) {
    auto const found = std::find(m_listeners.begin(), m_listeners.end(), listener);
    if (found == m_listeners.end() || found + 1 == m_listeners.end()) return nullptr;
    return *(found + 1);
}
