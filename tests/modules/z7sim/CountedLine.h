// SPDX-License-Identifier: BSD-2-Clause
// A line whose changes are added up, interval by interval.
#pragma once

#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <array>
#include <ostream>
#include <vector>

#include <gtest/gtest.h>

#include "LinePerformance.h"

struct LineCountsField {
    char const* name;
    std::int32_t LineCounts::*count;
};

inline constexpr std::array kLineCountsFields{
    LineCountsField{"ES", &LineCounts::errorSeconds},
    LineCountsField{"SES", &LineCounts::severelyErrorSeconds},
    LineCountsField{"SEFS", &LineCounts::severelyErrorFramingSeconds},
    LineCountsField{"UAS", &LineCounts::unavailableSeconds},
    LineCountsField{"CSS", &LineCounts::controlledSlipSeconds},
    LineCountsField{"PCV", &LineCounts::pathCodingViolations},
    LineCountsField{"LES", &LineCounts::lineErrorSeconds},
    LineCountsField{"BES", &LineCounts::burstyErrorSeconds},
    LineCountsField{"DM", &LineCounts::degradedMinutes},
    LineCountsField{"LCV", &LineCounts::lineCodeViolations},
};

inline void PrintTo(LineCounts const& counts, std::ostream* out) {
    for (auto const& field : kLineCountsFields)
        if (counts.*field.count != 0) *out << field.name << ' ' << counts.*field.count << ' ';
}

inline void PrintTo(LineFormat format, std::ostream* out) {
    constexpr std::array kNames{"Esf", "D4", "E1", "E1Crc", "Other"};
    *out << kNames.at(static_cast<std::size_t>(format));
}

inline bool hasNegativeCount(LineCounts const& counts) {
    return std::ranges::any_of(
        kLineCountsFields, [&](LineCountsField const& field) { return counts.*field.count < 0; });
}

/// A `CountedLine` is a line whose intervals the test can look at. A change that makes a count
/// negative, or that belongs to an interval that never was, fails the test.
class CountedLine {
  public:
    explicit CountedLine(LineFormat format, FailureTimes const& times = {})
        : m_line(format, times) {}

    /// Answers what the (last) second changed.
    LinePerformance::Change count(LineSecond const& second, int times = 1) {
        LinePerformance::Change change;
        for (int i = 0; i < times; ++i) {
            change = m_line.count(second);
            add(change.running, m_intervals.back());
            if (m_intervals.size() > 1)
                add(change.previous, m_intervals[m_intervals.size() - 2]);
            else
                EXPECT_EQ(change.previous, LineCounts());
        }
        return change;
    }
    void closeInterval() {
        m_line.closeInterval();
        m_intervals.emplace_back();
    }
    void begin(LineDefects const& defects) { m_line.begin(defects); }
    void interrupt() { m_line.interrupt(); }
    LineDefects failures() const { return m_line.failures(); }
    bool unavailable() const { return m_line.unavailable(); }
    LineCounts const& running() const { return m_intervals.back(); }
    LineCounts const& previous() const { return m_intervals.at(m_intervals.size() - 2); }
    /// The oldest first; the last one is running.
    std::vector<LineCounts> const& intervals() const { return m_intervals; }

  private:
    static void add(LineCounts const& change, LineCounts& counts) {
        counts += change;
        EXPECT_FALSE(hasNegativeCount(counts)) << testing::PrintToString(counts);
    }

    LinePerformance m_line;
    std::vector<LineCounts> m_intervals{1};
};
