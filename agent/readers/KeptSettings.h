// SPDX-License-Identifier: BSD-2-Clause
// Loads saved settings and persists changes.
#pragma once

#include <map>
#include <optional>

#include "agent/readers/StableIndices.h"
#include "agent/readers/StateFile.h"
#include "agent/rows/Settings.h"

namespace kvloamd {

/// A `KeptSettings` keeps operators' settings of one kind in the file of the indices that they
/// belong to.
///
/// A setting of something that cannot be identified after a restart is not saved, because another
/// board might have its index then. Settings whose index has been forgotten are deleted when the
/// file is read. Bound to the collector's thread once the file is open.
class KeptSettings final : private StatePart {
  public:
    /// Adds itself to `file`. All arguments outlive it. `kind`: what `indices` are.
    KeptSettings(StateFile& file, StableIndices const& indices, Settings& settings,
                 SettingIndex kind = SettingIndex::Interface);
    /// Saves.
    ~KeptSettings();
    KeptSettings(KeptSettings const&) = delete;
    KeptSettings& operator=(KeptSettings const&) = delete;

    /// Writes what has been set since the last call, and what could not be written then.
    void save();

  private:
    void load(Database& database) override;
    void createTables(Database& database) override;
    bool hasChanges() const override;
    void writeChanges(Database& database) override;
    void writeAll(Database& database) override;
    void written() override;
    void write(Database& database, SettingEntry const& entry) const;

    StateFile& m_file;
    StableIndices const& m_indices;
    Settings& m_settings;
    SettingIndex m_kind;
    std::map<SettingKey, std::optional<SettingValue>> m_unsaved;
};

} // namespace kvloamd
