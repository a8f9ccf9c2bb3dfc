// SPDX-License-Identifier: BSD-2-Clause
// What a DS1 line's performance counters make of what the line counts every second.
#pragma once

#include <cstdint>

/// How a line is framed, which decides what of its errors can be seen.
enum class LineFormat {
    esf,  ///< T1, extended superframes: has a CRC
    d4,   ///< T1, superframes: has none
    e1,   ///< E1 without CRC
    e1Crc ///< E1 with CRC
};

/// What a line counted in one second.
struct LineSecond {
    std::uint32_t lineCodeViolations = 0;
    std::uint32_t pathCodeViolations = 0; ///< CRC errors; without meaning for a format without CRC
    std::uint32_t framingErrors = 0;
    std::uint32_t controlledSlips = 0;
    bool lossOfSignal = false; ///< a line without signal has no frame either
    bool outOfFrame = false;
    bool alarmIndication = false;
};

/// Counts of an interval in the order of DS1-MIB's interval table, or changes of them.
struct LineCounts {
    std::int32_t errorSeconds = 0;
    std::int32_t severelyErrorSeconds = 0;
    std::int32_t severelyErrorFramingSeconds = 0;
    std::int32_t unavailableSeconds = 0;
    std::int32_t controlledSlipSeconds = 0;
    std::int32_t pathCodingViolations = 0;
    std::int32_t lineErrorSeconds = 0;
    std::int32_t burstyErrorSeconds = 0;
    std::int32_t degradedMinutes = 0;
    std::int32_t lineCodeViolations = 0;

    LineCounts& operator+=(LineCounts const& other);
    LineCounts& operator-=(LineCounts const& other);
    bool operator==(LineCounts const&) const = default;
};

/// Derives the counters of one line by the definitions of RFC 4805 (and RFC 2495), section 3.
///
/// Ten severely errored seconds in a row make the line unavailable, ten others in a row available
/// again, each time from the first of the ten on. The ten were counted before that was known, so
/// the tenth second also corrects what the nine before it did. In unavailable time nothing but the
/// unavailable seconds is counted.
///
/// The definition of a degraded minute goes by sixty seconds that were available and not severely
/// errored, however much time, of whatever kind, lies between them; the minute belongs to the
/// interval of its last second.
///
/// Where the definitions leave a choice: an E1 line without CRC that has no frame is severely
/// errored, for it carries nothing. And a second has no more violations of a kind than the line
/// has bits; a larger number counts as that many, which keeps the sums of an interval of 15 minutes
/// within 32 bits.
///
/// Threads: one at a time. Never allocates.
class LinePerformance {
  public:
    /// By how much the running interval and the one closed before it change. A count is negative
    /// where seconds are taken back.
    struct Change {
        LineCounts running;
        LineCounts previous;
    };

    /// A new line is available, and no seconds lie before its first.
    explicit LinePerformance(LineFormat format);

    /// Counts one second of the running interval.
    Change count(LineSecond const& second);
    /// The running interval, of any number of seconds, becomes the previous one; the seconds that
    /// follow count in a new one. What a row of ten would correct in a still older interval is
    /// lost, which can happen only where an interval is shorter than ten seconds.
    void closeInterval();
    bool unavailable() const { return m_unavailable; }

  private:
    /// The seconds so far of the sixty that may become a degraded minute.
    struct Minute {
        std::int32_t seconds = 0;
        std::int64_t errors = 0;
    };

    bool hasCrc() const;
    std::int32_t bitsPerSecond() const;
    bool severe(LineSecond const& second, LineCounts const& counts) const;
    LineCounts availableSecond(LineSecond const& second) const;
    bool completesDegradedMinute(LineCounts const& counts);
    void breakRun();

    // What every second touches lies together.
    Minute m_minute;
    LineFormat m_format;
    bool m_unavailable = false;
    /// How many seconds in a row, up to now, speak for the line's being what it is not yet
    /// (unavailable or available), and what changes once they are ten.
    std::int32_t m_runLength = 0;
    Change m_correction;
    Minute m_minuteBeforeRun; ///< to go back to when a run in unavailable time is broken
};
