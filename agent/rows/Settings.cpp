// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/Settings.h"

namespace kvloamd {

namespace {

std::optional<SettingValue> valueIn(std::map<SettingKey, SettingValue> const& values,
                                    SettingKey key) {
    auto const found = values.find(key);
    return found == values.end() ? std::nullopt : std::optional(found->second);
}

/// The value as a `Type`, if it is one.
template <class Type>
std::optional<Type> as(std::optional<SettingValue> const& value) {
    auto const* const held = value ? std::get_if<Type>(&*value) : nullptr;
    return held == nullptr ? std::nullopt : std::optional(*held);
}

} // namespace

std::optional<SettingValue> Settings::value(SettingKey key) const {
    std::scoped_lock const guard(m_mutex);
    return valueIn(m_values, key);
}

std::optional<int> Settings::find(SettingKey key) const {
    return as<int>(value(key));
}

std::optional<std::string> Settings::findText(SettingKey key) const {
    return as<std::string>(value(key));
}

std::optional<SettingValue> Settings::exchange(SettingKey key, std::optional<SettingValue> value) {
    std::scoped_lock const guard(m_mutex);
    std::optional<SettingValue> former = valueIn(m_values, key);
    if (value)
        m_values.insert_or_assign(key, *std::move(value));
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

std::vector<SettingEntry> Settings::all(SettingIndex kind) const {
    std::scoped_lock const guard(m_mutex);
    std::vector<SettingEntry> entries;
    for (auto const& [key, value] : m_values)
        if (indexOf(key.setting) == kind) entries.push_back({key, value});
    return entries;
}

bool Settings::hasUnsaved() const {
    std::scoped_lock const guard(m_mutex);
    return !m_unsaved.empty();
}

std::vector<SettingEntry> Settings::takeUnsaved(SettingIndex kind) {
    std::scoped_lock const guard(m_mutex);
    std::vector<SettingEntry> entries;
    std::erase_if(m_unsaved, [&](SettingKey const& key) {
        if (indexOf(key.setting) != kind) return false;
        entries.push_back({key, valueIn(m_values, key)});
        return true;
    });
    return entries;
}

} // namespace kvloamd
