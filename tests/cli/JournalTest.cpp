// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Journal.h"

#include <cstdlib>
#include <ctime>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "cli/Session.h"
#include "cli/Text.h"
#include "tests/cli/Samples.h"

namespace {

using kvloam::readAnswer;
using kvloam::Screen;

std::string print(std::string const& answer, Screen const& screen = {}) {
    setenv("TZ", "UTC", 1);
    tzset();
    std::ostringstream out;
    kvloam::printJournal({out, screen, {}}, readAnswer(answer), 0);
    return out.str();
}

TEST(JournalTest, EntriesAreLines) {
    EXPECT_EQ(print(samples::kJournal),
              "2026-11-22 17:00:00  agentStarted                 started\n"
              "2026-11-22 17:19:00  alarmRaised   critical       boardFailed on board Z70002: the "
              "board has "
              "failed\n");
}

TEST(JournalTest, EntriesAreCutToTheScreen) {
    for (std::size_t width = 1; width < 80; ++width) {
        Screen screen;
        screen.width = width;
        std::istringstream lines(print(samples::kJournal, screen));
        for (std::string line; std::getline(lines, line);)
            EXPECT_LE(kvloam::width(line), width);
    }
}

TEST(JournalTest, TextsOfOthersAreCleaned) {
    EXPECT_EQ(print(R"({"entries":[{"text":"a\u001b]0;x\u0007\nb","event":"\u001b[1m"}]})"),
              "-                    ?[1m                         a?]0;x? b\n");
}

TEST(JournalTest, TheHighestNumberIsKnown) {
    EXPECT_EQ(kvloam::newestEntry(readAnswer(samples::kJournal)), 8);
    EXPECT_EQ(kvloam::newestEntry(readAnswer(R"({"entries":[{"number":"x"}]})")), 0);
    std::ostringstream out;
    EXPECT_EQ(kvloam::printJournalJson(out, readAnswer(samples::kJournal), 3), 8);
    EXPECT_EQ(kvloam::printJournalJson(out, readAnswer(R"({"entries":[]})"), 9), 9);
}

TEST(WatchTest, TheScreenIsDrawnAnewWithinItsHeight) {
    Screen screen;
    screen.height = 3;
    EXPECT_EQ(kvloam::redrawn(screen, "a\nb\nc\nd\n"), "\033[Ha\033[K\nb\033[K\n\033[J");
}

} // namespace
