// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/KeptSettings.h"

namespace kvloamd {

namespace {

/// The column `ifIndex` has the index of whatever the file is about. A number is an INTEGER, a text
/// is a BLOB, because SQLite would store a text of digits as a number.
constexpr char kSchema[] = "CREATE TABLE IF NOT EXISTS setting ("
                           " ifIndex INTEGER NOT NULL,"
                           " setting INTEGER NOT NULL,"
                           " value INTEGER NOT NULL,"
                           " PRIMARY KEY (ifIndex, setting)) WITHOUT ROWID;";

SettingValue valueOf(Statement const& row, int column) {
    if (row.isBlob(column)) return row.blob(column);
    return static_cast<int>(row.number(column));
}

} // namespace

KeptSettings::KeptSettings(StateFile& file, StableIndices const& indices, Settings& settings,
                           SettingIndex kind)
    : m_file(file), m_indices(indices), m_settings(settings), m_kind(kind) {
    m_file.add(*this);
}

KeptSettings::~KeptSettings() {
    save();
}

void KeptSettings::save() {
    for (SettingEntry const& entry : m_settings.takeUnsaved(m_kind))
        m_unsaved.insert_or_assign(entry.key, entry.value);
    m_file.save();
}

void KeptSettings::load(Database& database) {
    m_unsaved.clear();
    if (database.number("SELECT count(*) FROM sqlite_master WHERE name = 'setting'") == 0) return;
    Statement settings(database, "SELECT setting, ifIndex, value FROM setting");
    std::vector<SettingEntry> entries;
    while (settings.step()) {
        SettingKey const key{static_cast<Setting>(settings.number(0)),
                             static_cast<std::uint32_t>(settings.number(1))};
        if (m_indices.isStable(key.index))
            entries.push_back({key, valueOf(settings, 2)});
        else
            m_unsaved.emplace(key, std::nullopt);
    }
    m_settings.load(entries);
}

void KeptSettings::createTables(Database& database) {
    database.execute(kSchema);
}

bool KeptSettings::hasChanges() const {
    return !m_unsaved.empty();
}

void KeptSettings::writeChanges(Database& database) {
    for (auto const& [key, value] : m_unsaved)
        write(database, {key, value});
}

void KeptSettings::writeAll(Database& database) {
    database.execute("DELETE FROM setting");
    for (SettingEntry const& entry : m_settings.all(m_kind))
        write(database, entry);
}

void KeptSettings::write(Database& database, SettingEntry const& entry) const {
    if (!entry.value || !m_indices.isStable(entry.key.index)) {
        Statement(database, "DELETE FROM setting WHERE ifIndex = ? AND setting = ?")
            .bind(1, entry.key.index)
            .bind(2, static_cast<std::int64_t>(entry.key.setting))
            .run();
        return;
    }
    Statement insert(database,
                     "INSERT OR REPLACE INTO setting (ifIndex, setting, value) VALUES (?, ?, ?)");
    insert.bind(1, entry.key.index).bind(2, static_cast<std::int64_t>(entry.key.setting));
    if (auto const* const text = std::get_if<std::string>(&*entry.value))
        insert.bindBlob(3, *text);
    else
        insert.bind(3, std::get<int>(*entry.value));
    insert.run();
}

void KeptSettings::written() {
    m_unsaved.clear();
}

} // namespace kvloamd
