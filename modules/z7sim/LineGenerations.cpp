// SPDX-License-Identifier: BSD-2-Clause
#include "LineGenerations.h"

#include <algorithm>

#include "LineScheduler.h"
#include "ObjectAttributes.h"
#include "access/DeviceMapperIf.h"

LineGenerations& LineGenerations::instance() {
    static auto* const generations = new LineGenerations;
    return *generations;
}

DS1BoardGeneration LineGenerations::of(long board, std::size_t& place) {
    if (m_pass != LineScheduler::passNumber()) ask();
    if (place >= m_boards.size() || m_boards[place].board != board) {
        auto const found =
            std::ranges::lower_bound(m_boards, board, {}, &DS1BoardGeneration::board);
        if (found == m_boards.end() || found->board != board) return {};
        place = static_cast<std::size_t>(found - m_boards.begin());
    }
    return m_boards[place];
}

void LineGenerations::ask() {
    constexpr std::size_t fewest = 64;
    m_pass = LineScheduler::passNumber();
    m_boards = {};
    if (m_buffer.empty()) m_buffer.resize(fewest);
    long root = 0;
    if (DeviceMapperIf::get_interface()->GetDMClient()->GetRootObject(&root) != 0) return;
    for (;;) {
        std::span<DS1BoardGeneration> const room(m_buffer);
        std::size_t const size =
            bytesAttribute(root, kDS1LineGenerations, room.data(), room.size_bytes());
        std::size_t const count = size / sizeof(DS1BoardGeneration);
        m_boards = room.first(std::min(count, room.size()));
        // A full buffer may hold only a part of the answer.
        if (count < room.size()) return;
        m_buffer.resize(2 * m_buffer.size());
    }
}
