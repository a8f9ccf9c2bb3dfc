// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Table.h"

#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "cli/Text.h"

namespace {

using kvloam::Align;
using kvloam::Paint;
using kvloam::Screen;
using kvloam::Table;

Screen screenOf(std::size_t width) {
    Screen screen;
    screen.width = width;
    return screen;
}

std::string print(Table const& table, Screen const& screen) {
    std::ostringstream out;
    table.print(out, screen);
    return out.str();
}

Table sample() {
    Table table({{"BOARD", 0}, {"SLOT", 2, Align::Right}, {"ERROR", 1, Align::Left, 8}});
    table.add({{"NX50001"}, {"4"}, {"does not answer"}});
    table.add({{"Köln"}, {"12"}, {""}});
    return table;
}

TEST(TableTest, ColumnsAreAsWideAsTheirContents) {
    EXPECT_EQ(print(sample(), {}), "BOARD    SLOT  ERROR\n"
                                   "NX50001     4  does not answer\n"
                                   "Köln       12\n");
}

TEST(TableTest, TheLeastImportantColumnIsLeftOutFirst) {
    EXPECT_EQ(print(sample(), screenOf(29)), "BOARD    ERROR\n"
                                             "NX50001  does not answer\n"
                                             "Köln\n");
}

TEST(TableTest, ColumnsThatMayBeCutAreCutBeforeTheyAreLeftOut) {
    EXPECT_EQ(print(sample(), screenOf(18)), "BOARD    ERROR\n"
                                             "NX50001  does not…\n"
                                             "Köln\n");
    EXPECT_EQ(print(sample(), screenOf(16)), "BOARD\n"
                                             "NX50001\n"
                                             "Köln\n");
}

TEST(TableTest, TheFirstColumnIsCutAtLast) {
    EXPECT_EQ(print(sample(), screenOf(4)), "BOA…\nNX5…\nKöln\n");
}

TEST(TableTest, NoLineIsEverWiderThanTheScreen) {
    Table table(
        {{"A", 0}, {"B", 3}, {"C", 1, Align::Left, 4}, {"D", 2, Align::Right, 2}, {"E", 3}});
    table.add({{"東京都庁"}, {"one"}, {"a long text"}, {"123456"}, {"e\u0301e\u0301"}});
    table.add({{"x"}, {"twenty-two"}, {"-"}, {"1"}, {"-"}});
    for (std::size_t width = 1; width < 60; ++width) {
        std::istringstream lines(print(table, screenOf(width)));
        int count = 0;
        for (std::string line; std::getline(lines, line); ++count)
            EXPECT_LE(kvloam::width(line), width) << line;
        EXPECT_EQ(count, 3);
    }
}

TEST(TableTest, TextsOfOthersAreCleaned) {
    Table table({{"NAME", 0}});
    table.add({{"a\033[31m\nb"}});
    EXPECT_EQ(print(table, {}), "NAME\na?[31m b\n");
}

TEST(TableTest, ColoursAreForScreensThatHaveThem) {
    Table table({{"STATE", 0}, {"X", 1}});
    table.add({{"failed", Paint::Bad}, {"1"}});
    Screen screen;
    EXPECT_EQ(print(table, screen).find('\033'), std::string::npos);
    screen.hasColours = true;
    EXPECT_EQ(print(table, screen),
              "\033[1mSTATE\033[0m   \033[1mX\033[0m\n\033[1;31mfailed\033[0m  1\n");
}

TEST(TableTest, PairsStandBelowEachOther) {
    std::ostringstream out;
    kvloam::printPairs(out, screenOf(14), {{"a", {"1"}}, {"board", {"does not answer"}}});
    EXPECT_EQ(out.str(), "a      1\nboard  does n…\n");
}

} // namespace
