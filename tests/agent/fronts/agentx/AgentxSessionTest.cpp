// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxSession.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include "tests/agent/fronts/agentx/AgentxSessionFixture.h"

namespace kvloamd {
namespace {

using std::chrono::milliseconds;

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

TEST_F(AgentxSessionTest, GarbageEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(std::string(40, 'x'));
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, NotificationIsTakenWhenTheMasterSaysSo) {
    startMaster();
    startSession();
    connectSession();
    ASSERT_TRUE(m_session->ready());
    notify();
    EXPECT_FALSE(m_session->ready());
    Packet const packet = next();
    EXPECT_EQ(packet.header.kind, AgentxKind::Notify);
    EXPECT_EQ(m_taken, 0);
    m_master->respond(packet);
    EXPECT_TRUE(runUntil([this] { return m_taken == 1; }));
    EXPECT_TRUE(m_session->ready());
}

TEST_F(AgentxSessionTest, NotificationCarriesValuesOfEveryType) {
    startMaster();
    startSession();
    connectSession();
    Oid const name{1, 3, 6, 1, 4, 1, 32473, 9};
    std::string const bits("\xa0\x00", 2);
    m_session->send({joined(kRoot, Oid{0, 1}),
                     {{name, ValueType::Integer, std::int64_t{-5}},
                      {name, ValueType::TimeTicks, std::int64_t{4294967295}},
                      {name, ValueType::Counter64, std::int64_t{1} << 40},
                      {name, ValueType::Text, std::string("text")},
                      {name, ValueType::Octets, bits},
                      {name, ValueType::ObjectId, kOtherRoot}},
                     Clock::now()},
                    [](Delivery) {});
    Packet const packet = next();
    AgentxReader reader(packet.payload, true);
    auto const head = [&](unsigned type, Oid const& of) {
        EXPECT_EQ(reader.number16(), type);
        reader.number16();
        EXPECT_EQ(reader.name().name, of);
    };
    auto const octets = [&] {
        std::string text(reader.number(), '\0');
        for (std::size_t i = 0; i < (text.size() + 3) / 4 * 4; ++i) {
            auto const octet = static_cast<char>(reader.octet());
            if (i < text.size()) text[i] = octet;
        }
        return text;
    };
    head(6, {1, 3, 6, 1, 6, 3, 1, 1, 4, 1, 0});
    EXPECT_EQ(reader.name().name, joined(kRoot, Oid{0, 1}));
    head(2, name);
    EXPECT_EQ(reader.number(), 0xfffffffb);
    head(67, name);
    EXPECT_EQ(reader.number(), 0xffffffff);
    head(70, name);
    EXPECT_EQ(reader.number(), 256U);
    EXPECT_EQ(reader.number(), 0U);
    head(4, name);
    EXPECT_EQ(octets(), "text");
    head(4, name);
    EXPECT_EQ(octets(), bits);
    head(6, name);
    EXPECT_EQ(reader.name().name, kOtherRoot);
    EXPECT_TRUE(reader.atEnd());
}

TEST_F(AgentxSessionTest, NotificationOfALostConnectionIsNotTaken) {
    startMaster();
    startSession();
    connectSession();
    notify();
    EXPECT_EQ(next().header.kind, AgentxKind::Notify);
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    EXPECT_FALSE(m_session->ready());
    connectSession();
    EXPECT_TRUE(m_session->ready());
    EXPECT_EQ(m_taken, 0);
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

TEST_F(AgentxSessionTest, RefusedNotificationIsDropped) {
    startMaster();
    startSession();
    connectSession();
    notify();
    m_master->respond(next(), AgentxFault::ParseError);
    EXPECT_TRUE(runUntil([this] { return m_dropped == 1; }));
    EXPECT_EQ(m_taken, 0);
    EXPECT_TRUE(m_session->isConnected());
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

TEST_F(AgentxSessionTest, SilentMasterIsAskedAndLostUntilItAnswers) {
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

TEST_F(AgentxSessionTest, NotificationThatIsNeverAnsweredDoesNotBlockTheNext) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = milliseconds(20);
    startSession(pace);
    connectSession();
    notify();
    EXPECT_EQ(next().header.kind, AgentxKind::Notify);
    // The master goes on with other requests.
    EXPECT_TRUE(runUntil([this] {
        m_master->say(AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take());
        m_master->receive();
        return m_dropped == 1;
    }));
    EXPECT_EQ(m_taken, 0);
    EXPECT_TRUE(runUntil([this] {
        m_master->say(AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take());
        m_master->receive();
        return m_session->ready();
    }));
}

TEST_F(AgentxSessionTest, MasterThatMisbehavesIsConnectedToEverMoreSlowly) {
    startMaster();
    AgentxPace pace = patient();
    pace.retry = milliseconds(4);
    pace.longestRetry = milliseconds(16);
    startSession(pace);
    for (int const expected : {4, 8, 16, 16}) {
        connectSession();
        auto const before = Clock::now();
        m_master->say(std::string(40, 'x'));
        EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
        EXPECT_GE(m_session->deadline(), before + milliseconds(expected));
        EXPECT_LE(m_session->deadline(), Clock::now() + milliseconds(expected));
        m_master->hangUp();
    }
}

TEST_F(AgentxSessionTest, MasterThatLeavesAtOnceIsConnectedToEverMoreSlowly) {
    startMaster();
    startSession();
    for (int const expected : {1, 2, 4, 8}) {
        connectSession();
        auto const before = Clock::now();
        m_master->hangUp();
        EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
        EXPECT_GE(m_session->deadline(), before + milliseconds(expected));
    }
}

TEST_F(AgentxSessionTest, SteadyConnectionEndsTheLongPauses) {
    startMaster();
    AgentxPace pace = patient();
    pace.steady = milliseconds(0);
    startSession(pace);
    for (int round = 0; round < 4; ++round) {
        connectSession();
        m_master->hangUp();
        EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
        EXPECT_LE(m_session->deadline(), Clock::now() + pace.retry);
    }
}

TEST_F(AgentxSessionTest, PacketOfAnotherSessionEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(AgentxWriter(AgentxKind::TestSet, 78, 5, 6).take());
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, EndlessPacketEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    std::string head = AgentxWriter(AgentxKind::GetNext, 77, 5, 6).take();
    head.replace(16, 4, "\x7f\xff\xff\xff");
    m_master->say(head);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
}

TEST_F(AgentxSessionTest, MasterThatAsksAndDoesNotReadCostsBoundedMemory) {
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

TEST_F(AgentxSessionTest, MasterThatNeverAnswersIsConnectedAnew) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = pace.surrender = milliseconds(20);
    startSession(pace);
    EXPECT_EQ(next().header.kind, AgentxKind::Open);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
}

TEST_F(AgentxSessionTest, MasterThatLetsNobodyInIsWaitedForWithoutBlocking) {
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
