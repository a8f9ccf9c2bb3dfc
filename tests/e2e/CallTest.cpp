// SPDX-License-Identifier: BSD-2-Clause
// Calls on ISDN channels, as a manager sees them.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

// Of the chassis with one trunk of two bearer channels: signalling 1001, bearers 1002 and 1003,
// data link 1004.
constexpr char kChassis[] = R"(
boards:
  - handle: 3
    attributes: {SERIAL_NUMBER: "S3"}
    devices:
      - handle: 31
        type: 514
        attributes: {NAME: trunk, CALLING_ADDRESS: "5550100", CALLING_SUBADDRESS: "42"}
        line: {type: e1-crc}
        channels: {bearers: 2}
)";

class CallTest : public AgentFixture {
  protected:
    void serve() {
        useChassis(kChassis);
        startAgent();
        ASSERT_TRUE(eventually([this] { return bearer(2) == "INTEGER: 1"; }));
    }
    void serveWithTraps() {
        useChassis(kChassis);
        startWithReceiver("rwcommunity");
        ASSERT_TRUE(eventually([this] { return bearer(2) == "INTEGER: 1"; }));
        Result const result = ask("snmpset", {"1.3.6.1.2.1.10.20.1.3.2.1.7.1001", "i", "1"});
        ASSERT_EQ(result.status, 0) << result.output;
    }
    /// A column of the first bearer channel.
    std::string bearer(int column) {
        return get("1.3.6.1.2.1.10.20.1.2.1.1." + std::to_string(column) + ".1002");
    }
    /// A column of the signalling channel's statistics.
    std::string statistics(int column) {
        return get("1.3.6.1.2.1.10.20.1.3.3.1." + std::to_string(column) + ".1001");
    }
    /// How many notifications are about calls with `peer`.
    int toldOf(std::string const& peer) {
        std::string const named = "= \"" + peer + "\"";
        std::string const told = trapReceiver().output();
        int count = 0;
        for (std::size_t at = told.find(named); at != std::string::npos;
             at = told.find(named, at + 1))
            ++count;
        return count;
    }
};

TEST_F(CallTest, ChannelThatHadNoCallHasTheValuesForNone) {
    serve();
    EXPECT_EQ(bearer(4), "\"\"");
    EXPECT_EQ(bearer(5), "\"\"");
    EXPECT_EQ(bearer(6), "INTEGER: 1");
    EXPECT_EQ(bearer(7), "INTEGER: 1");
    EXPECT_EQ(bearer(8), "INTEGER: 2");
    EXPECT_THAT(bearer(9), HasSubstr("(0)"));
    EXPECT_THAT(bearer(10), HasSubstr("(0)"));
    EXPECT_EQ(bearer(11), "Gauge32: 0");
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.1.0"), "INTEGER: 0");
}

TEST_F(CallTest, CallShowsInItsChannelAndInTheCountsOfItsSignallingChannel) {
    serve();
    sim({"call", "setup", "31", "1", "--incoming", "--peer", "5550199", "--subaddress", "7",
         "--information", "digital", "--multirate"});
    sim({"call", "charge", "31", "1", "12"});
    EXPECT_TRUE(eventually([this] { return bearer(11) == "Gauge32: 12"; }));
    EXPECT_EQ(bearer(2), "INTEGER: 4");
    EXPECT_EQ(bearer(4), "STRING: \"5550199\"");
    EXPECT_EQ(bearer(5), "STRING: \"7\"");
    EXPECT_EQ(bearer(6), "INTEGER: 3"); // answer
    EXPECT_EQ(bearer(7), "INTEGER: 3"); // unrestricted digital
    EXPECT_EQ(bearer(8), "INTEGER: 1");
    sim({"call", "setup", "31", "2", "--state", "connecting"});
    EXPECT_TRUE(eventually([this] { return statistics(3) == "Counter32: 1"; }));
    EXPECT_EQ(statistics(1), "Counter32: 1");
    EXPECT_EQ(statistics(2), "Counter32: 1");
    EXPECT_EQ(statistics(4), "Counter32: 0");
    EXPECT_EQ(statistics(5), "Counter32: 12");
    sim({"call", "release", "31", "--all"});
    EXPECT_TRUE(eventually([this] { return bearer(2) == "INTEGER: 1"; }));
    EXPECT_EQ(bearer(4), "STRING: \"5550199\""); // the last call
}

TEST_F(CallTest, SignallingChannelHasItsAddressAndItsDataLinkItsCounts) {
    serve();
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.2.1.4.1001"), "STRING: \"5550100\"");
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.2.1.5.1001"), "STRING: \"42\"");
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.2.1.7.1001"), "INTEGER: 2");
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.2.1.8.1001"), "INTEGER: 1");
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.4.1.1.1004"), "INTEGER: 1");
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.4.1.3.1004"), "Counter32: 0");
    sim({"call", "signalling", "31", "inactive"});
    sim({"call", "signalling", "31", "l2"});
    EXPECT_TRUE(
        eventually([this] { return get("1.3.6.1.2.1.10.20.1.3.4.1.3.1004") == "Counter32: 1"; }));
    EXPECT_EQ(get("1.3.6.1.2.1.10.20.1.3.4.1.4.1004"), "Counter32: 0");
}

TEST_F(CallTest, ConnectedCallIsAnnouncedWithItsPeer) {
    serveWithTraps();
    sim({"call", "setup", "31", "1", "--peer", "5550199"});
    EXPECT_TRUE(trapReceiver().waitFor("= \"5550199\"")) << trapReceiver().output();
    EXPECT_EQ(toldOf("5550199"), 1);
}

TEST_F(CallTest, FailedCallsWithOnePeerAreAnnouncedOnce) {
    serveWithTraps();
    // Each peer has a channel of its own, so that every call is seen.
    sim({"call", "setup", "31", "1", "--peer", "100", "--state", "connecting"});
    sim({"call", "release", "31", "1"});
    EXPECT_TRUE(trapReceiver().waitFor("= \"100\"")) << trapReceiver().output();
    sim({"call", "setup", "31", "2", "--peer", "100", "--state", "connecting"});
    sim({"call", "release", "31", "2"});
    // The second failure is in a snapshot before that of the call that follows.
    EXPECT_TRUE(eventually(
        [this] { return get("1.3.6.1.2.1.10.20.1.2.1.1.4.1003") == "STRING: \"100\""; }));
    sim({"call", "setup", "31", "1", "--peer", "200"});
    EXPECT_TRUE(trapReceiver().waitFor("= \"200\"")) << trapReceiver().output();
    EXPECT_EQ(toldOf("100"), 1);
}

} // namespace
} // namespace kvloamd::e2e
