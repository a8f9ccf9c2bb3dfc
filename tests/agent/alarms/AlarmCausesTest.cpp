// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmCauses.h"

#include <set>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "agent/alarms/AlarmList.h"

namespace kvloamd {
namespace {

using std::chrono::seconds;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using enum AlarmKind;

/// Whether `cause` stands above `kind`, directly or by others.
bool isAbove(AlarmKind cause, AlarmKind kind, std::uint32_t fault = 0, int depth = 0) {
    if (depth > 8) return false;
    for (AlarmCause const& each : causesOf(kind, fault))
        if (each.cause == cause || isAbove(cause, each.cause, 0, depth + 1)) return true;
    return false;
}

TEST(AlarmCausesTest, BoardsStandAboveLinesAndLinesAboveChannels) {
    EXPECT_TRUE(isAbove(BoardGone, LineLossOfSignal));
    EXPECT_TRUE(isAbove(BoardFailed, LinkDown));
    EXPECT_TRUE(isAbove(LineLossOfSignal, LineLossOfFrame));
    EXPECT_TRUE(isAbove(LineLossOfFrame, LineUnavailable));
    EXPECT_TRUE(isAbove(LineUnavailable, ChannelLayer2Down));
    EXPECT_EQ(causesOf(ChannelInactive, 1).front().cause, BoardGone) << "the furthest one first";
}

TEST(AlarmCausesTest, NothingIsItsOwnCause) {
    for (AlarmKindInfo const& info : alarmKinds())
        for (std::uint32_t const fault : {0U, 256U, 260U})
            EXPECT_FALSE(isAbove(info.kind, info.kind, fault)) << info.name;
}

TEST(AlarmCausesTest, FaultsOfLinesFollowFromTheirAlarmsAndOthersFromNothing) {
    EXPECT_TRUE(isAbove(LineLossOfSignal, PlatformFault, 256));
    EXPECT_FALSE(isAbove(LineLossOfFrame, PlatformFault, 256));
    EXPECT_TRUE(isAbove(LineLossOfSignal, PlatformFault, 260)) << "the line sends RAI by itself";
    EXPECT_TRUE(isAbove(LineT16AIS, PlatformFault, 263));
    EXPECT_TRUE(isAbove(LineRcvFarEndLOMF, PlatformFault, 264));
    EXPECT_THAT(causesOf(PlatformFault, 17), IsEmpty());
}

TEST(AlarmCausesTest, ThresholdsAndTheAgentStandAlone) {
    for (AlarmKindInfo const& info : alarmKinds())
        if (info.scope != AlarmScope::Snapshot) {
            EXPECT_THAT(causesOf(info.kind, 0), IsEmpty()) << info.name;
            EXPECT_FALSE(isCause(info.kind)) << info.name;
        }
}

/// One line and its channel, with a clock by hand.
class ConsequenceTest : public ::testing::Test {
  protected:
    static Condition of(AlarmKind kind, std::uint32_t number = 1000) {
        return {{kind, "S1", number}, "S1." + std::to_string(number), 1, number, {}, {}};
    }
    static Condition channel() {
        Condition condition = of(ChannelLayer2Down, 1001);
        condition.line = 1000;
        return condition;
    }
    static Condition fault(std::uint32_t value) { return of(PlatformFault, value); }
    void begin(Condition const& condition) {
        m_list.begin(condition, m_now);
        m_list.advance(m_now);
    }
    void end(Condition const& condition) {
        m_list.end(condition.key, m_now);
        m_list.advance(m_now);
    }
    void pass(int time) {
        for (int second = 0; second < time; ++second) {
            m_now.steady += seconds(1);
            m_now.date += seconds(1);
            m_list.advance(m_now);
        }
    }
    std::vector<std::string> active() const {
        std::vector<std::string> names;
        for (Alarm const& alarm : m_list.active())
            names.push_back(alarmKind(alarm.condition.key.kind).name);
        return names;
    }
    void configure(std::string const& entry) {
        AlarmPolicies policies;
        ASSERT_EQ(policies.configure(entry), "");
        m_list.apply(policies, m_now);
        m_list.advance(m_now);
    }

    Instant m_now{Clock::time_point(seconds(1000)),
                  std::chrono::system_clock::time_point(seconds(5))};
    std::vector<std::string> m_events;
    AlarmList m_list{
        {}, [this](AlarmEvent event, Alarm const& alarm) {
            static char const* const kEvents[] = {"raised ", "cleared ", "changed ", "explained "};
            std::string text = kEvents[static_cast<int>(event)];
            text += alarmKind(alarm.condition.key.kind).name;
            if (!alarm.cause.empty()) text += " by " + alarm.cause;
            m_events.push_back(text);
            return static_cast<std::uint32_t>(m_events.size());
        }};
    Condition const m_los = of(LineLossOfSignal);
    Condition const m_lof = of(LineLossOfFrame);
    Condition const m_unavailable = of(LineUnavailable);
};

TEST_F(ConsequenceTest, LineWithoutSignalIsOneAlarm) {
    m_list.change({m_los, m_lof, m_unavailable}, {}, m_now);
    begin(fault(256));
    begin(fault(260));
    begin(channel());
    pass(100);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    EXPECT_THAT(m_events,
                ElementsAre("raised dsx1LossOfSignal",
                            "explained dsx1LossOfFrame by dsx1LossOfSignal on S1.1000",
                            "explained dsx1UnavailSigState by dsx1LossOfSignal on S1.1000",
                            "explained platformFault by dsx1LossOfSignal on S1.1000",
                            "explained platformFault by dsx1LossOfSignal on S1.1000",
                            "explained isdnLapdLayer2Down by dsx1LossOfSignal on S1.1000"));
}

TEST_F(ConsequenceTest, OrderInOneMomentDoesNotMatter) {
    m_list.compare(AlarmScope::Snapshot, {m_unavailable, m_lof, m_los}, m_now.steady, m_now);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    m_list.change({}, {m_los.key, m_lof.key, m_unavailable.key}, m_now);
    m_list.advance(m_now);
    EXPECT_THAT(active(), IsEmpty());
    EXPECT_EQ(m_list.counts().raised, 1U);
}

TEST_F(ConsequenceTest, ConsequenceThatCameFirstCeasesToBeAnAlarm) {
    begin(m_lof);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfFrame"));
    begin(m_los);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    EXPECT_EQ(m_events.back(), "cleared dsx1LossOfFrame by dsx1LossOfSignal on S1.1000");
}

TEST_F(ConsequenceTest, ConsequenceThatStaysIsAnAlarmWhenItsCauseHasGone) {
    m_list.change({m_los, m_lof}, {}, m_now);
    pass(10);
    end(m_los);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfFrame"));
    EXPECT_EQ(m_list.active().front().began, m_now.date - seconds(10));
}

TEST_F(ConsequenceTest, RaiseHoldBeginsAnewWhenTheCauseHasGone) {
    begin(m_los);
    begin(channel());
    pass(100);
    end(m_los);
    pass(4);
    EXPECT_THAT(active(), IsEmpty());
    pass(1);
    EXPECT_THAT(active(), ElementsAre("isdnLapdLayer2Down"));
}

TEST_F(ConsequenceTest, ConsequenceThatRecoversAfterItsCauseIsNoAlarm) {
    begin(m_los);
    begin(channel());
    pass(100);
    end(m_los);
    pass(4);
    end(channel());
    pass(100);
    EXPECT_EQ(m_list.counts().raised, 1U);
    EXPECT_EQ(m_list.counts().suppressed, 2U - 1U) << "the channel's only beginning";
}

TEST_F(ConsequenceTest, CauseStandsWhileItsAlarmIsHeld) {
    configure("dsx1LossOfSignal=clear=10");
    m_list.change({m_los, m_lof}, {}, m_now);
    end(m_los);
    pass(9);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    pass(1);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfFrame"));
}

TEST_F(ConsequenceTest, CauseStandsBeforeItsAlarmIsRaised) {
    configure("dsx1LossOfSignal=raise=10");
    m_list.change({m_los, m_lof}, {}, m_now);
    pass(9);
    EXPECT_THAT(active(), IsEmpty());
    end(m_los);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfFrame"));
}

TEST_F(ConsequenceTest, CauseThatIsSwitchedOffHasNoConsequences) {
    m_list.change({m_los, m_lof}, {}, m_now);
    configure("dsx1LossOfSignal=off");
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfFrame"));
    configure("dsx1LossOfSignal=major");
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
}

TEST_F(ConsequenceTest, ConsequenceOfAConsequenceNamesTheRoot) {
    m_list.change({m_lof, m_unavailable}, {}, m_now);
    begin(channel());
    begin(m_los);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    EXPECT_EQ(m_events.back(), "explained isdnLapdLayer2Down by dsx1LossOfSignal on S1.1000");
    end(m_los);
    end(m_lof);
    EXPECT_THAT(active(), ElementsAre("dsx1UnavailSigState"));
}

TEST_F(ConsequenceTest, OtherLinesAndBoardsAreNoCause) {
    begin(m_los);
    begin(of(LineLossOfFrame, 2000));
    Condition other = of(LineLossOfFrame);
    other.key.board = "S2";
    begin(other);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal", "dsx1LossOfFrame", "dsx1LossOfFrame"));
}

TEST_F(ConsequenceTest, FaultOfALineFollowsFromAnyLineOfTheBoard) {
    begin(fault(256));
    pass(3);
    begin(of(LineLossOfSignal, 1000));
    begin(of(LineLossOfSignal, 1016));
    pass(100);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal", "dsx1LossOfSignal"));
    end(of(LineLossOfSignal, 1000));
    pass(100);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    end(of(LineLossOfSignal, 1016));
    pass(39);
    EXPECT_THAT(active(), IsEmpty());
    pass(1);
    EXPECT_THAT(active(), ElementsAre("platformFault"));
}

TEST_F(ConsequenceTest, BoardThatFailsExplainsItsLines) {
    begin(m_los);
    begin(of(BoardFailed, 0));
    EXPECT_THAT(active(), ElementsAre("boardFailed"));
    m_list.change({of(BoardGone, 0)}, {of(BoardFailed, 0).key}, m_now);
    m_list.advance(m_now);
    EXPECT_THAT(active(), ElementsAre("boardGone"));
    end(of(BoardGone, 0));
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
}

TEST_F(ConsequenceTest, RestoredCauseExplainsWhatIsFoundAtTheStart) {
    Alarm alarm;
    alarm.condition = m_los;
    m_list.restore({alarm}, m_now);
    m_list.compare(AlarmScope::Snapshot, {m_los, m_lof}, m_now.steady, m_now);
    m_list.advance(m_now);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
    EXPECT_EQ(m_list.counts().raised, 0U);
}

TEST_F(ConsequenceTest, RestoredConsequenceOfARestoredCauseIsCleared) {
    Alarm los;
    los.condition = m_los;
    Alarm lof;
    lof.condition = m_lof;
    m_list.restore({los, lof}, m_now);
    m_list.advance(m_now);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal"));
}

} // namespace
} // namespace kvloamd
