// SPDX-License-Identifier: BSD-2-Clause
// SET requests to the real agent.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

/// The writable objects of the line with ifIndex 1000.
constexpr char kLineTraps[] = "1.3.6.1.2.1.10.18.6.1.17.1000";
constexpr char kLinkTraps[] = "1.3.6.1.2.1.31.1.1.1.14.1000";
constexpr char kAlias[] = "1.3.6.1.2.1.31.1.1.1.18.1000";

class SetTest : public AgentFixture {
  protected:
    SetTest() { configureSnmp("rwcommunity public 127.0.0.1\n"); }

    /// The tool's error message for a refused request; empty if it succeeded.
    std::string refusal(std::vector<std::string> const& arguments) const {
        Result const result = ask("snmpset", arguments);
        return result.status == 0 ? "" : result.output;
    }
    /// The same with SNMPv1.
    std::string firstVersionRefusal(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), {"-v1", "-c", "public", "-r", "0", address()});
        Result const result = snmp("snmpset", arguments);
        return result.status == 0 ? "" : result.output;
    }
    void set(std::vector<std::string> const& arguments) const { EXPECT_EQ(refusal(arguments), ""); }
};

TEST_F(SetTest, WhatIsSetShowsInTheNextAnswer) {
    startAgent();
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
    set({kLineTraps, "i", "1"});
    EXPECT_EQ(get(kLineTraps), "INTEGER: 1");
    set({kLineTraps, "i", "2"});
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
}

TEST_F(SetTest, WhatIsSetShowsInAWalk) {
    startAgent();
    set({kLineTraps, "i", "1"});
    auto const column = walk("1.3.6.1.2.1.10.18.6.1.17");
    ASSERT_EQ(column.size(), 5U);
    EXPECT_EQ(column[0].value, "INTEGER: 1");
    EXPECT_EQ(column[1].value, "INTEGER: 2");
}

TEST_F(SetTest, LinksAreToldOfUnlessTheyLieAboveOthers) {
    startAgent();
    EXPECT_EQ(get(kLinkTraps), "INTEGER: 1");
    std::size_t stacked = 0;
    for (Answer const& answer : walk("1.3.6.1.2.1.31.1.2.1.3")) {
        std::uint32_t const higher = answer.name[answer.name.size() - 2];
        std::uint32_t const lower = answer.name.back();
        if (higher == 0) continue;
        EXPECT_EQ(get("1.3.6.1.2.1.31.1.1.1.14." + std::to_string(higher)),
                  lower == 0 ? "INTEGER: 1" : "INTEGER: 2");
        if (lower != 0 && ++stacked == 3) break;
    }
    EXPECT_EQ(stacked, 3U);
}

TEST_F(SetTest, ObjectThatIsReadOnlyIsNotWritable) {
    startAgent();
    EXPECT_THAT(refusal({"1.3.6.1.2.1.10.18.6.1.10.1000", "i", "1"}), HasSubstr("notWritable"));
    EXPECT_THAT(refusal({"1.3.6.1.2.1.2.1.0", "i", "1"}), HasSubstr("notWritable"));
}

TEST_F(SetTest, ValueOfAnotherTypeIsRefused) {
    startAgent();
    EXPECT_THAT(refusal({kLineTraps, "s", "enabled"}), HasSubstr("wrongType"));
    EXPECT_THAT(refusal({kLineTraps, "u", "1"}), HasSubstr("wrongType"));
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
}

TEST_F(SetTest, ValueBesideTheEnumerationIsRefused) {
    startAgent();
    for (char const* const value : {"0", "3", "-1"})
        EXPECT_THAT(refusal({kLineTraps, "i", value}), HasSubstr("wrongValue"));
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
}

TEST_F(SetTest, InstanceThatIsNotThereIsNotMade) {
    startAgent();
    EXPECT_THAT(refusal({"1.3.6.1.2.1.10.18.6.1.17.999", "i", "1"}), HasSubstr("noCreation"));
    EXPECT_THAT(refusal({"1.3.6.1.2.1.31.1.1.1.14.999", "i", "1"}), HasSubstr("noCreation"));
}

TEST_F(SetTest, FirstVersionHasItsOwnErrors) {
    startAgent();
    EXPECT_THAT(firstVersionRefusal({"1.3.6.1.2.1.10.18.6.1.17.999", "i", "1"}),
                HasSubstr("noSuchName"));
    EXPECT_THAT(firstVersionRefusal({"1.3.6.1.2.1.10.18.6.1.10.1000", "i", "1"}),
                HasSubstr("noSuchName"));
    EXPECT_THAT(firstVersionRefusal({kLineTraps, "i", "3"}), HasSubstr("badValue"));
    EXPECT_EQ(firstVersionRefusal({kLineTraps, "i", "1"}), "");
    EXPECT_EQ(get(kLineTraps), "INTEGER: 1");
}

TEST_F(SetTest, SeveralAreSetTogether) {
    startAgent();
    set({kLineTraps, "i", "1", kLinkTraps, "i", "2"});
    EXPECT_EQ(get(kLineTraps), "INTEGER: 1");
    EXPECT_EQ(get(kLinkTraps), "INTEGER: 2");
}

TEST_F(SetTest, NoneOfSeveralIsSetWhenOneCanNotBe) {
    startAgent();
    EXPECT_THAT(refusal({kLineTraps, "i", "1", kLinkTraps, "i", "2", "1.3.6.1.2.1.10.18.6.1.17.999",
                         "i", "1"}),
                HasSubstr("noCreation"));
    // A request that also sets an object of another module is refused as a whole.
    EXPECT_THAT(refusal({kLineTraps, "i", "1", "kvlAgentVersion.0", "s", "mine"}),
                HasSubstr("notWritable"));
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
    EXPECT_EQ(get(kLinkTraps), "INTEGER: 1");
}

TEST_F(SetTest, ReaderCanNotSet) {
    configureSnmp(kReader);
    startAgent();
    EXPECT_THAT(refusal({kLineTraps, "i", "1"}), HasSubstr("noAccess"));
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
}

TEST_F(SetTest, WriterWhoMayNotSeeAnObjectCanNotSetIt) {
    configureSnmp("view links included .1.3.6.1.2.1.31\n"
                  "rwcommunity private 127.0.0.1 -V links\n"
                  "rocommunity public 127.0.0.1\n");
    startAgent();
    auto const setBy = [this](std::string const& community, std::string const& name) {
        return snmp("snmpset", {"-v2c", "-c", community, address(), name, "i", "1"}).output;
    };
    EXPECT_THAT(setBy("private", kLineTraps), HasSubstr("noAccess"));
    EXPECT_THAT(setBy("private", kLinkTraps), HasSubstr("INTEGER: 1"));
    EXPECT_EQ(get(kLineTraps), "INTEGER: 2");
}

TEST_F(SetTest, SettingsSurviveARestart) {
    startAgent();
    set({kLineTraps, "i", "1", kLinkTraps, "i", "2"});
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startAgent();
    EXPECT_EQ(get(kLineTraps), "INTEGER: 1");
    EXPECT_EQ(get(kLinkTraps), "INTEGER: 2");
}

TEST_F(SetTest, AliasIsEmptyUntilItIsSetAndKept) {
    startAgent();
    EXPECT_EQ(get(kAlias), "\"\"");
    set({kAlias, "s", "trunk to Berlin, floor 2"});
    EXPECT_EQ(get(kAlias), "STRING: \"trunk to Berlin, floor 2\"");
    EXPECT_THAT(refusal({kAlias, "s", std::string(65, 'x')}), HasSubstr("wrongLength"));
    EXPECT_THAT(refusal({kAlias, "x", "e9"}), HasSubstr("wrongValue"));
    EXPECT_THAT(refusal({kAlias, "i", "1"}), HasSubstr("wrongType"));
    // Digits are a text too.
    set({kAlias, "s", "0017"});
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startAgent();
    EXPECT_EQ(get(kAlias), "STRING: \"0017\"");
}

TEST_F(SetTest, TextIsNotSetWhenAnotherVariableCanNotBe) {
    startAgent();
    set({kAlias, "s", "first"});
    EXPECT_THAT(refusal({kAlias, "s", "second", kLinkTraps, "i", "3"}), HasSubstr("wrongValue"));
    EXPECT_EQ(get(kAlias), "STRING: \"first\"");
}

TEST_F(SetTest, SettingsAreThereAgainWhenTheirBoardComesBack) {
    useChassis("boards:\n"
               "  - handle: 1\n"
               "    attributes: {SERIAL_NUMBER: ONE}\n"
               "    devices: [{handle: 10, type: 501, attributes: {NAME: trunk}, "
               "line: {type: esf}}]\n");
    startAgent();
    set({kLineTraps, "i", "1"});
    sim({"remove", "1"});
    EXPECT_TRUE(eventually([&] { return get(kLineTraps).find("No Such") == 0; }));
    EXPECT_THAT(refusal({kLineTraps, "i", "2"}), HasSubstr("noCreation"));
    sim({"insert", path("chassis.yaml")});
    EXPECT_TRUE(eventually([&] { return get(kLineTraps) == "INTEGER: 1"; })) << get(kLineTraps);
}

} // namespace
} // namespace kvloamd::e2e
