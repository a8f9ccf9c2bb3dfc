// SPDX-License-Identifier: BSD-2-Clause
// The scheduler's list and its passes, driven by hand.
#include <algorithm>
#include <limits>
#include <string>
#include <utility>

#include <gtest/gtest.h>

#include "platform/ActionList.h"
#include "platform/ActionScheduler_pthread.h"
#include "tests/support/Slots.h"

namespace {

constexpr long kStart = 1000;
constexpr long kLast = std::numeric_limits<long>::max();
constexpr long kNever = kLast;

long s_now = kStart;

/// A scheduler without a thread. The test wakes it.
class DrivenScheduler final : public ActionScheduler_pthread {
  public:
    DrivenScheduler() : ActionScheduler_pthread([] { return s_now; }) {}

    using ActionScheduler_pthread::lock_list;
    using ActionScheduler_pthread::put_item_on_list;
    using ActionScheduler_pthread::remove_item_from_list;
    using ActionScheduler_pthread::unlock_list;

    void wakeAt(long time) {
        s_now = time;
        run_pass(time);
    }
    long nextWakeUp() const { return m_nextWakeUp; }
    std::size_t size() const { return m_list->size(); }
    SchedItem item(Schedulable* target) { return *find_item_on_list(target); }
};

/// Appends its name and the time to the test's record when it is called.
class Action final : public Schedulable {
  public:
    Action(std::string name, std::string& record) : m_name(std::move(name)), m_record(record) {}
    int ScheduledAction() override {
        m_record += m_name + std::to_string(s_now) + " ";
        return 0;
    }

  private:
    std::string m_name;
    std::string& m_record;
};

class ActionSchedulerTest : public testing::Test {
  protected:
    ActionSchedulerTest() { s_now = kStart; }

    /// Sleeps and wakes as the loop does, from a change of the list until `time`.
    void runUntil(long time) {
        m_scheduler.wakeAt(s_now);
        while (m_scheduler.nextWakeUp() <= time)
            m_scheduler.wakeAt(std::max(s_now, m_scheduler.nextWakeUp()));
        s_now = time;
    }
    /// Returns what was called since the last call of this.
    std::string called() { return std::exchange(m_record, ""); }

    std::string m_record;
    Action m_a{"a", m_record};
    Action m_b{"b", m_record};
    Action m_c{"c", m_record};
    DrivenScheduler m_scheduler;
};

TEST_F(ActionSchedulerTest, PeriodOfASecondIsCalledEverySecondFromTheNextOn) {
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, 1), 0);
    runUntil(1003);
    EXPECT_EQ(called(), "a1001 a1002 a1003 ");
}

TEST_F(ActionSchedulerTest, PeriodOfFifteenMinutesIsFirstCalledAfterFifteenMinutes) {
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, 900), 0);
    runUntil(2800);
    EXPECT_EQ(called(), "a1900 a2800 ");
}

TEST_F(ActionSchedulerTest, PeriodOfZeroIsCalledOnceAtTheNextWakeUp) {
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, 0), 0);
    EXPECT_EQ(m_scheduler.item(&m_a).due, 0);
    runUntil(1010);
    EXPECT_EQ(called(), "a1000 ");
    EXPECT_EQ(m_scheduler.size(), 0U);
}

TEST_F(ActionSchedulerTest, NegativePeriodIsCalledOnceAtTheNextWakeUp) {
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, -5), 0);
    runUntil(1010);
    EXPECT_EQ(called(), "a1000 ");
    EXPECT_EQ(m_scheduler.size(), 0U);
}

TEST_F(ActionSchedulerTest, TimeOfAOneTimeActionIsSinceTheEpochAndThusLongPast) {
    EXPECT_EQ(m_scheduler.AddOneTimeAction(&m_a, 60), 0);
    runUntil(1200);
    EXPECT_EQ(called(), "a1000 ");
    EXPECT_EQ(m_scheduler.size(), 0U);
}

TEST_F(ActionSchedulerTest, OneTimeActionOfTheFutureIsCalledAtItsTime) {
    EXPECT_EQ(m_scheduler.AddOneTimeAction(&m_a, 1060), 0);
    runUntil(1059);
    EXPECT_EQ(called(), "");
    runUntil(1200);
    EXPECT_EQ(called(), "a1060 ");
}

TEST_F(ActionSchedulerTest, ObjectOnTheListIsRefusedAndItsEntryStays) {
    m_scheduler.AddPeriodic(&m_a, 900);
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, 1), 1);
    EXPECT_EQ(m_scheduler.AddOneTimeAction(&m_a, 1001), 1);
    EXPECT_EQ(m_scheduler.size(), 1U);
    EXPECT_EQ(m_scheduler.item(&m_a).period, 900);
    EXPECT_EQ(m_scheduler.item(&m_a).due, 1900);
}

TEST_F(ActionSchedulerTest, OneTimeEntryIsRefusedASecondTime) {
    m_scheduler.AddOneTimeAction(&m_a, 1060);
    EXPECT_EQ(m_scheduler.AddOneTimeAction(&m_a, 1001), 1);
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, 1), 1);
    runUntil(1200);
    EXPECT_EQ(called(), "a1060 ");
}

TEST_F(ActionSchedulerTest, RemovedObjectIsNotCalled) {
    m_scheduler.AddPeriodic(&m_a, 1);
    m_scheduler.AddPeriodic(&m_b, 1);
    runUntil(1001);
    EXPECT_EQ(m_scheduler.Remove(&m_a), 0);
    runUntil(1002);
    EXPECT_EQ(called(), "a1001 b1001 b1002 ");
}

TEST_F(ActionSchedulerTest, RemovedObjectCanBeAddedAgain) {
    m_scheduler.AddPeriodic(&m_a, 900);
    EXPECT_EQ(m_scheduler.Remove(&m_a), 0);
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, 2), 0);
    runUntil(1002);
    EXPECT_EQ(called(), "a1002 ");
}

TEST_F(ActionSchedulerTest, OneTimeActionCanBeAddedAgainAfterItsCall) {
    m_scheduler.AddOneTimeAction(&m_a, 1001);
    runUntil(1001);
    EXPECT_EQ(m_scheduler.Remove(&m_a), 1);
    EXPECT_EQ(m_scheduler.AddOneTimeAction(&m_a, 1002), 0);
    runUntil(1002);
    EXPECT_EQ(called(), "a1001 a1002 ");
}

TEST_F(ActionSchedulerTest, UnknownObjectIsNeitherRemovedNorChanged) {
    m_scheduler.AddPeriodic(&m_b, 1);
    EXPECT_EQ(m_scheduler.Remove(&m_a), 1);
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, 5), 1);
    EXPECT_EQ(m_scheduler.size(), 1U);
}

TEST_F(ActionSchedulerTest, ChangeOfPeriodMovesTheNextCallByTheDifference) {
    m_scheduler.AddPeriodic(&m_a, 900);
    s_now = 1010;
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, 300), 0);
    EXPECT_EQ(m_scheduler.item(&m_a).due, 1300);
    runUntil(1600);
    EXPECT_EQ(called(), "a1300 a1600 ");
}

TEST_F(ActionSchedulerTest, LongerPeriodMovesTheNextCallLater) {
    m_scheduler.AddPeriodic(&m_a, 300);
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, 900), 0);
    runUntil(1900);
    EXPECT_EQ(called(), "a1900 ");
}

TEST_F(ActionSchedulerTest, SamePeriodIsNoChange) {
    m_scheduler.AddPeriodic(&m_a, 900);
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, 900), 1);
    EXPECT_EQ(m_scheduler.item(&m_a).due, 1900);
    EXPECT_EQ(m_scheduler.item(&m_a).period, 900);
}

TEST_F(ActionSchedulerTest, OneTimeEntryTakesNoPeriod) {
    m_scheduler.AddOneTimeAction(&m_a, 1060);
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, 300), 1);
    EXPECT_EQ(m_scheduler.item(&m_a).due, 1060);
    EXPECT_EQ(m_scheduler.item(&m_a).period, 0);
}

TEST_F(ActionSchedulerTest, ChangeToNoPeriodMakesTheNextCallTheLast) {
    for (long const period : {0, -1}) {
        s_now = kStart;
        m_scheduler.AddPeriodic(&m_a, 10);
        EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, period), 0);
        runUntil(1100);
        EXPECT_EQ(called(), "a1000 ") << period;
        EXPECT_EQ(m_scheduler.size(), 0U) << period;
    }
}

TEST_F(ActionSchedulerTest, EntriesDueTogetherAreCalledInTheOrderOfTheirAddition) {
    m_scheduler.AddPeriodic(&m_c, 2);
    m_scheduler.AddOneTimeAction(&m_a, 1002);
    m_scheduler.AddPeriodic(&m_b, 2);
    runUntil(1002);
    EXPECT_EQ(called(), "c1002 a1002 b1002 ");
}

TEST_F(ActionSchedulerTest, EarlierEntriesAreCalledBeforeLaterOnes) {
    m_scheduler.AddPeriodic(&m_a, 3);
    m_scheduler.AddPeriodic(&m_b, 2);
    m_scheduler.AddPeriodic(&m_c, 1);
    m_scheduler.wakeAt(1000);
    m_scheduler.wakeAt(1003);
    EXPECT_EQ(called(), "c1003 b1003 a1003 ");
}

TEST_F(ActionSchedulerTest, EntriesCalledTogetherKeepTheirOrder) {
    m_scheduler.AddPeriodic(&m_b, 1);
    m_scheduler.AddPeriodic(&m_a, 1);
    runUntil(1003);
    EXPECT_EQ(called(), "b1001 a1001 b1002 a1002 b1003 a1003 ");
}

TEST_F(ActionSchedulerTest, EntriesThatMeetAfterAPassStandInTheOrderOfTheirCalls) {
    m_scheduler.AddPeriodic(&m_a, 2);
    s_now = 998;
    m_scheduler.AddPeriodic(&m_b, 3);
    m_scheduler.AddOneTimeAction(&m_c, 1004);
    m_scheduler.wakeAt(998);
    m_scheduler.wakeAt(1002);
    EXPECT_EQ(called(), "b1002 a1002 ");
    m_scheduler.wakeAt(1004);
    EXPECT_EQ(called(), "c1004 b1004 a1004 ");
}

TEST_F(ActionSchedulerTest, EntriesOfDifferentPeriodsMeetAndPart) {
    m_scheduler.AddPeriodic(&m_a, 3);
    m_scheduler.AddPeriodic(&m_b, 1);
    runUntil(1006);
    EXPECT_EQ(called(), "b1001 b1002 a1003 b1003 b1004 b1005 a1006 b1006 ");
}

TEST_F(ActionSchedulerTest, EntryCalledAgainStandsBehindThoseThatWereNotDue) {
    m_scheduler.AddPeriodic(&m_a, 1);
    m_scheduler.AddPeriodic(&m_b, 2);
    runUntil(1002);
    EXPECT_EQ(called(), "a1001 b1002 a1002 ");
}

TEST_F(ActionSchedulerTest, EntryOfAChangedPeriodStandsBehindItsEquals) {
    m_scheduler.AddPeriodic(&m_a, 900);
    m_scheduler.AddPeriodic(&m_b, 300);
    m_scheduler.AddPeriodic(&m_c, 300);
    m_scheduler.ChangePeriod(&m_a, 300);
    runUntil(1300);
    EXPECT_EQ(called(), "b1300 c1300 a1300 ");
}

TEST_F(ActionSchedulerTest, NextWakeUpIsOfTheEarliestEntryThatWasCalled) {
    m_scheduler.AddPeriodic(&m_a, 10);
    m_scheduler.AddOneTimeAction(&m_b, 1012);
    m_scheduler.wakeAt(1000);
    m_scheduler.wakeAt(1010);
    EXPECT_EQ(called(), "a1010 ");
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1020);
    m_scheduler.wakeAt(1020);
    EXPECT_EQ(called(), "b1020 a1020 ");
}

TEST_F(ActionSchedulerTest, ChangeOfTheListBringsAnEarlierEntryForward) {
    m_scheduler.AddPeriodic(&m_a, 10);
    m_scheduler.AddOneTimeAction(&m_b, 1012);
    m_scheduler.wakeAt(1000);
    m_scheduler.wakeAt(1010);
    m_scheduler.AddOneTimeAction(&m_c, 1015);
    m_scheduler.wakeAt(1011);
    EXPECT_EQ(called(), "a1010 ");
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1012);
    m_scheduler.wakeAt(1012);
    EXPECT_EQ(called(), "b1012 ");
}

TEST_F(ActionSchedulerTest, PassThatCallsNothingAgainSleepsUntilTheListChanges) {
    m_scheduler.AddOneTimeAction(&m_a, 1001);
    m_scheduler.AddPeriodic(&m_b, 2);
    m_scheduler.wakeAt(1000);
    m_scheduler.wakeAt(1001);
    EXPECT_EQ(called(), "a1001 ");
    EXPECT_EQ(m_scheduler.nextWakeUp(), kNever);

    m_scheduler.AddOneTimeAction(&m_c, 1050);
    m_scheduler.wakeAt(1004);
    EXPECT_EQ(called(), "");
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1002);
    m_scheduler.wakeAt(1004);
    EXPECT_EQ(called(), "b1004 ");
}

TEST_F(ActionSchedulerTest, OverdueEntryIsCalledOnceAPassAndCatchesUp) {
    m_scheduler.AddPeriodic(&m_a, 1);
    m_scheduler.wakeAt(1000);
    m_scheduler.wakeAt(1003);
    EXPECT_EQ(called(), "a1003 ");
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1002);
    m_scheduler.wakeAt(1003);
    m_scheduler.wakeAt(1003);
    EXPECT_EQ(called(), "a1003 a1003 ");
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1004);
    m_scheduler.wakeAt(1003);
    EXPECT_EQ(called(), "");
}

TEST_F(ActionSchedulerTest, EarlyWakeUpCallsNothing) {
    m_scheduler.AddPeriodic(&m_a, 10);
    m_scheduler.wakeAt(1000);
    m_scheduler.wakeAt(1009);
    EXPECT_EQ(called(), "");
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1010);
}

TEST_F(ActionSchedulerTest, EmptyListIsNeverWokenFor) {
    EXPECT_EQ(m_scheduler.nextWakeUp(), kNever);
    m_scheduler.AddPeriodic(&m_a, 10);
    m_scheduler.wakeAt(1000);
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1010);
    m_scheduler.Remove(&m_a);
    m_scheduler.wakeAt(1001);
    EXPECT_EQ(m_scheduler.nextWakeUp(), kNever);
}

TEST_F(ActionSchedulerTest, NewEntryMovesTheNextWakeUpWithTheNextPassOnly) {
    EXPECT_EQ(m_scheduler.put_item_on_list(&m_a, 5, 0), 0);
    EXPECT_EQ(m_scheduler.nextWakeUp(), kNever);
    m_scheduler.wakeAt(1000);
    EXPECT_EQ(m_scheduler.nextWakeUp(), 1005);
}

TEST_F(ActionSchedulerTest, EndlessPeriodIsDueAtTheLastTimeThatFits) {
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_a, kLast), 0);
    EXPECT_EQ(m_scheduler.item(&m_a).due, kLast);
    m_scheduler.wakeAt(kStart);
    m_scheduler.wakeAt(kLast);
    EXPECT_EQ(m_scheduler.item(&m_a).due, kLast);
    EXPECT_EQ(called(), "a" + std::to_string(kLast) + " ");
}

TEST_F(ActionSchedulerTest, ChangeToAnEndlessPeriodIsDueAtTheLastTimeThatFits) {
    m_scheduler.AddPeriodic(&m_a, 900);
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, kLast), 0);
    EXPECT_EQ(m_scheduler.item(&m_a).due, kLast);
}

TEST_F(ActionSchedulerTest, ChangeToTheSmallestPeriodIsDueAtOnceAndForTheLastTime) {
    m_scheduler.AddPeriodic(&m_a, 900);
    EXPECT_EQ(m_scheduler.ChangePeriod(&m_a, std::numeric_limits<long>::min()), 0);
    runUntil(1100);
    EXPECT_EQ(called(), "a1000 ");
}

TEST_F(ActionSchedulerTest, RemovalOfAnItemLeavesTheList) {
    m_scheduler.AddPeriodic(&m_a, 1);
    SchedItem item = m_scheduler.item(&m_a);
    EXPECT_EQ(m_scheduler.remove_item_from_list(&item), 0);
    EXPECT_EQ(m_scheduler.size(), 1U);
}

TEST_F(ActionSchedulerTest, ListCanBeLocked) {
    EXPECT_EQ(m_scheduler.lock_list(), 0);
    EXPECT_EQ(m_scheduler.unlock_list(), 0);
}

TEST_F(ActionSchedulerTest, OperationsKeepTheirSlots) {
    class Opened : public ActionScheduler {
      public:
        using ActionScheduler::lock_list;
        using ActionScheduler::put_item_on_list;
        using ActionScheduler::remove_item_from_list;
        using ActionScheduler::unlock_list;
    };
    EXPECT_EQ(slotOf(&Schedulable::ScheduledAction), 0);
    EXPECT_EQ(slotOf(&ActionScheduler::Run), 0);
    // The destructor takes two.
    EXPECT_EQ(slotOf(&ActionScheduler::Remove), 3);
    EXPECT_EQ(slotOf(&ActionScheduler::ChangePeriod), 4);
    EXPECT_EQ(slotOf(&Opened::put_item_on_list), 5);
    EXPECT_EQ(slotOf(&Opened::remove_item_from_list), 6);
    EXPECT_EQ(slotOf(&Opened::lock_list), 7);
    EXPECT_EQ(slotOf(&Opened::unlock_list), 8);
}

TEST_F(ActionSchedulerTest, ConcreteOperationsKeepTheSlotsOfTheAbstractOnes) {
    EXPECT_EQ(slotOf(&ActionScheduler_pthread::Run), 0);
    EXPECT_EQ(slotOf(&ActionScheduler_pthread::Remove), 3);
    EXPECT_EQ(slotOf(&ActionScheduler_pthread::ChangePeriod), 4);
    EXPECT_EQ(slotOf(&DrivenScheduler::put_item_on_list), 5);
    EXPECT_EQ(slotOf(&DrivenScheduler::remove_item_from_list), 6);
    EXPECT_EQ(slotOf(&DrivenScheduler::lock_list), 7);
    EXPECT_EQ(slotOf(&DrivenScheduler::unlock_list), 8);
}

} // namespace
