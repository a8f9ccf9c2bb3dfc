// SPDX-License-Identifier: BSD-2-Clause
// Single requests: missing instances, read-only objects and views.
#include <ostream>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AllOf;
using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::Gt;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Lt;
using ::testing::Not;
using ::testing::SizeIs;

class RequestTest : public AgentFixture {
  protected:
    Result set(std::string const& name, std::string const& type, std::string const& value) {
        return snmp("snmpset", {"-v2c", "-c", "private", address(), name, type, value});
    }
};

TEST_F(RequestTest, RowThatIsNotThereIsNoInstance) {
    startAgent();
    EXPECT_THAT(get("kvlBoardName.99"), HasSubstr("No Such Instance"));
}

TEST_F(RequestTest, ColumnThatIsNotThereIsNoObject) {
    startAgent();
    EXPECT_THAT(get(std::string(kTable) + ".1.99.1"), HasSubstr("No Such Object"));
}

TEST_F(RequestTest, IndexIsNotAccessible) {
    startAgent();
    EXPECT_THAT(get("kvlBoardIndex.1"), HasSubstr("No Such Object"));
}

TEST_F(RequestTest, FirstVersionAnswersAnUnknownRowWithItsError) {
    startAgent();
    Result const result =
        snmp("snmpget", {"-v1", "-c", "public", "-r", "0", address(), "kvlBoardName.99"});
    EXPECT_EQ(result.status, 2);
    EXPECT_THAT(result.output, HasSubstr("noSuchName"));
}

TEST_F(RequestTest, FirstVersionReadsTheTable) {
    startAgent();
    Result const result = snmp("snmpwalk", {"-v1", "-c", "public", "-On", address(), kTable});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(parseAnswers(result.output), walk(kTable));
}

TEST_F(RequestTest, ScalarCanNotBeWritten) {
    configureSnmp("rwcommunity private 127.0.0.1\n");
    startAgent();
    Result const result = set("kvlAgentVersion.0", "s", "mine");
    EXPECT_EQ(result.status, 2);
    EXPECT_THAT(result.output, HasSubstr("notWritable"));
}

TEST_F(RequestTest, CellCanNotBeWritten) {
    configureSnmp("rwcommunity private 127.0.0.1\nrocommunity public 127.0.0.1\n");
    startAgent();
    EXPECT_THAT(set("kvlBoardName.1", "s", "mine").output, HasSubstr("notWritable"));
    EXPECT_EQ(get("kvlBoardName.1"), "STRING: NX5-T1");
}

TEST_F(RequestTest, ObjectsMoveWithTheEnterpriseArc) {
    startAgent({"--enterprise-oid", "1.3.6.1.4.1.55555.7"});
    EXPECT_THAT(walk("1.3.6.1.4.1.55555.7.1.1.2"), SizeIs(3 + 3 * 20));
    EXPECT_THAT(ask("snmpgetnext", {kObjects}).output, Not(HasSubstr(".32473.")));
}

TEST_F(RequestTest, AgentListensOnSeveralAddresses) {
    std::string const second = "127.0.0.1:" + std::to_string(freePort());
    std::string const third = "tcp:127.0.0.1:" + std::to_string(freePort());
    write(path("kvloamd.toml"),
          "module=[\"z7sim\"]\nlisten=[\"udp:" + second + "\", \"" + third + "\"]\n");
    Process agent({KVLOAMD, "--config", path("kvloamd.toml"), "--module-dir", moduleDirectory(),
                   "--snmp-config", path("snmp.conf"), "--persistent-dir", path("persistent")},
                  environment());
    ASSERT_TRUE(agent.waitFor("kvloamd: serving "));
    for (std::string const& place : {second, third}) {
        Result const result =
            snmp("snmpget", {"-v2c", "-c", "public", "-t", "30", place, "kvlBoardCount.0"});
        EXPECT_THAT(result.output, HasSubstr("Gauge32: 3")) << place;
    }
}

/// A user whose view contains the boards' names and the status of the second board.
class RestrictedViewTest : public AgentFixture {
  protected:
    RestrictedViewTest() {
        configureSnmp("com2sec reader 127.0.0.1 public\n"
                      "group readers v2c reader\n"
                      "view some included .1.3.6.1.4.1.32473.1.1.2.4.1.4\n"
                      "view some included .1.3.6.1.4.1.32473.1.1.2.4.1.2.2\n"
                      "access readers \"\" any noauth exact some none none\n");
    }
    static std::vector<std::string> values(std::vector<Answer> const& answers) {
        std::vector<std::string> result;
        for (Answer const& answer : answers)
            result.push_back(answer.value);
        return result;
    }
};

TEST_F(RestrictedViewTest, WalkShowsWhatTheReaderMaySee) {
    startAgent();
    EXPECT_THAT(values(walk()), ElementsAre("INTEGER: started(3)", "STRING: NX5-T1",
                                            "STRING: QUILLON-E1", "STRING: VORN-E1"));
}

TEST_F(RestrictedViewTest, BulkWalkShowsNoMore) {
    startAgent();
    for (char const* const repetitions : {"-Cr1", "-Cr3", "-Cr50"})
        EXPECT_EQ(values(answers("snmpbulkwalk", {repetitions, kObjects})), values(walk()))
            << repetitions;
}

TEST_F(RestrictedViewTest, BulkRequestForSeveralColumnsShowsNoMore) {
    startAgent();
    auto const shown = values(
        answers("snmpbulkget", {"-Cr9", "kvlBoardStatus", "kvlBoardName", "kvlBoardSerialNumber"}));
    EXPECT_THAT(shown, Not(IsEmpty()));
    EXPECT_THAT(shown, Each(::testing::AnyOf("INTEGER: started(3)", "STRING: NX5-T1",
                                             "STRING: QUILLON-E1", "STRING: VORN-E1")));
}

TEST_F(RestrictedViewTest, GetOfWhatTheReaderMayNotSeeIsNoObject) {
    startAgent();
    EXPECT_THAT(get("kvlBoardSerialNumber.1"), HasSubstr("No Such Object"));
}

/// What a view contains of the boards' table, in which the first board has row 1.
struct PartialView {
    char const* what;
    std::vector<std::string> lines; ///< "included" or "excluded", the name below the entry, a mask

    friend std::ostream& operator<<(std::ostream& to, PartialView const& view) {
        return to << view.what;
    }
};

/// Two readers: `public` has the view, `all` may see everything.
class PartialViewTest : public AgentFixture, public ::testing::WithParamInterface<PartialView> {
  protected:
    PartialViewTest() {
        std::string config = "com2sec reader 127.0.0.1 public\n"
                             "group readers v2c reader\n"
                             "access readers \"\" any noauth exact some none none\n"
                             "rocommunity all 127.0.0.1\n";
        for (std::string const& line : GetParam().lines)
            config +=
                "view some " + line.substr(0, 8) + " " + kTable + ".1" + line.substr(9) + "\n";
        configureSnmp(config);
    }
    std::vector<std::string> namesOfAll() const {
        std::vector<std::string> names;
        Result const walked =
            snmp("snmpbulkwalk", {"-v2c", "-c", "all", "-On", "-t", "30", address(), kTable});
        for (Answer const& answer : parseAnswers(walked.output))
            names.push_back(text(answer.name));
        return names;
    }
    static std::string text(Oid const& name) {
        std::string result;
        for (std::uint32_t const number : name)
            result += "." + std::to_string(number);
        return result;
    }
};

/// The library itself decides what a GET shows.
TEST_P(PartialViewTest, WalksShowExactlyWhatGetsShow) {
    startAgent();
    std::vector<std::string> const all = namesOfAll();
    std::vector<Answer> visible = answers("snmpget", all);
    ASSERT_EQ(visible.size(), all.size());
    std::erase_if(visible,
                  [](Answer const& answer) { return answer.value.starts_with("No Such"); });
    ASSERT_THAT(visible, SizeIs(AllOf(Gt(0U), Lt(all.size()))));
    EXPECT_EQ(walk(kTable), visible);
    for (char const* const repetitions : {"-Cr1", "-Cr2", "-Cr50"})
        EXPECT_EQ(answers("snmpbulkwalk", {repetitions, kTable}), visible) << repetitions;
}

INSTANTIATE_TEST_SUITE_P(
    , PartialViewTest,
    ::testing::Values(PartialView{"AllButACell", {"included ", "excluded .4.2"}},
                      PartialView{"CellsOfAColumn", {"included .4.1", "included .4.3"}},
                      PartialView{"AllButAColumn", {"included ", "excluded .4"}},
                      PartialView{"CellOfAnExcludedColumn",
                                  {"included ", "excluded .4", "included .4.2"}},
                      // The mask has a bit for each number of the name: any column matches, in the
                      // last case of many tables.
                      PartialView{"RowOfEveryColumn", {"included .1.2 ff:f7"}},
                      PartialView{"AllButARow", {"included ", "excluded .1.2 ff:f7"}},
                      PartialView{"AllButARowOfManyTables", {"included ", "excluded .1.2 ff:b7"}}),
    [](auto const& test) { return test.param.what; });

} // namespace
} // namespace kvloamd::e2e
