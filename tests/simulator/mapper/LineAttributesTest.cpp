// SPDX-License-Identifier: BSD-2-Clause
// The answers of lines and ISDN channels to a client of the device mapper.
#include <atomic>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "boardplatform/dm_client.h"
#include "boardplatform/ds1_line.h"
#include "boardplatform/isdn_channels.h"
#include "simulator/exports/Control.h"
#include "tests/simulator/LineClock.h"

namespace {

using nlohmann::json;
using support::LineClock;
using support::readLine;
using testing::ElementsAre;
using namespace std::chrono_literals;

constexpr char const* kChassis = R"(
boards:
  - handle: 1
    attributes: {SERIAL_NUMBER: "S1"}
    devices:
      - {handle: 10, type: 501, line: {type: d4, errors: {code-violations: 0.5, slips: 2}}}
      - handle: 11
        type: 501
        line:
          type: e1
          past:
            seconds: 40
            errors: {path-violations: 0.3}
            spells:
              - {ago: 30, seconds: 10, alarms: [los], errors: {code-violations: 7.5}}
              - {ago: 15, seconds: 1, alarms: [ais]}
      - {handle: 12, type: 514, channels: {bearers: 3, signalling: l1}}
      - {handle: 13, type: 503}
)";

class LineAttributesTest : public testing::Test {
  protected:
    LineAttributesTest() { kvlsim::loadChassis(kChassis); }

    /// The answer's bytes, or "status N".
    static std::string read(long handle, char const* name, std::size_t capacity = 65536) {
        std::string buffer(capacity, '#');
        DMAttribute request{name, buffer.data(), 0, 0, static_cast<std::int32_t>(capacity)};
        int const result = dm_getDeviceMapperClient()->GetAttributes(handle, 1, &request);
        if (request.status != 0) {
            EXPECT_EQ(result, kDMSomeAttributesFailed);
            EXPECT_EQ(request.size, 0);
            EXPECT_EQ(buffer, std::string(capacity, '#')) << "an unread buffer has changed";
            return "status " + std::to_string(request.status);
        }
        EXPECT_EQ(result, 0);
        buffer.resize(static_cast<std::size_t>(request.size));
        return buffer;
    }

    static std::int32_t readNumber(long handle, char const* name) {
        std::string const bytes = read(handle, name);
        std::int32_t number = -1;
        EXPECT_EQ(bytes.size(), sizeof number);
        if (bytes.size() == sizeof number) std::memcpy(&number, bytes.data(), sizeof number);
        return number;
    }

    /// The records that `bytes` consists of, of which there may be none.
    template <class Record>
    static std::vector<Record> records(std::string const& bytes) {
        std::vector<Record> all(bytes.size() / sizeof(Record));
        if (!all.empty()) std::memcpy(all.data(), bytes.data(), all.size() * sizeof(Record));
        return all;
    }
    static std::vector<DS1LineCounters> past(long handle) {
        return records<DS1LineCounters>(read(handle, kDS1LinePast));
    }
    static std::vector<DS1BoardLine> lines(long board, std::size_t capacity = 65536) {
        return records<DS1BoardLine>(read(board, kDS1BoardCounters, capacity));
    }
    /// What the board answers for its lines is what each of them answers.
    static void expectTheSameAlone(std::vector<DS1BoardLine> const& lines) {
        for (DS1BoardLine const& line : lines) {
            DS1LineCounters const alone = readLine(line.device);
            EXPECT_EQ(std::memcmp(&line.counters, &alone, sizeof alone), 0) << line.device;
        }
    }

    static void run(char const* command) {
        json const reply = kvlsim::execute(json::parse(command));
        ASSERT_EQ(reply["ok"], true) << reply;
    }

    LineClock clock;
};

TEST_F(LineAttributesTest, CountersAreReadLive) {
    EXPECT_EQ(read(10, kDS1LineCounters).size(), 36U);
    EXPECT_EQ(readLine(10).seconds, 0U);
    clock.advance(10s + 1ms);
    DS1LineCounters const counters = readLine(10);
    EXPECT_EQ(counters.seconds, 10U);
    EXPECT_EQ(counters.lineCodeViolations, 5U);
    EXPECT_EQ(counters.controlledSlips, 20U);
    EXPECT_EQ(counters.pathCodeViolations, 0U);
}

TEST_F(LineAttributesTest, CountersThatDoNotFitAreNotRead) {
    EXPECT_EQ(read(10, kDS1LineCounters, 35), "status 2");
    EXPECT_EQ(read(10, kDS1LineCounters, 36).size(), 36U);
}

TEST_F(LineAttributesTest, DevicesWithoutALineHaveNoCounters) {
    for (char const* name : {kDS1LineCounters, kDS1LinePast, kDS1LinePastSeconds, kDS1LineType,
                             kISDNChannelStates, kISDNSignallingState})
        EXPECT_EQ(read(13, name), "status 1") << name;
}

TEST_F(LineAttributesTest, BoardAnswersForAllItsLines) {
    auto const handles = [](auto const& lines) {
        std::vector<std::int32_t> devices;
        for (DS1BoardLine const& line : lines)
            devices.push_back(line.device);
        return devices;
    };
    EXPECT_THAT(handles(lines(1)), ElementsAre(10, 11));
    expectTheSameAlone(lines(1));
    clock.advance(10s + 1ms);
    expectTheSameAlone(lines(1));
    EXPECT_EQ(lines(1)[0].counters.controlledSlips, 20U);
    EXPECT_EQ(lines(1)[1].counters.seconds, 50U);
}

TEST_F(LineAttributesTest, BoardAnswersForAsManyLinesAsTheBufferHolds) {
    EXPECT_EQ(lines(1, 2 * sizeof(DS1BoardLine)).size(), 2U);
    EXPECT_EQ(lines(1, 2 * sizeof(DS1BoardLine) - 1).size(), 1U);
    EXPECT_EQ(lines(1, 3).size(), 0U);
}

TEST_F(LineAttributesTest, OnlyBoardsWithLinesAnswerForThem) {
    run(R"({"command": "insert", "board": {"handle": 2, "attributes": {"SERIAL_NUMBER": "S2"},
            "devices": [{"handle": 20, "type": 503}]}})");
    EXPECT_EQ(read(2, kDS1BoardCounters), "status 1");
    EXPECT_EQ(read(10, kDS1BoardCounters), "status 1");
}

TEST_F(LineAttributesTest, BoardThatReturnsAnswersForItsNewLines) {
    run(R"({"command": "remove", "board": 1})");
    DS1BoardLine line{};
    DMAttribute request{kDS1BoardCounters, &line, 0, 0, sizeof line};
    EXPECT_EQ(dm_getDeviceMapperClient()->GetAttributes(1, 1, &request), 201);
    run(R"({"command": "insert", "board": {"handle": 1, "attributes": {"SERIAL_NUMBER": "S1"},
            "devices": [{"handle": 11, "type": 501, "line": {"type": "esf"}}]}})");
    ASSERT_EQ(lines(1).size(), 1U);
    EXPECT_EQ(lines(1)[0].device, 11);
    EXPECT_EQ(lines(1)[0].counters.seconds, 0U);
}

TEST_F(LineAttributesTest, LineThatCountsNoMoreKeepsItsCounts) {
    clock.advance(10s);
    run(R"({"command": "line-alarm", "line": 10, "alarm": "los"})");
    clock.advance(2s);
    run(R"({"command": "line-mend", "line": 10})");
    run(R"({"command": "line-rates", "line": 10, "rates": {"slips": 0, "code-violations": 0}})");
    DS1LineCounters const then = lines(1)[0].counters;
    EXPECT_EQ(then.controlledSlips, 24U);
    EXPECT_EQ(then.lossOfSignalSeconds, 2U);
    clock.advance(100s);
    DS1LineCounters now = lines(1)[0].counters;
    EXPECT_EQ(now.seconds, 112U);
    now.seconds = then.seconds;
    EXPECT_EQ(std::memcmp(&now, &then, sizeof now), 0);
}

TEST_F(LineAttributesTest, LineTellsItsType) {
    EXPECT_EQ(readNumber(10, kDS1LineType), 3);
    EXPECT_EQ(readNumber(11, kDS1LineType), 4);
}

TEST_F(LineAttributesTest, LineWithoutPastAnswersNone) {
    EXPECT_EQ(read(10, kDS1LinePastSeconds), "status 1");
    EXPECT_EQ(read(10, kDS1LinePast), "status 1");
}

TEST_F(LineAttributesTest, PastHasOneRecordMoreThanSeconds) {
    EXPECT_EQ(readNumber(11, kDS1LinePastSeconds), 40);
    EXPECT_EQ(past(11).size(), 41U);
}

TEST_F(LineAttributesTest, PastThatDoesNotFitIsNotRead) {
    EXPECT_EQ(read(11, kDS1LinePast, 41UL * 36 - 1), "status 2");
    EXPECT_EQ(read(11, kDS1LinePast, 41UL * 36).size(), 41U * 36);
}

TEST_F(LineAttributesTest, LiveCountersContinueThePast) {
    DS1LineCounters const last = past(11).back();
    DS1LineCounters const first = readLine(11);
    EXPECT_EQ(std::memcmp(&first, &last, sizeof first), 0);
    EXPECT_EQ(first.seconds, 40U);
    EXPECT_EQ(first.pathCodeViolations, 12U);
    clock.advance(5s);
    EXPECT_EQ(readLine(11).seconds, 45U);
    EXPECT_EQ(readLine(11).pathCodeViolations, 12U) << "the errors of the past are over";
}

TEST_F(LineAttributesTest, PastIsWhatLiveReadingWouldHaveSeen) {
    auto const records = past(11);
    run(R"({"command": "insert", "board": {"handle": 2, "attributes": {"SERIAL_NUMBER": "S2"},
            "devices": [{"handle": 20, "type": 501,
                         "line": {"type": "e1", "errors": {"path-violations": 0.3}}}]}})");
    ASSERT_EQ(records.size(), 41U);
    for (std::size_t second = 0; second <= 40; ++second) {
        DS1LineCounters const live = readLine(20);
        EXPECT_EQ(std::memcmp(&live, &records[second], sizeof live), 0) << second;
        if (second == 10) {
            run(R"({"command": "line-alarm", "line": 20, "alarm": "los"})");
            run(R"({"command": "line-rates", "line": 20, "rates": {"code-violations": 7.5}})");
        } else if (second == 20) {
            run(R"({"command": "line-alarm", "line": 20, "alarm": "los", "clear": true})");
            run(R"({"command": "line-rates", "line": 20, "rates": {"code-violations": 0}})");
        } else if (second == 25) {
            run(R"({"command": "line-alarm", "line": 20, "alarm": "ais"})");
        } else if (second == 26) {
            run(R"({"command": "line-alarm", "line": 20, "alarm": "ais", "clear": true})");
        }
        clock.advance(1s);
    }
}

TEST_F(LineAttributesTest, ReloadedChassisBeginsItsLinesAnew) {
    clock.advance(100s);
    kvlsim::loadChassis(kChassis);
    EXPECT_EQ(readLine(10).seconds, 0U);
    EXPECT_EQ(readLine(11).seconds, 40U);
}

TEST_F(LineAttributesTest, InsertedLineIsAsOldAsItsBoard) {
    clock.advance(100s);
    run(R"({"command": "insert", "board": {"handle": 2, "attributes": {"SERIAL_NUMBER": "S2"},
            "devices": [{"handle": 20, "type": 501, "line": {"type": "esf"}}]}})");
    clock.advance(3s);
    EXPECT_EQ(readLine(20).seconds, 3U);
    EXPECT_EQ(readLine(10).seconds, 103U);
}

TEST_F(LineAttributesTest, LinesGoWithTheirBoard) {
    run(R"({"command": "remove", "board": 1})");
    DS1LineCounters counters{};
    DMAttribute request{kDS1LineCounters, &counters, 0, 0, sizeof counters};
    EXPECT_EQ(dm_getDeviceMapperClient()->GetAttributes(10, 1, &request), 201);
}

TEST_F(LineAttributesTest, ChannelsAnswerTheirStates) {
    EXPECT_THAT(read(12, kISDNChannelStates), ElementsAre(1, 1, 1));
    EXPECT_EQ(readNumber(12, kISDNSignallingState), 2);
    run(R"({"command": "call-setup", "trunk": 12, "channel": 2, "state": "connected"})");
    run(R"({"command": "call-signalling", "trunk": 12, "state": "l2"})");
    EXPECT_THAT(read(12, kISDNChannelStates), ElementsAre(1, 3, 1));
    EXPECT_EQ(readNumber(12, kISDNSignallingState), 3);
}

TEST_F(LineAttributesTest, ChannelStatesThatDoNotFitAreNotRead) {
    EXPECT_EQ(read(12, kISDNChannelStates, 2), "status 2");
    EXPECT_EQ(read(12, kISDNSignallingState, 3), "status 2");
}

TEST_F(LineAttributesTest, ReadersSeeAllCountersOfOneMoment) {
    std::atomic<bool> torn = false;
    std::atomic<int> reads = 0;
    std::atomic<bool> done = false;
    std::vector<std::thread> readers;
    for (int i = 0; i < 2; ++i)
        readers.emplace_back([&] {
            while (!done.load()) {
                DS1LineCounters const counters = readLine(11);
                // 75 and 12 from the past; what is added is the same for both.
                if (counters.lineCodeViolations - 75 != counters.pathCodeViolations - 12)
                    torn = true;
                ++reads;
            }
        });
    for (int i = 0; i < 200 || reads.load() < 200; ++i) {
        clock.advance(1ms);
        json const reply =
            kvlsim::execute({{"command", "line-errors"},
                             {"line", 11},
                             {"errors", {{"code-violations", 1}, {"path-violations", 1}}}});
        ASSERT_EQ(reply["ok"], true) << reply;
    }
    done = true;
    for (auto& thread : readers)
        thread.join();
    EXPECT_FALSE(torn.load());
    EXPECT_GE(readLine(11).pathCodeViolations, 212U);
}

TEST(LineClockTest, WithoutATestsClockLinesAgeByTheSteadyClock) {
    auto const before = std::chrono::steady_clock::now();
    kvlsim::loadChassis("boards: [{handle: 1, attributes: {SERIAL_NUMBER: \"S1\"}, devices: "
                        "[{handle: 10, type: 501, line: {type: esf, errors: {slips: "
                        "1000000}}}]}]\n");
    while (readLine(10).controlledSlips == 0) // a slip in every microsecond
        std::this_thread::yield();
    std::uint32_t const slips = readLine(10).controlledSlips;
    auto const passed = std::chrono::steady_clock::now() - before;
    EXPECT_LE(slips, std::chrono::duration_cast<std::chrono::microseconds>(passed).count());
}

} // namespace
