// SPDX-License-Identifier: BSD-2-Clause
#include "cli/History.h"

#include <algorithm>

#include "cli/Details.h"
#include "cli/Text.h"

namespace kvloam {

namespace {

constexpr std::size_t kPlotRows = 4;
constexpr std::size_t kMargin = 6;      ///< for the scale
constexpr std::size_t kLabelEvery = 24; ///< intervals: 6 hours

/// The length of so many intervals.
Seconds lengthOf(std::size_t intervals) {
    return LineHistory::kLength * static_cast<std::int64_t>(intervals);
}

/// One column of a plot: some neighbouring intervals.
struct PlotColumn {
    std::int64_t sum = 0;
    std::size_t known = 0; ///< how many of its intervals have a value
};

/// How many intervals share a column, so that the plot fits into `room` columns.
std::size_t intervalsPerColumn(std::size_t room) {
    for (std::size_t const group : {1U, 2U, 3U, 4U, 6U, 8U})
        if (LineHistory::kIntervals / group <= room) return group;
    return 12;
}

std::vector<PlotColumn> columnsOf(LineHistory const& history, char const* counter,
                                  std::size_t group) {
    std::vector<PlotColumn> columns(LineHistory::kIntervals / group);
    for (std::size_t i = 0; i < LineHistory::kIntervals; ++i) {
        auto const& interval = history.intervals[i];
        if (!interval) continue;
        auto const value = numberIn(interval->counts, counter);
        if (!value) continue;
        // An interval of 900 s has no more errored seconds.
        columns[i / group].sum += std::clamp<std::int64_t>(*value, 0, 100000);
        ++columns[i / group].known;
    }
    return columns;
}

/// How a column fills a row of the plot, from nothing to all of it.
struct Signs {
    std::vector<char const*> levels;
    char const* base;   ///< an interval with data
    char const* partly; ///< some of the column's intervals have none
    char const* edge;
};

Signs const& signsOf(Screen const& screen) {
    static Signs const utf8{{" ", "▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"}, "─", "╌", "┤"};
    static Signs const ascii{{" ", ".", ":", "#"}, "-", ".", "|"};
    return screen.hasUtf8 ? utf8 : ascii;
}

std::string rightAligned(std::string const& text, std::size_t columns) {
    return std::string(columns - std::min(columns, text.size()), ' ') + text;
}

void printPlot(View const& view, std::string const& title, Paint paint,
               std::vector<PlotColumn> const& columns, std::size_t group) {
    Signs const& signs = signsOf(view.screen);
    std::int64_t highest = 0;
    std::int64_t sum = 0;
    std::size_t known = 0;
    for (auto const& column : columns) {
        highest = std::max(highest, column.sum);
        sum += column.sum;
        known += column.known;
    }
    std::string heading = title + (known == 0 ? ": not known" : ": " + std::to_string(sum));
    view.out << view.screen.painted(cut(heading, view.screen.width, view.screen.mark()),
                                    Paint::Heading)
             << '\n';

    auto const perRow = static_cast<std::int64_t>(signs.levels.size() - 1);
    std::int64_t const all = perRow * static_cast<std::int64_t>(kPlotRows);
    // A plot of zeroes is its base line.
    for (std::size_t row = highest == 0 ? 0 : kPlotRows; row > 0; --row) {
        std::string line;
        for (auto const& column : columns) {
            // Rounded up: one second shows.
            std::int64_t const level = (column.sum * all + highest - 1) / highest;
            std::int64_t const below = static_cast<std::int64_t>(row - 1) * perRow;
            auto const filled = std::clamp<std::int64_t>(level - below, 0, perRow);
            line += signs.levels[static_cast<std::size_t>(filled)];
        }
        line.resize(line.find_last_not_of(' ') + 1);
        view.out << rightAligned(row == kPlotRows ? std::to_string(highest) : "", kMargin - 2)
                 << " " << signs.edge << view.screen.painted(line, paint) << '\n';
    }
    std::string base;
    for (auto const& column : columns)
        base += column.known == 0 ? " " : column.known < group ? signs.partly : signs.base;
    base.resize(base.find_last_not_of(' ') + 1);
    view.out << rightAligned("0", kMargin - 2) << " " << signs.edge << base << '\n';
}

void printTimes(View const& view, LineHistory const& history, std::size_t group) {
    constexpr std::size_t kLabel = 5; // "17:30"
    std::size_t const step = kLabelEvery / group;
    std::string times(kMargin, ' ');
    Date const begin = history.end - lengthOf(LineHistory::kIntervals);
    for (std::size_t i = 0; i <= LineHistory::kIntervals; i += kLabelEvery) {
        bool const isEdge = i == 0 || i == LineHistory::kIntervals;
        if (!isEdge && step <= kLabel) continue;
        std::size_t place = kMargin + i / group;
        // The last label ends where the plot does.
        if (i == LineHistory::kIntervals) place -= std::min(place, kLabel);
        if (place < times.size() + (i > 0 ? 1 : 0)) continue;
        times.resize(place, ' ');
        times += localTime(begin + lengthOf(i));
    }
    view.out << view.screen.painted(times, Paint::Faint) << '\n';
}

struct CounterName {
    char const* key;
    char const* metric;
    char const* unit;
    char const* help;
};

constexpr CounterName kCounters[] = {
    {"es", "errored_seconds", "seconds", "Seconds with errors"},
    {"ses", "severely_errored_seconds", "seconds", "Seconds with many errors"},
    {"sefs", "severely_errored_framing_seconds", "seconds", "Seconds with severe framing faults"},
    {"uas", "unavailable_seconds", "seconds", "Seconds in which the line was unavailable"},
    {"css", "controlled_slip_seconds", "seconds", "Seconds with controlled slips"},
    {"les", "line_errored_seconds", "seconds", "Seconds with line coding violations"},
    {"bes", "bursty_errored_seconds", "seconds", "Seconds with some errors"},
    {"dm", "degraded_minutes", "", "Minutes with a raised error rate"},
    {"pcv", "path_coding_violations", "", "Path coding violations"},
    {"lcv", "line_coding_violations", "", "Line coding violations"},
};

/// The value of a label, between its quotes.
std::string labelValue(std::string const& text) {
    std::string result;
    for (char const c : printable(text)) {
        if (c == '\\' || c == '"') result += '\\';
        result += c;
    }
    return result;
}

} // namespace

bool LineHistory::isEmpty() const {
    return std::ranges::none_of(intervals, [](auto const& interval) { return bool(interval); });
}

LineHistory readHistory(Json const& answer) {
    Json const& line = objectIn(answer, "line");
    LineHistory history;
    history.name = textIn(line, "name");
    history.board = textIn(line, "board");
    // Where no interval says when it was: the running one began after the last closed one.
    history.end =
        timeOf(answer) -
        Seconds(std::clamp<std::int64_t>(numberIn(line, "timeElapsed").value_or(0), 0, 100000));
    for (Json const& row : rowsIn(line, "intervals")) {
        auto const number = numberIn(row, "number").value_or(0);
        if (number < 1 || number > static_cast<std::int64_t>(LineHistory::kIntervals)) continue;
        auto const begin = dateIn(row, "start");
        if (begin && number == 1) history.end = *begin + LineHistory::kLength;
        // An interval that missed data has no counts.
        if (!truthIn(row, "validData").value_or(true)) continue;
        history.intervals[LineHistory::kIntervals - static_cast<std::size_t>(number)] =
            HistoryInterval{begin.value_or(Date()), row};
    }
    for (std::size_t i = 0; i < LineHistory::kIntervals; ++i)
        if (auto& interval = history.intervals[i]; interval && interval->begin == Date())
            interval->begin = history.end - lengthOf(LineHistory::kIntervals - i);
    return history;
}

void printHistory(View const& view, LineHistory const& history) {
    std::string const name = view.screen.clean(
        "Line " + history.name + (history.board.empty() ? "" : " of board ") + history.board);
    view.out << view.screen.painted(cut(name, view.screen.width, view.screen.mark()),
                                    Paint::Heading);
    if (history.isEmpty()) {
        view.out << "\nno closed intervals\n";
        return;
    }
    std::size_t const room = view.screen.width - std::min(view.screen.width - 1, kMargin);
    std::size_t const group = intervalsPerColumn(room);
    std::string const note = ", until " + localDate(history.end) + ", a column is " +
                             std::to_string(group * 15) + " min";
    view.out << cut(note, view.screen.width - std::min(view.screen.width, width(name)),
                    view.screen.mark())
             << '\n';

    struct {
        char const* counter;
        char const* title;
        Paint paint;
    } static constexpr kPlots[] = {{"es", "Errored seconds (ES)", Paint::Warning},
                                   {"ses", "Severely errored seconds (SES)", Paint::Bad},
                                   {"uas", "Unavailable seconds (UAS)", Paint::Bad}};
    for (auto const& [counter, title, paint] : kPlots)
        printPlot(view, title, paint, columnsOf(history, counter, group), group);
    printTimes(view, history, group);
}

std::string openMetrics(std::vector<LineHistory> const& histories) {
    std::string text;
    for (auto const& [key, metric, unit, help] : kCounters) {
        std::string const name = std::string("kvloam_line_interval_") + metric;
        text += "# TYPE " + name + " gauge\n";
        if (*unit != '\0') text += "# UNIT " + name + " " + unit + "\n";
        text +=
            "# HELP " + name + " " + help + " in the 15 minutes that end at the sample's time.\n";
        for (LineHistory const& history : histories) {
            std::string const series = name + "{board=\"" + labelValue(history.board) +
                                       "\",line=\"" + labelValue(history.name) + "\"} ";
            std::optional<Date> last;
            for (auto const& interval : history.intervals) {
                if (!interval) continue;
                auto const value = numberIn(interval->counts, key);
                Date const end = interval->begin + LineHistory::kLength;
                // Samples of one series must ascend, whatever the agent says.
                if (!value || (last && end <= *last)) continue;
                last = end;
                text += series + std::to_string(*value) + " " +
                        std::to_string(end.time_since_epoch().count()) + "\n";
            }
        }
    }
    return text + "# EOF\n";
}

} // namespace kvloam
