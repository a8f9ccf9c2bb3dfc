// SPDX-License-Identifier: BSD-2-Clause
// Everything that can break does, in random order and across restarts of the agent; the alarms are
// held against a model that knows the state of the world and nothing of the agent.
#include <map>
#include <memory>
#include <random>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "agent/alarms/AlarmEvents.h"
#include "agent/alarms/ThresholdWatch.h"
#include "agent/daemon/AlarmReport.h"
#include "board/DS1LineDevice.h"
#include "board/ISDNChannel.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/FakeLines.h"
#include "tests/support/LogCapture.h"
#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

using std::chrono::seconds;
using Names = std::set<std::string>;

constexpr std::uint32_t kBoards = 4;
constexpr std::uint32_t kLines = 2; ///< of a board
constexpr int kLimit = 5;           ///< on errored seconds in 15 minutes
constexpr int kESF = 2;

// Bits of dsx1LineStatus and the numbers of faults, written down once more.
constexpr int kLOS = 64;
constexpr int kLOF = 32;
constexpr int kAIS = 8;
constexpr int kRAI = 2;
constexpr int kT16AIS = 256;
constexpr int kLOMF = 512;
constexpr int kOther = 4096;
constexpr int kUnavailable = 8192;
constexpr int kOutOfService = 16384;
constexpr int kPayloadAIS = 32768;
constexpr int kDs2Threshold = 65536;
constexpr int kNoAlarmBits[] = {4, 128, 2048}; ///< sending RAI, a loopback, a test code

std::map<int, std::string> const kLineAlarms{{kLOS, "dsx1LossOfSignal"},
                                             {kLOF, "dsx1LossOfFrame"},
                                             {kAIS, "dsx1RcvAIS"},
                                             {kRAI, "dsx1RcvFarEndLOF"},
                                             {kT16AIS, "dsx1T16AIS"},
                                             {kLOMF, "dsx1RcvFarEndLOMF"},
                                             {kOther, "dsx1OtherFailure"},
                                             {kUnavailable, "dsx1UnavailSigState"},
                                             {kOutOfService, "dsx1NetEquipOOS"},
                                             {kPayloadAIS, "dsx1RcvPayloadAIS"},
                                             {kDs2Threshold, "dsx1Ds2PerfThreshold"}};

struct WorldLine {
    std::set<int> bits;
    int channel = ISDNDChannelStatusL2Active;
    int erroredSeconds = 0; ///< of the running interval
    bool isOverLimit = false;
    FakeHistoryWithGaps* history = new FakeHistoryWithGaps;
    FakeLine* line = new FakeLine("line", "");
    ReferenceCounter<DS1LineDevice> handle{line};

    WorldLine() {
        line->history = ReferenceCounter<DS1IntervalTable>(history);
        history->run(0, 1);
    }
    bool has(int bit) const { return bits.contains(bit); }
    bool isCut() const { return has(kLOS) || has(kLOF) || has(kAIS); }
    int status() const {
        int sum = 0;
        for (int const bit : bits)
            sum |= bit;
        return sum == 0 ? 1 : sum;
    }
    void count(int errors) {
        erroredSeconds += errors;
        history->run(erroredSeconds, 100);
        if (erroredSeconds >= kLimit) isOverLimit = true;
    }
    void closeInterval(bool isValid) {
        history->close(erroredSeconds);
        ++history->closed;
        for (int& n : history->invalid)
            ++n;
        if (!isValid) history->invalid.push_back(1);
        if (isValid) isOverLimit = erroredSeconds >= kLimit;
        erroredSeconds = 0;
        history->run(0, 1);
    }
};

struct WorldBoard {
    bool present = true;
    bool failed = false;
    bool stopped = false;
    bool unreadable = false;
    bool missed = false; ///< it was removed while it ran
    bool linkDown = false;
    std::set<std::uint32_t> faults;
    std::vector<WorldLine> lines = std::vector<WorldLine>(kLines);
};

/// The world, and what an operator has to be told about it.
struct World {
    std::vector<WorldBoard> boards = std::vector<WorldBoard>(kBoards);
    bool platformSilent = false;
    bool storeUnreadable = false;
    bool masterLost = false;
    bool persistenceFails = false;
    bool notificationsDropped = false;

    static std::string serialNumber(std::uint32_t board) { return "S" + std::to_string(board); }
    static std::uint32_t lineIndex(std::uint32_t board, std::uint32_t line) {
        return 1000 + 100 * board + 10 * line;
    }
    static std::uint32_t channelIndex(std::uint32_t board, std::uint32_t line) {
        return lineIndex(board, line) + 1;
    }
    static std::uint32_t linkIndex(std::uint32_t board) { return 1000 + 100 * board + 50; }

    /// What is wrong and follows from nothing else that is wrong.
    Names wrong() const {
        Names all;
        for (std::uint32_t board = 0; board < kBoards; ++board)
            addBoard(all, board);
        auto const agent = [&](bool isWrong, char const* kind) {
            if (isWrong) all.insert(std::string(kind) + " of  0");
        };
        agent(platformSilent, "agentPlatformSilent");
        agent(storeUnreadable, "agentStoreUnreadable");
        agent(masterLost, "agentMasterLost");
        agent(persistenceFails, "agentPersistenceFailing");
        agent(notificationsDropped, "agentNotificationsDropped");
        return all;
    }

  private:
    void addBoard(Names& all, std::uint32_t number) const {
        WorldBoard const& board = boards[number];
        auto const add = [&](std::string const& kind, std::uint32_t index) {
            all.insert(kind + " of " + serialNumber(number) + " " + std::to_string(index));
        };
        if (!board.present) {
            if (board.missed) add("boardGone", 0);
            return;
        }
        for (std::uint32_t line = 0; line < kLines; ++line)
            if (board.lines[line].isOverLimit) add("thresholdES15m", lineIndex(number, line));
        for (std::uint32_t const fault : board.faults)
            if (fault < 256 || (!board.failed && !isShownByALine(board, fault)))
                add("platformFault", fault);
        if (board.failed) return add("boardFailed", 0);
        if (board.unreadable && !platformSilent) add("boardUnreadable", 0);
        if (board.linkDown) add("linkDown", linkIndex(number));
        for (std::uint32_t line = 0; line < kLines; ++line) {
            WorldLine const& each = board.lines[line];
            for (auto const& [bit, name] : kLineAlarms)
                if (each.has(bit) && isRoot(each, bit)) add(name, lineIndex(number, line));
            bool const carriesNothing = each.isCut() || each.has(kOther) ||
                                        each.has(kOutOfService) || each.has(kUnavailable) ||
                                        each.has(kT16AIS) || each.has(kRAI);
            if (carriesNothing) continue;
            if (each.channel == 1) add("isdnLapdInactive", channelIndex(number, line));
            if (each.channel == 2) add("isdnLapdLayer2Down", channelIndex(number, line));
        }
    }
    /// Whether this is what is wrong with the line, and not what follows from it.
    static bool isRoot(WorldLine const& line, int bit) {
        switch (bit) {
        case kLOS:
        case kOther:
        case kOutOfService:
        case kDs2Threshold:
            return true;
        case kAIS:
            return !line.has(kLOS);
        case kLOF:
            return !line.has(kLOS) && !line.has(kAIS);
        case kUnavailable:
            return !line.isCut() && !line.has(kOther) && !line.has(kOutOfService);
        default:
            return !line.isCut();
        }
    }
    static bool isShownByALine(WorldBoard const& board, std::uint32_t fault) {
        static std::map<std::uint32_t, std::set<int>> const kShownBy{{256, {kLOS}},
                                                                     {257, {kLOF}},
                                                                     {258, {kAIS}},
                                                                     {259, {kRAI}},
                                                                     {260, {kLOS, kLOF, kAIS}},
                                                                     {263, {kT16AIS}},
                                                                     {264, {kLOMF}}};
        auto const bits = kShownBy.find(fault);
        if (bits == kShownBy.end()) return false;
        for (WorldLine const& line : board.lines)
            for (int const bit : bits->second)
                if (line.has(bit)) return true;
        return false;
    }
};

/// Whether an alarm of this name waits for some seconds before it is raised.
bool isHeld(std::string const& name) {
    return name.starts_with("isdnLapd") || name.starts_with("agentMasterLost") ||
           (name.starts_with("platformFault") && name.find(" 2") != std::string::npos);
}

class AlarmWorldTest : public ::testing::TestWithParam<unsigned> {
  protected:
    AlarmWorldTest() {
        for (std::uint32_t board = 0; board < kBoards; ++board)
            m_handles.push_back(m_chassis.insert(World::serialNumber(board)));
        startAgent();
    }

    /// What the agent is made of, as far as alarms are concerned.
    struct Agent {
        explicit Agent(std::function<Instant()> const& now) : events(alarms, {}, now) {
            EXPECT_EQ(limits.configure("t1=es15m=" + std::to_string(kLimit)), "");
            thresholds.configure(limits);
        }

        AlarmReport report;
        AlarmList alarms{{}, [this](AlarmEvent event, Alarm const& alarm) {
                             return report.report(event, alarm);
                         }};
        AlarmEvents events;
        Counters counters;
        Settings settings;
        TypeLimits limits;
        ThresholdWatch thresholds{alarms, settings, {}};
        AlarmClock clock{alarms, report, counters, [] {}};
        Snapshot newest;
    };
    void startAgent() {
        m_agent = std::make_unique<Agent>([this] { return m_now; });
        m_agent->alarms.restore(m_agent->report.open(m_folder.file("")), m_now);
        refresh();
    }
    void restartAgent() {
        // What an agent cannot read when it starts, it cannot know to have been stopped.
        for (WorldBoard& board : m_world.boards)
            board.unreadable = false;
        m_world.notificationsDropped = false;
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
        WorldBoard& board = m_world.boards[number];
        if (!board.present) {
            board = {};
            return announce(number, BoardStatusAdded);
        }
        switch (any(4)) {
        case 0:
            board.failed = board.stopped = true;
            return announce(number, BoardStatusFailed);
        case 1:
            board.failed = board.stopped = false;
            return announce(number, BoardStatusStarted);
        case 2:
            if (board.failed) return;
            board.stopped = true;
            return announce(number, BoardStatusStopped);
        default:
            board.present = false;
            board.missed = board.failed || !board.stopped;
            return announce(number, BoardStatusRemoved);
        }
    }
    void changeFault(std::uint32_t number) {
        std::set<std::uint32_t>& faults = m_world.boards[number].faults;
        auto const fault = static_cast<std::uint16_t>(any(2) == 0 ? 16 + any(2) : 256 + any(11));
        bool const raised = !faults.contains(fault);
        if (raised)
            faults.insert(fault);
        else
            faults.erase(fault);
        if (isReported())
            m_agent->events.fault(raised, static_cast<int>(number + 1), World::serialNumber(number),
                                  fault);
    }
    void changeLine(std::uint32_t number) {
        auto const index = static_cast<std::uint32_t>(any(kLines));
        WorldLine& line = m_world.boards[number].lines[index];
        auto const toggle = [&](int bit) {
            if (!line.bits.insert(bit).second) line.bits.erase(bit);
        };
        if (any(10) == 0) {
            toggle(kNoAlarmBits[any(3)]);
        } else if (any(4) == 0) {
            // A real line: what belongs together comes and goes together.
            bool const was = line.has(kLOS);
            line.bits.clear();
            if (!was) line.bits = {kLOS, kLOF, kUnavailable};
        } else {
            auto at = kLineAlarms.begin();
            std::advance(at, any(static_cast<int>(kLineAlarms.size())));
            toggle(at->first);
        }
        if (isReported())
            m_agent->events.lineStatus(World::lineIndex(number, index), line.status());
    }
    void changeAgent() {
        switch (any(5)) {
        case 0:
            m_world.platformSilent = !m_world.platformSilent;
            break;
        case 1:
            m_world.storeUnreadable = !m_world.storeUnreadable;
            break;
        case 2:
            m_world.masterLost = !m_world.masterLost;
            break;
        case 3:
            m_world.persistenceFails = !m_world.persistenceFails;
            break;
        default:
            ++m_agent->counters.notificationsDropped;
            m_world.notificationsDropped = true;
            m_dropped = m_now;
            break;
        }
    }
    void changeSomething() {
        auto const number = static_cast<std::uint32_t>(any(kBoards));
        WorldBoard& board = m_world.boards[number];
        int const what = any(10);
        if (what == 0) return changeAgent();
        if (what == 1 || !board.present) return changeBoard(number);
        WorldLine& line = board.lines[static_cast<std::size_t>(any(kLines))];
        switch (what) {
        case 2:
        case 3:
            return changeFault(number);
        case 4:
            line.channel = 1 + any(3);
            break;
        case 5:
            board.linkDown = !board.linkDown;
            break;
        case 6:
            board.unreadable = !board.unreadable;
            break;
        case 7:
            line.count(any(kLimit + 1));
            if (any(2) == 0) line.closeInterval(any(4) != 0);
            break;
        default:
            return changeLine(number);
        }
    }
    /// An event may be lost, or come before the next snapshot.
    bool isReported() { return any(3) != 0; }

    void pass(seconds time) {
        m_now.steady += time;
        m_now.date += time;
        constexpr std::chrono::minutes kRemembered{5};
        if (m_world.notificationsDropped && m_now.steady - m_dropped.steady >= kRemembered)
            m_world.notificationsDropped = false;
    }
    /// One turn of everything that happens in the agent by itself.
    void refresh() {
        Snapshot& snapshot = m_agent->newest;
        snapshot = {};
        snapshot.begun = m_now.steady;
        std::vector<PlacedLine> lines;
        for (std::uint32_t number = 0; number < kBoards; ++number)
            if (m_world.boards[number].present) addBoard(snapshot, number, lines);
        snapshot.platformSilent = m_world.platformSilent;
        snapshot.storeUnreadable = m_world.storeUnreadable;
        if (m_world.persistenceFails) snapshot.persistence = Persistence::InUse;
        m_agent->counters.master = m_world.masterLost ? Master::Lost : Master::Connected;
        m_agent->thresholds.update(snapshot, lines);
        m_agent->thresholds.look(m_now);
        m_agent->events.update(snapshot);
        m_agent->clock.advance(snapshot, m_now);
    }
    void addBoard(Snapshot& snapshot, std::uint32_t number, std::vector<PlacedLine>& lines) const {
        WorldBoard const& board = m_world.boards[number];
        BoardRow row;
        row.boardIndex = number + 1;
        row.serialNumber = World::serialNumber(number);
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
        for (std::uint32_t line = 0; line < kLines; ++line)
            addLine(snapshot, number, line, lines);
        InterfaceRow link;
        link.ifIndex = World::linkIndex(number);
        link.boardIndex = number + 1;
        link.operStatus = board.linkDown ? kDown : kUp;
        snapshot.interfaces.interfaces.push_back(link);
        EthernetRow ethernet;
        ethernet.ifIndex = link.ifIndex;
        snapshot.interfaces.ethernets.push_back(ethernet);
    }
    void addLine(Snapshot& snapshot, std::uint32_t number, std::uint32_t index,
                 std::vector<PlacedLine>& lines) const {
        WorldLine const& line = m_world.boards[number].lines[index];
        for (std::uint32_t const ifIndex :
             {World::lineIndex(number, index), World::channelIndex(number, index)}) {
            InterfaceRow interface;
            interface.ifIndex = ifIndex;
            interface.boardIndex = number + 1;
            snapshot.interfaces.interfaces.push_back(interface);
        }
        LineRow row;
        row.ifIndex = World::lineIndex(number, index);
        row.lineType = kESF;
        row.lineStatus = line.status();
        row.closed = std::make_shared<ClosedIntervals>();
        snapshot.interfaces.lines.push_back(row);
        LapdRow channel;
        channel.ifIndex = World::channelIndex(number, index);
        channel.operStatus = line.channel;
        snapshot.interfaces.lapds.push_back(channel);
        snapshot.interfaces.stack.push_back({channel.ifIndex, row.ifIndex});
        lines.push_back({row.ifIndex, line.handle, number + 1});
    }

    Names active() const {
        Names all;
        for (Alarm const& alarm : m_agent->alarms.active()) {
            AlarmKey const& key = alarm.condition.key;
            all.insert(std::string(alarmKind(key.kind).name) + " of " + key.board + " " +
                       std::to_string(key.number));
        }
        return all;
    }
    /// While the agent cannot read the boards for half a minute, and after it.
    void hang() {
        pass(seconds(40));
        m_agent->clock.advance(m_agent->newest, m_now);
        Names expected = m_world.wrong();
        expected.insert("agentSnapshotStale of  0");
        ASSERT_EQ(active(), expected);
        pass(seconds(2));
        refresh();
        ASSERT_EQ(active(), m_world.wrong());
        m_seen.insert("agentSnapshotStale");
    }
    void step() {
        pass(AlarmClock::kPause); // the agent looks at its own health no sooner
        Names const before = m_world.wrong();
        int const what = any(100);
        if (what == 0) return hang();
        if (what == 1)
            restartAgent();
        else
            changeSomething();
        refresh();
        Names const wrong = m_world.wrong();
        Names expected;
        for (std::string const& name : wrong)
            if (!isHeld(name) || before.contains(name)) expected.insert(name);
        ASSERT_EQ(active(), expected) << "at once";
        // Long enough for every hold, and too long for anything to flap.
        for (int turn = 0; turn < 4; ++turn) {
            pass(seconds(16));
            refresh();
        }
        ASSERT_EQ(active(), m_world.wrong()) << "a minute later";
        for (std::string const& alarm : wrong)
            m_seen.insert(alarm.substr(0, alarm.find(' ')));
    }

    LogCapture m_log;
    support::TemporaryDirectory m_folder;
    FakeChassis m_chassis;
    std::vector<ReferenceCounter<Board>> m_handles;
    std::mt19937 m_random{GetParam()};
    Instant m_now{Clock::time_point(std::chrono::hours(1)),
                  std::chrono::system_clock::time_point(std::chrono::hours(1))};
    Instant m_dropped;
    World m_world;
    Names m_seen;
    std::unique_ptr<Agent> m_agent;
};

TEST_P(AlarmWorldTest, AlarmsAreWhatIsWrongAfterEveryChange) {
    for (int step = 0; step < WORLD_STEPS; ++step) {
        SCOPED_TRACE("step " + std::to_string(step));
        this->step();
        if (HasFatalFailure()) return;
    }
    // Fewer steps need not come upon everything.
    constexpr int kEnough = 2000;
    if (WORLD_STEPS < kEnough) return;
    // All but these have been there: a fake board is never stopped without an order, and the only
    // limit is on errored seconds.
    constexpr std::size_t kOthers = 1 + 9;
    EXPECT_EQ(m_seen.size(), alarmKinds().size() - kOthers) << "every kind has been active";
}

// Ten thousand steps in all; less under a sanitizer.
INSTANTIATE_TEST_SUITE_P(Seeds, AlarmWorldTest, ::testing::Range(1U, 6U));

} // namespace
} // namespace kvloamd
