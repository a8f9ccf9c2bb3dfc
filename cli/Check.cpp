// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Check.h"

#include <algorithm>
#include <array>

#include "cli/Cells.h"
#include "cli/Text.h"

namespace kvloam {

namespace {

/// A text of others for a plugin's output, in which a bar separates the performance data.
std::string plain(std::string const& text) {
    std::string clean = printable(text);
    std::ranges::replace(clean, '|', '/');
    return clean;
}

std::string stateLine(PluginState state, std::string const& text) {
    static constexpr std::array<char const*, 4> kNames = {"OK", "WARNING", "CRITICAL", "UNKNOWN"};
    return std::string("KVLOAM ") + kNames[static_cast<std::size_t>(state)] + ": " + plain(text);
}

std::string plural(std::int64_t number, std::string const& what) {
    return std::to_string(number) + " " + what + (number == 1 ? "" : "s");
}

std::string performance(Totals const& totals) {
    char age[32];
    std::snprintf(age, sizeof age, "%.1f", totals.age);
    auto const number = [](char const* name, std::int64_t value) {
        return std::string(name) + "=" + std::to_string(value) + ";;;0 ";
    };
    std::string text =
        number("boards", totals.boards) + number("boards_failed", totals.failedBoards) +
        number("boards_not_started", totals.stoppedBoards) + number("lines", totals.lines) +
        number("lines_failed", totals.failedLines) + number("alarms", totals.alarms);
    for (char const* name : {"critical", "major", "minor", "warning", "indeterminate"})
        text += number((std::string("alarms_") + name).c_str(), totals.alarmsOf[gravity(name)]);
    return text + "age=" + age + "s;;;0";
}

} // namespace

CheckResult check(Overview const& overview, CheckLimits const& limits) {
    constexpr std::size_t kMostListed = 20;
    Totals const totals = count(overview);
    Json const alarms = sortedAlarms(rowsIn(overview.alarms, "alarms"));

    PluginState state = PluginState::Ok;
    std::string text;
    auto const find = [&](PluginState found, std::string const& what) {
        state = std::max(state, found);
        text += (text.empty() ? "" : ", ") + what;
    };
    if (totals.age > limits.oldest)
        find(PluginState::Critical,
             "boards were read " +
                 spanText(Seconds(static_cast<std::int64_t>(std::min(totals.age, 1e12)))) + " ago");
    if (!alarms.empty()) {
        int const worst = gravity(textIn(alarms.front(), "severity"));
        PluginState found = PluginState::Ok;
        if (worst >= gravity(limits.warning)) found = PluginState::Warning;
        if (worst >= gravity(limits.critical)) found = PluginState::Critical;
        find(found, plural(totals.alarms, "alarm") + ", " +
                        valueText(field(alarms.front(), "severity")) + " " +
                        valueText(field(alarms.front(), "kind")) + " on " +
                        valueText(field(alarms.front(), "resource")));
    }
    if (text.empty()) text = "no alarms";
    text += ", " + plural(totals.boards, "board") + ", " + plural(totals.lines, "line");

    CheckResult result{state, stateLine(state, text) + " | " + performance(totals) + "\n"};
    for (std::size_t i = 0; i < std::min(alarms.size(), kMostListed); ++i) {
        Json const& alarm = alarms[i];
        result.text +=
            plain(valueText(field(alarm, "severity")) + " " + valueText(field(alarm, "kind")) +
                  " on " + valueText(field(alarm, "resource")) + ": " +
                  valueText(field(alarm, "text"))) +
            "\n";
    }
    if (alarms.size() > kMostListed)
        result.text += "and " + std::to_string(alarms.size() - kMostListed) + " more\n";
    return result;
}

CheckResult unknownResult(std::string const& why) {
    return {PluginState::Unknown, stateLine(PluginState::Unknown, why) + "\n"};
}

} // namespace kvloam
