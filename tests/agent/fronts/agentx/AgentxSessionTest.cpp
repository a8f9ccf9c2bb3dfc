// SPDX-License-Identifier: BSD-2-Clause
// How a session connects to its master, registers, and leaves.
#include "agent/fronts/agentx/AgentxSession.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include "tests/agent/fronts/agentx/AgentxSessionFixture.h"

namespace kvloamd {
namespace {

class AgentxSessionTest : public AgentxSessionFixture {};

TEST_F(AgentxSessionTest, OpensThenRegistersInTheSessionThatTheMasterNames) {
    startMaster();
    startSession();
    grant(AgentxKind::Open);
    Packet const packet = grant(AgentxKind::Register);
    EXPECT_EQ(packet.header.session, 77U);
    AgentxReader reader(packet.payload, true);
    reader.number();
    EXPECT_EQ(reader.name().name, kRoot);
    EXPECT_TRUE(reader.atEnd());
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
}

TEST_F(AgentxSessionTest, ListsItsCapabilitiesInEverySession) {
    m_capabilities = {{{1, 3, 6, 1, 2, 1, 31}, "The MIB module IF-MIB"},
                      {{1, 3, 6, 1, 4, 1, 32473, 1}, "The MIB module KVL-OAM-MIB"}};
    startMaster();
    startSession();
    for (int session = 0; session < 2; ++session) {
        grant(AgentxKind::Open);
        grant(AgentxKind::Register);
        for (Capability const& capability : m_capabilities) {
            Packet const packet = grant(AgentxKind::AddAgentCaps);
            EXPECT_EQ(packet.header.session, 77U);
            AgentxReader reader(packet.payload, true);
            EXPECT_EQ(reader.name().name, capability.id);
            std::size_t const length = reader.number();
            EXPECT_EQ(length, capability.description.size());
            EXPECT_EQ(packet.payload.substr(packet.payload.size() - (length + 3) / 4 * 4, length),
                      capability.description);
        }
        EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
        m_master->hangUp();
        EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    }
}

TEST_F(AgentxSessionTest, ServesEvenIfTheMasterRefusesItsCapabilities) {
    m_capabilities = {{{1, 3, 6, 1, 2, 1, 31}, "The MIB module IF-MIB"}};
    startMaster();
    startSession();
    connectSession();
    m_master->respond(next(), AgentxFault::RequestDenied);
    notify();
    grant(AgentxKind::Notify);
    EXPECT_TRUE(runUntil([this] { return m_taken == 1; }));
    EXPECT_TRUE(m_session->isConnected());
}

TEST_F(AgentxSessionTest, ConnectsOnceAMasterIsThere) {
    startSession();
    EXPECT_FALSE(m_session->isConnected());
    startMaster();
    connectSession();
}

TEST_F(AgentxSessionTest, ConnectsAgainWhenTheMasterHasHungUp) {
    startMaster();
    startSession();
    connectSession();
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    connectSession();
}

TEST_F(AgentxSessionTest, ConnectsAgainWhenTheMasterEndsTheSession) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(AgentxWriter(AgentxKind::Close, 77, 0, 1).take());
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, TriesAgainWhenItsNamesAreRefused) {
    startMaster();
    startSession();
    grant(AgentxKind::Open);
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    EXPECT_FALSE(m_session->isConnected());
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, NamesThatCanBeDoneWithoutMayBeRefused) {
    m_servesOther = true;
    startMaster();
    startSession();
    grant(AgentxKind::Open);
    grant(AgentxKind::Register);
    ::testing::internal::CaptureStderr();
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    std::string const told = ::testing::internal::GetCapturedStderr();
    EXPECT_THAT(told, ::testing::HasSubstr("the SNMP master refuses DS1-MIB: another agent serves "
                                           "them already; stop it"));
    // The next master refuses them, too, which is not logged again.
    m_master->hangUp();
    ::testing::internal::CaptureStderr();
    grant(AgentxKind::Open);
    grant(AgentxKind::Register);
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    EXPECT_THAT(::testing::internal::GetCapturedStderr(),
                ::testing::Not(::testing::HasSubstr("refuses")));
}

TEST_F(AgentxSessionTest, RequestIsAnsweredWhateverPiecesItComesIn) {
    startMaster();
    startSession();
    connectSession();
    for (char const octet : AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take()) {
        m_master->say(std::string(1, octet));
        m_session->advance(POLLIN);
    }
    Packet const packet = next();
    EXPECT_EQ(packet.header.kind, AgentxKind::Response);
    EXPECT_EQ(packet.header.transaction, 5U);
    EXPECT_EQ(packet.header.packet, 6U);
}

TEST_F(AgentxSessionTest, LossesOfAMasterThatWasConnectedAreCounted) {
    startMaster();
    startSession();
    connectSession();
    EXPECT_EQ(m_session->timesLost(), 0U);
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    EXPECT_EQ(m_session->timesLost(), 1U);
}

TEST_F(AgentxSessionTest, MasterThatWasNeverConnectedIsNotLost) {
    startMaster();
    startSession();
    EXPECT_EQ(next().header.kind, AgentxKind::Open);
    m_master->hangUp();
    EXPECT_EQ(next().header.kind, AgentxKind::Open); // of the next connection
    EXPECT_EQ(m_session->timesLost(), 0U);
}

TEST_F(AgentxSessionTest, MasterThatHasForgottenTheSessionIsConnectedAnew) {
    startMaster();
    startSession();
    connectSession();
    notify();
    m_master->respond(next(), AgentxFault::NotOpen);
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    EXPECT_EQ(m_taken, 0);
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, RefusedConnectionOfTheNetworkIsTriedAgain) {
    // A bound port where nobody listens.
    int const bound = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    ASSERT_EQ(bind(bound, reinterpret_cast<sockaddr*>(&address), size), 0);
    ASSERT_EQ(getsockname(bound, reinterpret_cast<sockaddr*>(&address), &size), 0);
    m_session.emplace(
        *parseAgentxAddress("tcp:" + std::to_string(ntohs(address.sin_port))), roots(), m_rows,
        [](AgentxHeader const&, std::string_view) { return ""; }, patient());
    EXPECT_TRUE(runUntil([this] { return m_session->descriptor() < 0; }));
    ASSERT_EQ(listen(bound, 1), 0);
    int accepted = -1;
    EXPECT_TRUE(runUntil([&] {
        pollfd door{bound, POLLIN, 0};
        if (poll(&door, 1, 0) > 0) accepted = accept4(bound, nullptr, nullptr, SOCK_CLOEXEC);
        return accepted >= 0;
    }));
    close(accepted);
    close(bound);
}

TEST_F(AgentxSessionTest, LeaveIsTaken) {
    startMaster();
    startSession();
    connectSession();
    m_session.reset();
    auto const packet = m_master->receive();
    ASSERT_TRUE(packet.has_value());
    EXPECT_EQ(packet->header.kind, AgentxKind::Close);
    EXPECT_EQ(packet->header.session, 77U);
    EXPECT_TRUE(m_master->isLeft());
}

} // namespace
} // namespace kvloamd
