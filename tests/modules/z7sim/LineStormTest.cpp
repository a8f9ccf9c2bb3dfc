// SPDX-License-Identifier: BSD-2-Clause
// A thousand lines are read from four threads while all of them tick, archive and wrap, and while
// boards with lines come and go.
#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "core/ReferenceTable.h"
#include "tests/modules/z7sim/LineFixture.h"

namespace {

constexpr int kSteadyBoards = 8;
constexpr int kComingBoards = 2;
constexpr int kLinesOfABoard = 100;
/// Enough for every line to close an interval.
constexpr int kSeconds = 905;
constexpr int kReaders = 4;

/// A board of lines. The first line of each has a day of past, so that its ring wraps.
std::string boardOfLines(int board) {
    std::string devices;
    for (int line = 0; line < kLinesOfABoard; ++line) {
        devices += "{handle: " + std::to_string(1000 * board + line) +
                   ", type: 501, line: {type: " + (line % 2 == 0 ? "esf" : "e1-crc") +
                   ", errors: {path-violations: " + std::to_string(line % 5) + "}" +
                   (line == 0 && board <= kSteadyBoards ? ", past: {hours: 24}" : "") + "}}, ";
    }
    return sim::board(board, "S" + std::to_string(board), "NAME: lines",
                      "devices: [" + devices + "]");
}

/// Walks every line of every board, and counts the answers that no line can give.
class LineReader {
  public:
    LineReader(BoardManager& manager, std::atomic<int>& impossible)
        : m_manager(manager), m_impossible(impossible) {}

    void readAll() {
        for (auto board = m_manager.GetFirstBoard(); board.get() != nullptr;
             board = m_manager.GetNextBoard(board)) {
            auto const feature = board->GetFirstFeature(DS1LineFeature::iid());
            if (feature.get() == nullptr) continue;
            auto* const lines = dynamic_cast<DS1LineFeature*>(feature.get());
            for (auto line = lines->GetFirstDevice(); line.get() != nullptr;
                 line = lines->GetNextDevice(line))
                read(*line.get());
        }
    }

  private:
    void read(DS1LineDevice& line) {
        char name[64];
        line.GetName(name);
        judge(line.GetLineStatus(), 1, 131071);
        auto const table = line.GetIntervalTable();
        judge(table->GetTimeElapsed(), 0, 900);
        judge(table->GetValidIntervals(), 0, 96);
        for (int const n : {0, 1, 95, 96}) {
            judge(table->GetErrorSeconds(n), 0, 900);
            judge(table->GetUnavailableSeconds(n), 0, 900);
            judge(table->GetPathCodingViolations(n), 0, 4 * 900);
        }
    }
    void judge(int answer, int least, int most) {
        if (answer < least || answer > most) ++m_impossible;
    }

    BoardManager& m_manager;
    std::atomic<int>& m_impossible;
};

/// Asks the line of every event for more, as an agent's trap does.
class LineListener final : public DS1LineStatusListener {
  public:
    int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) override {
        auto const line = event->GetLine();
        char name[64];
        line->GetName(name);
        m_heard += line->GetIntervalTable()->GetTimeElapsed() >= 0 ? 1 : 0;
        return 0;
    }
    int heard() const { return m_heard; }

  private:
    std::atomic<int> m_heard{0};
};

TEST(LineStormTest, ReadersSeeNothingImpossibleAndNothingIsLeftOver) {
    LineClock const clock;
    StillLineScheduler& scheduler = StillLineScheduler::install();
    int const before = ReferenceTable::get_instance()->referenced_objects();
    std::atomic<int> impossible{0};
    LineListener listener;
    {
        std::string chassis = "boards:\n";
        for (int board = 1; board <= kSteadyBoards + kComingBoards; ++board)
            chassis += boardOfLines(board);
        kvlsim::loadChassis(chassis);
        ReferenceCounter<BoardManager> manager(new BoardManager);
        auto* const factory = new OpenFactory;
        factory->SetPingInterval(0);
        manager->Attach(ReferenceCounter<BoardFactory>(factory));

        std::vector<ReferenceCounter<DS1IntervalTable>> tables;
        for (int i = 1; i <= kSteadyBoards; ++i) {
            auto const feature =
                manager->GetBoardByIndex(i)->GetFirstFeature(DS1LineFeature::iid());
            auto* const lines = dynamic_cast<DS1LineFeatureZ7*>(feature.get());
            ASSERT_NE(lines, nullptr);
            lines->AddLineStatusListener(&listener);
            for (auto line = lines->GetFirstDevice(); line.get() != nullptr;
                 line = lines->GetNextDevice(line))
                tables.push_back(line->GetIntervalTable());
        }
        ASSERT_EQ(tables.size(), static_cast<std::size_t>(kSteadyBoards * kLinesOfABoard));

        std::atomic<bool> over{false};
        std::vector<std::thread> readers;
        for (int i = 0; i < kReaders; ++i)
            readers.emplace_back([&] {
                LineReader reader(*manager.get(), impossible);
                while (!over)
                    reader.readAll();
            });
        std::thread comingAndGoing([&] {
            for (int round = 0; !over; ++round) {
                int const board = kSteadyBoards + 1 + round % kComingBoards;
                sim::Json const shown = sim::command({{"command", "show"}, {"board", board}});
                sim::command({{"command", "stop"}, {"board", board}});
                sim::command({{"command", "start"}, {"board", board}});
                sim::command({{"command", "remove"}, {"board", board}});
                sim::command({{"command", "insert"}, {"board", shown["boards"][0]}});
                sim::drain();
            }
        });
        for (int second = 0; second < kSeconds; ++second) {
            LineClock::advance(std::chrono::seconds(1));
            if (second % 10 == 0) {
                int const line = 1000 * (1 + second % kSteadyBoards) + second % kLinesOfABoard;
                sim::command({{"command", "line-alarm"},
                              {"line", line},
                              {"alarm", "los"},
                              {"clear", second % 20 != 0}});
            }
            scheduler.pass(LineScheduler::time() + 1);
        }
        over = true;
        comingAndGoing.join();
        for (auto& reader : readers)
            reader.join();
        EXPECT_EQ(tables.front()->GetValidIntervals(), 96);
        EXPECT_EQ(tables.back()->GetValidIntervals(), 1);
        EXPECT_EQ(tables.back()->GetTimeElapsed(), kSeconds - 900);

        tables.clear();
        for (int board = 1; board <= kSteadyBoards + kComingBoards; ++board)
            sim::command({{"command", "remove"}, {"board", board}});
        sim::drain();
        LineStatusDelivery::instance().drain();
        EXPECT_EQ(manager->GetNumberOfBoards(), 0);
    }
    EXPECT_EQ(impossible, 0);
    EXPECT_GT(listener.heard(), 0);
    // The factory stays for good, with its table of boards, and so does the event adaptor.
    EXPECT_LE(ReferenceTable::get_instance()->referenced_objects() - before, 3);
}

} // namespace
