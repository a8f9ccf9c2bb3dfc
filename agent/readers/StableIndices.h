// SPDX-License-Identifier: BSD-2-Clause
// Indices that interfaces and physical entities keep.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <span>
#include <string>
#include <vector>

#include "agent/readers/BoardKeys.h"
#include "agent/readers/IndexTables.h"
#include "agent/readers/StateFile.h"
#include "agent/rows/IndexKey.h"

namespace kvloamd {

/// How long indices are kept for a board that is away.
struct Retention {
    std::int64_t days = 400; ///< on which the agent runs
    std::size_t boards =
        16384; ///< that are away; more than these: those that went first are forgotten
    std::function<std::int64_t()> date =
        {}; ///< today, in days since the epoch; empty: by the clock
};

/// A `StableIndices` gives indices to the things of boards. A thing is identified by its board's
/// key, its kind and its name. It keeps its index while its board is away, and across restarts as
/// far as the file can be used, until the board has been away for too long.
///
/// The things that a board has when it first appears get neighbouring indices, in a block whose
/// size is a power of two, with room for some more. A board that outgrows its blocks gets another.
/// Unsynchronised.
class StableIndices final : private StatePart {
  public:
    /// `base`: the lowest index for a board that has none yet; above 0. Nothing is kept.
    explicit StableIndices(std::uint32_t base);
    /// Kept in `file`, which outlives the indices.
    StableIndices(StateFile& file, std::uint32_t base, Retention retention = {});
    StableIndices(StableIndices const&) = delete;
    StableIndices& operator=(StableIndices const&) = delete;

    /// The indices of a board's things, in the order of `keys`, which are all different. 0 where
    /// no index is left, and where the thing is not known yet because the file is locked.
    std::vector<std::uint32_t> indicesOf(BoardKey const& key, std::span<IndexKey const> keys);
    /// The boards that the last reading has asked for are present in this one as well. Before
    /// anything else in a reading.
    void presentAgain();
    /// Writes what is new since the last call, after every reading of all boards.
    void save();

    /// False while nothing can be said about indices because the file is locked.
    bool areKnown() const { return contentsKnown(); }
    /// From now on gives no index below `first` to a board that has no block with room.
    void skipTo(std::uint32_t first);
    /// Whether `index` belongs to something that is identified across restarts.
    bool isStable(std::uint32_t index) const;

  private:
    /// Indices from `first` to `end - 1`, of which those from `next` on are free.
    struct Block {
        std::uint32_t first;
        std::uint32_t next;
        std::uint32_t end;
    };
    static constexpr std::int64_t kUnknownDay = -1;
    struct Board {
        std::map<IndexKey, std::uint32_t> indices;
        std::vector<Block> blocks;
        bool stable = true;
        std::int64_t day = kUnknownDay; ///< the agent's day on which it was present last
        std::uint64_t reading = 0;      ///< the reading that asked for it last
    };
    using Place = std::map<std::string, Board>::iterator;

    void load(Database& database) override;
    void createTables(Database& database) override;
    bool hasChanges() const override;
    void writeChanges(Database& database) override;
    void writeAll(Database& database) override;
    void written() override;

    bool contentsKnown() const { return m_file == nullptr || m_file->contentsKnown(); }
    void countDays();
    void present(std::string const& name, Board& board);
    /// Makes room for `count` more indices, unless there are none left.
    void makeRoom(std::string const& name, Board& board, std::size_t count);
    void forgetBoards();
    void forget(Place board);

    StateFile* m_file = nullptr; ///< null: nothing is kept
    std::uint32_t m_base;
    Retention m_retention;
    std::uint64_t m_free;                  ///< the first index of the next block
    std::map<std::string, Board> m_boards; ///< by key
    Calendar m_calendar;
    std::uint64_t m_reading = 1;
    std::size_t m_present = 0; ///< boards in this reading
    IndexRecords m_unsaved;
    bool m_changed = false; ///< `m_unsaved` has something
};

} // namespace kvloamd
