// SPDX-License-Identifier: BSD-2-Clause
// Gives every interface, or every physical entity, an index that it keeps.
#pragma once

#include <cstdint>
#include <map>
#include <span>
#include <string>
#include <vector>

#include "agent/readers/IndexFile.h"
#include "agent/rows/IndexKey.h"

namespace kvloamd {

/// A thing is known by its board's serial number, its kind and its name; what belongs to no board,
/// by an empty serial number. It keeps its index while its board is away, and across restarts as
/// far as the file can be used.
///
/// The things that a board has when it first comes get neighbouring indices, in a block whose
/// size is a power of two, with room for some more; a board that outgrows its blocks gets another.
/// Not synchronised.
class StableIndices {
  public:
    /// `file`: where indices are kept; empty: nowhere. `base`: the lowest index that is given to
    /// whatever has none yet, above 0. `things`: what is numbered, for the log.
    StableIndices(std::string file, std::uint32_t base, std::string things);

    /// The indices of a board's things, in the order of `keys`, which are all different. 0 where
    /// there is no index left.
    std::vector<std::uint32_t> indicesOf(std::string const& serialNumber,
                                         std::span<IndexKey const> keys);
    /// Writes what has been given since the last time to the file, in one piece.
    void save();

    /// What the file held of settings, when it was opened.
    std::vector<SettingEntry> const& settings() const { return m_file.records().settings; }
    /// Writes changes of settings to the file.
    void save(std::vector<SettingEntry> settings);

  private:
    /// What is free in a block: `next` to `end - 1`.
    struct Room {
        std::uint32_t next;
        std::uint32_t end;
    };
    struct Board {
        std::map<IndexKey, std::uint32_t> indices;
        std::vector<Room> rooms;
    };

    void load(IndexRecords const& records);
    /// Makes room for `count` more indices, unless there are none left.
    void makeRoom(std::string const& serialNumber, Board& board, std::size_t count);

    IndexFile m_file;
    std::uint64_t m_free;                  ///< the first index of the next block
    std::map<std::string, Board> m_boards; ///< by serial number
    IndexRecords m_unsaved;
};

} // namespace kvloamd
