// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Summary.h"

#include <algorithm>
#include <cmath>

#include "cli/Cells.h"
#include "cli/Details.h"

namespace kvloam {

namespace {

constexpr double kOldSnapshot = 30; ///< seconds
constexpr std::size_t kHeadLines = 8;

/// "2 failed" with the colour of trouble, if there are any.
void append(Cell& cell, std::int64_t number, char const* what, Paint paint) {
    if (number == 0) return;
    cell.text += (cell.text.ends_with(':') ? " " : ", ") + std::to_string(number) + " " + what;
    cell.paint = std::max(cell.paint, paint);
}

Cell boardsText(Totals const& totals) {
    Cell cell{std::to_string(totals.boards) + ":", Paint::Plain};
    append(cell, totals.boards - totals.failedBoards - totals.stoppedBoards, "started",
           Paint::Good);
    append(cell, totals.stoppedBoards, "not started", Paint::Warning);
    append(cell, totals.failedBoards, "failed", Paint::Bad);
    if (totals.boards == 0) cell = {"none", Paint::Warning};
    return cell;
}

Cell linesText(Totals const& totals) {
    Cell cell{std::to_string(totals.lines) + ":", Paint::Plain};
    append(cell, totals.lines - totals.failedLines, "without alarm", Paint::Good);
    append(cell, totals.failedLines, "with alarm", Paint::Bad);
    if (totals.lines == 0) cell = {"none"};
    return cell;
}

Cell alarmsText(Totals const& totals) {
    if (totals.alarms == 0) return {"none", Paint::Good};
    Cell cell{std::to_string(totals.alarms) + ":", Paint::Plain};
    static constexpr char const* kNames[] = {
        "of unknown severity", "indeterminate", "warning", "minor", "major", "critical"};
    for (int grave = 5; grave >= 0; --grave)
        append(cell, totals.alarmsOf[grave], kNames[grave],
               grave >= gravity("major") ? Paint::Bad : Paint::Warning);
    return cell;
}

std::string oneDecimal(double number) {
    char text[32];
    std::snprintf(text, sizeof text, "%.1f", number);
    return text;
}

Cell agentText(Json const& health, Totals const& totals, Date now) {
    Cell cell{"version " + valueText(field(health, "agentVersion")) + ", up " +
                  fieldText(health, "agentUpTimeSeconds", now) + ", read " +
                  oneDecimal(totals.age) + " s ago",
              totals.age > kOldSnapshot ? Paint::Bad : Paint::Good};
    auto const note = [&](std::string const& what, Paint paint) {
        cell.text += ", " + what;
        cell.paint = std::max(cell.paint, paint);
    };
    if (textIn(health, "masterState") == "lost") note("SNMP master lost", Paint::Bad);
    if (auto const kept = textIn(health, "persistence"); !kept.empty() && kept != "kept")
        note("persistence " + kept, Paint::Warning);
    if (auto const dropped = numberIn(health, "notificationsDropped").value_or(0); dropped > 0)
        note(std::to_string(dropped) + " notifications dropped", Paint::Warning);
    return cell;
}

Json rowsThat(Json const& rows, bool (*isGood)(Json const&)) {
    Json bad = Json::array();
    std::ranges::copy_if(rows, std::back_inserter(bad),
                         [&](Json const& row) { return !isGood(row); });
    return bad;
}

/// Prints as many rows as there is room for; `room` is in lines of the screen.
void printSome(View const& view, char const* command, char const* heading, Json const& rows,
               std::size_t& room) {
    constexpr std::size_t kAround = 4; // blank line, heading, titles, what is left out
    if (rows.empty() || room <= kAround) return;
    std::size_t const shown = std::min(rows.size(), room - kAround);
    Json some = Json::array();
    std::copy_n(rows.begin(), shown, std::back_inserter(some));
    view.out << '\n';
    printWords(view.out, view.screen, {heading, Paint::Heading});
    printRows(view, listNamed(command).sections.front(), some);
    if (shown < rows.size())
        printWords(view.out, view.screen,
                   {"and " + std::to_string(rows.size() - shown) + " more, see: kvloam " + command,
                    Paint::Faint});
    room -= std::min(room, shown + kAround);
}

} // namespace

Totals count(Overview const& overview) {
    Totals totals;
    for (Json const& board : rowsIn(overview.boards, "boards")) {
        ++totals.boards;
        if (boardState(board).paint == Paint::Bad)
            ++totals.failedBoards;
        else if (!isGoodBoard(board))
            ++totals.stoppedBoards;
    }
    for (Json const& line : rowsIn(overview.lines, "lines")) {
        ++totals.lines;
        if (lineStatus(line).paint == Paint::Bad) ++totals.failedLines;
    }
    for (Json const& alarm : rowsIn(overview.alarms, "alarms")) {
        ++totals.alarms;
        ++totals.alarmsOf[gravity(textIn(alarm, "severity"))];
    }
    double const age = realIn(overview.health, "ageSeconds").value_or(0);
    totals.age = std::isfinite(age) ? std::max(age, 0.0) : 0;
    return totals;
}

void printOverview(View const& view, Overview const& overview) {
    Totals const totals = count(overview);
    Json const& health = objectIn(overview.health, "health");
    std::vector<std::pair<std::string, Cell>> pairs = {
        {"host", {valueText(field(health, "host")), Paint::Heading}},
        {"agent", agentText(health, totals, view.now)},
        {"boards", boardsText(totals)},
        {"lines", linesText(totals)},
    };
    if (auto const channels = numberIn(health, "channels"))
        pairs.emplace_back("channels", Cell{std::to_string(*channels) + ": " +
                                            valueText(field(health, "channelsInUse")) + " in use"});
    pairs.emplace_back("alarms", alarmsText(totals));
    printPairs(view.out, view.screen, pairs);

    std::size_t room = view.screen.height == Screen::kUnlimited
                           ? Screen::kUnlimited
                           : view.screen.height - std::min(view.screen.height, kHeadLines);
    printSome(view, "alarms", "Alarms", sortedAlarms(rowsIn(overview.alarms, "alarms")), room);
    printSome(view, "boards", "Boards that are not started",
              rowsThat(rowsIn(overview.boards, "boards"), isGoodBoard), room);
    printSome(view, "lines", "Lines with a status to look at",
              rowsThat(rowsIn(overview.lines, "lines"), isGoodLine), room);
}

} // namespace kvloam
