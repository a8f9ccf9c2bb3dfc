// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/CallWatch.h"

#include <string>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

constexpr int kIdle = 1;
constexpr int kConnecting = 2;
constexpr int kActive = 4;

/// Channel 7 of signalling channel 3.
BearerRow bearer(int operStatus, std::uint32_t setupTime = 0, bool connected = false,
                 std::string peer = "100") {
    BearerRow row;
    row.ifIndex = 7;
    row.signalling = 3;
    row.operStatus = operStatus;
    row.call.setupTime = setupTime;
    row.call.connected = connected;
    row.call.connectTime = connected ? setupTime + 1 : 0;
    row.call.peerAddress = std::move(peer);
    row.call.origin = 2;
    return row;
}

BearerRow unused() {
    BearerRow row = bearer(kIdle);
    row.call = {};
    return row;
}

class CallWatchTest : public ::testing::Test {
  protected:
    CallWatchTest() { m_settings.exchange({Setting::CallInformationTraps, 3}, 1); }

    /// The peers of the notifications that a snapshot with `row` causes, "+" before connected ones.
    std::string toldOf(BearerRow const& row) {
        m_watch.update({row}, Clock::now());
        std::string all;
        while (auto const notification = m_queue.pop()) {
            EXPECT_EQ(notification->name, (Oid{1, 3, 6, 1, 2, 1, 10, 20, 2, 0, 1}));
            // The eighth object is the time at which the call was connected.
            if (notification->objects.size() == 8) all += "+";
            all += std::get<std::string>(notification->objects.at(2).value) + " ";
        }
        return all;
    }

    Settings m_settings;
    Counters m_counters;
    NotificationQueue m_queue{m_counters};
    CallWatch m_watch{m_settings, m_queue, m_counters};
};

TEST_F(CallWatchTest, CallThatIsConnectedIsAnnouncedOnce) {
    EXPECT_EQ(toldOf(unused()), "");
    EXPECT_EQ(toldOf(bearer(kConnecting, 10)), "");
    EXPECT_EQ(toldOf(bearer(kActive, 10, true)), "+100 ");
    EXPECT_EQ(toldOf(bearer(kActive, 10, true)), "");
    EXPECT_EQ(toldOf(bearer(kIdle, 10, true)), "");
}

TEST_F(CallWatchTest, CallThatWasOverBeforeTheSnapshotIsAnnounced) {
    toldOf(unused());
    EXPECT_EQ(toldOf(bearer(kIdle, 10, true)), "+100 ");
    EXPECT_EQ(toldOf(bearer(kIdle, 20, true)), "+100 ");
}

TEST_F(CallWatchTest, FailedCallsWithOnePeerAreAnnouncedOnceUntilOneIsConnected) {
    toldOf(unused());
    EXPECT_EQ(toldOf(bearer(kIdle, 10)), "100 ");
    EXPECT_EQ(toldOf(bearer(kIdle, 20)), "");
    EXPECT_EQ(toldOf(bearer(kIdle, 30, false, "200")), "200 ");
    EXPECT_EQ(toldOf(bearer(kActive, 40, true)), "+100 ");
    EXPECT_EQ(toldOf(bearer(kIdle, 50)), "100 ");
}

TEST_F(CallWatchTest, ChannelThatAppearsAnnouncesNothing) {
    EXPECT_EQ(toldOf(bearer(kActive, 10, true)), "");
    m_watch.update({}, Clock::now());
    EXPECT_EQ(toldOf(bearer(kActive, 20, true)), "");
}

TEST_F(CallWatchTest, NothingIsAnnouncedUnlessTheSignallingChannelHasItEnabled) {
    m_settings.exchange({Setting::CallInformationTraps, 3}, 2);
    toldOf(unused());
    EXPECT_EQ(toldOf(bearer(kActive, 10, true)), "");
    m_settings.exchange({Setting::CallInformationTraps, 3}, std::nullopt);
    EXPECT_EQ(toldOf(bearer(kActive, 20, true)), "");
    m_settings.exchange({Setting::CallInformationTraps, 3}, 1);
    EXPECT_EQ(toldOf(bearer(kActive, 30, true)), "+100 ");
}

TEST_F(CallWatchTest, NotificationHasTheObjectsOfItsModuleInTheirOrder) {
    m_watch.update({unused()}, Clock::now());
    m_watch.update({bearer(kActive, 10, true)}, Clock::now());
    auto const notification = m_queue.pop();
    ASSERT_TRUE(notification);
    std::vector<std::uint32_t> columns;
    for (NotifiedObject const& object : notification->objects) {
        EXPECT_EQ(object.name.back(), 7U);
        columns.push_back(object.name.at(object.name.size() - 2));
    }
    EXPECT_EQ(columns, (std::vector<std::uint32_t>{1, 2, 4, 5, 9, 7, 6, 10}));
}

} // namespace
} // namespace kvloamd
