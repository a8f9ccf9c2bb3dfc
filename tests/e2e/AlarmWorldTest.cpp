// SPDX-License-Identifier: BSD-2-Clause
// Boards and lines break in random order, and the agent is killed in between; its alarms are held
// against the state of what was broken.
#include <algorithm>
#include <csignal>
#include <map>
#include <random>
#include <set>

#include <sqlite3.h>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using Names = std::set<std::string>;

constexpr int kAllBoards = 6;
constexpr int kLineBoards = 1; ///< only have lines that break, which takes seconds
constexpr int kSteps = 50;
constexpr int kStepsBetweenKills = 17;

class AlarmWorldTest : public AgentFixture {
  protected:
    struct Board {
        bool present = true;
        bool running = true;
        bool failed = false;
        bool stoppedByNobody = false;
        bool missed = false;
        std::set<int> faults;
        std::string lineAlarm; ///< empty: none
    };

    AlarmWorldTest() {
        setVariable("Z7SIM_FAILURE_CLEARING", "0");
        start();
    }
    static std::string serial(int board) { return "B" + std::to_string(board); }
    Board& board(int number) { return m_boards[static_cast<std::size_t>(number - 1)]; }
    Board const& board(int number) const { return m_boards[static_cast<std::size_t>(number - 1)]; }

    /// The board as a chassis file has it.
    std::string described(int number) const {
        std::string const handle = std::to_string(number);
        std::string yaml = "  - handle: " + handle + "\n    attributes: {SERIAL_NUMBER: \"" +
                           serial(number) + "\", LOGICAL ID: " + handle +
                           (board(number).failed ? ", BOARD_CONDITION: 15" : "") + "}\n";
        if (number <= kLineBoards)
            yaml += "    devices:\n      - handle: " + handle +
                    "01\n        type: 501\n        attributes: {NAME: line" + handle +
                    "}\n        line: {type: esf}\n";
        return yaml;
    }
    /// Starts the agent and the platform in it, in the state of the world.
    void start() {
        std::string yaml = "boards:\n";
        for (int number = 1; number <= kAllBoards; ++number)
            if (board(number).present) yaml += described(number);
        useChassis(yaml);
        startAgent();
    }
    /// What the platform does not keep is over when its process has been killed.
    void killAndStart() {
        ASSERT_TRUE(eventually([this] { return keptAlarms() == wrong().size(); }));
        agent().signal(SIGKILL);
        agent().wait();
        for (Board& each : m_boards) {
            each.faults.clear();
            each.lineAlarm.clear();
            if (each.stoppedByNobody) each.stoppedByNobody = false;
            each.running = !each.failed;
        }
        m_begun.clear();
        start();
    }
    /// How many alarms the journal has on disk.
    std::size_t keptAlarms() const {
        sqlite3* database = nullptr;
        sqlite3_stmt* count = nullptr;
        std::size_t alarms = 0;
        if (sqlite3_open_v2(path("persistent/journal.sqlite").c_str(), &database,
                            SQLITE_OPEN_READONLY, nullptr) == SQLITE_OK &&
            sqlite3_prepare_v2(database, "SELECT count(*) FROM alarm", -1, &count, nullptr) ==
                SQLITE_OK &&
            sqlite3_step(count) == SQLITE_ROW)
            alarms = static_cast<std::size_t>(sqlite3_column_int(count, 0));
        sqlite3_finalize(count);
        sqlite3_close(database);
        return alarms;
    }

    /// The alarms that there have to be.
    Names wrong() const {
        Names all;
        for (int number = 1; number <= kAllBoards; ++number) {
            Board const& each = board(number);
            std::string const on = " on board " + serial(number);
            if (!each.present && each.missed) all.insert("boardGone" + on);
            if (!each.present) continue;
            if (each.failed) all.insert("boardFailed" + on);
            if (each.stoppedByNobody) all.insert("boardStopped" + on);
            // Faults of one board differ only in their text.
            for (int const fault : each.faults)
                all.insert("platformFault" + on + " (fault " + std::to_string(fault) + ")");
            if (each.lineAlarm == "los" || each.lineAlarm == "lof" || each.lineAlarm == "ais")
                all.insert((each.lineAlarm == "los"   ? "dsx1LossOfSignal"
                            : each.lineAlarm == "lof" ? "dsx1LossOfFrame"
                                                      : "dsx1RcvAIS") +
                           on + ", T1 line line" + std::to_string(number));
        }
        return all;
    }
    Names active() const {
        std::map<std::uint32_t, std::string> rows;
        auto const append = [&](char const* column, std::string const& between) {
            for (Answer const& answer : walk(column))
                if (answer.value.starts_with("STRING: "))
                    rows[answer.name.back()] += between + answer.value.substr(8);
        };
        append("kvlAlarmKind", "");
        append("kvlAlarmResource", " on ");
        append("kvlAlarmText", "\n");
        Names all;
        for (auto const& [number, row] : rows) {
            auto const end = row.find('\n');
            auto const fault = row.find(" (fault ");
            all.insert(row.substr(0, end) +
                       (fault == std::string::npos ? std::string() : row.substr(fault)));
        }
        return all;
    }

    int any(int below) { return std::uniform_int_distribution(0, below - 1)(m_random); }
    /// Whether this may begin once more: what begins three times within a minute is held.
    bool mayBegin(std::string const& what) { return ++m_begun[what] <= 2; }

    /// Changes the world, if it comes upon something that can be changed.
    bool tryToChange() {
        int const number = 1 + any(kAllBoards);
        std::string const handle = std::to_string(number);
        if (number <= kLineBoards) return changeLine(number);
        Board& each = board(number);
        if (!each.present) {
            each = {};
            write(path("board.yaml"), "boards:\n" + described(number));
            sim({"insert", path("board.yaml")});
            return true;
        }
        switch (any(6)) {
        case 0:
            if (each.failed || !mayBegin("fail" + handle)) return false;
            sim({"fail", handle});
            each.failed = true;
            each.running = each.stoppedByNobody = false;
            return true;
        case 1:
            if (each.running) return false;
            sim({"start", handle});
            each.running = true;
            each.failed = each.stoppedByNobody = false;
            return true;
        case 2:
            if (!each.running) return false;
            sim({"stop", handle});
            each.running = false;
            return true;
        case 3:
            if (!each.running || !mayBegin("event" + handle)) return false;
            sim({"event", "0x40008", "--board", handle}); // a stop that nobody ordered
            each.running = false;
            each.stoppedByNobody = true;
            return true;
        case 4: {
            if (!mayBegin("remove" + handle)) return false;
            bool const inOrder = !each.running && !each.failed && !each.stoppedByNobody;
            sim({"remove", handle});
            each = {};
            each.present = false;
            each.missed = !inOrder;
            return true;
        }
        default:
            return changeFault(number);
        }
    }
    bool changeFault(int number) {
        Board& each = board(number);
        std::string const handle = std::to_string(number);
        if (!each.faults.empty() && any(2) == 0) {
            sim({"fault", handle, std::to_string(*each.faults.begin()), "--clear"});
            each.faults.erase(each.faults.begin());
            return true;
        }
        int const fault = 16 + any(200);
        std::string const text = std::to_string(fault);
        if (each.faults.contains(fault) || !mayBegin("fault" + handle + "." + text)) return false;
        sim({"fault", handle, text});
        each.faults.insert(fault);
        return true;
    }
    /// A line takes seconds to declare a failure, so there are few of these.
    bool changeLine(int number) {
        Board& each = board(number);
        std::string const device = std::to_string(number) + "01";
        if (!each.lineAlarm.empty()) {
            sim({"line", "mend", device});
            each.lineAlarm.clear();
            return true;
        }
        std::string const alarm = any(2) == 0 ? "los" : "ais";
        if (any(2) != 0 || !mayBegin(device)) return false;
        sim({"line", "alarm", device, alarm});
        each.lineAlarm = alarm;
        return true;
    }

    std::mt19937 m_random{20261122};
    std::vector<Board> m_boards = std::vector<Board>(kAllBoards);
    std::map<std::string, int> m_begun;
};

TEST_F(AlarmWorldTest, AlarmsAreWhatIsWrongAfterEveryChangeAndAcrossKills) {
    for (int step = 1; step <= kSteps; ++step) {
        SCOPED_TRACE("step " + std::to_string(step));
        if (step % kStepsBetweenKills == 0)
            killAndStart();
        else
            while (!tryToChange()) {
            }
        Names seen;
        EXPECT_TRUE(eventually([&] { return (seen = active()) == wrong(); }))
            << ::testing::PrintToString(seen) << " instead of "
            << ::testing::PrintToString(wrong());
        if (HasFailure()) return;
    }
}

} // namespace
} // namespace kvloamd::e2e
