// SPDX-License-Identifier: BSD-2-Clause
// A line of the chassis: a described line that has been running since it was loaded.
#pragma once

#include <cstddef>
#include <cstdint>

#include "simulator/chassis/LineDraft.h"

namespace kvlsim {

/// A `LiveLine` is a line of the chassis that runs since it was loaded. `now` is the time of the
/// clock of the lines. Unsynchronised: the platform guards it with its lock.
class LiveLine {
  public:
    using Time = Line::Time;

    LiveLine(LineDraft draft, Time now);

    /// Begins again as at loading.
    void restart(Time now);

    /// Prefetches what `counters` reads.
    void fetch() const {
        auto const* const first = reinterpret_cast<char const*>(this);
        constexpr std::size_t cacheLine = 64;
        for (std::size_t offset = 0; offset < sizeof m_born + sizeof m_line; offset += cacheLine)
            __builtin_prefetch(first + offset);
    }

    DS1LineCounters counters(Time now) const { return m_line.counters(age(now)); }
    /// As it was described.
    LineDraft const& draft() const { return m_draft; }
    LineRates const& rates() const { return m_line.rates(); }
    std::uint32_t raised() const { return m_line.raised(); }
    bool isSteady() const { return m_line.isSteady(); }
    /// When the line's age was 0.
    Time born() const { return m_born; }

    void add(LineErrors const& errors) { m_line.add(errors); }
    void setRates(LineRates const& rates, Time now) { m_line.setRates(rates, age(now)); }
    void setRaised(std::uint32_t alarms, Time now) { m_line.setRaised(alarms, age(now)); }

  private:
    Time age(Time now) const { return now - m_born; }

    Time m_born{};
    Line m_line;
    LineDraft m_draft;
};

} // namespace kvlsim
