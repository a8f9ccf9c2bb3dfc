// SPDX-License-Identifier: BSD-2-Clause
// A DS1 line's counters and alarms over time.
#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <string_view>

#include "boardplatform/ds1_line.h"

namespace kvlsim {

/// What a line counts, in the order of DS1LineCounters, as descriptions and commands name it.
inline constexpr std::array<std::string_view, 4> kLineErrorNames = {
    "code-violations", "path-violations", "framing-errors", "slips"};

using LineErrors = std::array<std::uint32_t, kLineErrorNames.size()>;
/// Errors per second, in billionths, so that sums are exact.
using LineRates = std::array<std::uint64_t, kLineErrorNames.size()>;

inline constexpr std::uint64_t kLineRateUnit = 1'000'000'000;
/// The highest rate, in errors per second; the sum of many such rates still fits.
inline constexpr std::uint64_t kMaxLineRate = 1'000'000;

/// The alarms' names; alarm n is bit n of `DS1LineCounters::alarms`.
inline constexpr std::array<std::string_view, 11> kLineAlarmNames = {"los",
                                                                     "lof",
                                                                     "ais",
                                                                     "rai",
                                                                     "sending-rai",
                                                                     "sending-ais",
                                                                     "loopback",
                                                                     "ts16-ais",
                                                                     "remote-multiframe",
                                                                     "sending-remote-multiframe",
                                                                     "test-code"};

/// A `LineTypeName` is a line type with its name in descriptions and commands.
struct LineTypeName {
    std::string_view name;
    DS1LineType type;
};
inline constexpr std::array<LineTypeName, 6> kLineTypeNames = {
    {{"esf", DS1LineType::esf},
     {"d4", DS1LineType::d4},
     {"e1", DS1LineType::e1},
     {"e1-crc", DS1LineType::e1Crc},
     {"e1-mf", DS1LineType::e1Mf},
     {"e1-crc-mf", DS1LineType::e1CrcMf}}};

/// "esf" and so on; empty for a number that is no type.
std::string_view nameOf(DS1LineType type);

/// A `Line` is the model of a DS1 line: its counters and its alarms. It counts evenly, without
/// randomness: after t seconds at a rate r, floor(r * t). All times are the line's age and must not
/// decrease from one call to the next.
class Line {
  public:
    using Time = std::chrono::nanoseconds;

    /// The age in whole seconds, as `DS1LineCounters` reports it.
    static std::uint32_t wholeSeconds(Time age) {
        return static_cast<std::uint32_t>(std::chrono::floor<std::chrono::seconds>(age).count());
    }

    DS1LineCounters counters(Time age) const;
    LineRates const& rates() const { return m_rates; }
    /// The alarms that were raised, without those that they cause.
    std::uint32_t raised() const { return m_raised; }
    /// Whether time adds nothing to the counters except for the age.
    bool isSteady() const;

    /// Counts these at once.
    void add(LineErrors const& errors);
    void setRates(LineRates const& rates, Time age);
    /// Raises these alarms and clears all others.
    void setRaised(std::uint32_t alarms, Time age);

  private:
    /// A `Count` is a number of errors; `part` is its fraction, in billionths.
    struct Count {
        std::uint32_t whole = 0;
        std::uint64_t part = 0;

        Count after(std::uint64_t rate, Time time) const;
    };

    /// `TouchedSeconds` are the seconds in which a defect was present, however briefly.
    class TouchedSeconds {
      public:
        std::uint32_t at(Time age) const;
        void set(bool present, Time age);

      private:
        std::uint32_t m_counted = 0;
        std::int64_t m_next = 0; ///< the first second that may still be counted
        bool m_present = false;
    };

    std::array<Count, kLineErrorNames.size()> m_counts; ///< at `m_since`
    LineRates m_rates{};                                ///< since then
    Time m_since{};
    std::uint32_t m_raised = 0;
    TouchedSeconds m_lossOfSignal;
    TouchedSeconds m_outOfFrame;
    TouchedSeconds m_alarmIndication;
};

} // namespace kvlsim
