// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmSources.h"

#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "board/Board.h"
#include "board/DS1LineDevice.h"
#include "board/ISDNChannel.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::UnorderedElementsAre;

/// "kind of resource (text)" of every condition.
std::vector<std::string> texts(std::vector<Condition> const& conditions) {
    std::vector<std::string> all;
    for (Condition const& condition : conditions) {
        std::string text = alarmKind(condition.key.kind).name;
        text += " of " + condition.resource;
        if (!condition.text.empty()) text += " (" + condition.text + ")";
        all.push_back(text);
    }
    return all;
}

class AlarmSourcesTest : public ::testing::Test {
  protected:
    BoardRow& addBoard(std::string const& serialNumber, int status = BoardStatusStarted) {
        BoardRow& row = m_snapshot.boards.emplace_back();
        row.boardIndex = static_cast<std::uint32_t>(m_snapshot.boards.size());
        row.serialNumber = serialNumber;
        row.status = status;
        return row;
    }
    InterfaceRow& addInterface(std::uint32_t ifIndex, std::string const& description) {
        InterfaceRow& row = m_snapshot.interfaces.interfaces.emplace_back();
        row.ifIndex = ifIndex;
        row.boardIndex = 1;
        row.description = description;
        return row;
    }
    void addLine(std::uint32_t ifIndex, std::optional<int> status) {
        addInterface(ifIndex, "T1 line " + std::to_string(ifIndex));
        LineRow row;
        row.ifIndex = ifIndex;
        row.lineStatus = status;
        m_snapshot.interfaces.lines.push_back(row);
    }
    void addChannel(std::uint32_t ifIndex, std::optional<int> status) {
        addInterface(ifIndex, "data link of D1");
        LapdRow row;
        row.ifIndex = ifIndex;
        row.operStatus = status;
        m_snapshot.interfaces.lapds.push_back(row);
    }
    std::vector<Condition> read(std::vector<Condition> const& stopped = {},
                                std::vector<Condition> const& gone = {}) const {
        return conditionsIn(m_snapshot, stopped, gone);
    }
    static Condition latched(AlarmKind kind, std::string const& board, std::string place = {}) {
        return {{kind, board, 0}, "board " + board, 1, 0, {}, std::move(place)};
    }

    Snapshot m_snapshot;
};

TEST_F(AlarmSourcesTest, SoundSnapshotHasNoConditions) {
    addBoard("S1");
    addBoard("S2", BoardStatusStopped);
    addLine(1000, DS1LineStatusNoAlarm);
    addLine(1001, std::nullopt);
    addChannel(1002, ISDNDChannelStatusL2Active);
    addChannel(1003, std::nullopt);
    EXPECT_THAT(read(), IsEmpty());
}

TEST_F(AlarmSourcesTest, FailedBoardHasItsErrorMessage) {
    BoardRow& board = addBoard("S1", BoardStatusStopped);
    board.secondaryStatus = BoardStatusFailed;
    board.errorMessage = "it burns";
    EXPECT_THAT(texts(read()), ElementsAre("boardFailed of board S1 (it burns)"));
}

TEST_F(AlarmSourcesTest, BoardThatDoesNotAnswerIsUnreadable) {
    addBoard("S1", BoardStatusNone).errorMessage = "no answer";
    EXPECT_THAT(texts(read()), ElementsAre("boardUnreadable of board S1 (no answer)"));
}

TEST_F(AlarmSourcesTest, BoardWithoutSerialNumberIsKnownByItsIndex) {
    addBoard("", BoardStatusNone).errorMessage = "no answer";
    EXPECT_EQ(read().front().key.board, "#1");
}

TEST_F(AlarmSourcesTest, UnexpectedStopLastsWhileTheBoardIsStopped) {
    auto const stopped = latched(AlarmKind::BoardStopped, "S1");
    BoardRow& board = addBoard("S1", BoardStatusStopped);
    EXPECT_THAT(texts(read({stopped})), ElementsAre("boardStopped of board S1"));
    board.status = BoardStatusStarted;
    EXPECT_THAT(read({stopped}), IsEmpty());
}

TEST_F(AlarmSourcesTest, GoneBoardIsMissingUntilItReturns) {
    auto const gone = latched(AlarmKind::BoardGone, "S1");
    addBoard("S2");
    EXPECT_THAT(texts(read({}, {gone})), ElementsAre("boardGone of board S1"));
    EXPECT_EQ(read({}, {gone}).front().boardIndex, 0U);
    addBoard("S1");
    EXPECT_THAT(read({}, {gone}), IsEmpty());
}

TEST_F(AlarmSourcesTest, GoneBoardIsReplacedByAnotherInItsSlot) {
    BoardRow& other = addBoard("S2");
    other.busNumber = 2;
    other.pciSlotNumber = 4;
    EXPECT_THAT(read({}, {latched(AlarmKind::BoardGone, "S1", "bus 2, slot 4")}), IsEmpty());
    EXPECT_THAT(texts(read({}, {latched(AlarmKind::BoardGone, "S1", "bus 2, slot 5")})),
                ElementsAre("boardGone of board S1"));
}

TEST_F(AlarmSourcesTest, BoardsWithoutASlotReplaceNobody) {
    addBoard("S2");
    EXPECT_THAT(texts(read({}, {latched(AlarmKind::BoardGone, "S1")})),
                ElementsAre("boardGone of board S1"));
}

TEST_F(AlarmSourcesTest, EveryListedFaultIsACondition) {
    addBoard("S1");
    FaultRow fault;
    fault.boardIndex = 1;
    fault.value = 17;
    m_snapshot.faults.rows = {FaultRow{}, fault};
    EXPECT_THAT(texts(read()), ElementsAre("platformFault of unknown board (fault 0)",
                                           "platformFault of board S1 (fault 17)"));
}

TEST_F(AlarmSourcesTest, EveryAlarmBitOfALineIsACondition) {
    addBoard("S1");
    addLine(1000, DS1LineStatusLossOfSignal | DS1LineStatusUnavailSigState |
                      DS1LineStatusXmtFarEndLOF | DS1LineStatusLoopbackState |
                      DS1LineStatusRcvTestCode);
    EXPECT_THAT(texts(read()),
                UnorderedElementsAre("dsx1LossOfSignal of board S1, T1 line 1000",
                                     "dsx1UnavailSigState of board S1, T1 line 1000"));
}

TEST_F(AlarmSourcesTest, SignallingChannelNamesTheLayerThatIsDown) {
    addBoard("S1");
    addChannel(1000, ISDNDChannelStatusInactive);
    addChannel(1001, ISDNDChannelStatusL1Active);
    EXPECT_THAT(texts(read()), ElementsAre("isdnLapdInactive of board S1, data link of D1",
                                           "isdnLapdLayer2Down of board S1, data link of D1"));
}

TEST_F(AlarmSourcesTest, EthernetInterfaceIsDownUnlessItWasSwitchedOff) {
    addBoard("S1");
    for (std::uint32_t const ifIndex : {1000U, 1001U, 1002U}) {
        EthernetRow row;
        row.ifIndex = ifIndex;
        m_snapshot.interfaces.ethernets.push_back(row);
        addInterface(ifIndex, "Ethernet " + std::to_string(ifIndex)).operStatus =
            ifIndex == 1000 ? kUp : kDown;
    }
    m_snapshot.interfaces.interfaces.edit(2).adminStatus = kDown;
    EXPECT_THAT(texts(read()), ElementsAre("linkDown of board S1, Ethernet 1001"));
}

TEST_F(AlarmSourcesTest, PlatformAndStoreAreTheAgents) {
    m_snapshot.platformSilent = m_snapshot.storeUnreadable = true;
    EXPECT_THAT(texts(read()),
                ElementsAre("agentPlatformSilent of agent", "agentStoreUnreadable of agent"));
}

TEST(LineAlarmsTest, AgreeWithTheAlarmsOfEntities) {
    // Which bits are alarms, and how severe, by the rules of ENTITY-STATE-MIB's port states.
    for (unsigned bit = 2; bit <= 65536; bit *= 2) {
        auto const& all = lineAlarms();
        auto const found = std::ranges::find(all, bit, &LineAlarm::bit);
        bool const isEcho = bit == DS1LineStatusXmtFarEndLOF || bit == DS1LineStatusXmtAIS ||
                            bit == DS1LineStatusLoopbackState ||
                            bit == DS1LineStatusXmtFarEndLOMF || bit == DS1LineStatusRcvTestCode;
        EXPECT_EQ(found == all.end(), isEcho) << bit;
    }
}

class HealthWatchTest : public ::testing::Test {
  protected:
    std::vector<std::string> conditions(std::chrono::seconds after = {}) {
        return texts(m_watch.conditions(m_newest, m_now + after, m_journalFails));
    }

    Clock::time_point const m_now = Clock::time_point(std::chrono::hours(1));
    Snapshot m_newest = [this] {
        Snapshot snapshot;
        snapshot.begun = m_now;
        return snapshot;
    }();
    bool m_journalFails = false;
    Counters m_counters;
    HealthWatch m_watch{m_counters};
};

TEST_F(HealthWatchTest, HealthyAgentHasNoConditions) {
    m_counters.master = Master::Connected;
    EXPECT_THAT(conditions(), IsEmpty());
}

TEST_F(HealthWatchTest, OldSnapshotIsStale) {
    EXPECT_THAT(conditions(HealthWatch::kStale - std::chrono::seconds(1)), IsEmpty());
    EXPECT_THAT(conditions(HealthWatch::kStale), ElementsAre("agentSnapshotStale of agent"));
}

TEST_F(HealthWatchTest, FileThatIsNotWrittenIsNamed) {
    m_newest.persistence = Persistence::InUse;
    EXPECT_THAT(conditions(), ElementsAre("agentPersistenceFailing of agent "
                                          "(another process has locked a file)"));
}

TEST_F(HealthWatchTest, JournalThatIsNotWrittenIsNamed) {
    m_journalFails = true;
    EXPECT_THAT(conditions(), ElementsAre("agentPersistenceFailing of agent "
                                          "(the journal cannot be written)"));
}

TEST_F(HealthWatchTest, DroppedNotificationsAreRememberedForFiveMinutes) {
    m_counters.notificationsDropped = 3;
    EXPECT_THAT(conditions(),
                ElementsAre("agentNotificationsDropped of agent (3 since the start)"));
    m_newest.begun += HealthWatch::kDropped;
    EXPECT_THAT(conditions(HealthWatch::kDropped), IsEmpty());
}

TEST_F(HealthWatchTest, LostMasterIsACondition) {
    m_counters.master = Master::Lost;
    EXPECT_THAT(conditions(), ElementsAre("agentMasterLost of agent"));
}

} // namespace
} // namespace kvloamd
