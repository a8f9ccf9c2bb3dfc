// SPDX-License-Identifier: BSD-2-Clause
// The performance counters of a DS1 line, derived from what the line counts every second.
#pragma once

#include <cstdint>

#include <array>

#include "LineFailures.h"

/// How a line is framed, which decides what of its errors can be seen.
enum class LineFormat : std::uint8_t {
    esf,   ///< T1, extended superframes: has a CRC
    d4,    ///< T1, superframes: has none
    e1,    ///< E1 without CRC
    e1Crc, ///< E1 with CRC
    other  ///< unframed or not known: of errors nothing is known, of failures all
};

/// The defects that deprive a line of its frame.
struct LineDefects {
    bool lossOfSignal = false;
    bool outOfFrame = false;
    bool alarmIndication = false;

    bool operator==(LineDefects const&) const = default;
};

/// What a line counted in one second.
struct LineSecond {
    std::uint32_t lineCodeViolations = 0;
    std::uint32_t pathCodeViolations = 0; ///< CRC errors; ignored for a format without CRC
    std::uint32_t framingErrors = 0;
    std::uint32_t controlledSlips = 0;
    // The defects that were there at some time of the second. Without signal there is no frame.
    bool lossOfSignal = false;
    bool outOfFrame = false;
    bool alarmIndication = false;
    /// Those of them that were no longer there when the second ended.
    LineDefects ended{};
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

/// A `LinePerformance` derives the counters of one line by the definitions of RFC 4805 (and RFC
/// 2495), section 3.
///
/// A line becomes unavailable in one of two ways: by ten severely errored seconds in a row, from
/// the first of them; or by a failure (no signal, no frame, AIS), from the onset of its defect, or
/// from the first of the severely errored seconds that lie in a row directly before it. The line is
/// available again from the first of ten seconds in a row that were not severely errored and in
/// which no failure's defect was there, once all failures have ended.
///
/// All of these seconds were counted before that was known, so the second that decides also
/// corrects what those before it counted. In unavailable time only unavailable seconds are counted.
///
/// A degraded minute is made of sixty seconds that were available and not severely errored, however
/// much other time lies between them. It belongs to the interval of its last second.
///
/// Where the definitions leave a choice: a second has no more violations of a kind than the line
/// has bits; a larger number counts as that many, which keeps the sums of an interval of 15 minutes
/// within 32 bits.
///
/// Unsynchronised. Never allocates.
class LinePerformance {
  public:
    /// By how much the running interval and the one closed before it change. A count is negative
    /// where seconds are taken back.
    struct Change {
        LineCounts running;
        LineCounts previous;
    };

    /// A new line is available, and no seconds lie before its first.
    explicit LinePerformance(LineFormat format, FailureTimes const& times = {});

    /// Takes the line as it is found, before its first second: with failures, and so unavailable,
    /// where it has these defects.
    void begin(LineDefects const& defects);
    /// Counts one second of the running interval.
    Change count(LineSecond const& second);
    /// Counts a second in which the line counted nothing and had no defect, if it changes nothing
    /// but time. Returns false, and does nothing, if it may change more: `count` it then.
    bool countClean() {
        if (m_unavailable || !m_isQuiet || m_minute.seconds + 1 >= kMinute) return false;
        m_run = 0;
        m_remembered = 0;
        ++m_minute.seconds;
        return true;
    }
    /// Some seconds were missed: nothing in a row goes on across them. The line stays available or
    /// unavailable, with the failures that it has.
    void interrupt();
    /// Makes the running interval, of any number of seconds, the previous one; the seconds that
    /// follow count in a new one. Corrections to an interval that is older still are lost, which
    /// can happen only where intervals are shorter than 24 seconds.
    void closeInterval();

    bool unavailable() const { return m_unavailable; }
    /// When the line became available or unavailable: how many seconds before the end of the second
    /// that decided it.
    int decidedAfter() const { return m_decidedAfter; }
    /// The failures. A line without signal has no frame either.
    LineDefects failures() const { return m_failures; }

  private:
    static constexpr std::int32_t kMinute = 60;

    /// The seconds so far of the sixty that may become a degraded minute.
    struct Minute {
        std::int32_t seconds = 0;
        std::int32_t errors = 0;
    };
    /// A second that may still be corrected. Every line stores two dozen of them, so they are
    /// packed: violations are numbers; each other count of a second is 0 or 1 and needs one bit.
    class Recent {
      public:
        Recent() = default;
        /// `counts`: if the line is available. `before`: the minute without this second.
        Recent(LineCounts const& counts, Minute const& before);

        LineCounts counts() const;
        Minute const& before() const { return m_before; }
        bool severe() const { return (m_ones & kSevere) != 0; }
        /// Whether it belongs to the running interval, or to the one before that.
        bool isRunning() const { return m_intervalsAgo == 0; }
        bool isForgotten() const { return m_intervalsAgo > 1; }
        void closeInterval() {
            if (!isForgotten()) ++m_intervalsAgo;
        }

      private:
        static constexpr unsigned kSevere = 2;

        std::int32_t m_pathCodingViolations = 0;
        std::int32_t m_lineCodeViolations = 0;
        Minute m_before;
        std::uint16_t m_ones = 0; ///< the other counts, a bit each
        std::uint8_t m_intervalsAgo = 0;
    };
    /// Corrections go back a failure's declaration or clearing and nine severely errored seconds.
    static constexpr int kRecent = 24;

    bool hasCrc() const;
    std::int32_t bitsPerSecond() const;
    bool severe(LineSecond const& second, LineCounts const& counts) const;
    LineCounts availableSecond(LineSecond const& second) const;
    bool completesDegradedMinute(LineCounts const& counts);
    void noteFailures();
    void countFailures(LineSecond const& second);
    Change countClosely(LineSecond const& second, LineCounts counts);
    int secondsToTakeBack() const;
    int withSevereBefore(int seconds) const;
    bool sustainsFailure(LineSecond const& second) const;
    void becomeUnavailable(int seconds, Change& change);
    void becomeAvailable(Change& change);
    Recent& recent(int ago);
    Recent const& recent(int ago) const { return const_cast<LinePerformance*>(this)->recent(ago); }
    void remember(LineCounts const& counts, Minute const& before);

    // What every second reads lies together.
    Minute m_minute;
    LineFormat m_format;
    bool m_unavailable = false;
    bool m_isQuiet = true;  ///< no defect lasts, and no failure is declared
    LineDefects m_failures; ///< those that are declared
    /// Seconds in a row, up to now, that speak for the line's becoming the other: severely errored
    /// while it is available, good while it is unavailable.
    int m_run = 0;
    int m_decidedAfter = 0;
    int m_remembered = 0; ///< seconds in a row, up to now, that can be corrected
    LineFailure m_signal;
    LineFailure m_frame;
    LineFailure m_indication;
    FailureTimes m_times;
    int m_newest = 0; ///< its place in `m_recent`
    std::array<Recent, kRecent> m_recent;
};
