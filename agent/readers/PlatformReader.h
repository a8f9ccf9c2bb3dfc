// SPDX-License-Identifier: BSD-2-Clause
// Reads what the platform keeps about the boards.
#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "agent/rows/BoardRow.h"
#include "agent/rows/PlatformRecords.h"
#include "agent/rows/Rows.h"

namespace kvloamd {

/// A `PlatformReader` reads the platform's records of the boards: those of a new board at once, all
/// of them when the last such reading is old. A board is found by its serial number.
///
/// While the device mapper does not answer, what it answered last stays; while the attribute store
/// cannot be read, there are no records of it. The log says when either begins and when it ends,
/// and when the store has a record of none of the boards. On a host without an attribute store, it
/// is no fault that there is none.
///
/// Thread-bound: the collector, which alone uses the attribute store.
class PlatformReader {
  public:
    /// The age at which all is read anew.
    static constexpr std::chrono::milliseconds kMaxAge{10000};

    /// `hasStore`: whether the host has an attribute store.
    explicit PlatformReader(std::chrono::milliseconds maxAge = kMaxAge, bool hasStore = true)
        : m_maxAge(maxAge), m_hasStore(hasStore) {}

    /// The records of `boards`, which are ascending by index.
    std::shared_ptr<PlatformRecords const> read(Rows<BoardRow> const& boards);

    // Whether it worked when it was read last. A store that the host does not have works.
    bool mapperAnswers() const { return m_mapperAnswers; }
    bool storeIsReadable() const { return m_storeReadable; }

  private:
    struct BoardRecords {
        std::string serialNumber;
        DeviceRows objects;
        std::optional<StoreRow> store;
    };
    using Wanted = std::vector<BoardRow const*>;

    /// Whether anything has been taken out.
    bool dropGoneBoards(Rows<BoardRow> const& boards);
    void readObjects(Wanted const& wanted);
    void readStore(Wanted const& wanted);
    std::shared_ptr<PlatformRecords const> joined() const;

    std::chrono::milliseconds m_maxAge;
    bool m_hasStore;
    std::optional<std::chrono::steady_clock::time_point> m_allRead; ///< when
    Rows<BoardRow> m_boardRows;                                     ///< of the last reading
    std::map<std::uint32_t, BoardRecords> m_boards;                 ///< by board index
    std::shared_ptr<PlatformRecords const> m_records = std::make_shared<PlatformRecords>();
    bool m_mapperAnswers = true;
    bool m_storeReadable = true;
    bool m_storeHasBoards = true;
};

} // namespace kvloamd
