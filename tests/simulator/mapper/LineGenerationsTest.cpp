// SPDX-License-Identifier: BSD-2-Clause
// Which boards' lines have changed, as a client of the device mapper asks it.
#include <cstring>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "boardplatform/dm_client.h"
#include "boardplatform/ds1_line.h"
#include "simulator/exports/Control.h"
#include "tests/simulator/LineClock.h"

namespace {

using nlohmann::json;
using support::LineClock;
using namespace std::chrono_literals;

/// Board 1 has line 10, which slips twice a second, and line 11, whose errors are over.
class LineGenerationsTest : public testing::Test {
  protected:
    LineGenerationsTest() {
        kvlsim::loadChassis("boards: [{handle: 1, attributes: {SERIAL_NUMBER: S1}, devices: ["
                            "{handle: 10, type: 501, line: {type: d4, errors: {slips: 2}}}, "
                            "{handle: 11, type: 501, line: {type: e1, past: {seconds: 40, "
                            "errors: {path-violations: 0.3}}}}]}]");
    }

    /// The records of an attribute; none if the object does not have it.
    template <class Record>
    static std::vector<Record> records(long object, char const* name, std::size_t capacity = 1024) {
        std::vector<Record> all(capacity / sizeof(Record) + 1);
        DMAttribute request{name, all.data(), 0, 0, static_cast<std::int32_t>(capacity)};
        dm_getDeviceMapperClient()->GetAttributes(object, 1, &request);
        all.resize(static_cast<std::size_t>(request.size) / sizeof(Record));
        return all;
    }
    static std::vector<DS1BoardLine> lines() { return records<DS1BoardLine>(1, kDS1BoardCounters); }
    static std::vector<DS1BoardGeneration> generations(std::size_t capacity = 1024) {
        long root = 0;
        EXPECT_EQ(dm_getDeviceMapperClient()->GetRootObject(&root), 0);
        return records<DS1BoardGeneration>(root, kDS1LineGenerations, capacity);
    }
    /// The generation of board 1, which comes first in the answer.
    static std::uint64_t generation() { return generations().at(0).generation; }

    static void run(std::string const& command) {
        json const reply = kvlsim::execute(json::parse(command));
        ASSERT_EQ(reply["ok"], true) << reply;
    }
    static void makeSteady() { run(R"({"command": "line-mend", "line": 10})"); }
    static void insert(int board, int line) {
        run(R"({"command": "insert", "board": {"handle": )" + std::to_string(board) +
            R"(, "attributes": {"SERIAL_NUMBER": "S)" + std::to_string(board) +
            R"("}, "devices": [{"handle": )" + std::to_string(line) +
            R"(, "type": 501, "line": {"type": "esf"}}]}})");
    }

    LineClock clock;
};

TEST_F(LineGenerationsTest, LinesThatCountHaveNone) {
    EXPECT_EQ(generation(), 0U);
    makeSteady();
    EXPECT_NE(generation(), 0U);
    for (std::string const alarm : {"los", "lof", "ais"}) {
        std::string const command =
            R"({"command": "line-alarm", "line": 11, "alarm": ")" + alarm + '"';
        run(command + '}');
        EXPECT_EQ(generation(), 0U) << alarm;
        run(command + R"(, "clear": true})");
        EXPECT_NE(generation(), 0U) << alarm;
    }
    run(R"({"command": "line-rates", "line": 11, "rates": {"slips": 0.001}})");
    EXPECT_EQ(generation(), 0U);
}

TEST_F(LineGenerationsTest, EveryChangeOfALineBeginsOne) {
    makeSteady();
    std::uint64_t last = generation();
    for (char const* command : {
             R"({"command": "line-errors", "line": 10, "errors": {"slips": 1}})",
             R"({"command": "line-errors", "line": 11, "errors": {"path-violations": 1}})",
             R"({"command": "line-alarm", "line": 10, "alarm": "rai"})",
             R"({"command": "line-alarm", "line": 11, "alarm": "loopback"})",
             R"({"command": "line-mend", "line": 11})",
         }) {
        clock.advance(1500ms);
        EXPECT_EQ(generation(), last) << "without a change";
        run(command);
        EXPECT_NE(generation(), last) << command;
        EXPECT_NE(generation(), 0U) << command;
        last = generation();
    }
}

TEST_F(LineGenerationsTest, CountersOfOneDifferInTheirSecondsOnly) {
    makeSteady();
    auto before = lines();
    std::uint64_t const then = generation();
    for (int i = 0; i < 50; ++i) {
        clock.advance(300ms);
        auto const now = lines();
        std::uint32_t const passed = now[0].counters.seconds - before[0].counters.seconds;
        for (DS1BoardLine& line : before)
            line.counters.seconds += passed;
        EXPECT_EQ(std::memcmp(now.data(), before.data(), 2 * sizeof(DS1BoardLine)), 0);
        EXPECT_EQ(generations()[0].seconds, now[0].counters.seconds);
        EXPECT_EQ(generation(), then);
    }
}

TEST_F(LineGenerationsTest, BoardsWithLinesHaveThemInTheOrderOfTheirHandles) {
    insert(300, 30);
    insert(200, 20);
    run(R"({"command": "insert", "board": {"handle": 400, "attributes": {"SERIAL_NUMBER": "S4"}}})");
    clock.advance(3s);
    auto all = generations();
    ASSERT_EQ(all.size(), 3U);
    EXPECT_EQ(all[0].board, 1);
    EXPECT_EQ(all[1].board, 200);
    EXPECT_EQ(all[2].board, 300);
    EXPECT_EQ(all[1].seconds, 3U);
    EXPECT_NE(all[1].generation, all[2].generation);
    EXPECT_EQ(generations(2 * sizeof(DS1BoardGeneration)).size(), 2U);
    EXPECT_EQ(generations(2 * sizeof(DS1BoardGeneration) - 1).size(), 1U);
    run(R"({"command": "remove", "board": 200})");
    all = generations();
    ASSERT_EQ(all.size(), 2U);
    EXPECT_EQ(all[1].board, 300);
}

TEST_F(LineGenerationsTest, LinesThatBeginAnewHaveAnother) {
    makeSteady();
    std::uint64_t const first = generation();
    kvlsim::loadChassis("boards: []");
    EXPECT_TRUE(generations().empty());
    insert(1, 10);
    std::uint64_t const second = generation();
    EXPECT_NE(second, first);
    run(R"({"command": "remove", "board": 1})");
    insert(1, 10);
    std::uint64_t const third = generation();
    EXPECT_NE(third, second);
    LineClock const another;
    EXPECT_NE(generation(), third);
}

TEST_F(LineGenerationsTest, OnlyTheRootAnswersThem) {
    for (long const object : {1, 10})
        EXPECT_TRUE(records<DS1BoardGeneration>(object, kDS1LineGenerations).empty());
}

} // namespace
