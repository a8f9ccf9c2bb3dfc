// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/PlatformReader.h"

#include <algorithm>

#include "agent/log/Log.h"
#include "agent/readers/BoardFinder.h"
#include "agent/readers/Courtesy.h"
#include "agent/readers/DeviceReader.h"
#include "agent/readers/StoreReader.h"

namespace kvloamd {

namespace {

/// Keeps in `state` whether something works, and logs when that changes.
void note(bool& state, bool works, char const* fault, char const* recovery) {
    if (state == works) return;
    state = works;
    if (works)
        log(LogLevel::Info, recovery);
    else
        log(LogLevel::Warning, fault);
}

template <class Row>
void append(std::vector<Row>& all, std::vector<Row> const& rows) {
    all.insert(all.end(), rows.begin(), rows.end());
}

} // namespace

std::shared_ptr<PlatformRecords const> PlatformReader::read(Rows<BoardRow> const& boards) {
    auto const now = std::chrono::steady_clock::now();
    bool const all = !m_allRead || now - *m_allRead >= m_maxAge;
    if (!all && boards.shares(m_boardRows)) return m_records;
    m_boardRows = boards;
    bool const dropped = dropGoneBoards(boards);
    Wanted wanted;
    for (BoardRow const& board : boards)
        if (all || !m_boards.contains(board.boardIndex)) wanted.push_back(&board);
    if (!all && !dropped && wanted.empty()) return m_records;
    if (all) m_allRead = now;
    for (BoardRow const* const board : wanted)
        m_boards[board->boardIndex].serialNumber = board->serialNumber;
    if (!wanted.empty()) {
        readObjects(wanted);
        readStore(wanted);
    }
    m_records = joined();
    return m_records;
}

bool PlatformReader::dropGoneBoards(Rows<BoardRow> const& boards) {
    // A board with another serial number is another board.
    return std::erase_if(m_boards, [&](auto const& kept) {
               auto const row =
                   std::ranges::lower_bound(boards, kept.first, {}, &BoardRow::boardIndex);
               return row == boards.end() || row->boardIndex != kept.first ||
                      row->serialNumber != kept.second.serialNumber;
           }) > 0;
}

void PlatformReader::readObjects(Wanted const& wanted) {
    BoardFinder const finder;
    note(m_mapperAnswers, finder.good(),
         "the device mapper does not list its boards; the tables of devices stay as they are",
         "the device mapper lists its boards again");
    if (!finder.good()) return;
    for (BoardRow const* const board : wanted) {
        auto const handle = finder.find(board->serialNumber);
        m_boards[board->boardIndex].objects =
            handle ? readDevices(*handle, board->boardIndex) : DeviceRows{};
        yieldBetweenBoards();
    }
}

void PlatformReader::readStore(Wanted const& wanted) {
    StoreReading store;
    bool const readable = store.good();
    if (m_hasStore)
        note(m_storeReadable, readable,
             "the attribute store cannot be read, or has no family of boards; its table stays "
             "empty (see VQRXCFGPATH)",
             "the attribute store can be read again");
    if (!readable) {
        for (auto& [index, records] : m_boards)
            records.store.reset();
        return;
    }
    for (BoardRow const* const board : wanted)
        m_boards[board->boardIndex].store = store.read(board->serialNumber, board->boardIndex);
    note(m_storeHasBoards,
         std::ranges::any_of(m_boards,
                             [](auto const& board) { return board.second.store.has_value(); }),
         "the attribute store has a record of none of the boards, so its table is empty; it may "
         "be the store of another chassis (see VQRXCFGPATH)",
         "the attribute store has records of the boards");
}

std::shared_ptr<PlatformRecords const> PlatformReader::joined() const {
    auto records = std::make_shared<PlatformRecords>();
    for (auto const& [index, board] : m_boards) {
        append(records->devices, board.objects.devices);
        append(records->subDevices, board.objects.subDevices);
        append(records->processors, board.objects.processors);
        if (board.store) records->store.push_back(*board.store);
    }
    return records;
}

} // namespace kvloamd
