// SPDX-License-Identifier: BSD-2-Clause
// Clients that misbehave, and requests at the limits of a message.
#include <sys/socket.h>

#include <algorithm>
#include <csignal>
#include <fstream>
#include <memory>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"
#include "tests/e2e/SnmpMessage.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AnyOf;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

constexpr int kLong = 60000; ///< milliseconds; only a failing test waits so long
constexpr int kShort = 300;  ///< for an answer that does not come

Oid const kEverything{1, 3};
Oid const kUptime{1, 3, 6, 1, 2, 1, 1, 3, 0};

class PeerTest : public AgentFixture {
  protected:
    PeerTest() {
        configureSnmp("rocommunity public 127.0.0.1\nrwcommunity private 127.0.0.1\n"
                      "createUser op\nrouser op noauth\n");
    }
    /// Starts an agent that listens at one port by UDP and TCP.
    void startAgentWithTcp() {
        for (int attempt = 0; attempt < 10; ++attempt) {
            askPort(m_port = freePort());
            launchAgent({"--listen", "udp:" + address(), "--listen", "tcp:" + address(), "--module",
                         "z7sim", "--module-dir", moduleDirectory(), "--snmp-config",
                         path("snmp.conf"), "--persistent-dir", path("persistent")});
            if (agent().waitFor("kvloamd: serving ")) return;
        }
        FAIL() << agent().output();
    }
    /// The engine of the agent, as a discovery by UDP finds it.
    Engine discover() const {
        SnmpSocket const udp(m_port, false);
        Engine engine;
        udp.send(userMessage(engine, {}));
        EXPECT_TRUE(parseMessage(udp.receive(kLong), &engine).has_value());
        engine.user = "op";
        return engine;
    }
    /// The answer by UDP; a PDU of kind Get when none comes.
    SnmpPdu answerTo(std::string const& message) const {
        SnmpSocket const udp(m_port, false);
        udp.send(message);
        return parseMessage(udp.receive(kLong)).value_or(SnmpPdu{});
    }
    void expectService() { EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards"); }
    static std::string bulk(int repetitions) {
        return communityMessage(1, "public", {PduKind::GetBulk, 0, repetitions, {{kEverything}}});
    }

    int m_port = 0;
};

TEST_F(PeerTest, TcpClientThatLeavesBeforeItsAnswersDoesNotEndTheAgent) {
    startAgentWithTcp();
    for (int round = 0; round < 20; ++round) {
        SnmpSocket const tcp(m_port, true);
        for (int i = 0; i < 50; ++i)
            tcp.send(userMessage({}, {}));
    }
    expectService();
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

TEST_F(PeerTest, TcpClientThatDoesNotReadBlocksNobody) {
    startAgentWithTcp();
    SnmpSocket const tcp(m_port, true);
    int sent = 0;
    while (sent < 100000 && tcp.send(bulk(500)))
        ++sent;
    ASSERT_LT(sent, 100000); // the agent has stopped reading
    expectService();
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

TEST_F(PeerTest, TcpRequestIsAnsweredWhateverPiecesItComesIn) {
    startAgentWithTcp();
    SnmpSocket const tcp(m_port, true);
    std::string const request = communityMessage(1, "public", {PduKind::Get, 0, 0, {{kUptime}}});
    for (int round = 0; round < 20; ++round) {
        for (std::size_t at = 0; at < request.size(); at += 7)
            ASSERT_TRUE(tcp.send(request.substr(at, 7)));
        ASSERT_TRUE(parseMessage(tcp.receive(kLong)).has_value());
    }
}

TEST_F(PeerTest, IdleTcpClientsMakeRoomForNewOnes) {
    startAgentWithTcp();
    std::vector<std::unique_ptr<SnmpSocket>> idle;
    for (int i = 0; i < 300; ++i)
        idle.push_back(std::make_unique<SnmpSocket>(m_port, true));
    SnmpSocket const late(m_port, true);
    late.send(communityMessage(1, "public", {PduKind::Get, 0, 0, {{kUptime}}}));
    EXPECT_TRUE(parseMessage(late.receive(kLong)).has_value());
    EXPECT_TRUE(idle.front()->isClosedWithin(kLong));
    expectService();
}

TEST_F(PeerTest, TcpClientThatSendsNoSnmpIsDisconnected) {
    startAgentWithTcp();
    for (std::string const& rubbish :
         {std::string("GET / HTTP/1.0\r\n\r\n"), std::string("\x30\x84\x7f\xff\xff\xff", 6),
          std::string("\x30\x80", 2)}) {
        SnmpSocket const tcp(m_port, true);
        tcp.send(rubbish);
        EXPECT_TRUE(tcp.isClosedWithin(kLong));
    }
    expectService();
}

TEST_F(PeerTest, BulkRequestIsAnsweredWithWhatFitsTheAsker) {
    startAgentWithTcp();
    Engine engine = discover();
    std::size_t last = 0;
    for (int const size : {484, 700, 1472, 2000, 65507}) {
        engine.maxSize = size;
        SnmpSocket const udp(m_port, false);
        udp.send(userMessage(engine, {PduKind::GetBulk, 0, 500, {{kEverything}}}));
        std::string const message = udp.receive(kLong);
        auto const pdu = parseMessage(message);
        ASSERT_TRUE(pdu.has_value()) << size;
        EXPECT_LE(message.size(), static_cast<std::size_t>(size));
        EXPECT_EQ(pdu->kind, PduKind::Response);
        EXPECT_EQ(pdu->errorStatus, 0) << size;
        EXPECT_GT(pdu->variables.size(), last) << size;
        last = pdu->variables.size();
    }
    expectService();
}

TEST_F(PeerTest, ResponseThatDoesNotFitIsTooBigAndHasNoVariables) {
    configureSnmp("rocommunity public 127.0.0.1\ncreateUser op\nrouser op noauth\nsysDescr " +
                  std::string(200, 'x') + "\n");
    startAgentWithTcp();
    Oid const description{1, 3, 6, 1, 2, 1, 1, 1, 0}; // a long text
    Engine engine = discover();
    engine.maxSize = 484;
    SnmpPdu request{PduKind::Get, 0, 0, std::vector<Variable>(40, Variable{description})};
    SnmpPdu const small = answerTo(userMessage(engine, request));
    EXPECT_EQ(small.kind, PduKind::Response);
    EXPECT_EQ(small.errorStatus, 1);
    EXPECT_THAT(small.variables, IsEmpty());

    request.variables.assign(800, Variable{description});
    SnmpPdu const version2 = answerTo(communityMessage(1, "public", request));
    EXPECT_EQ(version2.errorStatus, 1);
    EXPECT_THAT(version2.variables, IsEmpty());
    SnmpPdu const version1 = answerTo(communityMessage(0, "public", request));
    EXPECT_EQ(version1.errorStatus, 1);
    EXPECT_THAT(version1.variables, SizeIs(800));
    EXPECT_EQ(version1.variables.front().value, Variable{}.value);
}

TEST_F(PeerTest, BulkRequestOfTheFirstVersionIsDropped) {
    startAgentWithTcp();
    SnmpSocket const udp(m_port, false);
    udp.send(communityMessage(0, "public", {PduKind::GetBulk, 0, 5, {{kEverything}}}));
    EXPECT_THAT(udp.receive(kShort), IsEmpty());
    expectService();
}

TEST_F(PeerTest, WriterWithoutAViewReachesTheSettingsOnly) {
    startAgentWithTcp();
    std::vector<Variable> cells;
    SnmpSocket const udp(m_port, false);
    for (Oid from = kEverything;;) {
        udp.send(communityMessage(1, "private", {PduKind::GetBulk, 0, 50, {{from}}}));
        SnmpPdu const page = parseMessage(udp.receive(kLong)).value_or(SnmpPdu{});
        ASSERT_THAT(page.variables, Not(IsEmpty()));
        for (Variable const& variable : page.variables)
            if (static_cast<unsigned char>(variable.value[0]) != 0x82) cells.push_back(variable);
        if (static_cast<unsigned char>(page.variables.back().value[0]) == 0x82) break;
        from = page.variables.back().name;
    }
    ASSERT_GT(cells.size(), 1000U);
    // A row of a table that creates rows: usmUserStatus.
    Oid const usmUser{1, 3, 6, 1, 6, 3, 15, 1, 2, 2, 1, 13, 5, 1, 2, 3, 4, 5, 1, 97};
    cells.push_back({usmUser, integerValue(4)});
    // dsx1CircuitIdentifier, trap enables of lines, signalling channels and interfaces, ifAlias;
    // entPhysicalAlias, AssetID and Uris; kvlThresholdTable.
    std::vector<Oid> const settings{
        {1, 3, 6, 1, 2, 1, 10, 18, 6, 1, 8},       {1, 3, 6, 1, 2, 1, 10, 18, 6, 1, 17},
        {1, 3, 6, 1, 2, 1, 10, 20, 1, 3, 2, 1, 7}, {1, 3, 6, 1, 2, 1, 31, 1, 1, 1, 14},
        {1, 3, 6, 1, 2, 1, 31, 1, 1, 1, 18},       {1, 3, 6, 1, 2, 1, 47, 1, 1, 1, 1, 14},
        {1, 3, 6, 1, 2, 1, 47, 1, 1, 1, 1, 15},    {1, 3, 6, 1, 2, 1, 47, 1, 1, 1, 1, 18},
        {1, 3, 6, 1, 4, 1, 32473, 1, 1, 13, 1, 1}};
    int settable = 0;
    for (Variable const& cell : cells) {
        udp.send(communityMessage(1, "private", {PduKind::Set, 0, 0, {cell}}));
        SnmpPdu const answer = parseMessage(udp.receive(kLong)).value_or(SnmpPdu{});
        bool const isSetting = std::ranges::any_of(
            settings, [&](Oid const& column) { return startsWith(cell.name, column); });
        if (isSetting) ++settable;
        // Of our objects, the others are notWritable; of the library's, noAccess.
        if (isSetting)
            ASSERT_EQ(answer.errorStatus, 0) << ::testing::PrintToString(cell.name);
        else
            ASSERT_THAT(answer.errorStatus, AnyOf(6, 17)) << ::testing::PrintToString(cell.name);
    }
    EXPECT_GT(settable, 10);
}

TEST_F(PeerTest, WriterWithAViewOfItsOwnKeepsIt) {
    configureSnmp("view place included .1.3.6.1.2.1.1.6\n"
                  "rocommunity public 127.0.0.1\nrwcommunity private 127.0.0.1 -V place\n");
    startAgentWithTcp();
    SnmpPdu const answer = answerTo(communityMessage(
        1, "private",
        {PduKind::Set, 0, 0, {{{1, 3, 6, 1, 2, 1, 1, 6, 0}, textValue("the cellar")}}}));
    EXPECT_EQ(answer.errorStatus, 0);
}

} // namespace
} // namespace kvloamd::e2e
