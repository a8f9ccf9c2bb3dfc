// SPDX-License-Identifier: BSD-2-Clause
// Everything that can break does, in random order and across restarts of the agent; the alarms are
// held against the state of the world that was broken.
#include <map>
#include <memory>
#include <random>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "agent/alarms/AlarmEvents.h"
#include "agent/daemon/AlarmReport.h"
#include "board/DS1LineDevice.h"
#include "board/ISDNChannel.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/LogCapture.h"
#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

constexpr std::uint32_t kBoards = 4;

struct WorldBoard {
    bool present = true;
    bool failed = false;
    bool stopped = false;
    bool unreadable = false;
    bool missed = false; ///< it was removed while it ran
    std::set<std::uint32_t> faults;
    int lineStatus = DS1LineStatusNoAlarm;
    int channel = ISDNDChannelStatusL2Active;
    bool linkDown = false;
};

/// The names of the line's alarms, written down once more.
std::map<int, std::string> const kLineAlarms{
    {64, "dsx1LossOfSignal"},      {32, "dsx1LossOfFrame"},   {8, "dsx1RcvAIS"},
    {2, "dsx1RcvFarEndLOF"},       {256, "dsx1T16AIS"},       {512, "dsx1RcvFarEndLOMF"},
    {8192, "dsx1UnavailSigState"}, {4096, "dsx1OtherFailure"}};

class AlarmWorldTest : public ::testing::Test {
  protected:
    AlarmWorldTest() {
        for (std::uint32_t board = 0; board < kBoards; ++board)
            m_handles.push_back(m_chassis.insert(serialNumber(board)));
        startAgent();
    }

    static std::string serialNumber(std::uint32_t board) { return "S" + std::to_string(board); }
    static std::uint32_t lineOf(std::uint32_t board) { return 1000 + 10 * board; }

    /// What the agent is made of, as far as alarms are concerned.
    struct Agent {
        AlarmReport report;
        AlarmList alarms{{}, [this](AlarmEvent event, Alarm const& alarm) {
                             return report.report(event, alarm);
                         }};
        AlarmEvents events{alarms};
    };
    void startAgent() {
        m_agent = std::make_unique<Agent>();
        m_agent->alarms.restore(m_agent->report.open(m_folder.file("")), Instant::now());
        refresh();
    }
    void restartAgent() {
        // What an agent cannot read when it starts, it cannot know to have been stopped.
        for (WorldBoard& board : m_boards)
            board.unreadable = false;
        if (any(2) == 0) m_agent->report.close(m_agent->alarms.active());
        m_agent.reset();
        startAgent();
    }
    int any(int below) { return std::uniform_int_distribution(0, below - 1)(m_random); }

    void announce(std::uint32_t board, BoardStatusEnum status) {
        m_agent->events.boardStatus(static_cast<int>(board + 1),
                                    FakeChassis::fake(m_handles[board]), status);
    }
    void changeBoard(std::uint32_t number) {
        WorldBoard& board = m_boards[number];
        if (!board.present) {
            board = {};
            announce(number, BoardStatusAdded);
            return;
        }
        switch (any(4)) {
        case 0:
            board.failed = board.stopped = true;
            announce(number, BoardStatusFailed);
            break;
        case 1:
            board.failed = board.stopped = false;
            announce(number, BoardStatusStarted);
            break;
        case 2:
            if (board.failed) return;
            board.stopped = true;
            announce(number, BoardStatusStopped);
            break;
        default:
            board.present = false;
            board.missed = board.failed || !board.stopped;
            announce(number, BoardStatusRemoved);
            break;
        }
    }
    void changeSomething() {
        auto const number = static_cast<std::uint32_t>(any(kBoards));
        WorldBoard& board = m_boards[number];
        int const what = any(7);
        if (what == 0) return changeBoard(number);
        if (!board.present) return;
        auto const fault = static_cast<std::uint16_t>(any(3) + 16);
        switch (what) {
        case 1: {
            bool const raised = !board.faults.contains(fault);
            if (raised)
                board.faults.insert(fault);
            else
                board.faults.erase(fault);
            if (isReported())
                m_agent->events.fault(raised, static_cast<int>(number + 1), serialNumber(number),
                                      fault);
            break;
        }
        case 2: {
            auto at = kLineAlarms.begin();
            std::advance(at, any(static_cast<int>(kLineAlarms.size())));
            board.lineStatus ^= at->first;
            board.lineStatus &= ~DS1LineStatusNoAlarm;
            if (board.lineStatus == 0) board.lineStatus = DS1LineStatusNoAlarm;
            if (isReported()) m_agent->events.lineStatus(lineOf(number), board.lineStatus);
            break;
        }
        case 3:
            board.channel = 1 + any(3);
            break;
        case 4:
            board.linkDown = !board.linkDown;
            break;
        case 5:
            board.unreadable = !board.unreadable;
            break;
        default:
            (any(2) == 0 ? m_platformSilent : m_storeUnreadable) = any(2) == 0;
            break;
        }
    }
    /// An event may be lost, or come before the next snapshot.
    bool isReported() { return any(3) != 0; }

    void refresh() {
        Snapshot snapshot;
        snapshot.begun = Clock::now();
        for (std::uint32_t number = 0; number < kBoards; ++number)
            if (m_boards[number].present) addBoard(snapshot, number, m_boards[number]);
        snapshot.platformSilent = m_platformSilent;
        snapshot.storeUnreadable = m_storeUnreadable;
        m_agent->events.update(snapshot);
    }
    static void addBoard(Snapshot& snapshot, std::uint32_t number, WorldBoard const& board) {
        BoardRow row;
        row.boardIndex = number + 1;
        row.serialNumber = serialNumber(number);
        row.status = board.stopped ? BoardStatusStopped : BoardStatusStarted;
        row.secondaryStatus = board.failed ? BoardStatusFailed : BoardStatusNone;
        if (board.unreadable) {
            row.status = BoardStatusNone;
            row.errorMessage = "no answer";
        }
        snapshot.boards.push_back(row);
        for (std::uint32_t const value : board.faults) {
            FaultRow fault;
            fault.boardIndex = number + 1;
            fault.value = value;
            snapshot.faults.rows.push_back(fault);
        }
        for (std::uint32_t kind = 0; kind < 3; ++kind) {
            InterfaceRow interface;
            interface.ifIndex = lineOf(number) + kind;
            interface.boardIndex = number + 1;
            if (kind == 2) interface.operStatus = board.linkDown ? kDown : kUp;
            snapshot.interfaces.interfaces.push_back(interface);
        }
        LineRow line;
        line.ifIndex = lineOf(number);
        line.lineStatus = board.lineStatus;
        snapshot.interfaces.lines.push_back(line);
        LapdRow channel;
        channel.ifIndex = lineOf(number) + 1;
        channel.operStatus = board.channel;
        snapshot.interfaces.lapds.push_back(channel);
        EthernetRow ethernet;
        ethernet.ifIndex = lineOf(number) + 2;
        snapshot.interfaces.ethernets.push_back(ethernet);
    }

    /// What is wrong with the world.
    std::set<std::string> expected() const {
        std::set<std::string> all;
        for (std::uint32_t number = 0; number < kBoards; ++number) {
            WorldBoard const& board = m_boards[number];
            std::string const of = " of " + serialNumber(number);
            if (!board.present) {
                if (board.missed) all.insert("boardGone" + of + " 0");
                continue;
            }
            std::string const line = of + " " + std::to_string(lineOf(number));
            std::string const channel = of + " " + std::to_string(lineOf(number) + 1);
            if (board.failed)
                all.insert("boardFailed" + of + " 0");
            else if (board.unreadable)
                all.insert("boardUnreadable" + of + " 0");
            for (std::uint32_t const fault : board.faults)
                all.insert("platformFault" + of + " " + std::to_string(fault));
            for (auto const& [bit, name] : kLineAlarms)
                if ((board.lineStatus & bit) != 0) all.insert(name + line);
            if (board.channel == 1) all.insert("isdnLapdInactive" + channel);
            if (board.channel == 2) all.insert("isdnLapdLayer2Down" + channel);
            if (board.linkDown)
                all.insert("linkDown" + of + " " + std::to_string(lineOf(number) + 2));
        }
        if (m_platformSilent) all.insert("agentPlatformSilent of  0");
        if (m_storeUnreadable) all.insert("agentStoreUnreadable of  0");
        return all;
    }
    /// The alarms whose condition is present. Those of conditions that come and go are held.
    std::set<std::string> present() const {
        std::set<std::string> all;
        for (auto const& [alarm, isPresent] : m_agent->alarms.contents(0).active) {
            AlarmKey const& key = alarm.condition.key;
            EXPECT_TRUE(isPresent || alarm.count >= 1);
            if (isPresent)
                all.insert(std::string(alarmKind(key.kind).name) + " of " + key.board + " " +
                           std::to_string(key.number));
        }
        return all;
    }

    LogCapture m_log;
    support::TemporaryDirectory m_folder;
    FakeChassis m_chassis;
    std::vector<ReferenceCounter<Board>> m_handles;
    std::mt19937 m_random{20261122};
    std::vector<WorldBoard> m_boards = std::vector<WorldBoard>(kBoards);
    bool m_platformSilent = false;
    bool m_storeUnreadable = false;
    std::unique_ptr<Agent> m_agent;
};

TEST_F(AlarmWorldTest, AlarmsAreWhatIsWrongAfterEachOfTenThousandChanges) {
    constexpr int kSteps = 10000;
    std::set<std::string> seen;
    for (int step = 0; step < kSteps; ++step) {
        if (any(200) == 0)
            restartAgent();
        else
            changeSomething();
        refresh();
        ASSERT_EQ(present(), expected()) << "step " << step;
        for (std::string const& alarm : expected())
            seen.insert(alarm.substr(0, alarm.find(' ')));
    }
    EXPECT_EQ(seen.size(), kLineAlarms.size() + 9) << "every kind of alarm has been active";
}

} // namespace
} // namespace kvloamd
