// SPDX-License-Identifier: BSD-2-Clause
// The rows that a session registers among the master's own.
#include "tests/agent/fronts/agentx/AgentxSessionFixture.h"

namespace kvloamd {
namespace {

using std::chrono::milliseconds;

class AgentxSessionRowsTest : public AgentxSessionFixture {};

TEST_F(AgentxSessionRowsTest, IsConnectedBeforeTheRowsAreRegistered) {
    startMaster();
    haveInterfaces({1000});
    startSession();
    connectSession();
    EXPECT_EQ(rangeOf(next()), "2.1000-1000");
}

TEST_F(AgentxSessionRowsTest, RowsAreRegisteredOneRangeAfterTheOther) {
    startMaster();
    haveInterfaces({1000, 1001, 1016});
    startSession();
    connectSession();
    Packet const first = next();
    EXPECT_EQ(first.header.kind, AgentxKind::Register);
    EXPECT_EQ(first.header.session, 77U);
    // Nothing more comes before the answer, but answers.
    m_master->say(AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take());
    EXPECT_EQ(next().header.kind, AgentxKind::Response);
    EXPECT_FALSE(m_master->receive().has_value());
    m_master->respond(first);
    EXPECT_THAT(grantRanges(AgentxKind::Register, 3),
                ::testing::ElementsAre("2.1000-1001", "1.1016-1016", "1.1000-1001"));
}

TEST_F(AgentxSessionRowsTest, RowsThatComeLaterAreRegistered) {
    startMaster();
    startSession();
    connectSession();
    haveInterfaces({1000});
    EXPECT_THAT(grantRanges(AgentxKind::Register, 2),
                ::testing::ElementsAre("2.1000-1000", "1.1000-1000"));
}

TEST_F(AgentxSessionRowsTest, RowsThatHaveLongBeenGoneAreUnregistered) {
    startMaster();
    haveInterfaces({1000, 1001});
    startSession();
    connectSession();
    grantRanges(AgentxKind::Register, 2);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    haveInterfaces({});
    EXPECT_THAT(grantRanges(AgentxKind::Unregister, 2),
                ::testing::ElementsAre("2.1000-1001", "1.1000-1001"));
}

TEST_F(AgentxSessionRowsTest, RefusedRowsLeaveTheRestServed) {
    startMaster();
    haveInterfaces({1000, 1016});
    startSession();
    connectSession();
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_THAT(grantRanges(AgentxKind::Register, 3),
                ::testing::ElementsAre("2.1000-1000", "1.1016-1016", "1.1000-1000"));
    EXPECT_TRUE(m_session->isConnected());
}

TEST_F(AgentxSessionRowsTest, MasterThatDiesAmidTheRowsIsToldAllAgain) {
    startMaster();
    haveInterfaces({1000, 1016});
    startSession();
    connectSession();
    EXPECT_EQ(rangeOf(grant(AgentxKind::Register)), "2.1016-1016");
    EXPECT_EQ(rangeOf(next()), "2.1000-1000");
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    connectSession();
    EXPECT_THAT(grantRanges(AgentxKind::Register, 4),
                ::testing::ElementsAre("2.1016-1016", "2.1000-1000", "1.1016-1016", "1.1000-1000"));
}

TEST_F(AgentxSessionRowsTest, MasterThatHangsAmidTheRowsGoesOnWithThem) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = milliseconds(20);
    haveInterfaces({1000});
    startSession(pace);
    connectSession();
    Packet const packet = next();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    m_master->respond(packet);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    EXPECT_THAT(grantRanges(AgentxKind::Register, 1), ::testing::ElementsAre("1.1000-1000"));
}

TEST_F(AgentxSessionRowsTest, NotificationGoesOutAmidTheRows) {
    startMaster();
    haveInterfaces({1000});
    startSession();
    connectSession();
    Packet const range = next();
    ASSERT_TRUE(m_session->ready());
    notify();
    Packet const packet = next();
    EXPECT_EQ(packet.header.kind, AgentxKind::Notify);
    m_master->respond(packet);
    EXPECT_TRUE(runUntil([this] { return m_taken == 1; }));
    m_master->respond(range);
    EXPECT_THAT(grantRanges(AgentxKind::Register, 1), ::testing::ElementsAre("1.1000-1000"));
}

} // namespace
} // namespace kvloamd
