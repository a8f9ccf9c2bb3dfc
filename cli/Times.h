// SPDX-License-Identifier: BSD-2-Clause
// Dates of the agent for people.
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

namespace kvloam {

using Seconds = std::chrono::seconds;
/// A date in whole seconds of UTC.
using Date = std::chrono::sys_seconds;

/// Reads a date as RFC 3339 writes it, such as "2026-11-22T17:16:48.5Z"; nothing when it is none.
/// Fractions of a second are dropped.
std::optional<Date> readDate(std::string_view text);

/// The date in the user's time zone: "2026-11-22 18:16:48".
std::string localDate(Date date);
/// Only its time of day: "18:16".
std::string localTime(Date date);
/// A span of time in its greatest unit: "5 s", "12 min", "3 h", "4 d". A negative one is "0 s".
std::string spanText(Seconds span);
/// The date and how long ago it was at `now`: "2026-11-22 18:16:48 (12 min ago)".
std::string dateWithAge(Date date, Date now);

} // namespace kvloam
