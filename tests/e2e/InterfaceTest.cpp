// SPDX-License-Identifier: BSD-2-Clause
// The tables of interfaces: IF-MIB, EtherLike-MIB and ISDN-MIB, as the real agent serves them.
#include <algorithm>
#include <map>
#include <set>
#include <string>
#include <utility>

#include <gmock/gmock.h>

#include "tests/e2e/InterfaceFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::Contains;
using ::testing::Each;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

class InterfaceTest : public InterfaceFixture {};

TEST_F(InterfaceTest, EveryInterfaceOfTheExampleChassisHasARow) {
    startAgent();
    EXPECT_EQ(at("1.3.6.1.2.1.2.1", "0"), "INTEGER: 73");
    auto const descriptions = column(c(kIf, 2));
    EXPECT_THAT(descriptions, SizeIs(73));
    for (char const* const description :
         {"T1 line nx5-trunk-1", "T1 line nx5-trunk-2", "host interface lo",
          "IP interface over host interface lo", "E1 line quillon-span-1",
          "E1 line vorn-primary-rate-2", "signalling channel D1",
          "data link of signalling channel D2", "bearer channel B2.31"})
        EXPECT_THAT(descriptions,
                    Contains(::testing::Pair(::testing::_,
                                             "STRING: \"" + std::string(description) + "\"")));
    std::map<std::string, int> types;
    for (auto const& [index, type] : column(c(kIf, 3)))
        ++types[type];
    EXPECT_EQ(types["INTEGER: 18"], 5);  // ds1
    EXPECT_EQ(types["INTEGER: 63"], 2);  // isdn
    EXPECT_EQ(types["INTEGER: 77"], 2);  // lapd
    EXPECT_EQ(types["INTEGER: 81"], 60); // ds0
    EXPECT_EQ(types["INTEGER: 24"], 1);  // the loopback
    EXPECT_EQ(types["INTEGER: 6"], 1);   // the Ethernet interface
    EXPECT_EQ(types["INTEGER: 53"], 2);  // the IP interfaces on them
}

TEST_F(InterfaceTest, CountersOfAnInterfaceHave64Bits) {
    startAgent();
    // The counters of the host's loopback interface, which carries the requests.
    auto const octets = column(c(kIfX, 6));
    ASSERT_THAT(octets, SizeIs(::testing::Ge(2U)));
    for (auto const& [index, value] : octets)
        EXPECT_THAT(value, ::testing::StartsWith("Counter64: "));
    std::string const loopback = octets.begin()->first;
    EXPECT_THAT(at(c(kIf, 10), loopback), ::testing::StartsWith("Counter32: "));
    long const before = numberIn(octets.begin()->second);
    EXPECT_TRUE(eventually([&] { return numberIn(at(c(kIfX, 6), loopback)) > before; }));
}

TEST_F(InterfaceTest, Version1IsNotAnsweredWith64Bits) {
    startAgent();
    std::string const from = std::string(kIfX).substr(0, std::string(kIfX).size() - 1);
    Result const old = snmp("snmpwalk", {"-v1", "-c", "public", "-On", address(), from});
    EXPECT_EQ(old.status, 0) << old.output;
    EXPECT_THAT(old.output, Not(HasSubstr("Counter64")));
    EXPECT_THAT(old.output, HasSubstr("nx5-trunk-1"));
    std::size_t longCounters = 0;
    for (int number = 6; number <= 13; ++number)
        longCounters += column(c(kIfX, number)).size();
    EXPECT_GT(longCounters, 8U);
    EXPECT_EQ(walkOf(from).size() - parseAnswers(old.output).size(), longCounters);
}

TEST_F(InterfaceTest, EveryInterfaceHasTheGeneralObjects) {
    startAgent();
    std::size_t const interfaces = column(c(kIf, 1)).size();
    for (int const number : {1, 2, 3, 6, 7, 8, 9})
        EXPECT_EQ(column(c(kIf, number)).size(), interfaces) << number;
    for (int const number : {1, 14, 17, 18, 19})
        EXPECT_EQ(column(c(kIfX, number)).size(), interfaces) << number;
    std::set<std::string> names;
    std::set<std::string> descriptions;
    for (auto const& [index, name] : column(c(kIfX, 1)))
        names.insert(name);
    for (auto const& [index, description] : column(c(kIf, 2)))
        descriptions.insert(description);
    EXPECT_EQ(names.size(), interfaces);
    EXPECT_EQ(descriptions.size(), interfaces);
    EXPECT_FALSE(names.contains("\"\""));
    EXPECT_FALSE(descriptions.contains("\"\""));
}

TEST_F(InterfaceTest, EthernetHasThePacketCountersAndItsAddresses) {
    startAgent();
    std::string const ethernet = column(c(kDot3, 18)).begin()->first; // counts symbol errors
    EXPECT_EQ(at(c(kIf, 3), ethernet), "INTEGER: 6");
    EXPECT_EQ(at(c(kIf, 8), ethernet), "INTEGER: 1");
    for (int const number : {4, 10, 11, 13, 14, 15, 16, 17, 19, 20})
        EXPECT_THAT(at(c(kIf, number), ethernet), Not(HasSubstr("No Such"))) << number;
    for (int number = 2; number <= 13; ++number)
        EXPECT_THAT(at(c(kIfX, number), ethernet), HasSubstr("Counter")) << number;
    EXPECT_EQ(at(c(kIfX, 2), ethernet), "Counter32: 12");
    EXPECT_EQ(at(c(kIfX, 13), ethernet), "Counter64: 4");
    EXPECT_EQ(at(c(kIfX, 16), ethernet), "INTEGER: 2"); // not promiscuous
    auto const addresses = column("1.3.6.1.2.1.31.1.4.1.3");
    EXPECT_EQ(addresses.at(ethernet + ".6.2.0.94.0.0.2"), "INTEGER: 3");
    EXPECT_EQ(addresses.at(ethernet + ".6.255.255.255.255.255.255"), "INTEGER: 2");
}

TEST_F(InterfaceTest, IpInterfaceStandsOnItsEthernetAndCountsNothingTwice) {
    startAgent();
    auto const stack = column(kStack);
    std::size_t found = 0;
    for (auto const& [index, type] : column(c(kIf, 3))) {
        if (type != "INTEGER: 53") continue;
        ++found;
        EXPECT_EQ(std::ranges::count_if(stack,
                                        [above = index + "."](auto const& row) {
                                            return row.first.starts_with(above) &&
                                                   !row.first.ends_with(".0");
                                        }),
                  1);
        EXPECT_THAT(at(c(kIf, 10), index), HasSubstr("No Such Instance"));
        EXPECT_EQ(at(c(kIf, 6), index), "\"\"");
        EXPECT_EQ(at(c(kIfX, 14), index), "INTEGER: 2");
    }
    EXPECT_EQ(found, 2U);
}

TEST_F(InterfaceTest, ChannelsOfADeadLineAreLowerLayerDown) {
    startAgent();
    std::string const bearer = lineNamed("B1.1");
    std::string const signalling = lineNamed("D1");
    EXPECT_EQ(at(c(kIf, 8), bearer), "INTEGER: 5");
    EXPECT_EQ(at(c(kIf, 5), signalling), "Gauge32: 64000");
    EXPECT_EQ(at(c(kIfX, 15), signalling), "Gauge32: 0");
    sim({"line", "alarm", "301", "los"});
    EXPECT_TRUE(eventually([&] { return at(c(kIf, 8), bearer) == "INTEGER: 7"; }));
    EXPECT_EQ(at(c(kIf, 8), signalling), "INTEGER: 7");
    EXPECT_GT(numberIn(at(c(kIf, 9), bearer).replace(0, 10, ": ").erase(2, 2)), 0);
    sim({"line", "mend", "301"});
    EXPECT_TRUE(eventually([&] { return at(c(kIf, 8), bearer) == "INTEGER: 5"; }));
    EXPECT_EQ(at(c(kIf, 8), lineNamed("B2.31")), "INTEGER: 5");
}

TEST_F(InterfaceTest, CounterThatBeginsAgainIsADiscontinuity) {
    startAgent();
    std::string const ethernet = column(c(kDot3, 18)).begin()->first;
    EXPECT_EQ(at(c(kIfX, 19), ethernet), "Timeticks: (0) 0:00:00.00");
    EXPECT_EQ(at(c(kIfX, 6), ethernet), "Counter64: 1048576");
    sim({"set", "2", "ETHERNET_IN_OCTETS", "7"});
    EXPECT_TRUE(eventually([&] { return at(c(kIfX, 6), ethernet) == "Counter64: 7"; }));
    EXPECT_THAT(at(c(kIfX, 19), ethernet), Not(HasSubstr("(0)")));
}

TEST_F(InterfaceTest, InterfacesOfTwoBoardsAreNotCalledTheSame) {
    std::string const board = "    devices: [{handle: 10, type: 514, attributes: {NAME: span}, "
                              "line: {type: e1-crc}, channels: {bearers: 1}}]\n";
    useChassis("boards:\n  - handle: 1\n    attributes: {SERIAL_NUMBER: ONE}\n" + board +
               "  - handle: 2\n    attributes: {SERIAL_NUMBER: TWO}\n" +
               std::string(board).replace(board.find("10"), 2, "20"));
    startAgent();
    for (char const* const name : {"D1@ONE", "D1@TWO", "B1.1@ONE", "B1.1@TWO", "span@ONE"})
        EXPECT_NE(lineNamed(name), "none") << name;
    EXPECT_EQ(at(c(kIf, 2), lineNamed("D1@TWO")), "STRING: \"signalling channel D1 of board TWO\"");
}

TEST_F(InterfaceTest, ChannelsLieAboveTheirLine) {
    startAgent();
    std::string const first = lineNamed("vorn-primary-rate-1");
    std::string const second = lineNamed("vorn-primary-rate-2");
    auto const stack = column(kStack);
    EXPECT_EQ(std::ranges::count_if(
                  stack, [&](auto const& row) { return row.first.ends_with("." + first); }),
              31);
    for (auto const& [channel, line] : {std::pair{std::string("D1"), lineNamed("D1-lapd")},
                                        {"D1-lapd", first},
                                        {"B1.1", first},
                                        {"D2", lineNamed("D2-lapd")},
                                        {"D2-lapd", second},
                                        {"B2.31", second}}) {
        EXPECT_TRUE(stack.contains(lineNamed(channel) + "." + line)) << channel;
        EXPECT_EQ(stack.contains("0." + lineNamed(channel)), !channel.ends_with("lapd")) << channel;
        EXPECT_FALSE(stack.contains(lineNamed(channel) + ".0")) << channel;
    }
    EXPECT_TRUE(stack.contains(first + ".0"));
    EXPECT_FALSE(stack.contains("0." + first));
}

TEST_F(InterfaceTest, ChannelsHaveTheirStates) {
    startAgent();
    EXPECT_THAT(column(c(kIsdn, 2) + ".1.1.1"), SizeIs(60));
    auto const slots = column(c(kIsdn, 2) + ".1.1.3");
    EXPECT_EQ(slots.at(lineNamed("B1.1")), "INTEGER: 1");
    EXPECT_EQ(slots.at(lineNamed("B2.31")), "INTEGER: 30");
    EXPECT_THAT(column(c(kIsdn, 2) + ".1.1.2"), Each(::testing::Pair(::testing::_, "INTEGER: 1")));
    EXPECT_EQ(at(c(kIf, 8), lineNamed("B1.1")), "INTEGER: 5"); // dormant while it is idle
    std::string const signalling = lineNamed("D1");
    EXPECT_EQ(at(c(kIsdn, 3) + ".2.1.2", signalling), "INTEGER: " + signalling);
    EXPECT_EQ(at(c(kIsdn, 3) + ".2.1.4", signalling), "STRING: \"5550100\"");
    EXPECT_EQ(at(c(kIsdn, 3) + ".2.1.6", signalling), "INTEGER: 30");
    EXPECT_THAT(column(c(kIsdn, 3) + ".4.1.2"), SizeIs(2));
}

TEST_F(InterfaceTest, EthernetsHaveTheStatisticsThatTheyKnow) {
    startAgent();
    EXPECT_THAT(column(c(kDot3, 1)), SizeIs(2));
    EXPECT_THAT(column(c(kDot3, 3)), Contains(::testing::Pair("1002", "Counter32: 0")));
    EXPECT_THAT(at(c(kDot3, 4), "1002"), HasSubstr("No Such Instance"));
    std::string const simulated = column(c(kDot3, 18)).begin()->first;
    for (int const number : {1, 2, 3, 10, 13, 16, 18, 19, 20, 21})
        EXPECT_THAT(at(c(kDot3, number), simulated), Not(HasSubstr("No Such"))) << number;
    EXPECT_EQ(at(c(kDot3, 19), simulated), "INTEGER: 3");
    EXPECT_EQ(at(c(kDot3, 20), simulated), "INTEGER: 2");
    EXPECT_EQ(at(c(kDot3, 19), "1002"), "INTEGER: 1"); // the loopback has no duplex mode
    for (int number = 1; number <= 6; ++number)
        EXPECT_THAT(at("1.3.6.1.2.1.10.7.11.1." + std::to_string(number), simulated),
                    HasSubstr("Counter64"))
            << number;
}

TEST_F(InterfaceTest, WholeTreeIsWalkedInOrderWhateverTheRequest) {
    startWithFullHistory();
    auto const single = walk("1.3.6.1");
    EXPECT_TRUE(isStrictlyIncreasing(single));
    for (char const* const repetitions : {"-Cr7", "-Cr50"})
        EXPECT_TRUE(isStrictlyIncreasing(answers("snmpbulkwalk", {repetitions, "1.3.6.1"})))
            << repetitions;
    for (char const* const entry : {kIf, kIfX, kConfig, kCurrent, kInterval, kTotal, kDot3})
        EXPECT_TRUE(std::ranges::any_of(single, [&](Answer const& answer) {
            return startsWith(answer.name, *parseOid(c(entry, 1)));
        })) << entry;
}

TEST_F(InterfaceTest, ViewThatLeavesOutAnInterfaceHoldsForItsInstances) {
    configureSnmp("view some included .1.3.6.1.2.1.2.2.1\n"
                  "view some excluded .1.3.6.1.2.1.2.2.1.2.1001\n"
                  "rocommunity public 127.0.0.1 -V some\n");
    startAgent();
    auto const descriptions = column(c(kIf, 2));
    EXPECT_THAT(descriptions, SizeIs(72));
    EXPECT_FALSE(descriptions.contains("1001"));
}

TEST_F(InterfaceTest, StateThatIsWantedCanNotBeWritten) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    Result const result = ask("snmpset", {c(kIf, 7) + ".1000", "i", "2"});
    EXPECT_NE(result.status, 0);
    EXPECT_THAT(result.output, HasSubstr("notWritable"));
    EXPECT_EQ(at(c(kIf, 7), "1000"), "INTEGER: 1");
}

} // namespace
} // namespace kvloamd::e2e
