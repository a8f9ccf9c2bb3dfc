// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Commands.h"

#include <algorithm>
#include <chrono>
#include <fstream>
#include <iostream>
#include <thread>

#include "cli/Cells.h"
#include "cli/Details.h"
#include "cli/FleetTargets.h"
#include "cli/History.h"
#include "cli/Journal.h"
#include "cli/Text.h"

namespace kvloam {

namespace {

View viewOf(Session const& session, Json const& answer) {
    return {session.out, session.screen, timeOf(answer)};
}

void printJson(Session const& session, Json const& answer) {
    session.out << jsonText(answer, session.isWatched) << '\n';
}

Json find(Session& session, std::string const& kind, std::string const& name) {
    if (auto answer = session.client.find({kind + "s", name})) return std::move(*answer);
    throw CliError(kFailure,
                   "there is no " + kind + " " + name + "; kvloam " + kind + "s lists them");
}

/// A dot stands for the directory that it is in, and is removed from addresses.
void requireName(std::string const& name, std::string const& kind) {
    if (name.empty() || name == "." || name == "..")
        throw CliError(kUsage, "\"" + name + "\" is no name of a " + kind);
}

Json findNamed(Session& session, std::string const& kind, std::string const& name) {
    requireName(name, kind);
    return find(session, kind, name);
}

Overview readOverview(Session& session) {
    Overview overview;
    overview.health = session.client.get({"health"});
    overview.boards = session.client.get({"boards"});
    overview.lines = session.client.get({"lines"});
    overview.alarms = session.client.get({"alarms"});
    return overview;
}

/// The names under `key` of the rows of a list.
std::vector<std::string> namesOf(Json const& answer, char const* list, char const* key) {
    std::vector<std::string> names;
    for (Json const& row : rowsIn(answer, list))
        if (std::string name = textIn(row, key); !name.empty()) names.push_back(std::move(name));
    return names;
}

/// Every line by its ifIndex, as several boards may have lines of one name.
std::vector<std::string> allLines(Session& session) {
    std::vector<std::string> lines;
    Json const answer = session.client.get({"lines"});
    for (Json const& row : rowsIn(answer, "lines"))
        if (auto const index = numberIn(row, "ifIndex")) lines.push_back(std::to_string(*index));
    return lines;
}

std::vector<Json> readLines(Session& session, std::vector<std::string> const& lines) {
    std::vector<Json> answers;
    bool const asksForAll = lines.empty();
    for (std::string const& line : asksForAll ? allLines(session) : lines) {
        if (asksForAll) {
            // A board that has been pulled meanwhile has taken its lines along.
            if (auto answer = session.client.find({"lines", line}))
                answers.push_back(std::move(*answer));
        } else {
            answers.push_back(findNamed(session, "line", line));
        }
    }
    return answers;
}

} // namespace

int showOverview(Session& session) {
    Overview const overview = readOverview(session);
    if (session.asJson)
        printJson(session, {{"health", field(overview.health, "health")},
                            {"boards", rowsIn(overview.boards, "boards")},
                            {"lines", rowsIn(overview.lines, "lines")},
                            {"alarms", rowsIn(overview.alarms, "alarms")}});
    else
        printOverview(viewOf(session, overview.health), overview);
    return kSuccess;
}

int showList(Session& session, List const& list) {
    Json const answer = session.client.get({list.command});
    if (session.asJson)
        printJson(session, answer);
    else
        printList(viewOf(session, answer), list, answer);
    return kSuccess;
}

int showBoard(Session& session, std::string const& board) {
    Json const answer = findNamed(session, "board", board);
    if (session.asJson)
        printJson(session, answer);
    else
        printBoard(viewOf(session, answer), answer);
    return kSuccess;
}

int showLine(Session& session, std::string const& line) {
    Json const answer = findNamed(session, "line", line);
    if (session.asJson)
        printJson(session, answer);
    else
        printLine(viewOf(session, answer), answer);
    return kSuccess;
}

int showHealth(Session& session) {
    Json const answer = session.client.get({"health"});
    if (session.asJson)
        printJson(session, answer);
    else
        printFields(viewOf(session, answer), objectIn(answer, "health"));
    return kSuccess;
}

int showHistory(Session& session, std::vector<std::string> const& lines) {
    bool isFirst = true;
    for (Json const& answer : readLines(session, lines)) {
        if (session.asJson) {
            printJson(session, answer);
            continue;
        }
        if (!isFirst) session.out << '\n';
        isFirst = false;
        printHistory(viewOf(session, answer), readHistory(answer));
    }
    return kSuccess;
}

int exportHistory(Session& session, std::vector<std::string> const& lines) {
    std::vector<LineHistory> histories;
    for (Json const& answer : readLines(session, lines))
        histories.push_back(readHistory(answer));
    session.out << openMetrics(histories);
    return kSuccess;
}

int showJournal(Session& session, JournalOptions const& options) {
    std::string query = "limit=" + std::to_string(options.limit);
    if (options.after >= 0) query += "&after=" + std::to_string(options.after);
    std::int64_t last = std::max<std::int64_t>(options.after, 0);
    auto const print = [&](Json const& answer) {
        last = session.asJson ? printJournalJson(session.out, answer, last)
                              : printJournal(viewOf(session, answer), answer, last);
        session.out.flush();
    };
    Json const newest = session.client.get({"journal"}, query);
    if (!options.follow) {
        if (session.asJson)
            printJson(session, newest);
        else if (rowsIn(newest, "entries").empty())
            session.out << "no entries\n";
        else
            print(newest);
        return kSuccess;
    }

    print(newest);
    bool isAway = false;
    for (;;) {
        std::this_thread::sleep_for(std::chrono::duration<double>(options.interval));
        try {
            if (isAway && newestEntry(session.client.get({"journal"}, "limit=1")) < last)
                last = 0; // another journal has been begun
            print(session.client.get({"journal"}, "after=" + std::to_string(last)));
            isAway = false;
        } catch (CliError const& error) {
            if (error.status() != kNoAgent) throw;
            if (!isAway)
                session.errors << "kvloam: " << session.screen.clean(error.what()) << std::endl;
            isAway = true;
        }
        if (!session.out) return kFailure;
    }
}

int runCheck(Session& session, CheckLimits const& limits) {
    CheckResult result;
    try {
        result = check(readOverview(session), limits);
    } catch (CliError const& error) {
        result = unknownResult(error.what());
    }
    int const status = static_cast<int>(result.state);
    if (session.asJson)
        printJson(session, {{"status", status}, {"text", result.text}});
    else
        session.out << result.text;
    return status;
}

int showTables(Session& session) {
    Json const answer = session.client.get({"tables"});
    if (session.asJson) {
        printJson(session, answer);
        return kSuccess;
    }
    for (std::string const& name : textsIn(answer, "tables"))
        session.out << session.screen.clean(name) << '\n';
    return kSuccess;
}

int showTable(Session& session, std::string const& table) {
    requireName(table, "table");
    auto const answer = session.client.find({"tables", table});
    if (!answer)
        throw CliError(kFailure, "there is no table " + table + "; kvloam tables lists them");
    if (session.asJson)
        printJson(session, *answer);
    else
        printTable(viewOf(session, *answer), *answer);
    return kSuccess;
}

int showScalars(Session& session) {
    Json const answer = session.client.get({"scalars"});
    if (session.asJson) {
        printJson(session, answer);
        return kSuccess;
    }
    std::vector<std::pair<std::string, Cell>> pairs;
    for (auto const& [name, value] : objectIn(answer, "scalars").items())
        pairs.emplace_back(name, Cell{valueText(value)});
    printPairs(session.out, session.screen, pairs);
    return kSuccess;
}

int makeTargets(Session& session, std::string const& input, std::string const& output, int port) {
    std::ifstream file;
    if (!input.empty()) {
        file.open(input);
        if (!file) throw CliError(kFailure, input + ": cannot be read");
    }
    std::string const text = input.empty() ? discoveryFile(std::cin, "standard input", port)
                                           : discoveryFile(file, input, port);
    if (output.empty())
        session.out << text;
    else
        replaceFile(output, text);
    return kSuccess;
}

int printNames(Session& session, std::string const& kind) {
    try {
        std::vector<std::string> names;
        if (kind == "board")
            names = namesOf(session.client.get({"boards"}), "boards", "serialNumber");
        else if (kind == "line")
            names = namesOf(session.client.get({"lines"}), "lines", "name");
        else
            names = textsIn(session.client.get({"tables"}), "tables");
        for (std::string const& name : names)
            // A shell splits the names at blanks, and must not run anything in them.
            if (name.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                       "0123456789._+:@/,-") == std::string::npos)
                session.out << name << '\n';
        return kSuccess;
    } catch (CliError const& error) {
        return error.status();
    }
}

} // namespace kvloam
