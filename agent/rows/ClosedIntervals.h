// SPDX-License-Identifier: BSD-2-Clause
// The closed intervals of a line's history, in little memory.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <vector>

namespace kvloamd {

/// The performance counters of a line, in the order of DS1-MIB's tables.
enum LineCounter : std::size_t {
    kErrorSeconds,
    kSeverelyErrorSeconds,
    kSeverelyErrorFramingSeconds,
    kUnavailableSeconds,
    kControlledSlipSeconds,
    kPathCodingViolations,
    kLineErrorSeconds,
    kBurstyErrorSeconds,
    kDegradedMinutes,
    kLineCodeViolations,
    kLineCounters ///< how many
};

/// The counters of a line's interval; negative: not known.
using LineCounts = std::array<std::int32_t, kLineCounters>;

/// A `PackedCounts` is a list of `LineCounts` in a third of their size or less: most counters of
/// most intervals are 0, and most others are small. An interval is stored as the set of its
/// counters that are not 0, two bytes, and then their values, seven bits a byte. Unsynchronised.
class PackedCounts {
  public:
    PackedCounts() = default;
    PackedCounts(std::initializer_list<LineCounts> all) {
        for (LineCounts const& counts : all)
            push_back(counts);
    }

    /// Requires that there are fewer than a thousand.
    void push_back(LineCounts const& counts);
    /// Gives back the memory that further intervals would need.
    void shrink_to_fit();

    std::size_t size() const { return m_starts.size(); }
    bool empty() const { return m_starts.empty(); }
    LineCounts operator[](std::size_t place) const;
    LineCounts front() const { return (*this)[0]; }

  private:
    void append(std::int32_t count);

    std::vector<std::uint16_t> m_starts; ///< of each interval, in `m_bytes`
    std::vector<std::uint8_t> m_bytes;
};

/// Never changed once a row has them: snapshots share them.
struct ClosedIntervals {
    PackedCounts counts;     ///< from the newest
    std::vector<bool> valid; ///< of each, whether no data is missing
    LineCounts total{};      ///< of the valid ones
};

} // namespace kvloamd
