// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/ClosedIntervals.h"

namespace kvloamd {

namespace {

constexpr unsigned kBits = 7;
constexpr std::uint32_t kMore = 1U << kBits; ///< set in a byte that another one follows

/// Numbers small numbers of either sign with small numbers: 0, -1, 1, -2 ... become 0, 1, 2, 3 ...
std::uint32_t folded(std::int32_t count) {
    auto const bits = static_cast<std::uint32_t>(count);
    return count < 0 ? ~(bits << 1U) : bits << 1U;
}

std::int32_t unfolded(std::uint32_t bits) {
    return static_cast<std::int32_t>((bits & 1U) != 0 ? ~(bits >> 1U) : bits >> 1U);
}

} // namespace

void PackedCounts::push_back(LineCounts const& counts) {
    m_starts.push_back(static_cast<std::uint16_t>(m_bytes.size()));
    unsigned present = 0;
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        if (counts[counter] != 0) present |= 1U << counter;
    m_bytes.push_back(static_cast<std::uint8_t>(present & 0xff));
    m_bytes.push_back(static_cast<std::uint8_t>(present >> 8U));
    for (std::int32_t const count : counts)
        if (count != 0) append(count);
}

void PackedCounts::append(std::int32_t count) {
    std::uint32_t rest = folded(count);
    for (; rest >= kMore; rest >>= kBits)
        m_bytes.push_back(static_cast<std::uint8_t>(rest | kMore));
    m_bytes.push_back(static_cast<std::uint8_t>(rest));
}

void PackedCounts::shrink_to_fit() {
    m_starts.shrink_to_fit();
    m_bytes.shrink_to_fit();
}

LineCounts PackedCounts::operator[](std::size_t place) const {
    std::uint8_t const* next = m_bytes.data() + m_starts[place];
    unsigned const present = next[0] | static_cast<unsigned>(next[1]) << 8U;
    next += 2;
    LineCounts counts{};
    for (std::size_t counter = 0; counter < kLineCounters; ++counter) {
        if ((present >> counter & 1U) == 0) continue;
        std::uint32_t bits = 0;
        unsigned shift = 0;
        for (; *next >= kMore; ++next, shift += kBits)
            bits |= (*next & (kMore - 1)) << shift;
        bits |= std::uint32_t{*next++} << shift;
        counts[counter] = unfolded(bits);
    }
    return counts;
}

} // namespace kvloamd
