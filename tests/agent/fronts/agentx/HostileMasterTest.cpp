// SPDX-License-Identifier: BSD-2-Clause
// Masters that are silent, slow, or send nonsense.
#include "agent/fronts/agentx/AgentxSession.h"

#include "tests/agent/fronts/agentx/AgentxSessionFixture.h"

namespace kvloamd {
namespace {

using std::chrono::milliseconds;

class HostileMasterTest : public AgentxSessionFixture {};

TEST_F(HostileMasterTest, GarbageEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(std::string(40, 'x'));
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(HostileMasterTest, SilentMasterIsAskedAndLostUntilItAnswers) {
    startMaster();
    AgentxPace pace = patient();
    pace.ping = pace.patience = milliseconds(20);
    startSession(pace);
    grant(AgentxKind::Open);
    grant(AgentxKind::Register);
    Packet const ping = next();
    EXPECT_EQ(ping.header.kind, AgentxKind::Ping);
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    m_master->respond(ping);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
}

TEST_F(HostileMasterTest, MasterThatMisbehavesIsConnectedToEverMoreSlowly) {
    startMaster();
    AgentxPace pace = patient();
    pace.retry = milliseconds(4);
    pace.longestRetry = milliseconds(16);
    startSession(pace);
    for (int const expected : {4, 8, 16, 16}) {
        connectSession();
        m_master->say(std::string(40, 'x'));
        EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
        EXPECT_EQ(m_session->deadline() - m_now, milliseconds(expected));
        m_master->hangUp();
    }
}

TEST_F(HostileMasterTest, MasterThatLeavesAtOnceIsConnectedToEverMoreSlowly) {
    startMaster();
    startSession();
    for (int const expected : {1, 2, 4, 8}) {
        connectSession();
        m_master->hangUp();
        EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
        EXPECT_EQ(m_session->deadline() - m_now, milliseconds(expected));
    }
}

TEST_F(HostileMasterTest, SteadyConnectionEndsTheLongPauses) {
    startMaster();
    AgentxPace pace = patient();
    pace.steady = milliseconds(0);
    startSession(pace);
    for (int round = 0; round < 4; ++round) {
        connectSession();
        m_master->hangUp();
        EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
        EXPECT_EQ(m_session->deadline() - m_now, pace.retry);
    }
}

TEST_F(HostileMasterTest, PacketOfAnotherSessionEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(AgentxWriter(AgentxKind::TestSet, 78, 5, 6).take());
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(HostileMasterTest, EndlessPacketEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    std::string head = AgentxWriter(AgentxKind::GetNext, 77, 5, 6).take();
    head.replace(16, 4, "\x7f\xff\xff\xff");
    m_master->say(head);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
}

TEST_F(HostileMasterTest, MasterThatAsksAndDoesNotReadCostsBoundedMemory) {
    constexpr std::size_t answerSize = std::size_t{64} * 1024;
    startMaster();
    m_session.emplace(
        *parseAgentxAddress(path()), roots(), m_rows,
        [](AgentxHeader const&, std::string_view) { return std::string(answerSize, 'x'); },
        patient());
    connectSession();
    std::size_t asked = 0;
    while (asked < 1000 && m_session->isConnected()) {
        m_master->say(AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take());
        m_session->advance(POLLIN);
        ++asked;
    }
    EXPECT_FALSE(m_session->isConnected());
    // What the socket takes, and four megabytes.
    int taken = 0;
    socklen_t size = sizeof taken;
    int const probe = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    ASSERT_EQ(getsockopt(probe, SOL_SOCKET, SO_SNDBUF, &taken, &size), 0);
    close(probe);
    EXPECT_LE(asked * answerSize,
              std::size_t{4} * 1024 * 1024 + static_cast<std::size_t>(taken) + 2 * answerSize);
}

TEST_F(HostileMasterTest, MasterThatNeverAnswersIsConnectedAnew) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = pace.surrender = milliseconds(20);
    startSession(pace);
    EXPECT_EQ(next().header.kind, AgentxKind::Open);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
}

TEST_F(HostileMasterTest, MasterThatLetsNobodyInIsWaitedForWithoutBlocking) {
    startMaster();
    // Those who wait already fill the place before the door.
    auto const address = *parseAgentxAddress(path());
    std::vector<int> waiting;
    int result = 0;
    while (result == 0) {
        waiting.push_back(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
        result = connect(waiting.back(), reinterpret_cast<sockaddr const*>(&address.socket),
                         address.size);
    }
    ASSERT_EQ(errno, EAGAIN);
    startSession();
    EXPECT_LT(m_session->descriptor(), 0);
    for (int const descriptor : waiting)
        close(descriptor);
    // The master lets in those who waited, and finds that they have left.
    for (std::size_t i = 0; i + 1 < waiting.size(); ++i) {
        ASSERT_TRUE(m_master->accept());
        m_master->hangUp();
    }
    connectSession();
}

} // namespace
} // namespace kvloamd
