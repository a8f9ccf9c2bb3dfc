// SPDX-License-Identifier: BSD-2-Clause
// Notification receivers that cannot be reached when the agent starts.
#include <arpa/inet.h>
#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr char kInformUser[] =
    "trapsess -Ci -v 3 -u op -l authPriv -a SHA -A authpass1 -x AES -X privpass1 ";

class ReceiverTest : public AgentFixture {
  protected:
    void expectService() { EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards"); }
    /// Waits for the line that a receiver is not open.
    void expectNotOpen(std::string const& where, std::string const& why) {
        EXPECT_TRUE(agent().waitFor("kvloamd: the notification receiver " + where +
                                    " cannot be opened: " + why))
            << agent().output();
    }
    void expectOpen(std::string const& where) {
        EXPECT_TRUE(agent().waitFor("kvloamd: the notification receiver " + where + " is open\n"))
            << agent().output();
    }
    void expectReceived(std::string const& text) {
        EXPECT_TRUE(trapReceiver().waitFor(text)) << trapReceiver().output();
    }
    int linesWith(std::string const& text) {
        int found = 0;
        for (std::string const& line : linesOf(agent().output()))
            if (line.find(text) != std::string::npos) ++found;
        return found;
    }
};

TEST_F(ReceiverTest, NamesThatDoNotResolveDoNotKeepTheAgentFromStarting) {
    startTrapReceiver("authCommunity log public\n");
    configureSnmp(kReader +
                  std::string("trapsink a.invalid public\ntrap2sink b.invalid:1162\n"
                              "informsink c.invalid public\n"
                              "trapsess -v 2c -c public udp6:d.invalid:162\n") +
                  kInformUser + "e.invalid\ntrap2sink " + trapAddress() + " public\n");
    startAgent();
    expectService();
    for (char const* const where :
         {"a.invalid", "b.invalid:1162", "c.invalid", "udp6:d.invalid:162", "e.invalid"})
        expectNotOpen(where, "its name does not resolve");
    // The others are served.
    expectReceived("snmpModules.1.1.5.1"); // coldStart
    sim({"stop", "1"});
    expectReceived("kvlNotifyBoardStatus.0 = stopped");
    EXPECT_EQ(stopAgent(), 0);
    EXPECT_EQ(linesWith("cannot be opened"), 5) << agent().output();
}

TEST_F(ReceiverTest, NotificationThatOneReceiverMissesCountsAsDropped) {
    startTrapReceiver("authCommunity log public\n");
    configureSnmp(kReader + std::string("trap2sink a.invalid public\ntrap2sink ") + trapAddress() +
                  " public\n");
    startAgent();
    expectNotOpen("a.invalid", "");
    sim({"fault", "2", "17"});
    expectReceived("kvlFaultRaised");
    EXPECT_TRUE(eventually([this] {
        return get("kvlNotificationsDropped.0") == "Counter32: 2 notifications";
    })) << "coldStart is the first";
    EXPECT_EQ(get("kvlNotificationsSent.0"), "Counter32: 0 notifications");
}

TEST_F(ReceiverTest, NameServerThatDoesNotAnswerDelaysNothing) {
    startTrapReceiver("authCommunity log public\n");
    std::string const port = trapAddress().substr(trapAddress().find(':'));
    ASSERT_EQ(mkfifo(path("gate").c_str(), 0600), 0);
    setVariable("HOOK_NAME_GATE", path("gate"));
    setVariable("LD_PRELOAD", HOOKS);
    configureSnmp(kReader + std::string("trap2sink slow.invalid") + port + " public\n");
    startAgent();
    setVariable("LD_PRELOAD", "");
    expectService();
    sim({"stop", "1"});
    EXPECT_TRUE(eventually([this] { return get("kvlBoardStatus.1") == "INTEGER: stopped(4)"; }));
    // Only now does the name server answer.
    int const gate = open(path("gate").c_str(), O_WRONLY | O_CLOEXEC);
    ASSERT_GE(gate, 0);
    close(gate);
    // What was raised meanwhile may have been dropped; what follows reaches the receiver.
    EXPECT_TRUE(eventually([this] {
        sim({"fault", "2", "17"});
        return trapReceiver().hasNow("kvlFaultRaised");
    }));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

TEST_F(ReceiverTest, InformReceiverThatIsDownIsOpenedWhenItIsBack) {
    chooseTrapPort();
    configureSnmp(kReader + std::string(kInformUser) + trapAddress() + "\n");
    startAgent();
    expectService();
    expectNotOpen(trapAddress(), "nobody receives there");
    startTrapReceiver("createUser op SHA authpass1 AES privpass1\nauthUser log op priv\n");
    expectOpen(trapAddress());
    sim({"remove", "2"});
    expectReceived("kvlNotifyBoardSerialNumber.0 = QL-77-0420");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_EQ(linesWith("notification receiver"), 2) << agent().output();
}

TEST_F(ReceiverTest, InformReceiverThatNeverAnswersDelaysNothing) {
    int const silent = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    ASSERT_EQ(bind(silent, reinterpret_cast<sockaddr*>(&address), size), 0);
    ASSERT_EQ(getsockname(silent, reinterpret_cast<sockaddr*>(&address), &size), 0);
    std::string const where = "127.0.0.1:" + std::to_string(ntohs(address.sin_port));
    configureSnmp(kReader + std::string(kInformUser) + where + "\n");
    startAgent();
    // The agent asks it for its engine ID, and answers requests meanwhile.
    pollfd polled{silent, POLLIN, 0};
    EXPECT_EQ(poll(&polled, 1, 90000), 1);
    expectService();
    expectNotOpen(where, "it does not answer with its engine ID");
    expectService();
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    close(silent);
}

TEST_F(ReceiverTest, ReceiverByTcpIsRefusedWithItsLine) {
    for (char const* const line :
         {"trap2sink tcp:127.0.0.1:162 public", "trapsess -v 2c -c public tcp6:[::1]:162"}) {
        configureSnmp(kReader + std::string(line) + "\n");
        Result const result = runAgent({"--module", "z7sim", "--module-dir", moduleDirectory(),
                                        "--port", std::to_string(freePort()), "--snmp-config",
                                        path("snmp.conf"), "--persistent-dir", path("persistent")});
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(linesOf(result.output).size(), 1U) << result.output;
        EXPECT_THAT(result.output,
                    AllOf(HasSubstr("snmp.conf: line 2"), HasSubstr("udp: and udp6: only")));
    }
}

TEST_F(ReceiverTest, CheckNeedsNoReceiver) {
    configureSnmp(kReader + std::string("trap2sink a.invalid public\n") + kInformUser +
                  "127.0.0.1:" + std::to_string(freePort()) + "\n");
    Result const result = runAgent({"--snmp-config", path("snmp.conf"), "--persistent-dir",
                                    path("persistent"), "--check-config"});
    EXPECT_EQ(result.status, 0) << result.output;
    EXPECT_THAT(result.output, Not(HasSubstr("cannot")));
}

} // namespace
} // namespace kvloamd::e2e
