// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/ReceiverLine.h"

#include <sys/socket.h>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::HasSubstr;

struct Address {
    char const* written;
    int family;
    char const* host;
    char const* port;
};

TEST(ReceiverLineTest, AddressIsTakenApart) {
    for (Address const& expected :
         {Address{"192.0.2.7", AF_INET, "192.0.2.7", "162"},
          Address{"192.0.2.7:1162", AF_INET, "192.0.2.7", "1162"},
          Address{"udp:receiver.example.com:1162", AF_INET, "receiver.example.com", "1162"},
          Address{"UDP:receiver.example.com", AF_INET, "receiver.example.com", "162"},
          Address{"udp6:[2001:db8::7]:1162", AF_INET6, "2001:db8::7", "1162"},
          Address{"udp6:[2001:db8::7]", AF_INET6, "2001:db8::7", "162"},
          Address{"udp6:2001:db8::7", AF_INET6, "2001:db8::7", "162"},
          Address{"udp6:receiver.example.com:1162", AF_INET6, "receiver.example.com", "1162"}}) {
        SCOPED_TRACE(expected.written);
        ReceiverLine const line("trap2sink", expected.written + std::string(" public"), false);
        EXPECT_EQ(line.address().family, expected.family);
        EXPECT_EQ(line.address().host, expected.host);
        EXPECT_EQ(line.address().port, expected.port);
        EXPECT_EQ(line.where(), expected.written);
    }
}

TEST(ReceiverLineTest, NumbersAndNamesAreToldApart) {
    auto const isNumber = [](char const* text) {
        return ReceiverLine("trap2sink", text, false).address().number().has_value();
    };
    EXPECT_TRUE(isNumber("192.0.2.7"));
    EXPECT_TRUE(isNumber("udp6:[2001:db8::7]:162"));
    EXPECT_FALSE(isNumber("receiver.example.com"));
    EXPECT_FALSE(isNumber("12.receiver"));
    EXPECT_FALSE(isNumber("udp6:receiver"));
}

TEST(ReceiverLineTest, OnlyTheHostOfTheLineIsReplaced) {
    EXPECT_EQ(ReceiverLine("trap2sink", "-s 10.0.0.1  receiver:1162 \"com munity\"", false)
                  .resolved("192.0.2.7", {}),
              "-s 10.0.0.1  udp:192.0.2.7:1162 \"com munity\"");
    EXPECT_EQ(ReceiverLine("trap2sink", "receiver public 1162", false).resolved("192.0.2.7", {}),
              "udp:192.0.2.7 public 1162");
    EXPECT_EQ(ReceiverLine("informsink", "udp6:receiver", false).resolved("2001:db8::7", {}),
              "udp6:[2001:db8::7]:162");
}

TEST(ReceiverLineTest, EngineIdPrecedesTheHost) {
    ReceiverLine const line("trapsess", "-Ci -v3 -u op -l noAuthNoPriv receiver", false);
    ASSERT_TRUE(line.asksEngine());
    EXPECT_EQ(line.resolved("192.0.2.7", "\x80\x01\xff"),
              "-Ci -v3 -u op -l noAuthNoPriv -e 8001ff udp:192.0.2.7:162");
}

TEST(ReceiverLineTest, OnlyInformsOfTheThirdVersionAskForAnEngineId) {
    auto const asks = [](char const* text, bool thirdByDefault = false) {
        return ReceiverLine("trapsess", text, thirdByDefault).asksEngine();
    };
    EXPECT_TRUE(asks("-v 3 -Ci -u op receiver"));
    EXPECT_TRUE(asks("-v 3 -C i -u op receiver"));
    EXPECT_TRUE(asks("-name a -Ci -u op receiver", true));
    EXPECT_FALSE(asks("-v 3 -u op receiver"));
    EXPECT_FALSE(asks("-v 2c -Ci -c public receiver"));
    EXPECT_FALSE(asks("-v 3 -Ci -e 8000000001020304 -u op receiver"));
    EXPECT_FALSE(asks("-Ci -c public receiver"));
    // The password is no option.
    EXPECT_FALSE(asks("-v 3 -u op -A -Ci receiver"));
}

TEST(ReceiverLineTest, FaultsAreNamed) {
    struct Faulty {
        char const* directive;
        char const* text;
        char const* named;
    };
    for (Faulty const& faulty :
         {Faulty{"trap2sink", "", "names no host"}, Faulty{"trap2sink", "-s 10.0.0.1", "no host"},
          Faulty{"trap2sink", "-q receiver", "unknown option -q"},
          Faulty{"trap2sink", "receiver:0 public", "not an address"},
          Faulty{"trap2sink", "receiver:snmp public", "not an address"},
          Faulty{"trap2sink", "receiver public 70000", "not a port"},
          Faulty{"trap2sink", "2001:db8::7", "not an address"},
          Faulty{"trap2sink", "tcp:192.0.2.7", "udp: and udp6: only"},
          Faulty{"trapsess", "-v 2c -c public TCP6:[::1]", "udp: and udp6: only"},
          Faulty{"trapsess", "-v 2c -c", "-c has no value"},
          Faulty{"trapsess", "-v 2c -c public", "names no host"},
          Faulty{"trapsess", "-V receiver", "unknown option -V"},
          Faulty{"trapsess", "-v 2c -c \"public receiver", "not closed"}}) {
        SCOPED_TRACE(faulty.text);
        try {
            ReceiverLine(faulty.directive, faulty.text, false);
            ADD_FAILURE() << "is accepted";
        } catch (ReceiverFault const& fault) {
            EXPECT_THAT(fault.what(), HasSubstr(faulty.named));
        }
    }
}

} // namespace
} // namespace kvloamd
