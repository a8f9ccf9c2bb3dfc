// SPDX-License-Identifier: BSD-2-Clause
// Objects set through a master.
#include <gmock/gmock.h>

#include "tests/e2e/MasterFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

constexpr char kLineTraps[] = "1.3.6.1.2.1.10.18.6.1.17.";
constexpr char kLinkTrapsOfLine[] = "1.3.6.1.2.1.31.1.1.1.14.1000";
constexpr char kLineTrapsOfLine[] = "1.3.6.1.2.1.10.18.6.1.17.1000";
constexpr char kAliasOfLine[] = "1.3.6.1.2.1.31.1.1.1.18.1000";
constexpr char kCircuitOfLine[] = "1.3.6.1.2.1.10.18.6.1.8.1000";
constexpr char kLineName[] = "1.3.6.1.2.1.31.1.1.1.1.1000";

class SubagentSetTest : public MasterFixture {
  protected:
    void start() {
        configureMaster("rwcommunity private 127.0.0.1\n");
        startMaster();
        startSubagent();
        ASSERT_TRUE(isConnected()) << agent().output();
        // The rows of tables that the master shares are registered last.
        ASSERT_TRUE(eventually([this] { return get(kLineName) == "STRING: \"nx5-trunk-1\""; }));
        m_lineTraps = get(kLineTrapsOfLine);
        m_linkTraps = get(kLinkTrapsOfLine);
    }
    /// The tool's output for these variables, each a name, a type and a value.
    std::string set(std::vector<std::string> const& variables) const {
        std::vector<std::string> arguments{"-v2c", "-c", "private", "-t",     "30",
                                           "-r",   "0",  "-On",     address()};
        arguments.insert(arguments.end(), variables.begin(), variables.end());
        return snmp("snmpset", arguments).output;
    }
    static std::string other(std::string const& value) { return value == "INTEGER: 1" ? "2" : "1"; }
    void expectUnchanged() const {
        EXPECT_EQ(get(kLineTrapsOfLine), m_lineTraps);
        EXPECT_EQ(get(kLinkTrapsOfLine), m_linkTraps);
    }

    std::string m_lineTraps;
    std::string m_linkTraps;
};

TEST_F(SubagentSetTest, LimitOfALineIsSetAndForgotten) {
    constexpr char kLimit[] = "1.3.6.1.4.1.32473.1.1.13.1.1.2.1000";
    start();
    EXPECT_EQ(get(kLimit), "INTEGER: 0 seconds");
    set({kLimit, "i", "65"});
    EXPECT_EQ(get(kLimit), "INTEGER: 65 seconds");
    set({kLimit, "i", "-1"});
    EXPECT_EQ(get(kLimit), "INTEGER: 0 seconds");
}

TEST_F(SubagentSetTest, LinesTrapsAreSwitched) {
    start();
    for (int round = 0; round < 2; ++round) {
        std::string const value = other(get(kLineTrapsOfLine));
        EXPECT_THAT(set({kLineTrapsOfLine, "i", value}), HasSubstr("INTEGER: " + value));
        EXPECT_EQ(get(kLineTrapsOfLine), "INTEGER: " + value);
    }
}

TEST_F(SubagentSetTest, RowAmongTheHostsIsSet) {
    start();
    std::string const value = other(m_linkTraps);
    EXPECT_THAT(set({kLinkTrapsOfLine, "i", value}), HasSubstr("INTEGER: " + value));
    EXPECT_EQ(get(kLinkTrapsOfLine), "INTEGER: " + value);
}

TEST_F(SubagentSetTest, TextAmongTheHostsRowsIsSetAndKept) {
    start();
    EXPECT_EQ(get(kAliasOfLine), "\"\"");
    EXPECT_THAT(set({kAliasOfLine, "s", "to Berlin"}), HasSubstr("to Berlin"));
    EXPECT_EQ(get(kAliasOfLine), "STRING: \"to Berlin\"");
    // One bad variable leaves the text as it was.
    EXPECT_THAT(set({kAliasOfLine, "s", "elsewhere", kLinkTrapsOfLine, "i", "9"}),
                HasSubstr("wrongValue"));
    EXPECT_THAT(set({kAliasOfLine, "s", std::string(65, 'x')}), HasSubstr("wrongLength"));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startSubagent();
    ASSERT_TRUE(isConnected()) << agent().output();
    EXPECT_TRUE(eventually([this] { return get(kAliasOfLine) == "STRING: \"to Berlin\""; }))
        << get(kAliasOfLine);
}

TEST_F(SubagentSetTest, CircuitIdentifierIsSetAndKept) {
    start();
    EXPECT_EQ(get(kCircuitOfLine), "STRING: \"T1-0001\"");
    EXPECT_THAT(set({kCircuitOfLine, "s", std::string(256, 'x')}), HasSubstr("wrongLength"));
    EXPECT_EQ(get(kCircuitOfLine), "STRING: \"T1-0001\"");
    EXPECT_THAT(set({kCircuitOfLine, "s", "B-4711"}), HasSubstr("B-4711"));
    EXPECT_EQ(get(kCircuitOfLine), "STRING: \"B-4711\"");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startSubagent();
    ASSERT_TRUE(isConnected()) << agent().output();
    EXPECT_TRUE(eventually([this] { return get(kCircuitOfLine) == "STRING: \"B-4711\""; }))
        << get(kCircuitOfLine);
}

TEST_F(SubagentSetTest, VariablesOfSeveralTablesAreSetTogether) {
    start();
    std::string const line = other(m_lineTraps);
    std::string const link = other(m_linkTraps);
    set({kLineTrapsOfLine, "i", line, kLinkTrapsOfLine, "i", link});
    EXPECT_EQ(get(kLineTrapsOfLine), "INTEGER: " + line);
    EXPECT_EQ(get(kLinkTrapsOfLine), "INTEGER: " + link);
}

TEST_F(SubagentSetTest, TextIsSetTogetherWithANumberOrNotAtAll) {
    start();
    std::string const alias = "1.3.6.1.2.1.47.1.1.1.1.14.1";
    std::string const line = other(m_lineTraps);
    EXPECT_THAT(set({alias, "s", "rack 7", kLineTrapsOfLine, "i", "9"}), HasSubstr("wrongValue"));
    EXPECT_EQ(get(alias), "\"\"");
    EXPECT_THAT(set({alias, "s", std::string(33, 'a')}), HasSubstr("wrongLength"));
    set({alias, "s", "rack 7", kLineTrapsOfLine, "i", line});
    EXPECT_EQ(get(alias), "STRING: \"rack 7\"");
    EXPECT_EQ(get(kLineTrapsOfLine), "INTEGER: " + line);
}

TEST_F(SubagentSetTest, OneBadVariableLeavesAllAsTheyWere) {
    start();
    std::string const line = other(m_lineTraps);
    std::string const link = other(m_linkTraps);
    EXPECT_THAT(set({kLineTrapsOfLine, "i", line, kLinkTrapsOfLine, "i", "9"}),
                HasSubstr("wrongValue"));
    expectUnchanged();
    EXPECT_THAT(set({kLinkTrapsOfLine, "i", link, kLineTrapsOfLine, "i", "9"}),
                HasSubstr("wrongValue"));
    expectUnchanged();
    EXPECT_THAT(set({kLineTrapsOfLine, "i", line, std::string(kLineTraps) + "4711", "i", "1"}),
                HasSubstr("noCreation"));
    expectUnchanged();
}

TEST_F(SubagentSetTest, MastersRefusalLeavesOursAsTheyWere) {
    start();
    // sysUpTime, the master's own
    std::string const refused =
        set({kLineTrapsOfLine, "i", other(m_lineTraps), "1.3.6.1.2.1.1.3.0", "t", "1"});
    EXPECT_THAT(refused, HasSubstr("notWritable"));
    expectUnchanged();
}

TEST_F(SubagentSetTest, FaultsAreNamed) {
    start();
    EXPECT_THAT(set({kLineTrapsOfLine, "i", "3"}), HasSubstr("wrongValue"));
    EXPECT_THAT(set({kLineTrapsOfLine, "s", "on"}), HasSubstr("wrongType"));
    EXPECT_THAT(set({std::string(kLineTraps) + "4711", "i", "1"}), HasSubstr("noCreation"));
    EXPECT_THAT(set({kLineName, "s", "another"}), HasSubstr("notWritable"));
    EXPECT_THAT(set({"kvlBoardName.1", "s", "another"}), HasSubstr("notWritable"));
    expectUnchanged();
}

TEST_F(SubagentSetTest, WhatIsSetOutlivesTheAgent) {
    start();
    std::string const value = other(m_lineTraps);
    set({kLineTrapsOfLine, "i", value});
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startSubagent();
    ASSERT_TRUE(isConnected()) << agent().output();
    EXPECT_EQ(get(kLineTrapsOfLine), "INTEGER: " + value);
}

} // namespace
} // namespace kvloamd::e2e
