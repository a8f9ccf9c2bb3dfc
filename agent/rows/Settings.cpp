// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/Settings.h"

namespace kvloamd {

namespace {

std::optional<int> valueIn(std::map<SettingKey, int> const& values, SettingKey key) {
    auto const found = values.find(key);
    return found == values.end() ? std::nullopt : std::optional(found->second);
}

} // namespace

std::optional<int> Settings::find(SettingKey key) const {
    std::scoped_lock const guard(m_mutex);
    return valueIn(m_values, key);
}

std::optional<int> Settings::exchange(SettingKey key, std::optional<int> value) {
    std::scoped_lock const guard(m_mutex);
    std::optional<int> const former = valueIn(m_values, key);
    if (value)
        m_values.insert_or_assign(key, *value);
    else
        m_values.erase(key);
    m_unsaved.insert(key);
    return former;
}

void Settings::load(std::vector<SettingEntry> const& entries) {
    std::scoped_lock const guard(m_mutex);
    for (SettingEntry const& entry : entries)
        if (entry.value) m_values.insert_or_assign(entry.key, *entry.value);
}

std::vector<SettingEntry> Settings::all() const {
    std::scoped_lock const guard(m_mutex);
    std::vector<SettingEntry> entries;
    for (auto const& [key, value] : m_values)
        entries.push_back({key, value});
    return entries;
}

bool Settings::hasUnsaved() const {
    std::scoped_lock const guard(m_mutex);
    return !m_unsaved.empty();
}

std::vector<SettingEntry> Settings::takeUnsaved() {
    std::scoped_lock const guard(m_mutex);
    std::vector<SettingEntry> entries;
    for (SettingKey const& key : m_unsaved)
        entries.push_back({key, valueIn(m_values, key)});
    m_unsaved.clear();
    return entries;
}

} // namespace kvloamd
