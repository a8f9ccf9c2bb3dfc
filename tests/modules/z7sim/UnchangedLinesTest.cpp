// SPDX-License-Identifier: BSD-2-Clause
// Boards whose unchanged lines are not asked, against the same lines asked one by one.
#include <chrono>
#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <array>
#include <memory>
#include <random>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "LineTicks.h"
#include "Z7SimIntervalTable.h"
#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"
#include "tests/modules/z7sim/LineFixture.h"

namespace {

using sim::Json;
using Table = ReferenceCounter<Z7SimIntervalTable>;

constexpr std::array kBoards{10, 20, 30};
constexpr int kLinesOfABoard = 3;
constexpr std::array kFormats{LineFormat::esf, LineFormat::d4, LineFormat::e1, LineFormat::e1Crc,
                              LineFormat::other};

/// A board of the platform that counts the requests for its lines.
class CountedBoard final : public LineBatch {
  public:
    CountedBoard(long board, int& requests) : m_board(board), m_requests(requests) {}

    DS1BoardGeneration generation() override { return m_board.generation(); }
    std::size_t read(std::span<DS1BoardLine> lines) override {
        ++m_requests;
        return m_board.read(lines);
    }

  private:
    PlatformBoard m_board;
    int& m_requests;
};

/// A line with its history, in one of the two ways.
struct History {
    History(int device, LineFormat format, Z7SimIntervalTable::Ticked ticked)
        : source(std::make_shared<PlatformLine>(device)),
          table(new Z7SimIntervalTable(format, {}, source, state, source->past(), ticked)) {}

    std::shared_ptr<PlatformLine> source;
    std::shared_ptr<LineState> state = std::make_shared<LineState>();
    Table table;
};

constexpr int kAll = DS1IntervalTable::kIntervals;

/// What a history shows in its last intervals, as numbers.
std::vector<int> shown(History const& line, int intervals) {
    auto& table = *line.table.get();
    std::vector<int> numbers{table.GetTimeElapsed(), table.GetValidIntervals(),
                             table.GetIntervalsClosed(), line.state->status()};
    for (int n = 0; n <= intervals; ++n)
        for (int const number :
             {table.IsIntervalValid(n) ? 1 : 0, table.GetErrorSeconds(n),
              table.GetSeverelyErrorSeconds(n), table.GetSeverelyErrorFramingSeconds(n),
              table.GetUnavailableSeconds(n), table.GetControlledSlipSeconds(n),
              table.GetPathCodingViolations(n), table.GetLineErrorSeconds(n),
              table.GetBurstyErrorSeconds(n), table.GetDegradedMinutes(n),
              table.GetLineCodeViolations(n)})
            numbers.push_back(number);
    return numbers;
}

Json errors(int codeViolations, int pathViolations, int slips) {
    return {
        {"code-violations", codeViolations}, {"path-violations", pathViolations}, {"slips", slips}};
}

/// A chassis of three boards, each line of which has two histories.
class World {
  public:
    explicit World(unsigned seed) : m_random(seed) {
        kvlsim::loadChassis("boards: []");
        for (int const board : kBoards)
            insert(board);
        for (int const board : kBoards) {
            auto& ticks = m_boards.emplace_back(
                std::make_unique<LineTicks>(std::make_unique<CountedBoard>(board, requests)));
            for (int i = 1; i <= kLinesOfABoard; ++i) {
                LineFormat const format = kFormats[one(kFormats.size())];
                m_together.emplace_back(board + i, format, Z7SimIntervalTable::Ticked::withBoard);
                m_alone.emplace_back(board + i, format, Z7SimIntervalTable::Ticked::alone);
                ticks->add(board + i, *m_together.back().table.get());
            }
        }
    }
    ~World() { m_boards.clear(); } // before the tables, which they use
    World(World const&) = delete;
    World& operator=(World const&) = delete;

    /// Something happens, and some time passes.
    void step() {
        switch (one(14)) {
        case 0:
            command({{"command", "line-errors"}, {"errors", errors(between(0, 2000), 0, 1)}});
            break;
        case 1:
            command({{"command", "line-errors"}, {"errors", errors(0, between(1, 900), 0)}});
            break;
        case 2:
        case 3: {
            Json const rates = one(2) == 0 ? errors(0, 0, 0) : errors(0, between(0, 400), 0);
            command({{"command", "line-rates"}, {"rates", rates}});
            break;
        }
        case 4:
        case 5: {
            char const* const alarm = std::array{"los", "lof", "ais", "rai", "loopback"}[one(5)];
            command({{"command", "line-alarm"}, {"alarm", alarm}, {"clear", one(2) == 0}});
            break;
        }
        case 6:
        case 7:
            for (std::size_t line = 0; line < m_alone.size(); ++line)
                mend(line);
            break;
        case 8: // the line's clock runs unevenly
            for (int left = between(1, 20); left > 0; --left)
                second(std::chrono::milliseconds(between(0, 2500)), 1);
            break;
        case 9: // passes are left out
            second(std::chrono::seconds(one(2) == 0 ? 1 : between(1, 1000)), between(2, 1000));
            break;
        case 10: { // a board leaves, and another comes
            int const board = kBoards[one(kBoards.size())];
            sim::command({{"command", "remove"}, {"board", board}});
            run(between(0, 5));
            insert(board);
            break;
        }
        case 11: // all lines begin anew
            LineClock::useAgain();
            break;
        case 12: // another board is in the place of a board
            suspend(one(kBoards.size()));
            break;
        default:
            break;
        }
        run(one(8) == 0 ? between(100, 1500) : between(1, 40));
    }

    void expectTheSame(int intervals) {
        for (std::size_t i = 0; i < m_alone.size(); ++i)
            ASSERT_EQ(shown(m_together[i], intervals), shown(m_alone[i], intervals))
                << "line " << i;
    }

    int seconds = 0;  ///< of all boards together
    int requests = 0; ///< for the lines of a board

  private:
    std::size_t one(std::size_t of) { return m_random() % of; }
    int between(int least, int most) {
        return std::uniform_int_distribution<int>(least, most)(m_random);
    }

    void insert(int board) {
        Json devices = Json::array();
        for (int i = 1; i <= kLinesOfABoard; ++i) {
            Json line = {{"type", "esf"}};
            if (one(4) == 0) line["past"] = {{"seconds", between(1, 2000)}};
            if (one(4) == 0) line["errors"] = errors(0, between(1, 50), 0);
            devices.push_back({{"handle", board + i}, {"type", 501}, {"line", line}});
        }
        std::string const serial = "S" + std::to_string(++m_serial);
        sim::command({{"command", "insert"},
                      {"board",
                       {{"handle", board},
                        {"attributes", {{"SERIAL_NUMBER", serial}}},
                        {"devices", devices}}}});
    }
    int device(std::size_t line) const {
        return kBoards[line / kLinesOfABoard] + 1 + static_cast<int>(line % kLinesOfABoard);
    }
    /// A command to one of the lines.
    void command(Json command) {
        command["line"] = device(one(m_alone.size()));
        sim::command(command);
    }
    void mend(std::size_t line) {
        sim::command({{"command", "line-mend"}, {"line", device(line)}});
    }
    void suspend(std::size_t board) {
        auto const setSilent = [&](bool silent) {
            for (auto* const histories : {&m_together, &m_alone})
                for (int i = 0; i < kLinesOfABoard; ++i)
                    (*histories)[board * kLinesOfABoard + static_cast<std::size_t>(i)]
                        .source->setSilent(silent);
            m_boards[board]->askTogether(!silent);
        };
        setSilent(true);
        run(between(0, 5));
        setSilent(false);
    }
    void run(int count) {
        for (; count > 0; --count)
            second(std::chrono::seconds(1), 1);
    }
    void second(std::chrono::nanoseconds ofTheLines, long ofTheScheduler) {
        LineClock::advance(ofTheLines);
        m_scheduler.pass(LineScheduler::time() + ofTheScheduler);
        seconds += static_cast<int>(kBoards.size());
    }

    StillLineScheduler& m_scheduler = StillLineScheduler::install();
    LineClock m_clock;
    std::minstd_rand m_random;
    int m_serial = 0;
    std::vector<History> m_together;
    std::vector<History> m_alone;
    std::vector<std::unique_ptr<LineTicks>> m_boards;
};

TEST(UnchangedLinesTest, GenerationsOfAllBoardsAreKnownHoweverManyThereAre) {
    StillLineScheduler& scheduler = StillLineScheduler::install();
    LineClock const clock;
    for (int const count : {1, 64, 200, 3, 0}) {
        std::string text = count > 0 ? "boards:\n" : "boards: []";
        for (int i = 1; i <= count; ++i)
            text += sim::board(10 * i, "S" + std::to_string(i), "",
                               "devices: [{handle: " + std::to_string(10 * i + 1) +
                                   ", type: 501, line: {type: esf}}]");
        kvlsim::loadChassis(text);
        LineClock::advance(std::chrono::seconds(7));
        scheduler.pass(LineScheduler::time() + 1);
        for (int i = 1; i <= count; ++i) {
            int const board = 10 * i;
            auto const answer = PlatformBoard(board).generation();
            EXPECT_EQ(answer.board, board);
            EXPECT_EQ(answer.seconds, 7U);
            EXPECT_NE(answer.generation, 0U);
        }
        for (long const missing : {5, 10'000})
            EXPECT_EQ(PlatformBoard(missing).generation().generation, 0U);
    }
}

TEST(UnchangedLinesTest, GenerationsAreThoseOfTheBeginningOfAPass) {
    StillLineScheduler& scheduler = StillLineScheduler::install();
    sim::load({sim::board(10, "S1", "", "devices: [{handle: 11, type: 501, line: {type: esf}}]")});
    PlatformBoard board(10);
    scheduler.pass(LineScheduler::time() + 1);
    std::uint64_t const before = board.generation().generation;
    sim::command({{"command", "line-errors"}, {"line", 11}, {"errors", errors(1, 0, 0)}});
    EXPECT_EQ(board.generation().generation, before);
    scheduler.pass(LineScheduler::time() + 1);
    EXPECT_NE(board.generation().generation, before);
}

TEST(UnchangedLinesTest, HistoriesAreThoseOfLinesThatAreAskedOneByOne) {
    int seconds = 0;
    int requests = 0;
    for (unsigned seed = 1; seed <= 20; ++seed) {
        SCOPED_TRACE(seed);
        World world(seed);
        for (int step = 0; step < 100; ++step) {
            world.step();
            world.expectTheSame(3);
            ASSERT_FALSE(testing::Test::HasFatalFailure()) << "in step " << step;
        }
        world.expectTheSame(kAll);
        ASSERT_FALSE(testing::Test::HasFatalFailure());
        seconds += world.seconds;
        requests += world.requests;
    }
    // Boards were asked often, and left unasked often.
    EXPECT_GT(requests, seconds / 10);
    EXPECT_LT(requests, seconds / 10 * 9);
}

} // namespace
