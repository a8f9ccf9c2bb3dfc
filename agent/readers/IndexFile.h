// SPDX-License-Identifier: BSD-2-Clause
// The file that remembers which thing of a board has which index, and what is set for it.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "agent/rows/IndexKey.h"
#include "agent/rows/Settings.h"

struct sqlite3;

namespace kvloamd {

/// Indices that belong to one board: `first` to `first + size - 1`.
struct IndexBlock {
    std::string serialNumber;
    std::uint32_t first = 0;
    std::uint32_t size = 0;
};

struct IndexEntry {
    std::string serialNumber;
    IndexKey key;
    std::uint32_t index = 0;
};

/// Every entry lies in a block of its board, blocks do not overlap.
struct IndexRecords {
    std::vector<IndexBlock> blocks;
    std::vector<IndexEntry> entries;
    std::vector<SettingEntry> settings;
};

/// No index is above this.
inline constexpr std::uint32_t kLastIndex = 0x7fffffff;

/// Open, and this process's alone, while it lives. A file that is damaged, or another program's, is
/// renamed to `<name>.damaged-<date>` and begun anew. When the file can not be used, nothing is
/// kept. Either is logged once. Not synchronised.
class IndexFile {
  public:
    /// An empty `path`: nothing is kept, and nothing is said. `things`: what is numbered, for the
    /// log: "interfaces".
    IndexFile(std::string path, std::string things);

    /// What the file held when it was opened.
    IndexRecords const& records() const { return m_records; }
    /// Adds all of `records`, settings in the place of those of their keys; or, if that fails,
    /// nothing from now on.
    void add(IndexRecords const& records);

  private:
    struct Close {
        void operator()(sqlite3* database) const;
    };

    void open();
    void checkContents();
    void readContents();
    void setAside(std::string const& why);
    void giveUp(std::string const& why);

    std::string m_path;
    std::string m_things;
    IndexRecords m_records;
    std::unique_ptr<sqlite3, Close> m_database; ///< null: nothing is kept
};

} // namespace kvloamd
