// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StableIndices.h"

#include "agent/rows/IndexKey.h"

#include <algorithm>
#include <bit>
#include <utility>

namespace kvloamd {

namespace {

constexpr std::uint64_t kSmallestBlock = 16;

/// A quarter more than what is there, at least one.
std::uint64_t blockSize(std::uint64_t count) {
    return std::max(kSmallestBlock, std::bit_ceil(count + count / 4 + 1));
}

} // namespace

StableIndices::StableIndices(std::string file, std::uint32_t base, std::string things)
    : m_file(std::move(file), std::move(things)), m_free(base) {
    load(m_file.records());
}

void StableIndices::load(IndexRecords const& records) {
    for (IndexBlock const& block : records.blocks) {
        m_boards[block.serialNumber].rooms.push_back({block.first, block.first + block.size});
        m_free = std::max(m_free, std::uint64_t{block.first} + block.size);
    }
    for (IndexEntry const& entry : records.entries) {
        Board& board = m_boards[entry.serialNumber];
        board.indices.emplace(entry.key, entry.index);
        for (Room& room : board.rooms)
            if (entry.index >= room.next && entry.index < room.end) room.next = entry.index + 1;
    }
}

std::vector<std::uint32_t> StableIndices::indicesOf(std::string const& serialNumber,
                                                    std::span<IndexKey const> keys) {
    if (keys.empty()) return {};
    Board& board = m_boards[serialNumber];
    std::vector<std::uint32_t> indices(keys.size(), 0);
    std::vector<std::size_t> missing;
    for (std::size_t i = 0; i < keys.size(); ++i) {
        auto const known = board.indices.find(keys[i]);
        if (known == board.indices.end())
            missing.push_back(i);
        else
            indices[i] = known->second;
    }
    if (missing.empty()) return indices;
    makeRoom(serialNumber, board, missing.size());
    auto room = board.rooms.begin();
    for (std::size_t const i : missing) {
        while (room != board.rooms.end() && room->next == room->end)
            ++room;
        if (room == board.rooms.end()) break;
        indices[i] = room->next++;
        board.indices.emplace(keys[i], indices[i]);
        m_unsaved.entries.push_back({serialNumber, keys[i], indices[i]});
    }
    return indices;
}

void StableIndices::save() {
    if (m_unsaved.blocks.empty() && m_unsaved.entries.empty()) return;
    m_file.add(m_unsaved);
    m_unsaved = {};
}

void StableIndices::save(std::vector<SettingEntry> settings) {
    if (settings.empty()) return;
    IndexRecords changed;
    changed.settings = std::move(settings);
    m_file.add(changed);
}

void StableIndices::makeRoom(std::string const& serialNumber, Board& board, std::size_t count) {
    std::uint64_t room = 0;
    for (Room const& block : board.rooms)
        room += block.end - block.next;
    if (room >= count) return;
    std::uint64_t const size = blockSize(count - room);
    if (m_free + size - 1 > kLastIndex) return;
    auto const first = static_cast<std::uint32_t>(m_free);
    board.rooms.push_back({first, static_cast<std::uint32_t>(m_free + size)});
    m_unsaved.blocks.push_back({serialNumber, first, static_cast<std::uint32_t>(size)});
    m_free += size;
}

} // namespace kvloamd
