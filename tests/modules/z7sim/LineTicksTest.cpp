// SPDX-License-Identifier: BSD-2-Clause
// The lines of a board that are asked together.
#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <map>
#include <memory>
#include <span>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "LineTicks.h"
#include "Z7SimIntervalTable.h"
#include "tests/modules/z7sim/LineFixture.h"

namespace {

using testing::ElementsAre;

/// The lines of a board, by their devices, and what the platform answers for them.
struct ScriptedBoard {
    struct State {
        DS1LineCounters counters{};
        bool answersTogether = true;
        bool answersAlone = true;
    };
    std::map<long, State> lines;
    std::vector<long> order; ///< of the answers; other lines follow in the order of their devices
    int asked = 0;           ///< for all lines
    std::uint64_t generation = 0; ///< of the counters; 0: they may change at any time
    std::vector<long> askedAlone;
};

class ScriptedBatch final : public LineBatch {
  public:
    explicit ScriptedBatch(ScriptedBoard& board) : m_board(board) {}

    DS1BoardGeneration generation() override {
        if (m_board.lines.empty()) return {};
        return {0, m_board.lines.begin()->second.counters.seconds, m_board.generation};
    }
    std::size_t read(std::span<DS1BoardLine> lines) override {
        ++m_board.asked;
        std::vector<long> devices = m_board.order;
        for (auto const& [device, state] : m_board.lines)
            if (std::ranges::find(devices, device) == devices.end()) devices.push_back(device);
        std::size_t count = 0;
        for (long const device : devices)
            if (m_board.lines[device].answersTogether && count < lines.size())
                lines[count++] = {static_cast<std::int32_t>(device),
                                  m_board.lines[device].counters};
        return count;
    }

  private:
    ScriptedBoard& m_board;
};

class ScriptedSource final : public LineSource {
  public:
    ScriptedSource(ScriptedBoard& board, long device) : m_board(board), m_device(device) {}

    bool read(DS1LineCounters& counters) override {
        m_board.askedAlone.push_back(m_device);
        if (!m_board.lines[m_device].answersAlone) return false;
        counters = m_board.lines[m_device].counters;
        return true;
    }

  private:
    ScriptedBoard& m_board;
    long m_device;
};

class LineTicksTest : public testing::Test {
  protected:
    /// A line appears.
    void add(long device) {
        m_platform.lines[device];
        auto& table = m_tables[device] =
            ReferenceCounter<Z7SimIntervalTable>(new Z7SimIntervalTable(
                LineFormat::esf, {}, std::make_shared<ScriptedSource>(m_platform, device),
                std::make_shared<LineState>(), {}, Z7SimIntervalTable::Ticked::withBoard));
        m_ticks->add(device, *table.get());
        m_platform.askedAlone.clear();
    }
    void remove(long device) { m_ticks->remove(*m_tables[device].get()); }
    /// So many seconds pass; line N counts N errors in each.
    void pass(int seconds = 1) {
        for (int i = 0; i < seconds; ++i) {
            age(1);
            m_scheduler.pass(LineScheduler::time() + 1);
        }
    }
    void age(std::uint32_t seconds) {
        for (auto& [device, state] : m_platform.lines) {
            state.counters.seconds += seconds;
            state.counters.pathCodeViolations += seconds * static_cast<std::uint32_t>(device);
        }
    }
    int elapsed(long device) { return m_tables[device]->GetTimeElapsed(); }
    int errors(long device) { return m_tables[device]->GetPathCodingViolations(0); }
    bool isValid(long device) { return m_tables[device]->IsIntervalValid(0); }
    void expectWhole(long device, int seconds) {
        SCOPED_TRACE(device);
        EXPECT_EQ(elapsed(device), seconds);
        EXPECT_EQ(errors(device), seconds * static_cast<int>(device));
        EXPECT_TRUE(isValid(device));
    }

    StillLineScheduler& m_scheduler = StillLineScheduler::install();
    ScriptedBoard m_platform;
    std::map<long, ReferenceCounter<Z7SimIntervalTable>> m_tables;
    std::unique_ptr<LineTicks> m_ticks =
        std::make_unique<LineTicks>(std::make_unique<ScriptedBatch>(m_platform));
};

TEST_F(LineTicksTest, AllLinesAreAskedInOneRequestASecond) {
    for (long const device : {1, 2, 3})
        add(device);
    pass(10);
    for (long const device : {1, 2, 3})
        expectWhole(device, 10);
    EXPECT_EQ(m_platform.asked, 10);
    EXPECT_THAT(m_platform.askedAlone, ElementsAre());
}

TEST_F(LineTicksTest, BoardWithoutLinesIsNotAsked) {
    pass();
    EXPECT_EQ(m_platform.asked, 0);
}

TEST_F(LineTicksTest, AnswersMayComeInAnyOrder) {
    for (long const device : {1, 2, 3, 4})
        add(device);
    for (auto const& order : std::vector<std::vector<long>>{{4, 3, 2, 1}, {2, 4}, {3, 1, 2}}) {
        m_platform.order = order;
        pass(2);
    }
    for (long const device : {1, 2, 3, 4})
        expectWhole(device, 6);
    EXPECT_THAT(m_platform.askedAlone, ElementsAre());
}

TEST_F(LineTicksTest, LineThatTheAnswerLacksIsAskedAlone) {
    for (long const device : {1, 2, 3})
        add(device);
    pass(3);
    m_platform.lines[2].answersTogether = false;
    pass(2);
    EXPECT_THAT(m_platform.askedAlone, ElementsAre(2, 2));
    for (long const device : {1, 2, 3})
        expectWhole(device, 5);
}

TEST_F(LineTicksTest, LineThatDoesNotAnswerMissesItsSecondsAndNoOtherDoes) {
    for (long const device : {1, 2, 3})
        add(device);
    pass(3);
    m_platform.lines[2].answersTogether = m_platform.lines[2].answersAlone = false;
    pass(2);
    m_platform.lines[2].answersTogether = m_platform.lines[2].answersAlone = true;
    pass(3);
    expectWhole(1, 8);
    expectWhole(3, 8);
    EXPECT_EQ(elapsed(2), 8);
    EXPECT_FALSE(isValid(2));
    // Two seconds are missed, and a third because its beginning was not read.
    EXPECT_EQ(errors(2), 2 * (8 - 3));
}

TEST_F(LineTicksTest, EachLineIsAskedAloneWhereThePlatformDoesNotAnswerForAll) {
    for (long const device : {1, 2}) {
        add(device);
        m_platform.lines[device].answersTogether = false;
    }
    m_platform.askedAlone.clear();
    pass();
    EXPECT_THAT(m_platform.askedAlone, ElementsAre(1, 2));
    expectWhole(1, 1);
    expectWhole(2, 1);
}

TEST_F(LineTicksTest, LinesThatNobodyAsksForArePassedOver) {
    add(2);
    m_platform.lines[1].counters.seconds = 99; // stands before, and takes the room
    pass();
    EXPECT_THAT(m_platform.askedAlone, ElementsAre(2));
    expectWhole(2, 1);
}

TEST_F(LineTicksTest, LineThatAppearsCountsFromThenOn) {
    add(1);
    pass(5);
    add(2);
    pass(3);
    expectWhole(1, 8);
    expectWhole(2, 3);
}

TEST_F(LineTicksTest, LineThatIsRemovedIsNotTickedAndTheOthersGoOn) {
    for (long const device : {1, 2, 3})
        add(device);
    pass(5);
    remove(2);
    m_tables.erase(2);
    m_platform.lines.erase(2);
    pass(3);
    expectWhole(1, 8);
    expectWhole(3, 8);
}

TEST_F(LineTicksTest, AllLinesOfABoardThatIsAskedLineByLineGoOn) {
    add(1);
    add(2);
    pass(2);
    m_ticks->askTogether(false);
    pass(2);
    EXPECT_EQ(m_platform.asked, 2);
    EXPECT_THAT(m_platform.askedAlone, ElementsAre(1, 2, 1, 2));
    m_ticks->askTogether(true);
    pass(2);
    EXPECT_EQ(m_platform.asked, 4);
    expectWhole(1, 6);
    expectWhole(2, 6);
}

TEST_F(LineTicksTest, SecondsWithoutAPassAreMissed) {
    add(1);
    pass(5);
    age(10);
    m_scheduler.pass(LineScheduler::time() + 10);
    EXPECT_EQ(elapsed(1), 15);
    EXPECT_EQ(errors(1), 5);
    EXPECT_FALSE(isValid(1));
    pass(885);
    pass(10); // of the next interval
    expectWhole(1, 10);
}

TEST_F(LineTicksTest, LineWhoseAgeJumpsMissesSecondsAndTheOthersDoNot) {
    add(1);
    add(2);
    pass(5);
    m_platform.lines[1].counters.seconds += 100;
    pass();
    EXPECT_FALSE(isValid(1));
    EXPECT_EQ(elapsed(1), 5 + 101);
    expectWhole(2, 6);
    // It begins anew.
    m_platform.lines[2].counters = {};
    pass();
    EXPECT_FALSE(isValid(2));
}

TEST_F(LineTicksTest, LinesAreNotAskedAgainInTheSameGeneration) {
    add(0); // a line that counts no errors
    m_platform.generation = 7;
    pass(1000);
    EXPECT_EQ(m_platform.asked, 1);
    expectWhole(0, 100);
    EXPECT_EQ(m_tables[0]->GetIntervalsClosed(), 1);
}

TEST_F(LineTicksTest, LinesAreAskedInAnotherGeneration) {
    add(0);
    m_platform.generation = 7;
    pass(5);
    m_platform.lines[0].counters.pathCodeViolations += 9;
    m_platform.generation = 8;
    pass(5);
    EXPECT_EQ(m_platform.asked, 2);
    EXPECT_EQ(errors(0), 9);
    EXPECT_EQ(elapsed(0), 10);
}

TEST_F(LineTicksTest, LinesAreAskedWhenTheirSecondIsNotTheNext) {
    add(0);
    m_platform.generation = 7;
    pass(5);
    age(1);
    pass();
    EXPECT_EQ(m_platform.asked, 2);
    expectWhole(0, 6);
    age(100);
    pass();
    EXPECT_FALSE(isValid(0));
}

TEST_F(LineTicksTest, PassesThatAreLeftOutAreMissedInTheSameGeneration) {
    add(0);
    m_platform.generation = 7;
    pass(5);
    age(1);
    m_scheduler.pass(LineScheduler::time() + 10);
    EXPECT_EQ(m_platform.asked, 1);
    EXPECT_EQ(elapsed(0), 15);
    EXPECT_FALSE(isValid(0));
}

TEST_F(LineTicksTest, LineThatAppearsIsAskedInTheSameGeneration) {
    add(0);
    m_platform.generation = 7;
    pass(5);
    add(1);
    pass();
    EXPECT_EQ(m_platform.asked, 2);
    expectWhole(0, 6);
    expectWhole(1, 1);
}

TEST_F(LineTicksTest, LineThatTheAnswerLacksIsAskedInTheSameGeneration) {
    add(0);
    add(1);
    m_platform.generation = 7;
    m_platform.lines[1].answersTogether = false;
    pass(3);
    EXPECT_THAT(m_platform.askedAlone, ElementsAre(1, 1, 1));
    expectWhole(0, 3);
    expectWhole(1, 3);
}

TEST_F(LineTicksTest, LinesThatWereAskedAloneAreAskedInTheSameGeneration) {
    add(0);
    m_platform.generation = 7;
    pass(2);
    m_ticks->askTogether(false);
    pass();
    m_ticks->askTogether(true);
    pass(2);
    EXPECT_EQ(m_platform.asked, 2);
    EXPECT_THAT(m_platform.askedAlone, ElementsAre(0));
    expectWhole(0, 5);
}

TEST_F(LineTicksTest, IntervalsCloseAfterTheirSeconds) {
    add(1);
    pass(900);
    expectWhole(1, 900);
    pass(1);
    expectWhole(1, 1);
    EXPECT_EQ(m_tables[1]->GetPathCodingViolations(1), 900);
    EXPECT_EQ(m_tables[1]->GetIntervalsClosed(), 1);
}

TEST_F(LineTicksTest, CleanSecondsPassTimeAndCountNothing) {
    add(0); // a line that counts no errors
    pass(2000);
    EXPECT_EQ(elapsed(0), 200);
    EXPECT_TRUE(isValid(0));
    EXPECT_EQ(m_tables[0]->GetIntervalsClosed(), 2);
    for (int n = 0; n <= 2; ++n)
        EXPECT_EQ(m_tables[0]->GetErrorSeconds(n), 0);
    // An error after a long time without is counted.
    m_platform.lines[0].counters.pathCodeViolations += 7;
    pass(1);
    EXPECT_EQ(errors(0), 7);
    EXPECT_EQ(elapsed(0), 201);
}

/// The same through the device mapper.
class BoardOfLinesTest : public testing::Test {
  protected:
    BoardOfLinesTest() {
        kvlsim::loadChassis(
            "boards: [{handle: 5, attributes: {SERIAL_NUMBER: S5}, devices: ["
            "{handle: 51, type: 501, line: {type: esf, errors: {path-violations: 3}}}, "
            "{handle: 52, type: 503}, {handle: 53, type: 501, line: {type: e1}}]}]");
    }

    LineClock m_clock;
};

TEST_F(BoardOfLinesTest, PlatformAnswersForAllLines) {
    LineClock::advance(std::chrono::seconds(4));
    std::vector<DS1BoardLine> lines(4);
    ASSERT_EQ(PlatformBoard(5).read(lines), 2U);
    EXPECT_EQ(lines[0].device, 51);
    EXPECT_EQ(lines[0].counters.pathCodeViolations, 12U);
    EXPECT_EQ(lines[1].device, 53);
    EXPECT_EQ(lines[1].counters.seconds, 4U);
}

TEST_F(BoardOfLinesTest, BoardThatIsNotThereAnswersNothing) {
    std::vector<DS1BoardLine> lines(4);
    EXPECT_EQ(PlatformBoard(6).read(lines), 0U);
    EXPECT_EQ(PlatformBoard(52).read(lines), 0U);
}

} // namespace
