// SPDX-License-Identifier: BSD-2-Clause
// What operators have set.
#pragma once

#include <compare>
#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <variant>
#include <vector>

namespace kvloamd {

/// The numbers are in the files of the indices: they stay. Those of physical entities begin at
/// 1000.
enum class Setting : int {
    LineStatusChangeTraps = 1, ///< of a line: 1 enabled, 2 disabled
    LinkUpDownTraps = 2,       ///< of an interface: the same
    InterfaceAlias = 3,        ///< of an interface: a text
    CircuitIdentifier = 10,    ///< of a line: a text
    CallInformationTraps = 11, ///< of a signalling channel: 1 enabled, 2 disabled
    FirstThreshold = 20,       ///< of a line: a limit; with those that follow, see ThresholdRow.h
    EntityAlias = 1000,        ///< of a physical entity: a text, as the next two
    EntityAssetId = 1001,
    EntityUris = 1002
};

/// What the index of a setting's row is. Each kind has a file of its own.
enum class SettingIndex { Interface, Entity };

inline SettingIndex indexOf(Setting setting) {
    return setting < Setting::EntityAlias ? SettingIndex::Interface : SettingIndex::Entity;
}

using SettingValue = std::variant<int, std::string>;

/// A setting of the row whose index begins with `index`, an ifIndex or an entPhysicalIndex.
struct SettingKey {
    Setting setting;
    std::uint32_t index;

    auto operator<=>(SettingKey const&) const = default;
};

/// Without a value, the setting is deleted.
struct SettingEntry {
    SettingKey key;
    std::optional<SettingValue> value;

    bool operator==(SettingEntry const&) const = default;
};

/// A `Settings` holds what operators have set. A value takes effect at once and overrides the rows
/// of the snapshot. Thread-safe.
class Settings {
  public:
    /// Nothing when it has not been set.
    std::optional<SettingValue> value(SettingKey key) const;
    /// The same for a setting that is a number.
    std::optional<int> find(SettingKey key) const;
    /// The same for a setting that is a text.
    std::optional<std::string> findText(SettingKey key) const;
    /// Sets it, or forgets it. Returns what was set before, with which the same call undoes this
    /// one.
    std::optional<SettingValue> exchange(SettingKey key, std::optional<SettingValue> value);

    /// Enters what was kept.
    void load(std::vector<SettingEntry> const& entries);
    /// Everything of this kind that is set, ascending by key.
    std::vector<SettingEntry> all(SettingIndex kind = SettingIndex::Interface) const;
    bool hasUnsaved() const;
    /// What of this kind has been set or forgotten since the last time, ascending by key.
    std::vector<SettingEntry> takeUnsaved(SettingIndex kind = SettingIndex::Interface);

  private:
    mutable std::mutex m_mutex; ///< guards what follows
    std::map<SettingKey, SettingValue> m_values;
    std::set<SettingKey> m_unsaved;
};

} // namespace kvloamd
