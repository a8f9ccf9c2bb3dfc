// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmList.h"

#include <string>
#include <vector>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using std::chrono::seconds;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class AlarmListTest : public ::testing::Test {
  protected:
    static Condition condition(AlarmKind kind, std::uint32_t number = 1000) {
        return {{kind, "S1", number}, "board S1, T1 line 1", 1, number, {}, {}};
    }
    void configure(std::string const& entry) {
        ASSERT_EQ(m_policies.configure(entry), "");
        m_list.apply(m_policies, now());
    }
    Instant now() const { return m_now; }
    void pass(seconds time) {
        m_now.steady += time;
        m_now.date += time;
        m_list.advance(m_now);
    }
    void begin(Condition const& condition) { m_list.begin(condition, m_now); }
    void end(Condition const& condition) { m_list.end(condition.key, m_now); }
    void flap(Condition const& condition) {
        begin(condition);
        end(condition);
    }

    Instant m_now{Clock::time_point(seconds(1000)),
                  std::chrono::system_clock::time_point(seconds(5))};
    std::vector<std::string> m_events;
    AlarmPolicies m_policies;
    AlarmList m_list{m_policies, [this](AlarmEvent event, Alarm const& alarm) {
                         m_events.push_back(
                             std::string(event == AlarmEvent::Raised    ? "raised "
                                         : event == AlarmEvent::Cleared ? "cleared "
                                                                        : "changed ") +
                             severityName(alarm.severity) + " " + std::to_string(alarm.count));
                         return static_cast<std::uint32_t>(100 + m_events.size());
                     }};
    Condition const m_los = condition(AlarmKind::LineLossOfSignal);
};

TEST_F(AlarmListTest, ConditionWithoutHoldTimesIsAnAlarmAtOnceAndWhileItLasts) {
    begin(m_los);
    ASSERT_THAT(m_list.active(), SizeIs(1));
    Alarm const alarm = m_list.active().front();
    EXPECT_EQ(alarm.condition, m_los);
    EXPECT_EQ(alarm.severity, AlarmSeverity::Critical);
    EXPECT_EQ(alarm.raised, m_now.date);
    EXPECT_EQ(alarm.number, 101U);
    end(m_los);
    EXPECT_THAT(m_list.active(), IsEmpty());
    EXPECT_THAT(m_events, ElementsAre("raised critical 1", "cleared critical 1"));
}

TEST_F(AlarmListTest, ClearedAlarmIsRememberedWithItsTimes) {
    begin(m_los);
    auto const raised = m_now.date;
    pass(seconds(7));
    end(m_los);
    ASSERT_THAT(m_list.cleared(), SizeIs(1));
    EXPECT_EQ(m_list.cleared().front().raised, raised);
    EXPECT_EQ(m_list.cleared().front().cleared, raised + seconds(7));
}

TEST_F(AlarmListTest, AlarmIsRaisedAfterItsHoldTimeWithTheTimeOfItsBeginning) {
    configure("dsx1LossOfSignal=critical,raise=5");
    auto const began = m_now.date;
    begin(m_los);
    pass(seconds(4));
    EXPECT_THAT(m_list.active(), IsEmpty());
    pass(seconds(1));
    ASSERT_THAT(m_list.active(), SizeIs(1));
    EXPECT_EQ(m_list.active().front().began, began);
    EXPECT_EQ(m_list.active().front().raised, began + seconds(5));
}

TEST_F(AlarmListTest, ConditionThatEndsBeforeItsHoldTimeIsCountedAsSuppressed) {
    configure("dsx1LossOfSignal=critical,raise=5");
    begin(m_los);
    pass(seconds(4));
    end(m_los);
    pass(AlarmList::kFlapWindow);
    EXPECT_THAT(m_events, IsEmpty());
    EXPECT_EQ(m_list.counts().begun, 1U);
    EXPECT_EQ(m_list.counts().suppressed, 1U);
}

TEST_F(AlarmListTest, AlarmIsClearedWhenItsConditionHasBeenAbsentForTheHoldTime) {
    configure("dsx1LossOfSignal=critical,clear=10");
    begin(m_los);
    end(m_los);
    pass(seconds(9));
    EXPECT_THAT(m_list.active(), SizeIs(1));
    begin(m_los);
    pass(seconds(9));
    end(m_los);
    pass(seconds(10));
    EXPECT_THAT(m_events, ElementsAre("raised critical 1", "cleared critical 2"));
}

TEST_F(AlarmListTest, FlappingConditionIsOneAlarmUntilItHasBeenQuiet) {
    for (int i = 0; i < 20; ++i) {
        flap(m_los);
        pass(seconds(1));
    }
    // The third beginning within a minute makes it flap.
    EXPECT_THAT(m_events,
                ElementsAre("raised critical 1", "cleared critical 1", "raised critical 1",
                            "cleared critical 1", "raised critical 1"));
    EXPECT_THAT(m_list.active(), SizeIs(1));
    pass(AlarmList::kFlapWindow - seconds(2));
    EXPECT_THAT(m_list.active(), SizeIs(1));
    pass(seconds(1));
    EXPECT_THAT(m_list.active(), IsEmpty());
    EXPECT_EQ(m_events.back(), "cleared critical 18");
}

TEST_F(AlarmListTest, FlappingConditionThatNeverLastsLongEnoughIsRaisedAllTheSame) {
    configure("dsx1LossOfSignal=critical,raise=30");
    for (int i = 0; i < 3; ++i) {
        flap(m_los);
        pass(seconds(1));
    }
    EXPECT_THAT(m_events, ElementsAre("raised critical 3"));
}

TEST_F(AlarmListTest, ConditionThatHasLastedSinceItFlappedIsClearedAtOnce) {
    for (int i = 0; i < 3; ++i)
        flap(m_los);
    begin(m_los);
    pass(AlarmList::kFlapWindow);
    end(m_los);
    EXPECT_THAT(m_list.active(), IsEmpty());
}

TEST_F(AlarmListTest, RepeatedReportCountsButDoesNotRaiseAgain) {
    begin(m_los);
    m_list.begin(m_los, now(), true);
    begin(m_los);
    EXPECT_EQ(m_list.active().front().count, 2U);
    EXPECT_THAT(m_events, SizeIs(1));
}

TEST_F(AlarmListTest, ComparisonBeginsAndEndsWhatNoEventReported) {
    m_list.compare(AlarmScope::Snapshot, {m_los}, now().steady, now());
    EXPECT_THAT(m_list.active(), SizeIs(1));
    m_list.compare(AlarmScope::Snapshot, {m_los}, now().steady, now());
    EXPECT_EQ(m_list.active().front().count, 1U);
    m_list.compare(AlarmScope::Snapshot, {}, now().steady, now());
    EXPECT_THAT(m_list.active(), IsEmpty());
}

TEST_F(AlarmListTest, EventThatIsNewerThanTheSnapshotTakesPrecedence) {
    auto const read = now().steady;
    Condition const ais = condition(AlarmKind::LineRcvAIS);
    begin(ais);
    pass(seconds(1));
    begin(m_los);
    end(ais);
    m_list.compare(AlarmScope::Snapshot, {ais}, read, now());
    ASSERT_THAT(m_list.active(), SizeIs(1));
    EXPECT_EQ(m_list.active().front().condition.key.kind, AlarmKind::LineLossOfSignal);
}

TEST_F(AlarmListTest, ComparisonLeavesOtherScopesAlone) {
    begin(m_los);
    m_list.compare(AlarmScope::Health, {}, now().steady, now());
    EXPECT_THAT(m_list.active(), SizeIs(1));
}

TEST_F(AlarmListTest, OtherSeverityTakesEffectOnActiveAlarms) {
    begin(m_los);
    configure("dsx1LossOfSignal=minor");
    EXPECT_EQ(m_list.active().front().severity, AlarmSeverity::Minor);
    EXPECT_THAT(m_events, ElementsAre("raised critical 1", "changed minor 1"));
}

TEST_F(AlarmListTest, KindThatIsSwitchedOffIsClearedAndCountedOnly) {
    begin(m_los);
    configure("dsx1LossOfSignal=off");
    EXPECT_THAT(m_list.active(), IsEmpty());
    end(m_los);
    begin(m_los);
    EXPECT_THAT(m_events, ElementsAre("raised critical 1", "cleared critical 1"));
    EXPECT_EQ(m_list.counts().begun, 2U);
}

TEST_F(AlarmListTest, KindThatIsSwitchedOnAgainIsRaisedIfItsConditionLasts) {
    configure("dsx1LossOfSignal=off");
    begin(m_los);
    m_policies = {};
    m_list.apply(m_policies, now());
    EXPECT_THAT(m_events, ElementsAre("raised critical 1"));
}

TEST_F(AlarmListTest, RestoredAlarmStaysWithItsTimesUntilItsConditionHasGone) {
    Alarm alarm;
    alarm.condition = m_los;
    alarm.number = 7;
    alarm.count = 3;
    alarm.raised = m_now.date - seconds(3600);
    m_list.restore({alarm}, now());
    pass(seconds(1));
    m_list.compare(AlarmScope::Snapshot, {m_los}, now().steady, now());
    ASSERT_THAT(m_list.active(), SizeIs(1));
    EXPECT_EQ(m_list.active().front().number, 7U);
    EXPECT_EQ(m_list.active().front().count, 3U);
    EXPECT_THAT(m_events, IsEmpty());
    m_list.compare(AlarmScope::Snapshot, {}, now().steady, now());
    EXPECT_THAT(m_events, ElementsAre("cleared critical 3"));
}

TEST_F(AlarmListTest, FullListCountsWhatItCannotFollow) {
    AlarmList small(
        {}, [](AlarmEvent, Alarm const&) { return 1U; }, 2);
    for (std::uint32_t number = 1; number <= 3; ++number)
        small.begin(condition(AlarmKind::LineLossOfSignal, number), now());
    EXPECT_THAT(small.active(), SizeIs(2));
    EXPECT_EQ(small.counts().unlisted, 1U);
}

TEST_F(AlarmListTest, NextDeadlineIsThatOfTheEarliestHeldAlarm) {
    configure("dsx1LossOfSignal=critical,raise=5");
    EXPECT_EQ(m_list.advance(now()), std::nullopt);
    begin(m_los);
    EXPECT_EQ(m_list.advance(now()), now().steady + seconds(5));
}

TEST_F(AlarmListTest, VersionChangesWithWhatIsShown) {
    auto const before = m_list.contents(0).version;
    begin(m_los);
    auto const raised = m_list.contents(0).version;
    EXPECT_NE(raised, before);
    begin(m_los);
    EXPECT_EQ(m_list.contents(0).version, raised);
    Condition other = m_los;
    other.text = "something else";
    begin(other);
    EXPECT_NE(m_list.contents(0).version, raised);
}

TEST_F(AlarmListTest, EveryKindCanBeSwitchedOff) {
    for (AlarmKindInfo const& info : alarmKinds()) {
        begin(condition(info.kind));
        ASSERT_THAT(m_list.active(), SizeIs(info.raiseHold.count() == 0 ? 1 : 0)) << info.name;
        configure(std::string(info.name) + "=off");
        EXPECT_THAT(m_list.active(), IsEmpty()) << info.name;
        pass(AlarmPolicies::kLongestHold);
        EXPECT_THAT(m_list.active(), IsEmpty()) << info.name;
    }
}

TEST_F(AlarmListTest, CountsOfEachKindSayHowLongItsAlarmsWereActive) {
    begin(m_los);
    pass(seconds(10));
    begin(condition(AlarmKind::LineLossOfSignal, 1001));
    begin(condition(AlarmKind::BoardFailed));
    pass(seconds(5));
    end(m_los);
    auto const kinds = m_list.contents(0).kinds;
    AlarmList::KindCounts const& signal = kinds.at(AlarmKind::LineLossOfSignal);
    EXPECT_EQ(signal.raised, 2U);
    EXPECT_EQ(signal.cleared, 1U);
    EXPECT_EQ(signal.active, 1U);
    EXPECT_EQ(signal.lasted, seconds(10 + 2 * 5));
    EXPECT_EQ(kinds.at(AlarmKind::BoardFailed).active, 1U);
    EXPECT_FALSE(kinds.contains(AlarmKind::BoardGone));
}

TEST_F(AlarmListTest, RestoredAlarmIsActiveWithoutBeingRaised) {
    begin(m_los);
    AlarmList restarted({}, [](AlarmEvent, Alarm const&) { return 1U; });
    restarted.restore(m_list.active(), m_now);
    auto const before = restarted.contents(0).kinds.at(AlarmKind::LineLossOfSignal);
    EXPECT_EQ(before.raised, 0U);
    EXPECT_EQ(before.active, 1U);
    m_now.steady += seconds(7);
    restarted.end(m_los.key, m_now);
    auto const after = restarted.contents(0).kinds.at(AlarmKind::LineLossOfSignal);
    EXPECT_EQ(after.cleared, 1U);
    EXPECT_EQ(after.active, 0U);
    EXPECT_EQ(after.lasted, seconds(7));
}

} // namespace
} // namespace kvloamd
