// SPDX-License-Identifier: BSD-2-Clause
// What operators have set.
#pragma once

#include <compare>
#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <vector>

namespace kvloamd {

/// The numbers are in the file of interface indices: they stay.
enum class Setting : int {
    LineStatusChangeTraps = 1, ///< of a line: 1 enabled, 2 disabled
    LinkUpDownTraps = 2        ///< of an interface: the same
};

/// A setting of the row whose index begins with `index`, an ifIndex.
struct SettingKey {
    Setting setting;
    std::uint32_t index;

    auto operator<=>(SettingKey const&) const = default;
};

/// Without a value, the setting is deleted.
struct SettingEntry {
    SettingKey key;
    std::optional<int> value;

    bool operator==(SettingEntry const&) const = default;
};

/// A `Settings` holds what operators have set. A value takes effect at once and overrides the rows
/// of the snapshot. Thread-safe.
class Settings {
  public:
    /// Nothing when it has not been set.
    std::optional<int> find(SettingKey key) const;
    /// Sets it, or forgets it. Returns what was set before, with which the same call undoes this
    /// one.
    std::optional<int> exchange(SettingKey key, std::optional<int> value);

    /// Enters what was kept.
    void load(std::vector<SettingEntry> const& entries);
    /// Everything that is set, ascending by key.
    std::vector<SettingEntry> all() const;
    bool hasUnsaved() const;
    /// What has been set or forgotten since the last time, ascending by key.
    std::vector<SettingEntry> takeUnsaved();

  private:
    mutable std::mutex m_mutex; ///< guards what follows
    std::map<SettingKey, int> m_values;
    std::set<SettingKey> m_unsaved;
};

} // namespace kvloamd
