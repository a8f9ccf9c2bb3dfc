// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StableIndices.h"

#include <algorithm>
#include <bit>
#include <chrono>
#include <utility>

namespace kvloamd {

namespace {

constexpr std::uint64_t kSmallestBlock = 16;

/// A quarter more than what is there, at least one.
std::uint64_t blockSize(std::uint64_t count) {
    return std::max(kSmallestBlock, std::bit_ceil(count + count / 4 + 1));
}

std::int64_t today() {
    using Days = std::chrono::duration<std::int64_t, std::ratio<86400>>;
    return std::chrono::duration_cast<Days>(std::chrono::system_clock::now().time_since_epoch())
        .count();
}

} // namespace

StableIndices::StableIndices(std::uint32_t base) : m_base(base), m_free(base) {
    m_retention.date = today;
    countDays();
}

StableIndices::StableIndices(StateFile& file, std::uint32_t base, Retention retention)
    : m_file(&file), m_base(base), m_retention(std::move(retention)), m_free(base) {
    if (!m_retention.date) m_retention.date = today;
    m_file->add(*this);
}

std::vector<std::uint32_t> StableIndices::indicesOf(BoardKey const& key,
                                                    std::span<IndexKey const> keys) {
    std::vector<std::uint32_t> indices(keys.size(), 0);
    if (!contentsKnown()) return indices;
    auto found = m_boards.find(key.name);
    if (found == m_boards.end()) {
        if (keys.empty()) return indices;
        found = m_boards.try_emplace(key.name).first;
        found->second.stable = key.stable;
    }
    Board& board = found->second;
    present(key.name, board);
    std::vector<std::size_t> missing;
    for (std::size_t i = 0; i < keys.size(); ++i) {
        auto const known = board.indices.find(keys[i]);
        if (known == board.indices.end())
            missing.push_back(i);
        else
            indices[i] = known->second;
    }
    if (missing.empty()) return indices;
    makeRoom(key.name, board, missing.size());
    auto block = board.blocks.begin();
    for (std::size_t const i : missing) {
        while (block != board.blocks.end() && block->next == block->end)
            ++block;
        if (block == board.blocks.end()) break;
        indices[i] = block->next++;
        board.indices.emplace(keys[i], indices[i]);
        if (!board.stable) continue;
        m_unsaved.entries.push_back({key.name, keys[i], indices[i]});
        m_changed = true;
    }
    return indices;
}

void StableIndices::present(std::string const& name, Board& board) {
    if (std::exchange(board.reading, m_reading) != m_reading) ++m_present;
    if (std::exchange(board.day, m_calendar.day) == m_calendar.day || !board.stable) return;
    m_unsaved.seen.push_back({name, m_calendar.day});
    m_changed = true;
}

void StableIndices::presentAgain() {
    for (auto& [name, board] : m_boards)
        if (board.reading + 1 == m_reading) present(name, board);
}

void StableIndices::makeRoom(std::string const& name, Board& board, std::size_t count) {
    std::uint64_t room = 0;
    for (Block const& block : board.blocks)
        room += block.end - block.next;
    if (room >= count) return;
    std::uint64_t const size = blockSize(count - room);
    if (m_free + size - 1 > kLastIndex) return;
    auto const first = static_cast<std::uint32_t>(m_free);
    board.blocks.push_back({first, first, static_cast<std::uint32_t>(m_free + size)});
    m_free += size;
    if (!board.stable) return;
    m_unsaved.blocks.push_back({name, first, static_cast<std::uint32_t>(size)});
    m_changed = true;
}

void StableIndices::skipTo(std::uint32_t first) {
    m_base = std::max(m_base, first);
    m_free = std::max(m_free, std::uint64_t{m_base});
}

bool StableIndices::isStable(std::uint32_t index) const {
    return std::ranges::any_of(m_boards, [&](auto const& entry) {
        return entry.second.stable &&
               std::ranges::any_of(entry.second.blocks, [&](Block const& block) {
                   return index >= block.first && index < block.next;
               });
    });
}

void StableIndices::save() {
    if (contentsKnown()) {
        forgetBoards();
        countDays();
    }
    ++m_reading;
    if (m_file == nullptr)
        written();
    else
        m_file->save();
}

void StableIndices::countDays() {
    std::int64_t const date = m_retention.date();
    if (date == m_calendar.date) return;
    m_calendar = {m_calendar.day + 1, date};
    m_changed = true;
}

void StableIndices::forgetBoards() {
    if (std::exchange(m_present, 0) == m_boards.size()) return;
    std::vector<Place> away;
    for (auto board = m_boards.begin(); board != m_boards.end();) {
        auto const here = board++;
        if (here->second.reading == m_reading) continue;
        if (!here->second.stable || m_calendar.day - here->second.day > m_retention.days)
            forget(here);
        else
            away.push_back(here);
    }
    if (away.size() <= m_retention.boards) return;
    std::ranges::sort(
        away, {}, [](Place board) { return std::pair(board->second.day, board->second.reading); });
    away.resize(away.size() - m_retention.boards);
    for (Place const board : away)
        forget(board);
}

void StableIndices::forget(Place board) {
    if (board->second.stable) {
        m_unsaved.forgotten.push_back(board->first);
        // What has not been written yet need not be.
        auto const& name = board->first;
        std::erase_if(m_unsaved.blocks, [&](auto const& block) { return block.board == name; });
        std::erase_if(m_unsaved.entries, [&](auto const& entry) { return entry.board == name; });
        std::erase_if(m_unsaved.seen, [&](auto const& seen) { return seen.board == name; });
        m_changed = true;
    }
    m_boards.erase(board);
}

void StableIndices::load(Database& database) {
    IndexRecords const records = readIndexTables(database);
    m_boards.clear();
    m_present = 0;
    m_unsaved = {};
    m_changed = false;
    m_free = m_base;
    m_calendar = records.calendar;
    countDays();
    for (IndexBlock const& block : records.blocks) {
        Board& board = m_boards[block.board];
        board.blocks.push_back({block.first, block.first, block.first + block.size});
        m_free = std::max(m_free, std::uint64_t{block.first} + block.size);
    }
    for (IndexEntry const& entry : records.entries) {
        Board& board = m_boards[entry.board];
        board.indices.emplace(entry.key, entry.index);
        for (Block& block : board.blocks)
            if (entry.index >= block.first && entry.index < block.end)
                block.next = std::max(block.next, entry.index + 1);
    }
    for (BoardSeen const& seen : records.seen)
        if (auto const board = m_boards.find(seen.board); board != m_boards.end())
            board->second.day = seen.day;
    // From before there were days: they count from now on.
    for (auto& [name, board] : m_boards) {
        if (board.day != kUnknownDay) continue;
        board.day = m_calendar.day;
        m_unsaved.seen.push_back({name, board.day});
        m_changed = true;
    }
}

void StableIndices::createTables(Database& database) {
    createIndexTables(database);
}

bool StableIndices::hasChanges() const {
    return m_changed;
}

void StableIndices::writeChanges(Database& database) {
    m_unsaved.calendar = m_calendar;
    if (m_changed) writeIndices(database, m_unsaved);
}

void StableIndices::writeAll(Database& database) {
    IndexRecords all;
    for (auto const& [name, board] : m_boards) {
        if (!board.stable) continue;
        for (Block const& block : board.blocks)
            all.blocks.push_back({name, block.first, block.end - block.first});
        for (auto const& [key, index] : board.indices)
            all.entries.push_back({name, key, index});
        all.seen.push_back({name, board.day});
    }
    all.calendar = m_calendar;
    deleteIndices(database);
    writeIndices(database, all);
}

void StableIndices::written() {
    m_unsaved = {};
    m_changed = false;
}

} // namespace kvloamd
