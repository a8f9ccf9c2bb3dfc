// SPDX-License-Identifier: BSD-2-Clause
// A DS1 line as a chassis describes it: its type, its errors and alarms, and its past.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "simulator/AttributeValue.h"
#include "simulator/Description.h"
#include "simulator/Line.h"

namespace kvlsim {

/// A part of the past in which there was more than the usual.
struct LineSpell {
    std::int64_t ago = 0;     ///< seconds before loading at which it began
    std::int64_t seconds = 0; ///< how long it lasted
    std::uint32_t alarms = 0;
    LineRates rates{}; ///< on top of the usual ones
};

struct LinePast {
    std::int64_t seconds = 0; ///< 0: none
    LineRates rates{};
    std::vector<LineSpell> spells; ///< may overlap
};

struct LineDraft {
    DS1LineType type = DS1LineType::esf;
    LineRates rates{};
    std::uint32_t alarms = 0;
    LinePast past;
};

inline constexpr std::int64_t kMaxLinePast = 86400;
inline constexpr std::size_t kMaxLineSpells = 1000;

/// The line at its loading, whose age is then the length of its past.
Line lineAtLoading(LineDraft const& draft);
/// Calls `record` with the counters of every second of the past, the first and the last included.
void replayPast(LinePast const& past, std::function<void(DS1LineCounters const&)> const& record);

/// "esf" and so on; empty for a number that is no type.
std::string_view nameOf(DS1LineType type);

/// These throw ChassisError. `of` is the device, for messages: "device 101".
LineDraft readLine(Description const& line, std::string const& of);
/// A map "name: errors per second"; what is not named stays what it is in `rates`.
void readLineRates(Description const& errors, LineRates& rates);
/// A map "name: number".
LineErrors readLineErrors(Description const& errors);
/// The bit of an alarm.
std::uint32_t lineAlarmNamed(std::string_view name, int line);
/// The value that the attribute LINE_TYPE may have beside a line: a type, or an answer without
/// bytes.
bool fitsLineType(AttributeValue const& value);

} // namespace kvlsim
