// SPDX-License-Identifier: BSD-2-Clause
#include "LineGenerations.h"

#include <algorithm>
#include <new>

#include "LineScheduler.h"
#include "ObjectAttributes.h"
#include "access/DeviceMapperIf.h"

namespace {

// How many boards the buffer holds.
constexpr std::size_t kFewest = 64;
constexpr std::size_t kMost = std::size_t{1} << 18U;

} // namespace

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
    m_pass = LineScheduler::passNumber();
    m_boards = {};
    long root = 0;
    if (DeviceMapperIf::get_interface()->GetDMClient()->GetRootObject(&root) != 0) return;
    std::size_t count = ask(root);
    // A full buffer may hold only a part of the answer.
    while (count == m_buffer.size() && count < kMost && enlarge())
        count = ask(root);
    m_boards = std::span<DS1BoardGeneration const>(m_buffer).first(count);
}

std::size_t LineGenerations::ask(long root) {
    std::size_t const size = bytesAttribute(root, kDS1LineGenerations, m_buffer.data(),
                                            m_buffer.size() * sizeof(DS1BoardGeneration));
    return std::min(size / sizeof(DS1BoardGeneration), m_buffer.size());
}

/// Makes room for more boards. Boards for which there is no memory are asked every second.
bool LineGenerations::enlarge() {
    try {
        m_buffer.resize(std::max(2 * m_buffer.size(), kFewest));
    } catch (std::bad_alloc const&) {
        return false;
    }
    return true;
}
