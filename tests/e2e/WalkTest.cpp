// SPDX-License-Identifier: BSD-2-Clause
// Walks of the whole module, and single requests that must agree with them.
#include <algorithm>
#include <atomic>
#include <set>
#include <thread>

#include <gmock/gmock.h>

#include "agent/objects/OwnObjects.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

std::string text(Oid const& name) {
    std::string result;
    for (std::uint32_t const number : name)
        result += "." + std::to_string(number);
    return result;
}

bool isStrictlyIncreasing(std::vector<Answer> const& answers) {
    return std::ranges::adjacent_find(answers, [](Answer const& a, Answer const& b) {
               return compare(a.name, b.name) >= 0;
           }) == answers.end();
}

class WalkTest : public AgentFixture {
  protected:
    static std::vector<std::string> namesOf(std::vector<Answer> const& answers) {
        std::vector<std::string> names;
        for (Answer const& answer : answers)
            names.push_back(text(answer.name));
        return names;
    }
    /// The object identifiers of all columns that have an instance in `answers`.
    static std::set<std::uint32_t> columnsOf(std::vector<Answer> const& answers) {
        Oid const entry = *parseOidOf(kTable);
        std::set<std::uint32_t> columns;
        for (Answer const& answer : answers)
            if (startsWith(answer.name, entry)) columns.insert(answer.name[entry.size() + 1]);
        return columns;
    }
    static std::optional<Oid> parseOidOf(std::string const& name) {
        auto const parsed = parseAnswers(name + " = x");
        return parsed.empty() ? std::nullopt : std::optional(parsed.front().name);
    }
};

TEST_F(WalkTest, EveryColumnOfEveryBoardIsThere) {
    startAgent();
    auto const answers = walk(kBoards);
    EXPECT_TRUE(isStrictlyIncreasing(answers));
    EXPECT_THAT(columnsOf(answers), SizeIs(20));
    // 3 scalars, and 20 columns of 3 boards that answer every query.
    EXPECT_THAT(answers, SizeIs(3 + 3 * 20));
}

TEST_F(WalkTest, GetAnswersEveryInstanceAsTheWalkDoes) {
    startAgent();
    auto const walked = walk(kTable);
    ASSERT_THAT(walked, Not(IsEmpty()));
    EXPECT_EQ(answers("snmpget", namesOf(walked)), walked);
}

TEST_F(WalkTest, GetNextAnswersEveryInstanceWithTheOneAfterIt) {
    startAgent();
    auto walked = walk(kTable);
    ASSERT_THAT(walked, Not(IsEmpty()));
    auto names = namesOf(walked);
    names.pop_back();
    walked.erase(walked.begin());
    EXPECT_EQ(answers("snmpgetnext", names), walked);
}

TEST_F(WalkTest, BulkWalksOfAnySizeAgreeWithTheWalk) {
    startAgent();
    auto const walked = walk(kTable);
    for (char const* const repetitions : {"-Cr1", "-Cr2", "-Cr7", "-Cr50", "-Cr500"})
        EXPECT_EQ(answers("snmpbulkwalk", {repetitions, kTable}), walked) << repetitions;
}

TEST_F(WalkTest, BulkRequestForSeveralColumnsAnswersThemRowByRow) {
    startAgent();
    auto const walked = answers(
        "snmpbulkget", {"-Cn1", "-Cr3", "kvlBoardCount", "kvlBoardName", "kvlBoardSerialNumber"});
    std::vector<std::string> values;
    for (Answer const& answer : walked)
        values.push_back(answer.value);
    EXPECT_THAT(values,
                ::testing::ElementsAre("Gauge32: 3 boards", "STRING: NX5-T1", "STRING: NX50001",
                                       "STRING: QUILLON-E1", "STRING: QL-77-0420",
                                       "STRING: VORN-E1", "STRING: V0003-E"));
}

TEST_F(WalkTest, WalkGoesOnBehindTheModule) {
    startAgent();
    auto const after = answers("snmpgetnext", {text(walk().back().name)});
    ASSERT_THAT(after, SizeIs(1));
    EXPECT_FALSE(startsWith(after[0].name, *parseOidOf(kObjects))) << text(after[0].name);
}

TEST_F(WalkTest, WholeAgentIsWalkedThroughTheModule) {
    startAgent();
    auto const everything = walk("1");
    EXPECT_TRUE(isStrictlyIncreasing(everything));
    for (Answer const& answer : walk(kTable))
        EXPECT_THAT(everything, Contains(answer));
}

TEST_F(WalkTest, ValuesHaveTheTypesOfTheMib) {
    startAgent();
    Result const result = snmp("snmpwalk", {"-v2c", "-c", "public", address(), "kvl"});
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.output, Not(HasSubstr("Wrong Type")));
    EXPECT_THAT(result.output,
                AllOf(HasSubstr("KVL-OAM-MIB::kvlBoardStatus.1 = INTEGER: started(3)"),
                      HasSubstr("KVL-OAM-MIB::kvlBoardSharedMemoryAddress.1 = STRING: 0xd0000000"),
                      HasSubstr("KVL-OAM-MIB::kvlBoardIrq.1 = INTEGER: 11"),
                      HasSubstr("KVL-OAM-MIB::kvlLibraryVersion.0 = STRING: VQcid")));
}

TEST_F(WalkTest, TableIsPrintedWithItsNames) {
    startAgent();
    Result const result =
        snmp("snmptable", {"-v2c", "-c", "public", "-Ci", address(), "kvlBoardTable"});
    EXPECT_EQ(result.status, 0);
    auto const lines = linesOf(result.output);
    ASSERT_THAT(lines, SizeIs(6)) << result.output; // title, empty line, column heads, three boards
    for (std::size_t column = 0; column < boardTable().columnCount(); ++column)
        EXPECT_THAT(lines[2], HasSubstr(boardTable().column(column).name));
    EXPECT_THAT(lines[4], AllOf(HasSubstr("QUILLON-E1"), HasSubstr("QL-77-0420")));
}

TEST_F(WalkTest, NumbersThatABoardDoesNotKnowHaveNoInstance) {
    useChassis("boards:\n"
               "  - handle: 7\n"
               "    attributes: {SERIAL_NUMBER: \"S7\"}\n");
    startAgent();
    EXPECT_EQ(get("kvlBoardSerialNumber.1"), "STRING: S7");
    EXPECT_THAT(get("kvlBoardIrq.1"), HasSubstr("No Such Instance"));
    EXPECT_THAT(get("kvlBoardSharedMemoryAddress.1"), HasSubstr("No Such Instance"));
}

TEST_F(WalkTest, ChassisWithoutBoardsHasAnEmptyTable) {
    useChassis("boards: []\n");
    startAgent();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 0 boards");
    EXPECT_THAT(walk(kBoards), SizeIs(3));
}

TEST_F(WalkTest, ThousandBoardsAreWalkedCompletely) {
    Result const chassis = run({KVLSIM, "generate", "--boards", "1000"});
    ASSERT_EQ(chassis.status, 0) << chassis.output;
    useChassis(chassis.output);
    startAgent();
    auto const walked = answers("snmpbulkwalk", {"-Cr50", kTable});
    EXPECT_TRUE(isStrictlyIncreasing(walked));
    std::set<std::string> serialNumbers;
    for (Answer const& answer : answers("snmpbulkwalk", {"-Cr50", "kvlBoardSerialNumber"}))
        serialNumbers.insert(answer.value);
    EXPECT_THAT(serialNumbers, SizeIs(1000));
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 1000 boards");
    EXPECT_EQ(get("kvlBoardStatus.1000"), "INTEGER: started(3)");
}

TEST_F(WalkTest, WalksStayInOrderWhileBoardsComeAndGo) {
    startAgent();
    std::atomic<bool> done{false};
    std::thread operating([&] {
        for (int round = 0; round < 5; ++round) {
            // Each board has a line, and therefore rows in the standard tables.
            std::string const number = std::to_string(round);
            std::string const board = path("board" + number + ".yaml");
            write(board, "boards:\n"
                         "  - handle: 50\n"
                         "    attributes: {SERIAL_NUMBER: COMES" +
                             number +
                             "}\n"
                             "    devices: [{handle: 500, type: 501, attributes: {NAME: line}, "
                             "line: {type: esf}}]\n");
            sim({"insert", board});
            sim({"stop", "1"});
            sim({"start", "1"});
            sim({"remove", "50"});
        }
        done = true;
    });
    int walks = 0;
    do {
        auto const single = walk("1.3.6.1");
        auto const bulk = answers("snmpbulkwalk", {"-Cr7", "1.3.6.1"});
        EXPECT_TRUE(isStrictlyIncreasing(single));
        EXPECT_TRUE(isStrictlyIncreasing(bulk));
        for (auto const* const walked : {&single, &bulk})
            for (char const* const serialNumber :
                 {"STRING: NX50001", "STRING: QL-77-0420", "STRING: V0003-E"})
                EXPECT_THAT(*walked, Contains(::testing::Field(&Answer::value, serialNumber)));
        ++walks;
    } while (!done);
    operating.join();
    EXPECT_GT(walks, 0);
    EXPECT_TRUE(eventually([this] { return get("kvlBoardCount.0") == "Gauge32: 3 boards"; }));
}

} // namespace
} // namespace kvloamd::e2e
