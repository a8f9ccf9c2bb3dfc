// SPDX-License-Identifier: BSD-2-Clause
// The standard tables of lines, channels and interfaces, as the real agent serves them.
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <set>

#include <gmock/gmock.h>

#include "agent/daemon/Options.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::Contains;
using ::testing::Each;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

constexpr char kIf[] = "1.3.6.1.2.1.2.2.1.";
constexpr char kIfX[] = "1.3.6.1.2.1.31.1.1.1.";
constexpr char kStack[] = "1.3.6.1.2.1.31.1.2.1.3";
constexpr char kConfig[] = "1.3.6.1.2.1.10.18.6.1.";
constexpr char kCurrent[] = "1.3.6.1.2.1.10.18.7.1.";
constexpr char kInterval[] = "1.3.6.1.2.1.10.18.8.1.";
constexpr char kTotal[] = "1.3.6.1.2.1.10.18.9.1.";
constexpr char kIsdn[] = "1.3.6.1.2.1.10.20.1.";
constexpr char kDot3[] = "1.3.6.1.2.1.10.7.2.1.";

class InterfaceTest : public AgentFixture {
  protected:
    /// The value of an instance, without names: "INTEGER: 3", "STRING: "x"".
    std::string at(std::string const& column, std::string const& instance) const {
        auto const answered = answers("snmpget", {"-Oe", column + "." + instance});
        return answered.empty() ? "nothing" : answered.front().value;
    }
    std::vector<Answer> walkOf(std::string const& from) const {
        auto all = answers("snmpbulkwalk", {"-Oe", "-Cr50", from});
        std::erase_if(all,
                      [](Answer const& answer) { return answer.value.starts_with("No Such"); });
        return all;
    }
    /// The values of a column by index, such as "1000" or "1000.96".
    std::map<std::string, std::string> column(std::string const& name) const {
        std::map<std::string, std::string> values;
        std::size_t const parts = parseOid(name)->size();
        for (Answer const& answer : walkOf(name)) {
            std::string index;
            for (std::size_t i = parts; i < answer.name.size(); ++i)
                index += (i == parts ? "" : ".") + std::to_string(answer.name[i]);
            values[index] = answer.value;
        }
        return values;
    }
    /// The ifIndex of the line of that name; "none" when there is none.
    std::string lineNamed(std::string const& name) const {
        for (auto const& [index, value] : column(std::string(kIfX) + "1"))
            if (value == "STRING: \"" + name + "\"") return index;
        return "none";
    }
    /// Starts the agent and waits until the first line has closed the last interval of its past,
    /// after which nothing is closed for a quarter of an hour.
    void startWithFullHistory() {
        startAgent();
        ASSERT_TRUE(eventually([&] { return at(c(kConfig, 4), "1000") == "INTEGER: 96"; }));
    }
    static long numberIn(std::string const& value) {
        auto const colon = value.find(": ");
        return colon == std::string::npos ? -1 : std::atol(value.c_str() + colon + 2);
    }
    static bool isStrictlyIncreasing(std::vector<Answer> const& answers) {
        return std::ranges::adjacent_find(answers, [](Answer const& a, Answer const& b) {
                   return compare(a.name, b.name) >= 0;
               }) == answers.end();
    }
    /// A board of a chassis with one line, "line-<serial number>".
    static std::string boardWithLine(int handle, std::string const& serialNumber) {
        return "  - handle: " + std::to_string(handle) +
               "\n    attributes: {SERIAL_NUMBER: " + serialNumber +
               "}\n    devices: [{handle: " + std::to_string(handle * 10) +
               ", type: 501, attributes: {NAME: line-" + serialNumber + "}, line: {type: esf}}]\n";
    }
    static std::string c(char const* entry, int number) { return entry + std::to_string(number); }
};

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

TEST_F(InterfaceTest, LineHasTheColumnsThatItCanAnswer) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-1");
    EXPECT_EQ(line, "1000");
    EXPECT_EQ(at(c(kIf, 1), line), "INTEGER: 1000");
    EXPECT_EQ(at(c(kIf, 5), line), "Gauge32: 1544000");
    EXPECT_EQ(at(c(kIf, 7), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kIf, 8), line), "INTEGER: 1");
    EXPECT_THAT(at(c(kIf, 9), line), HasSubstr("Timeticks: (0)"));
    EXPECT_EQ(at(c(kIfX, 14), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kIfX, 15), line), "Gauge32: 2");
    EXPECT_EQ(at(c(kIfX, 17), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kIfX, 18), line), "\"\"");
    EXPECT_EQ(at(c(kIf, 6), line), "STRING: \"T1-0001\"");
    // A line carries bits, not packets, so it has no packet counters.
    for (int const number : {4, 10, 11, 20})
        EXPECT_THAT(at(c(kIf, number), line), HasSubstr("No Such Instance"));
    EXPECT_THAT(at(c(kIfX, 6), line), HasSubstr("No Such Instance"));
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

TEST_F(InterfaceTest, BrokenLineShowsInItsStatusAndIsDown) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-2");
    EXPECT_EQ(at(c(kConfig, 10), line), "INTEGER: 1"); // no alarm
    sim({"line", "alarm", "102", "los"});
    EXPECT_TRUE(eventually([&] { return (numberIn(at(c(kConfig, 10), line)) & 64) != 0; }));
    EXPECT_TRUE(eventually([&] { return at(c(kIf, 8), line) == "INTEGER: 2"; }));
    EXPECT_EQ(at(c(kIf, 8), lineNamed("nx5-trunk-1")), "INTEGER: 1");
    // The line counts, and reports the time of the failure.
    EXPECT_TRUE(eventually([&] { return numberIn(at(c(kCurrent, 5), line)) > 0; }));
    EXPECT_THAT(at(c(kConfig, 16), line), HasSubstr("Timeticks: ("));
    sim({"line", "mend", "102"});
    EXPECT_TRUE(eventually([&] { return at(c(kConfig, 10), line) == "INTEGER: 1"; }));
    EXPECT_TRUE(eventually([&] { return at(c(kIf, 8), line) == "INTEGER: 1"; }));
}

TEST_F(InterfaceTest, SetUpOfALineIsShown) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-1");
    EXPECT_EQ(at(c(kConfig, 1), line), "INTEGER: " + line);
    EXPECT_EQ(at(c(kConfig, 5), line), "INTEGER: 2"); // ESF
    EXPECT_EQ(at(c(kConfig, 6), line), "INTEGER: 2"); // B8ZS
    EXPECT_EQ(at(c(kConfig, 8), line), "STRING: \"T1-0001\"");
    EXPECT_EQ(at(c(kConfig, 15), line), "INTEGER: 40");
    EXPECT_EQ(at(c(kConfig, 17), line), "INTEGER: 2");
    EXPECT_EQ(at(c(kConfig, 18), line), "INTEGER: 1");
    EXPECT_EQ(at(c(kConfig, 20), lineNamed("vorn-primary-rate-1")), "INTEGER: 2");
    EXPECT_EQ(column(c(kConfig, 22)).size(), 5U);
}

TEST_F(InterfaceTest, LineWithAPastHasItsIntervals) {
    startWithFullHistory();
    std::string const line = lineNamed("nx5-trunk-1");
    EXPECT_EQ(at(c(kConfig, 14), line), "INTEGER: 1");
    auto const numbers = column(c(kInterval, 2));
    EXPECT_THAT(numbers, SizeIs(96)); // the other lines have closed none
    EXPECT_EQ(numbers.at(line + ".1"), "INTEGER: 1");
    EXPECT_EQ(numbers.at(line + ".96"), "INTEGER: 96");
    EXPECT_EQ(at(c(kInterval, 13), line + ".95"), "INTEGER: 1");
    EXPECT_EQ(at(c(kInterval, 13), line + ".96"), "INTEGER: 2");
    EXPECT_THAT(at(c(kInterval, 3), line + ".97"), HasSubstr("No Such Instance"));
    EXPECT_EQ(at(c(kConfig, 4), lineNamed("nx5-trunk-2")), "INTEGER: 0");
}

TEST_F(InterfaceTest, PastOfALineShowsInTheIntervalsThatItWasIn) {
    startWithFullHistory();
    // The signal was lost for 240 seconds, 50400 seconds ago: in interval 56, or in two
    // neighbouring intervals.
    auto const unavailable = column(c(kInterval, 6));
    std::string const line = lineNamed("nx5-trunk-1");
    long seconds = 0;
    for (int const number : {55, 56, 57})
        seconds += numberIn(unavailable.at(line + "." + std::to_string(number)));
    EXPECT_EQ(seconds, 240);
    EXPECT_EQ(unavailable.at(line + ".50"), "Gauge32: 0");
}

TEST_F(InterfaceTest, TotalsAreTheSumsOfTheClosedIntervals) {
    startWithFullHistory();
    std::string const line = lineNamed("nx5-trunk-1");
    for (int counter = 2; counter <= 11; ++counter) {
        long sum = 0;
        for (auto const& [index, value] : column(c(kInterval, counter + 1)))
            sum += numberIn(value);
        EXPECT_EQ(at(c(kTotal, counter), line), "Gauge32: " + std::to_string(sum)) << counter;
    }
    EXPECT_EQ(at(c(kTotal, 2), lineNamed("nx5-trunk-2")), "Gauge32: 0");
}

TEST_F(InterfaceTest, TimeOfTheRunningIntervalGoesOn) {
    startAgent();
    std::string const line = lineNamed("nx5-trunk-2");
    long const before = numberIn(at(c(kConfig, 3), line));
    EXPECT_GE(before, 0);
    EXPECT_TRUE(eventually([&] { return numberIn(at(c(kConfig, 3), line)) > before; }));
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

TEST_F(InterfaceTest, BulkWalksOfAnySizeAgreeWithTheWalk) {
    startWithFullHistory();
    auto const walked = walk("1.3.6.1.2.1.10.18.8");
    ASSERT_THAT(walked, SizeIs(13 * 95 + 3)); // the oldest has no counts
    for (char const* const repetitions : {"-Cr1", "-Cr7", "-Cr50"})
        EXPECT_EQ(answers("snmpbulkwalk", {repetitions, "1.3.6.1.2.1.10.18.8"}), walked)
            << repetitions;
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

TEST_F(InterfaceTest, IndicesAreTheSameAfterARestart) {
    startAgent();
    auto const before = column(c(kIfX, 1));
    EXPECT_THAT(before, SizeIs(73));
    EXPECT_EQ(stopAgent(), 0);
    startAgent({"--interface-base", "5000"});
    EXPECT_EQ(column(c(kIfX, 1)), before);
}

TEST_F(InterfaceTest, FirstIndexIsTheBase) {
    startAgent({"--interface-base", "5000"});
    EXPECT_EQ(column(c(kIf, 1)).begin()->first, "5000");
}

TEST_F(InterfaceTest, RowsGoWithABoardAndComeBackUnderTheSameIndices) {
    useChassis("boards:\n" + boardWithLine(1, "ONE") + boardWithLine(2, "TWO"));
    startAgent();
    ASSERT_EQ(lineNamed("line-ONE"), "1000");
    ASSERT_EQ(lineNamed("line-TWO"), "1016");
    sim({"remove", "1"});
    EXPECT_TRUE(eventually([&] { return column(c(kConfig, 1)).size() == 1; }));
    EXPECT_EQ(lineNamed("line-ONE"), "none");
    EXPECT_EQ(lineNamed("line-TWO"), "1016");
    // A board with another serial number is another board, even in the same slot.
    write(path("new.yaml"), "boards:\n" + boardWithLine(1, "NEW"));
    sim({"insert", path("new.yaml")});
    EXPECT_TRUE(eventually([&] { return lineNamed("line-NEW") == "1032"; }));
    write(path("one.yaml"), "boards:\n" + boardWithLine(7, "ONE"));
    sim({"insert", path("one.yaml")});
    EXPECT_TRUE(eventually([&] { return lineNamed("line-ONE") == "1000"; }));
}

TEST_F(InterfaceTest, BoardThatIsAwayDuringARestartHasItsIndicesAgain) {
    useChassis("boards:\n" + boardWithLine(1, "ONE") + boardWithLine(2, "TWO"));
    startAgent();
    EXPECT_EQ(stopAgent(), 0);
    useChassis("boards:\n" + boardWithLine(3, "NEW"));
    startAgent();
    EXPECT_EQ(lineNamed("line-NEW"), "1032");
    EXPECT_EQ(stopAgent(), 0);
    useChassis("boards:\n" + boardWithLine(5, "TWO"));
    startAgent();
    EXPECT_EQ(lineNamed("line-TWO"), "1016");
}

TEST_F(InterfaceTest, DamagedIndexFileIsSetAside) {
    std::filesystem::create_directories(path("persistent"));
    write(path("persistent/ifindex.sqlite"),
          "this is no database, and long enough to be taken for one if nobody looks into it");
    startAgent();
    EXPECT_THAT(agent().output(), HasSubstr("ifindex.sqlite.damaged-"));
    EXPECT_EQ(lineNamed("nx5-trunk-1"), "1000");
}

} // namespace
} // namespace kvloamd::e2e
