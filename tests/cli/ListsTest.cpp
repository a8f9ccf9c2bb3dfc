// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Lists.h"

#include <sstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cli/Cells.h"
#include "cli/Details.h"
#include "tests/cli/Samples.h"

namespace {

using kvloam::Json;
using kvloam::Paint;
using kvloam::readAnswer;
using kvloam::Screen;
using testing::HasSubstr;
using testing::Not;

class ListsTest : public testing::Test {
  protected:
    std::string list(char const* command, std::string const& answer) {
        std::ostringstream out;
        Json const read = readAnswer(answer);
        kvloam::printList({out, m_screen, kvloam::timeOf(read)}, kvloam::listNamed(command), read);
        return out.str();
    }
    template <class Print>
    std::string print(Print printAnswer, std::string const& answer) {
        std::ostringstream out;
        Json const read = readAnswer(answer);
        printAnswer({out, m_screen, kvloam::timeOf(read)}, read);
        return out.str();
    }

    Screen m_screen;
};

TEST_F(ListsTest, BoardsAreShownWithStateAndAge) {
    m_screen.width = 80;
    EXPECT_EQ(list("boards", samples::kBoards),
              "BOARD    INDEX  STATE    MODEL   NAME    SHELF  SLOT   AGE  ERROR\n"
              "NX50001      1  started  NX5-T1  NX5-T1      1     4   9 h  -\n"
              "Z70002       2  failed   Z7-E1   Z7-E1       1     5  63 s  does not answer\n");
}

TEST_F(ListsTest, LinesAreShownWithNamesOfTheirStatus) {
    m_screen.width = 60;
    EXPECT_EQ(list("lines", samples::kLines),
              "LINE         BOARD    STATUS        TYPE  ES  SES  UAS\n"
              "nx5-trunk-1  NX50001  LossOfSignal  ESF    3    1    0\n"
              "nx5-trunk-2  NX50001  NoAlarm       ESF    3    1    0\n");
}

TEST_F(ListsTest, TheGravestAlarmComesFirst) {
    std::string const text = list("alarms", samples::kAlarms);
    ASSERT_THAT(text, HasSubstr("dsx1RcvFarEndLOF"));
    EXPECT_LT(text.find("boardFailed"), text.find("dsx1RcvFarEndLOF"));
}

TEST_F(ListsTest, AnEmptyListIsSaidInWords) {
    EXPECT_EQ(list("alarms", samples::kNoAlarms), "no alarms\n");
}

TEST_F(ListsTest, EveryListPrintsRowsWithoutAnyField) {
    for (auto const& one : kvloam::lists()) {
        std::string rows;
        for (auto const& section : one.sections)
            rows += std::string(rows.empty() ? "" : ",") + "\"" + section.key + "\":[{}]";
        EXPECT_THAT(list(one.command, "{" + rows + "}"), HasSubstr("-")) << one.command;
        EXPECT_THROW(list(one.command, "{}"), kvloam::CliError) << one.command;
    }
}

TEST_F(ListsTest, EveryListPrintsRowsOfWrongTypes) {
    for (auto const& one : kvloam::lists())
        for (char const* value : {"1e300", "-1", "[[[]]]", "{}", "true", "\"\\u001b[2J\"", "[1]"}) {
            std::string rows;
            for (auto const& section : one.sections) {
                rows += std::string(rows.empty() ? "" : ",") + "\"" + section.key + "\":[{";
                std::string fields;
                for (char const* key : {"name", "serialNumber", "status", "lineStatus", "date",
                                        "current", "total", "severity", "speed", "changeDate"})
                    fields += std::string(fields.empty() ? "" : ",") + "\"" + key + "\":" + value;
                rows += fields + "}]";
            }
            EXPECT_THAT(list(one.command, "{" + rows + "}"), Not(HasSubstr("\033")));
        }
}

TEST_F(ListsTest, ABoardIsShownWithItsLinesAndDevices) {
    std::string const text =
        print(kvloam::printBoard,
              samples::answer("\"board\":" + samples::kFailedBoard + ",\"lines\":[" +
                              samples::line("z7-1", 5, "dsx1NoAlarm") +
                              R"(}],"devices":[{"name":"trunk","auid":7}],"processors":[])"));
    EXPECT_THAT(text, HasSubstr("Board Z70002: failed\n"));
    EXPECT_THAT(text, HasSubstr("error message     does not answer\n"));
    EXPECT_THAT(text, HasSubstr("(63 s ago)"));
    EXPECT_THAT(text, HasSubstr("\nLines\n"));
    EXPECT_THAT(text, HasSubstr("z7-1"));
    EXPECT_THAT(text, HasSubstr("\nDevices\n"));
    EXPECT_THAT(text, Not(HasSubstr("Processors")));
}

TEST_F(ListsTest, ALineIsShownWithItsCounters) {
    std::string const text = print(kvloam::printLine, samples::kLine);
    EXPECT_THAT(text, HasSubstr("Line nx5-trunk-1: LossOfSignal\n"));
    EXPECT_THAT(text, HasSubstr("line status last change  20 min\n"));
    EXPECT_THAT(text, HasSubstr("LAST 412 S"));
    EXPECT_THAT(text, HasSubstr("path coding violations"));
}

TEST_F(ListsTest, ALineWithoutCountersSaysSo) {
    EXPECT_THAT(print(kvloam::printLine, R"({"line":{"name":"x","current":null}})"),
                HasSubstr("keeps no counters"));
}

TEST_F(ListsTest, AnyTableIsShownByItsNames) {
    EXPECT_EQ(
        print(kvloam::printTable,
              R"({"table":"t","rows":[{"index":[1,2],"kvlA":"x","kvlB":null,"kvlC":["a","b"]}]})"),
        "index  kvlA  kvlB  kvlC\n[1,2]  x     -     a, b\n");
}

TEST(CellsTest, KeysBecomeWords) {
    EXPECT_EQ(kvloam::keyWords("boardTableLastChangeSeconds"), "board table last change");
    EXPECT_EQ(kvloam::keyWords("ifIndex"), "if index");
    EXPECT_EQ(kvloam::keyWords("assetID"), "asset ID");
    EXPECT_EQ(kvloam::keyWords("isFRU"), "is FRU");
    EXPECT_EQ(kvloam::keyWords(""), "");
}

TEST(CellsTest, NamesLoseTheirModulesPrefix) {
    EXPECT_EQ(kvloam::shortName("dsx1ESF"), "ESF");
    EXPECT_EQ(kvloam::shortName("dsx1"), "dsx1");
    EXPECT_EQ(kvloam::shortName("started"), "started");
}

TEST(CellsTest, LoopbacksAreNoFailures) {
    auto const paint = [](char const* status) {
        return kvloam::lineStatus(readAnswer(R"({"lineStatus":)" + std::string(status) + "}"))
            .paint;
    };
    EXPECT_EQ(paint(R"(["dsx1NoAlarm"])"), Paint::Good);
    EXPECT_EQ(paint(R"(["dsx1LoopbackState"])"), Paint::Warning);
    EXPECT_EQ(paint(R"(["dsx1LoopbackState","dsx1LossOfFrame"])"), Paint::Bad);
    EXPECT_EQ(paint("null"), Paint::Warning);
}

TEST(CellsTest, SpansOfAnyLengthAreShown) {
    auto const text = [](std::string const& value) {
        return kvloam::fieldText(readAnswer("{\"xSeconds\":" + value + "}"), "xSeconds", {});
    };
    EXPECT_EQ(text("7300.5"), "2 h");
    EXPECT_EQ(text("-1"), "0 s");
    EXPECT_EQ(text("1e308"), "11574074 d");
    EXPECT_EQ(text("null"), "-");
}

} // namespace
