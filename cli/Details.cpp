// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Details.h"

#include "cli/Cells.h"

namespace kvloam {

namespace {

/// Prints a list of the answer under its heading, unless it is empty.
void printSection(View const& view, Section const& section, Json const& answer) {
    Json const& rows = rowsIn(answer, section.key);
    if (rows.empty()) return;
    view.out << '\n' << view.screen.painted(section.heading, Paint::Heading) << '\n';
    printRows(view, section, rows);
}

void printSections(View const& view, char const* command, Json const& answer) {
    for (Section const& section : listNamed(command).sections)
        if (answer.contains(section.key)) printSection(view, section, answer);
}

std::string countText(Json const& counts, char const* key) {
    return valueText(field(counts, key));
}

void printCounts(View const& view, Json const& line) {
    struct Count {
        char const* key;
        char const* name;
    };
    static constexpr Count kCounts[] = {
        {"es", "errored seconds"},
        {"ses", "severely errored seconds"},
        {"sefs", "severely errored framing seconds"},
        {"uas", "unavailable seconds"},
        {"css", "controlled slip seconds"},
        {"les", "line errored seconds"},
        {"bes", "bursty errored seconds"},
        {"dm", "degraded minutes"},
        {"pcv", "path coding violations"},
        {"lcv", "line coding violations"},
    };
    auto const elapsed = numberIn(line, "timeElapsed");
    Table table({{"COUNTER", 0},
                 {elapsed ? "LAST " + std::to_string(*elapsed) + " S" : "NOW", 1, Align::Right},
                 {"24 H", 1, Align::Right}});
    for (auto const& [key, name] : kCounts)
        table.add({{name},
                   {countText(field(line, "current"), key)},
                   {countText(field(line, "total"), key)}});
    view.out << '\n';
    table.print(view.out, view.screen);
}

} // namespace

Json const& objectIn(Json const& answer, char const* key) {
    Json const& object = field(answer, key);
    if (!object.is_object())
        throw CliError(kFailure, "the agent's answer cannot be read: it has no object \"" +
                                     std::string(key) + "\"; is it an agent of this version?");
    return object;
}

void printFields(View const& view, Json const& object) {
    std::vector<std::pair<std::string, Cell>> pairs;
    for (auto const& [key, value] : object.items()) {
        bool const isNested =
            value.is_object() || (value.is_array() && !value.empty() && !value.front().is_string());
        if (isNested) continue;
        Cell cell{fieldText(object, key, view.now)};
        if (key == "lineStatus") cell = lineStatus(object);
        if (key == "operStatus") cell = operStatus(object);
        pairs.emplace_back(keyWords(key), std::move(cell));
    }
    printPairs(view.out, view.screen, pairs);
}

void printBoard(View const& view, Json const& answer) {
    Json const& board = objectIn(answer, "board");
    Cell const state = boardState(board);
    printWords(view.out, view.screen,
               {"Board " + textIn(board, "serialNumber") + ": " + state.text, state.paint});
    printFields(view, board);
    printSections(view, "lines", answer);
    printSections(view, "devices", answer);
}

void printLine(View const& view, Json const& answer) {
    Json const& line = objectIn(answer, "line");
    Cell const status = lineStatus(line);
    printWords(view.out, view.screen,
               {"Line " + textIn(line, "name") + ": " + status.text, status.paint});
    printFields(view, line);
    if (!field(line, "current").is_object()) {
        view.out << "\nThe line keeps no counters.\n";
        return;
    }
    printCounts(view, line);
}

void printTable(View const& view, Json const& answer) {
    Json const& rows = rowsIn(answer, "rows");
    if (rows.empty()) {
        view.out << "no rows\n";
        return;
    }
    std::vector<TableColumn> heads;
    std::vector<std::string> keys;
    for (auto const& [key, value] : rows.front().items()) {
        // The first columns say the most.
        heads.push_back({key, static_cast<int>(keys.size()), Align::Left, 6});
        keys.push_back(key);
    }
    if (keys.empty()) {
        view.out << rows.size() << " rows without columns\n";
        return;
    }
    Table table(std::move(heads));
    for (Json const& row : rows) {
        std::vector<Cell> cells;
        for (std::string const& key : keys) {
            Json const& value = field(row, key.c_str());
            cells.push_back({key == "index" ? jsonText(value, true) : valueText(value)});
        }
        table.add(std::move(cells));
    }
    table.print(view.out, view.screen);
}

} // namespace kvloam
