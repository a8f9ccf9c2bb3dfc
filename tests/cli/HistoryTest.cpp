// SPDX-License-Identifier: BSD-2-Clause
#include "cli/History.h"

#include <algorithm>
#include <cstdlib>
#include <ctime>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cli/Text.h"
#include "tests/cli/Samples.h"

namespace {

using kvloam::LineHistory;
using kvloam::readAnswer;
using kvloam::readHistory;
using kvloam::Screen;
using testing::HasSubstr;
using testing::Not;

class HistoryTest : public testing::Test {
  protected:
    HistoryTest() {
        setenv("TZ", "UTC", 1);
        tzset();
    }

    static std::string print(LineHistory const& history, std::size_t width, bool hasUtf8 = true) {
        std::ostringstream out;
        Screen screen;
        screen.width = width;
        screen.hasUtf8 = hasUtf8;
        kvloam::printHistory({out, screen, {}}, history);
        return out.str();
    }
    static std::vector<std::string> linesOf(std::string const& text) {
        std::istringstream in(text);
        std::vector<std::string> lines;
        for (std::string line; std::getline(in, line);)
            lines.push_back(line);
        return lines;
    }
    /// A line with all 96 intervals. Those in `errored` have one errored second, the others none.
    static LineHistory wholeDay(std::vector<int> const& errored) {
        std::string intervals;
        for (int number = 1; number <= 96; ++number)
            intervals += std::string(number > 1 ? "," : "") +
                         "{\"number\":" + std::to_string(number) +
                         ",\"es\":" + (std::ranges::count(errored, number) > 0 ? "1" : "0") +
                         ",\"ses\":0,\"uas\":0}";
        return readHistory(readAnswer("{\"time\":\"2026-11-22T17:20:03Z\",\"line\":{\"name\":\"x\","
                                      "\"timeElapsed\":303,\"intervals\":[" +
                                      intervals + "]}}"));
    }
};

TEST_F(HistoryTest, IntervalsAreReadByTheirNumber) {
    LineHistory const history = readHistory(readAnswer(samples::kLine));
    EXPECT_EQ(history.name, "nx5-trunk-1");
    EXPECT_EQ(history.board, "NX50001");
    EXPECT_TRUE(history.intervals[95]);
    EXPECT_FALSE(history.intervals[94]); // without data
    EXPECT_FALSE(history.intervals[93]); // missing
    EXPECT_TRUE(history.intervals[92]);
    EXPECT_EQ(kvloam::localDate(history.end), "2026-11-22 17:15:00");
}

TEST_F(HistoryTest, TimesFollowFromTheRunningIntervalWhereNoneAreGiven) {
    LineHistory const history = wholeDay({});
    EXPECT_EQ(kvloam::localDate(history.end), "2026-11-22 17:15:00");
    EXPECT_EQ(kvloam::localDate(history.intervals[95]->begin), "2026-11-22 17:00:00");
    EXPECT_EQ(kvloam::localDate(history.intervals[0]->begin), "2026-11-21 17:15:00");
}

TEST_F(HistoryTest, GapsAreGapsInTheBaseLine) {
    auto const lines = linesOf(print(readHistory(readAnswer(samples::kLine)), 120));
    std::string const gap92(92, ' ');
    ASSERT_EQ(lines.size(), 16U);
    EXPECT_EQ(lines[0], "Line nx5-trunk-1 of board NX50001, until 2026-11-22 17:15:00, a column is "
                        "15 min");
    EXPECT_EQ(lines[1], "Errored seconds (ES): 3");
    EXPECT_EQ(lines[2], "   3 ┤" + std::string(95, ' ') + "█");
    EXPECT_EQ(lines[6], "   0 ┤" + gap92 + "─  ─");
    // No unavailable second: only the base line.
    EXPECT_EQ(lines[13], "Unavailable seconds (UAS): 0");
    EXPECT_EQ(lines[14], "   0 ┤" + gap92 + "─  ─");
}

TEST_F(HistoryTest, OneErroredSecondShowsBesideMany) {
    auto history = wholeDay({1, 96});
    history.intervals[95]->counts["es"] = 900;
    auto const lines = linesOf(print(history, 120));
    EXPECT_EQ(lines[5], "     ┤▁" + std::string(94, ' ') + "█");
}

TEST_F(HistoryTest, ColumnsShareIntervalsOnANarrowScreen) {
    auto history = wholeDay({1});
    history.intervals[0].reset();
    std::string const text = print(history, 80);
    EXPECT_THAT(text, HasSubstr("a column is 30 min"));
    // The first column lacks one of its two intervals.
    EXPECT_THAT(text, HasSubstr("   0 ┤╌─"));
    EXPECT_THAT(text, HasSubstr("17:15       23:15       05:15       11:15  17:15"));
}

TEST_F(HistoryTest, ItFitsEveryScreen) {
    LineHistory const history = wholeDay({1, 50});
    for (std::size_t width = 20; width < 130; ++width)
        for (bool const hasUtf8 : {true, false})
            for (std::string const& line : linesOf(print(history, width, hasUtf8)))
                EXPECT_LE(kvloam::width(line), width) << line;
}

TEST_F(HistoryTest, AsciiScreensGetAnAsciiPlot) {
    std::string const text = print(wholeDay({1}), 120, false);
    EXPECT_EQ(kvloam::printableAscii(text).find('?'), std::string::npos);
    EXPECT_THAT(text, HasSubstr("   1 |" + std::string(95, ' ') + "#\n"));
}

TEST_F(HistoryTest, ALineWithoutIntervalsSaysSo) {
    EXPECT_THAT(print(readHistory(readAnswer(R"({"line":{"name":"x","intervals":[]}})")), 80),
                HasSubstr("no closed intervals"));
}

TEST_F(HistoryTest, SamplesHaveTheTimeOfTheIntervalsEnd) {
    std::string const text = kvloam::openMetrics({readHistory(readAnswer(samples::kLine))});
    EXPECT_THAT(text,
                testing::StartsWith(
                    "# TYPE kvloam_line_interval_errored_seconds gauge\n"
                    "# UNIT kvloam_line_interval_errored_seconds seconds\n"
                    "# HELP kvloam_line_interval_errored_seconds Seconds with errors in the 15 "
                    "minutes that end at the sample's time.\n"
                    "kvloam_line_interval_errored_seconds{board=\"NX50001\",line=\"nx5-trunk-"
                    "1\"} 0 1795365000\n"
                    "kvloam_line_interval_errored_seconds{board=\"NX50001\",line=\"nx5-trunk-"
                    "1\"} 3 1795367700\n"
                    "# TYPE kvloam_line_interval_severely_errored_seconds gauge\n"));
    EXPECT_THAT(text, testing::EndsWith("\n# EOF\n"));
}

TEST_F(HistoryTest, LabelsOfOthersCannotBreakTheText) {
    std::string const text = kvloam::openMetrics({readHistory(
        readAnswer(R"({"line":{"name":"a\"} 1\nx{y=\"\\","intervals":[{"number":1,"es":2}]}})"))});
    EXPECT_THAT(text, HasSubstr(R"(line="a\"} 1 x{y=\"\\"} 2 )"));
}

TEST_F(HistoryTest, SamplesOfOneSeriesAscend) {
    std::string const text = kvloam::openMetrics(
        {readHistory(readAnswer(R"({"line":{"name":"x","intervals":[)"
                                R"({"number":2,"start":"2026-11-22T17:00:00Z","es":1},)"
                                R"({"number":1,"start":"2026-11-22T16:00:00Z","es":2}]}})"))});
    EXPECT_THAT(text, HasSubstr("} 1 1795367700\n"));
    EXPECT_THAT(text, Not(HasSubstr("} 2 ")));
}

TEST_F(HistoryTest, IntervalsOfWrongTypesAreGaps) {
    for (char const* interval : {"{}", R"({"number":0,"es":1})", R"({"number":97,"es":1})",
                                 R"({"number":"1"})", R"({"number":1e300})", R"({"number":-1})"})
        EXPECT_TRUE(
            readHistory(readAnswer(R"({"line":{"intervals":[)" + std::string(interval) + "]}}"))
                .isEmpty())
            << interval;
    EXPECT_THROW(readHistory(readAnswer(R"({"line":{"intervals":[1]}})")), kvloam::CliError);
    EXPECT_THROW(readHistory(readAnswer(R"({"line":[]})")), kvloam::CliError);
    // Counts of wrong types are unknown.
    auto const odd = readHistory(readAnswer(
        R"({"line":{"name":"x","intervals":[{"number":1,"es":"2","ses":-5,"uas":99999999999}]}})"));
    EXPECT_THAT(print(odd, 80), HasSubstr("Errored seconds (ES): not known"));
}

} // namespace
