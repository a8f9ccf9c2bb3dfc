// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes what kvloam makes of an agent's answers. The input is an octet that chooses what is shown,
// one that is the screen's width, and the answer.
#include <algorithm>
#include <sstream>
#include <string>

#include "cli/Check.h"
#include "cli/Details.h"
#include "cli/History.h"
#include "cli/Journal.h"
#include "cli/Lists.h"
#include "cli/Summary.h"
#include "cli/Text.h"
#include "tests/fuzz/FuzzInput.h"

namespace {

using namespace kvloam;

/// Shows the answer in the way of this number.
void show(std::size_t way, View const& view, Json const& answer) {
    Overview const overview{answer, answer, answer, answer};
    switch (way) {
    case 0:
        printBoard(view, answer);
        break;
    case 1:
        printLine(view, answer);
        break;
    case 2:
        printHistory(view, readHistory(answer));
        break;
    case 3:
        view.out << openMetrics({readHistory(answer)});
        break;
    case 4:
        printJournal(view, answer, 0);
        break;
    case 5:
        printOverview(view, overview);
        break;
    case 6:
        view.out << check(overview, {}).text;
        break;
    case 7:
        printTable(view, answer);
        break;
    case 8:
        view.out << jsonText(answer) << '\n';
        break;
    default:
        printList(view, lists()[way - 9], answer);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    fuzz::FuzzInput input(octets, size);
    std::size_t const way = input.choice(9 + lists().size());
    Screen screen;
    screen.width = 1U + input.octet();
    screen.height = 24;
    std::ostringstream out;
    try {
        Json const answer = readAnswer(input.rest());
        show(way, {out, screen, timeOf(answer)}, answer);
    } catch (CliError const& error) {
        fuzz::require(*error.what() != '\0', "an error has a reason");
    }
    std::istringstream lines(out.str());
    // What is for programs is as wide as it is; a plot and our own words have a least width.
    bool const mustFit = way != 3 && way != 6 && way != 8;
    for (std::string line; std::getline(lines, line);) {
        fuzz::require(printable(line) == line, "a line has printable characters only");
        fuzz::require(!mustFit || width(line) <= std::max<std::size_t>(screen.width, 30),
                      "a line fits the screen");
    }
    return 0;
}
