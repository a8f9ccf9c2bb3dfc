// SPDX-License-Identifier: BSD-2-Clause
// The columns of DS1-MIB and the intervals of its lines, as the real agent serves them.
#include <string>

#include <gmock/gmock.h>

#include "tests/e2e/InterfaceFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::SizeIs;

class LineTablesTest : public InterfaceFixture {};

TEST_F(LineTablesTest, LineHasTheColumnsThatItCanAnswer) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-1");
    EXPECT_EQ(line, "1000");
    EXPECT_EQ(at(c(kIf, 1), line), "INTEGER: 1000");
    EXPECT_EQ(at(c(kIf, 5), line), "Gauge32: 1544000");
    EXPECT_EQ(at(c(kIf, 7), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kIf, 8), line), "INTEGER: 1");
    EXPECT_THAT(at(c(kIf, 9), line), HasSubstr("Timeticks: (0)"));
    EXPECT_EQ(at(c(kIfX, 14), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kIfX, 15), line), "Gauge32: 2");
    EXPECT_EQ(at(c(kIfX, 17), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kIfX, 18), line), "\"\"");
    EXPECT_EQ(at(c(kIf, 6), line), "STRING: \"T1-0001\"");
    // A line carries bits, not packets, so it has no packet counters.
    for (int const number : {4, 10, 11, 20})
        EXPECT_THAT(at(c(kIf, number), line), HasSubstr("No Such Instance"));
    EXPECT_THAT(at(c(kIfX, 6), line), HasSubstr("No Such Instance"));
}

TEST_F(LineTablesTest, BrokenLineShowsInItsStatusAndIsDown) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-2");
    EXPECT_EQ(at(c(kConfig, 10), line), "INTEGER: 1"); // no alarm
    sim({"line", "alarm", "102", "los"});
    EXPECT_TRUE(eventually([&] { return (numberIn(at(c(kConfig, 10), line)) & 64) != 0; }));
    EXPECT_TRUE(eventually([&] { return at(c(kIf, 8), line) == "INTEGER: 2"; }));
    EXPECT_EQ(at(c(kIf, 8), lineNamed("nx5-trunk-1")), "INTEGER: 1");
    // The line counts, and reports the time of the failure.
    EXPECT_TRUE(eventually([&] { return numberIn(at(c(kCurrent, 5), line)) > 0; }));
    EXPECT_THAT(at(c(kConfig, 16), line), HasSubstr("Timeticks: ("));
    sim({"line", "mend", "102"});
    EXPECT_TRUE(eventually([&] { return at(c(kConfig, 10), line) == "INTEGER: 1"; }));
    EXPECT_TRUE(eventually([&] { return at(c(kIf, 8), line) == "INTEGER: 1"; }));
}

TEST_F(LineTablesTest, SetUpOfALineIsShown) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-1");
    EXPECT_EQ(at(c(kConfig, 1), line), "INTEGER: " + line);
    EXPECT_EQ(at(c(kConfig, 5), line), "INTEGER: 2"); // ESF
    EXPECT_EQ(at(c(kConfig, 6), line), "INTEGER: 2"); // B8ZS
    EXPECT_EQ(at(c(kConfig, 8), line), "STRING: \"T1-0001\"");
    EXPECT_EQ(at(c(kConfig, 15), line), "INTEGER: 40");
    EXPECT_EQ(at(c(kConfig, 17), line), "INTEGER: 2");
    EXPECT_EQ(at(c(kConfig, 18), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kConfig, 20), lineNamed("vorn-primary-rate-1")), "INTEGER: 2");
    EXPECT_EQ(column(c(kConfig, 22)).size(), 5U);
}

TEST_F(LineTablesTest, LineWithAPastHasItsIntervals) {
    startWithFullHistory();
    std::string const line = lineNamed("nx5-trunk-1");
    EXPECT_EQ(at(c(kConfig, 14), line), "INTEGER: 1");
    auto const numbers = column(c(kInterval, 2));
    EXPECT_THAT(numbers, SizeIs(96)); // the other lines have closed none
    EXPECT_EQ(numbers.at(line + ".1"), "INTEGER: 1");
    EXPECT_EQ(numbers.at(line + ".96"), "INTEGER: 96");
    EXPECT_EQ(at(c(kInterval, 13), line + ".95"), "INTEGER: 1");
    EXPECT_EQ(at(c(kInterval, 13), line + ".96"), "INTEGER: 2");
    EXPECT_THAT(at(c(kInterval, 3), line + ".97"), HasSubstr("No Such Instance"));
    EXPECT_EQ(at(c(kConfig, 4), lineNamed("nx5-trunk-2")), "INTEGER: 0");
}

TEST_F(LineTablesTest, PastOfALineShowsInTheIntervalsThatItWasIn) {
    startWithFullHistory();
    // The signal was lost for 240 seconds, 50400 seconds ago: in interval 56, or in two
    // neighbouring intervals.
    auto const unavailable = column(c(kInterval, 6));
    std::string const line = lineNamed("nx5-trunk-1");
    long seconds = 0;
    for (int const number : {55, 56, 57})
        seconds += numberIn(unavailable.at(line + "." + std::to_string(number)));
    EXPECT_EQ(seconds, 240);
    EXPECT_EQ(unavailable.at(line + ".50"), "Gauge32: 0");
}

TEST_F(LineTablesTest, TotalsAreTheSumsOfTheClosedIntervals) {
    startWithFullHistory();
    std::string const line = lineNamed("nx5-trunk-1");
    for (int counter = 2; counter <= 11; ++counter) {
        long sum = 0;
        for (auto const& [index, value] : column(c(kInterval, counter + 1)))
            sum += numberIn(value);
        EXPECT_EQ(at(c(kTotal, counter), line), "Gauge32: " + std::to_string(sum)) << counter;
    }
    EXPECT_EQ(at(c(kTotal, 2), lineNamed("nx5-trunk-2")), "Gauge32: 0");
}

TEST_F(LineTablesTest, TimeOfTheRunningIntervalGoesOn) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-2");
    long const before = numberIn(at(c(kConfig, 3), line));
    EXPECT_GE(before, 0);
    EXPECT_TRUE(eventually([&] { return numberIn(at(c(kConfig, 3), line)) > before; }));
}

TEST_F(LineTablesTest, BulkWalksOfAnySizeAgreeWithTheWalk) {
    startWithFullHistory();
    auto const walked = walk("1.3.6.1.2.1.10.18.8");
    ASSERT_THAT(walked, SizeIs(13 * 95 + 3)); // the oldest has no counts
    for (char const* const repetitions : {"-Cr1", "-Cr7", "-Cr50"})
        EXPECT_EQ(answers("snmpbulkwalk", {repetitions, "1.3.6.1.2.1.10.18.8"}), walked)
            << repetitions;
}

} // namespace
} // namespace kvloamd::e2e
