// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Times.h"

#include <algorithm>
#include <charconv>
#include <ctime>

namespace kvloam {

namespace {

/// Takes a number of exactly `digits` digits from the front of `text`; -1 when there is none.
int takeNumber(std::string_view& text, std::size_t digits) {
    int number = -1;
    if (text.size() < digits) return -1;
    for (char const c : text.substr(0, digits))
        if (c < '0' || c > '9') return -1;
    std::from_chars(text.data(), text.data() + digits, number);
    text.remove_prefix(digits);
    return number;
}

bool take(std::string_view& text, std::string_view anyOf) {
    if (text.empty() || anyOf.find(text.front()) == std::string_view::npos) return false;
    text.remove_prefix(1);
    return true;
}

/// The offset from UTC at the end of a date; nothing when there is none.
std::optional<Seconds> takeOffset(std::string_view text) {
    if (text == "Z" || text == "z") return Seconds{0};
    bool const isWest = text.starts_with('-');
    if (!take(text, "+-")) return {};
    int const hours = takeNumber(text, 2);
    if (!take(text, ":")) return {};
    int const minutes = takeNumber(text, 2);
    if (!text.empty() || hours < 0 || hours > 23 || minutes < 0 || minutes > 59) return {};
    Seconds const offset = std::chrono::hours(hours) + std::chrono::minutes(minutes);
    return isWest ? -offset : offset;
}

std::string localText(Date date, char const* format) {
    std::time_t const time = date.time_since_epoch().count();
    std::tm broken{};
    char text[64];
    if (localtime_r(&time, &broken) == nullptr) return "?";
    return {text, std::strftime(text, sizeof text, format, &broken)};
}

} // namespace

std::optional<Date> readDate(std::string_view text) {
    namespace chrono = std::chrono;
    int const year = takeNumber(text, 4);
    if (!take(text, "-")) return {};
    int const month = takeNumber(text, 2);
    if (!take(text, "-")) return {};
    int const day = takeNumber(text, 2);
    if (!take(text, "Tt ")) return {};
    int const hour = takeNumber(text, 2);
    if (!take(text, ":")) return {};
    int const minute = takeNumber(text, 2);
    if (!take(text, ":")) return {};
    int const second = takeNumber(text, 2);
    if (std::min({year, month, day, hour, minute, second}) < 0 || hour > 23 || minute > 59 ||
        second > 60)
        return {};
    if (take(text, ".")) {
        if (!take(text, "0123456789")) return {};
        while (take(text, "0123456789")) {
        }
    }
    auto const offset = takeOffset(text);
    chrono::year_month_day const calendar{chrono::year(year),
                                          chrono::month(static_cast<unsigned>(month)),
                                          chrono::day(static_cast<unsigned>(day))};
    if (!offset || !calendar.ok()) return {};
    return chrono::sys_days(calendar) + chrono::hours(hour) + chrono::minutes(minute) +
           Seconds(second) - *offset;
}

std::string localDate(Date date) {
    return localText(date, "%Y-%m-%d %H:%M:%S");
}

std::string localTime(Date date) {
    return localText(date, "%H:%M");
}

std::string spanText(Seconds span) {
    constexpr struct {
        std::int64_t seconds;
        char const* unit;
    } kUnits[] = {{86400, " d"}, {3600, " h"}, {60, " min"}};
    std::int64_t const count = std::max<std::int64_t>(span.count(), 0);
    // The larger unit says enough from two of it on.
    for (auto const& [seconds, unit] : kUnits)
        if (count >= 2 * seconds) return std::to_string(count / seconds) + unit;
    return std::to_string(count) + " s";
}

std::string dateWithAge(Date date, Date now) {
    return localDate(date) + " (" + spanText(now - date) + " ago)";
}

} // namespace kvloam
