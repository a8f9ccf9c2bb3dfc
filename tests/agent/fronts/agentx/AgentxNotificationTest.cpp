// SPDX-License-Identifier: BSD-2-Clause
// Notifications that a session hands to its master.
#include "agent/fronts/agentx/AgentxSession.h"

#include "tests/agent/fronts/agentx/AgentxSessionFixture.h"

namespace kvloamd {
namespace {

class AgentxNotificationTest : public AgentxSessionFixture {};

TEST_F(AgentxNotificationTest, NotificationIsTakenWhenTheMasterSaysSo) {
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

TEST_F(AgentxNotificationTest, NotificationCarriesValuesOfEveryType) {
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

TEST_F(AgentxNotificationTest, NotificationOfALostConnectionIsNotTaken) {
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

TEST_F(AgentxNotificationTest, RefusedNotificationIsDropped) {
    startMaster();
    startSession();
    connectSession();
    notify();
    m_master->respond(next(), AgentxFault::ParseError);
    EXPECT_TRUE(runUntil([this] { return m_dropped == 1; }));
    EXPECT_EQ(m_taken, 0);
    EXPECT_TRUE(m_session->isConnected());
}

TEST_F(AgentxNotificationTest, NotificationThatIsNeverAnsweredDoesNotBlockTheNext) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = std::chrono::milliseconds(20);
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

} // namespace
} // namespace kvloamd
