// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/LinkWatch.h"

#include <string>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

InterfaceRow interface(std::uint32_t ifIndex, std::optional<int> operStatus,
                       std::uint32_t boardIndex = 1) {
    InterfaceRow row;
    row.ifIndex = ifIndex;
    row.boardIndex = boardIndex;
    row.adminStatus = 1;
    row.operStatus = operStatus;
    return row;
}

class LinkWatchTest : public ::testing::Test {
  protected:
    void note(std::vector<InterfaceRow> const& rows) { m_watch.update(rows, Clock::now()); }
    /// The notifications since the last call: "down 7 " for each.
    std::string told() {
        std::string all;
        while (auto const notification = m_queue.pop()) {
            EXPECT_TRUE(startsWith(notification->name, Oid{1, 3, 6, 1, 6, 3, 1, 1, 5}));
            all += notification->name.back() == 3 ? "down " : "up ";
            all += std::to_string(notification->objects.at(0).name.back()) + " ";
        }
        return all;
    }
    /// The notifications of an interface that changes from one state to another.
    std::string toldOf(std::optional<int> former, std::optional<int> now) {
        LinkWatch watch(m_settings, m_queue, m_counters);
        watch.update({interface(7, former)}, Clock::now());
        watch.update({interface(7, now)}, Clock::now());
        return told();
    }

    Settings m_settings;
    Counters m_counters;
    NotificationQueue m_queue{m_counters};
    LinkWatch m_watch{m_settings, m_queue, m_counters};
};

TEST_F(LinkWatchTest, FirstSnapshotTellsNothing) {
    note({interface(7, kDown), interface(8, kUp)});
    EXPECT_EQ(told(), "");
}

TEST_F(LinkWatchTest, LinkThatBecomesDownIsTold) {
    for (int const down : {kDown, kLowerLayerDown})
        for (int const former : {kUp, kTesting, kUnknownStatus, kDormant})
            EXPECT_EQ(toldOf(former, down), "down 7 ") << former << " " << down;
}

TEST_F(LinkWatchTest, LinkThatIsDownNoLongerIsTold) {
    for (int const down : {kDown, kLowerLayerDown})
        for (int const now : {kUp, kTesting, kUnknownStatus, kDormant})
            EXPECT_EQ(toldOf(down, now), "up 7 ") << down << " " << now;
}

TEST_F(LinkWatchTest, LinkThatIsNotPresentBeforeOrAfterIsNotTold) {
    for (int const other : {kUp, kDown, kDormant, kLowerLayerDown}) {
        EXPECT_EQ(toldOf(kNotPresent, other), "") << other;
        EXPECT_EQ(toldOf(other, kNotPresent), "") << other;
    }
}

TEST_F(LinkWatchTest, ChangeBetweenStatesThatAreNotDownIsNotTold) {
    EXPECT_EQ(toldOf(kDormant, kUp), "");
    EXPECT_EQ(toldOf(kUp, kTesting), "");
}

TEST_F(LinkWatchTest, LinkThatIsDownForAnotherReasonIsNotToldAgain) {
    EXPECT_EQ(toldOf(kDown, kLowerLayerDown), "");
    EXPECT_EQ(toldOf(kLowerLayerDown, kDown), "");
}

TEST_F(LinkWatchTest, LinkDownCarriesTheStateThatAGetAnswers) {
    note({interface(7, kUp)});
    note({interface(7, kLowerLayerDown)});
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_EQ(told->name.back(), 3U); // linkDown
    EXPECT_EQ(std::get<std::int64_t>(told->objects.at(2).value), kLowerLayerDown);
}

TEST_F(LinkWatchTest, LinkThatStaysIsNotToldAgain) {
    EXPECT_EQ(toldOf(kDown, kDown), "");
    EXPECT_EQ(toldOf(kUp, kUp), "");
}

TEST_F(LinkWatchTest, StateThatIsNotKnownIsNoChange) {
    EXPECT_EQ(toldOf(std::nullopt, kDown), "");
    EXPECT_EQ(toldOf(kDown, std::nullopt), "");
}

TEST_F(LinkWatchTest, InterfacesThatComeAndGoAreNotTold) {
    note({interface(7, kUp), interface(9, kUp)});
    note({interface(8, kDown), interface(9, kUp)});
    note({interface(7, kDown), interface(9, kUp)});
    EXPECT_EQ(told(), "");
}

TEST_F(LinkWatchTest, InterfaceThatHasComeBackWithItsBoardIsNotTold) {
    note({interface(7, kUp, 1)});
    note({interface(7, kDown, 2)});
    EXPECT_EQ(told(), "");
    note({interface(7, kUp, 2)});
    EXPECT_EQ(told(), "up 7 ");
}

TEST_F(LinkWatchTest, ChangesAreToldInTheOrderOfTheirIndices) {
    note({interface(7, kUp), interface(8, kUp), interface(9, kDown)});
    note({interface(6, kUp), interface(7, kDown), interface(8, kUp), interface(9, kUp)});
    EXPECT_EQ(told(), "down 7 up 9 ");
}

TEST_F(LinkWatchTest, InterfaceAboveAnotherIsNotToldUnlessItIsSet) {
    InterfaceRow up = interface(7, kUp);
    InterfaceRow down = interface(7, kDown);
    up.linkUpDownTraps = down.linkUpDownTraps = 2;
    note({up});
    note({down});
    EXPECT_EQ(told(), "");
    m_settings.exchange({Setting::LinkUpDownTraps, 7}, 1);
    note({up});
    EXPECT_EQ(told(), "up 7 ");
}

TEST_F(LinkWatchTest, InterfaceForWhichItIsSetOffIsNotTold) {
    m_settings.exchange({Setting::LinkUpDownTraps, 7}, 2);
    EXPECT_EQ(toldOf(kUp, kDown), "");
}

TEST_F(LinkWatchTest, NotificationCarriesIndexAndBothStates) {
    note({interface(7, kUp)});
    InterfaceRow row = interface(7, kDown);
    row.adminStatus = 2;
    auto const begun = Clock::now();
    m_watch.update({row}, begun);
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_EQ(told->when, begun);
    ASSERT_EQ(told->objects.size(), 3U);
    std::int64_t const expected[] = {7, 2, kDown};
    std::uint32_t const columns[] = {1, 7, 8};
    for (std::size_t i = 0; i < 3; ++i) {
        EXPECT_EQ(told->objects[i].name, (Oid{1, 3, 6, 1, 2, 1, 2, 2, 1, columns[i], 7}));
        EXPECT_EQ(told->objects[i].type, ValueType::Integer);
        EXPECT_EQ(std::get<std::int64_t>(told->objects[i].value), expected[i]);
    }
}

TEST_F(LinkWatchTest, InterfaceThatNobodyCanTakeDownIsToldAsWantedUp) {
    InterfaceRow up = interface(7, kUp);
    InterfaceRow down = interface(7, kDown);
    up.adminStatus = down.adminStatus = std::nullopt;
    note({up});
    note({down});
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_EQ(std::get<std::int64_t>(told->objects.at(1).value), kUp);
}

TEST_F(LinkWatchTest, LineIsToldWithTheTimeAtWhichItBecameUnavailable) {
    m_counters.started = Clock::now();
    m_counters.setSysUpTime(5000, m_counters.started);
    InterfaceRow up = interface(7, kUp);
    InterfaceRow down = interface(7, kDown);
    up.type = down.type = kTypeDs1;
    up.lastChange = 0;
    down.lastChange = 300;
    note({up});
    note({down});
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_EQ(told->sysUpTime, 5300U);
}

TEST_F(LinkWatchTest, OtherInterfacesAreToldWithTheTimeAtWhichTheyAreTold) {
    InterfaceRow down = interface(7, kDown);
    down.type = kTypeEthernet;
    down.lastChange = 300;
    note({interface(7, kUp)});
    note({down});
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_EQ(told->sysUpTime, std::nullopt);
}

TEST_F(LinkWatchTest, ChangesBeyondTheQueueAreCounted) {
    NotificationQueue queue(m_counters, 1);
    LinkWatch watch(m_settings, queue, m_counters);
    watch.update({interface(7, kUp), interface(8, kUp)}, Clock::now());
    watch.update({interface(7, kDown), interface(8, kDown)}, Clock::now());
    EXPECT_EQ(queue.size(), 1U);
    EXPECT_EQ(m_counters.notificationsDropped, 1U);
}

} // namespace
} // namespace kvloamd
