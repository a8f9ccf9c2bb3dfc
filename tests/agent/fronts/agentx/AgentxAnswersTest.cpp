// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxAnswers.h"

#include <algorithm>
#include <random>

#include <gtest/gtest.h>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "board/Board.h"

namespace kvloamd {
namespace {

Oid const kEnterprise{1, 3, 6, 1, 4, 1, 32473};

Oid absolute(Oid const& place) {
    Oid name = kEnterprise;
    name.insert(name.end(), place.begin(), place.end());
    return name;
}

/// A variable of a response: its type, its name, and its number or text.
struct Variable {
    int type = 0;
    Oid name;
    std::int64_t number = 0;
    std::string text;

    bool operator==(Variable const&) const = default;
};

struct Range {
    Oid start;
    bool include = false;
    Oid end;
};

constexpr int kText = 4;
constexpr int kNoSuchObject = 128;
constexpr int kNoSuchInstance = 129;
constexpr int kEndOfView = 130;

/// The trees over boards 2 and 5, and interfaces 1000 and 1002.
class AgentxAnswersTest : public ::testing::Test {
  protected:
    AgentxAnswersTest() {
        auto snapshot = std::make_shared<Snapshot>();
        for (std::uint32_t const index : {2U, 5U}) {
            BoardRow row;
            row.boardIndex = index;
            row.status = BoardStatusStarted;
            row.name = "board " + std::to_string(index);
            snapshot->boards.push_back(row);
        }
        for (std::uint32_t const index : {1000U, 1002U}) {
            InterfaceRow row;
            row.ifIndex = index;
            row.description = "interface " + std::to_string(index);
            snapshot->interfaces.interfaces.push_back(row);
        }
        m_snapshot = snapshot;
    }

    /// Answers a request for these ranges; `counts` come before them in a GETBULK.
    std::vector<Variable> ask(AgentxKind kind, std::vector<Range> const& ranges,
                              std::vector<std::uint16_t> const& counts = {}) {
        AgentxWriter writer(kind, 1, 2, 3);
        for (std::uint16_t const count : counts)
            writer.number16(count);
        for (Range const& range : ranges) {
            std::string name = nameOf(range.start);
            if (range.include) name[2] = 1;
            for (char const octet : name + nameOf(range.end))
                writer.octet(static_cast<std::uint8_t>(octet));
        }
        return read(answer(writer.take()));
    }
    std::string answer(std::string const& request) {
        AgentxHeader const header = parseAgentxHeader(request);
        return m_answers.answer(header, std::string_view(request).substr(AgentxHeader::kSize));
    }
    int faultOf(AgentxKind kind) { return faultOf(AgentxWriter(kind, 1, 2, 3).take()); }
    int faultOf(std::string const& request) {
        std::string const response = answer(request);
        AgentxReader reader(std::string_view(response).substr(AgentxHeader::kSize), true);
        reader.number();
        return reader.number16();
    }

    static std::string nameOf(Oid const& name) {
        AgentxWriter writer(AgentxKind::Get, 0, 0, 0);
        writer.name(name);
        return writer.take().substr(AgentxHeader::kSize);
    }
    static std::vector<Variable> read(std::string const& response) {
        AgentxHeader const header = parseAgentxHeader(response);
        EXPECT_EQ(header.kind, AgentxKind::Response);
        EXPECT_EQ(header.session, 1U);
        EXPECT_EQ(header.transaction, 2U);
        EXPECT_EQ(header.packet, 3U);
        EXPECT_EQ(header.payload, response.size() - AgentxHeader::kSize);
        AgentxReader reader(std::string_view(response).substr(AgentxHeader::kSize), true);
        reader.number();
        EXPECT_EQ(reader.number16(), 0U);
        reader.number16();
        std::vector<Variable> variables;
        while (!reader.atEnd()) {
            Variable variable;
            variable.type = reader.number16();
            reader.number16();
            variable.name = reader.name().name;
            if (variable.type < kNoSuchObject) variable.number = reader.number();
            if (variable.type == kText) {
                for (std::int64_t i = 0; i < (variable.number + 3) / 4 * 4; ++i) {
                    char const octet = static_cast<char>(reader.octet());
                    if (i < variable.number) variable.text += octet;
                }
                variable.number = 0;
            }
            variables.push_back(std::move(variable));
        }
        return variables;
    }

    int m_snapshotsTaken = 0;
    std::shared_ptr<Snapshot const> m_snapshot;
    std::vector<Table const*> const m_tables = tables();
    ObjectTree const m_tree{scalars(), m_tables};
    Counters m_counters;
    std::vector<Table const*> const m_standardTables = standardTables();
    ObjectTree const m_standardTree{standardScalars(), m_standardTables};
    Settings m_settings;
    AgentxAnswers m_answers{{{m_tree, kEnterprise, {}}, {m_standardTree, kStandardArc, {}}},
                            m_counters,
                            [this] {
                                ++m_snapshotsTaken;
                                return m_snapshot;
                            },
                            m_settings};

    Oid const m_name2 = absolute({1, 1, 2, 4, 1, 4, 2});
    Oid const m_name5 = absolute({1, 1, 2, 4, 1, 4, 5});
    Variable const m_board2{kText, m_name2, 0, "board 2"};
    Variable const m_board5{kText, m_name5, 0, "board 5"};
    Oid const m_description1000{1, 3, 6, 1, 2, 1, 2, 2, 1, 2, 1000};
    Oid const m_description1002{1, 3, 6, 1, 2, 1, 2, 2, 1, 2, 1002};
    Variable const m_interface1000{kText, m_description1000, 0, "interface 1000"};
    Variable const m_interface1002{kText, m_description1002, 0, "interface 1002"};
};

TEST_F(AgentxAnswersTest, GetAnswersValuesAndWhyThereAreNone) {
    Oid const noRow = absolute({1, 1, 2, 4, 1, 4, 3});
    Oid const noObject = absolute({1, 1, 99});
    EXPECT_EQ(
        ask(AgentxKind::Get, {{m_name2, false, {}}, {noRow, false, {}}, {noObject, false, {}}}),
        (std::vector<Variable>{
            m_board2, {kNoSuchInstance, noRow, 0, ""}, {kNoSuchObject, noObject, 0, ""}}));
}

TEST_F(AgentxAnswersTest, GetNextAnswersWhatComesAfter) {
    EXPECT_EQ(ask(AgentxKind::GetNext, {{m_name2, false, {}}}), std::vector{m_board5});
}

TEST_F(AgentxAnswersTest, InclusiveGetNextAnswersTheNameItself) {
    EXPECT_EQ(ask(AgentxKind::GetNext, {{m_name2, true, {}}}), std::vector{m_board2});
}

TEST_F(AgentxAnswersTest, InclusiveGetNextOfAGapAnswersWhatComesAfter) {
    EXPECT_EQ(ask(AgentxKind::GetNext, {{absolute({1, 1, 2, 4, 1, 4, 3}), true, {}}}),
              std::vector{m_board5});
}

TEST_F(AgentxAnswersTest, GetNextBeforeAllOfOursAnswersTheFirst) {
    auto const answered = ask(AgentxKind::GetNext, {{{1, 3, 6, 1, 2}, false, {}}});
    ASSERT_EQ(answered.size(), 1U);
    EXPECT_EQ(answered[0].name, (Oid{1, 3, 6, 1, 2, 1, 2, 1, 0}));
}

TEST_F(AgentxAnswersTest, GetNextBetweenTheTreesAnswersTheFirstOfTheSecond) {
    auto const answered = ask(AgentxKind::GetNext, {{{1, 3, 6, 1, 4, 1}, false, {}}});
    ASSERT_EQ(answered.size(), 1U);
    EXPECT_TRUE(startsWith(answered[0].name, kEnterprise));
}

TEST_F(AgentxAnswersTest, GetNextAfterTheFirstTreesLastAnswersTheFirstOfTheSecond) {
    auto const answered = ask(AgentxKind::GetNext, {{{1, 3, 6, 1, 2, 1, 200}, false, {}}});
    ASSERT_EQ(answered.size(), 1U);
    EXPECT_TRUE(startsWith(answered[0].name, kEnterprise));
}

TEST_F(AgentxAnswersTest, RangeThatEndsBeforeTheNextTreeDoesNotLeak) {
    Oid const start{1, 3, 6, 1, 2, 1, 200};
    EXPECT_EQ(ask(AgentxKind::GetNext, {{start, false, {1, 3, 6, 1, 2, 1, 201}}}),
              (std::vector<Variable>{{kEndOfView, start, 0, ""}}));
}

TEST_F(AgentxAnswersTest, RequestAsksSeveralTrees) {
    EXPECT_EQ(ask(AgentxKind::Get, {{m_name2, false, {}}, {m_description1002, false, {}}}),
              (std::vector{m_board2, m_interface1002}));
    EXPECT_EQ(ask(AgentxKind::GetNext, {{m_name2, false, {}}, {m_description1000, false, {}}}),
              (std::vector{m_board5, m_interface1002}));
}

TEST_F(AgentxAnswersTest, InclusiveRangeOfOneCellAnswersTheCell) {
    EXPECT_EQ(
        ask(AgentxKind::GetNext, {{m_description1000, true, {1, 3, 6, 1, 2, 1, 2, 2, 1, 2, 1001}}}),
        std::vector{m_interface1000});
}

TEST_F(AgentxAnswersTest, InclusiveRangeOfACellThatIsGoneIsEmpty) {
    Oid const gone{1, 3, 6, 1, 2, 1, 2, 2, 1, 2, 1001};
    EXPECT_EQ(ask(AgentxKind::GetNext, {{gone, true, m_description1002}}),
              (std::vector<Variable>{{kEndOfView, gone, 0, ""}}));
}

TEST_F(AgentxAnswersTest, GetNextAfterAllOfOursIsAtTheEnd) {
    Oid const later{1, 3, 6, 1, 4, 1, 32474};
    EXPECT_EQ(ask(AgentxKind::GetNext, {{later, false, {}}}),
              (std::vector<Variable>{{kEndOfView, later, 0, ""}}));
}

TEST_F(AgentxAnswersTest, GetNextEndsBeforeTheEndOfItsRange) {
    EXPECT_EQ(ask(AgentxKind::GetNext, {{m_name2, false, m_name5}}),
              (std::vector<Variable>{{kEndOfView, m_name2, 0, ""}}));
}

TEST_F(AgentxAnswersTest, BulkAnswersSinglesOnceAndTheRestInRounds) {
    Oid const count = absolute({1, 1, 2, 1});
    auto const answered = ask(AgentxKind::GetBulk,
                              {{count, false, {}},
                               {absolute({1, 1, 2, 4, 1, 4}), false, absolute({1, 1, 2, 4, 1, 5})},
                               {m_name2, true, {}}},
                              {1, 3});
    ASSERT_EQ(answered.size(), 1U + 3U * 2U);
    EXPECT_EQ(answered[0].number, 2);
    EXPECT_EQ(answered[1], m_board2);
    EXPECT_EQ(answered[2], m_board2);
    EXPECT_EQ(answered[3], m_board5);
    EXPECT_EQ(answered[4], m_board5);
    EXPECT_EQ(answered[5], (Variable{kEndOfView, m_name5, 0, ""}));
    EXPECT_GT(answered[6].name, m_name5);
}

TEST_F(AgentxAnswersTest, LongBulkIsCut) {
    auto const answered = ask(AgentxKind::GetBulk, {{m_name5, false, m_name5}}, {0, 65535});
    EXPECT_GT(answered.size(), 100U);
    EXPECT_LT(answered.size(), 5000U);
}

TEST_F(AgentxAnswersTest, OneResponseComesFromOneSnapshot) {
    ask(AgentxKind::Get, {{m_name2, false, {}}, {m_name5, false, {}}});
    EXPECT_EQ(m_snapshotsTaken, 1);
}

TEST_F(AgentxAnswersTest, SetIsTestedInTheTreeThatItsNameIsIn) {
    // ifLinkUpDownTrapEnable and kvlBoardName
    AgentxWriter writable(AgentxKind::TestSet, 1, 2, 3);
    writable.variable(Oid{1, 3, 6, 1, 2, 1, 31, 1, 1, 1, 14, 1000}, ValueType::Integer,
                      std::int64_t{2});
    EXPECT_EQ(faultOf(writable.take()), static_cast<int>(AgentxFault::None));
    AgentxWriter readOnly(AgentxKind::TestSet, 1, 2, 3);
    readOnly.variable(m_name2, ValueType::Text, std::string_view("another"));
    EXPECT_EQ(faultOf(readOnly.take()), static_cast<int>(AgentxFault::NotWritable));
    AgentxWriter foreign(AgentxKind::TestSet, 1, 2, 3);
    foreign.variable(Oid{1, 3, 6, 1, 6, 1}, ValueType::Integer, std::int64_t{2});
    EXPECT_EQ(faultOf(foreign.take()), static_cast<int>(AgentxFault::NotWritable));
}

TEST_F(AgentxAnswersTest, AnswersShowWhatIsSet) {
    Oid const trapEnable{1, 3, 6, 1, 2, 1, 31, 1, 1, 1, 14, 1000};
    AgentxWriter test(AgentxKind::TestSet, 1, 2, 3);
    test.variable(trapEnable, ValueType::Integer, std::int64_t{2});
    answer(test.take());
    EXPECT_EQ(faultOf(AgentxKind::CommitSet), static_cast<int>(AgentxFault::None));
    auto const answered = ask(AgentxKind::Get, {{trapEnable, false, {}}});
    ASSERT_EQ(answered.size(), 1U);
    EXPECT_EQ(answered[0].number, 2);
}

TEST_F(AgentxAnswersTest, AnswersShowATextThatIsSet) {
    Oid const alias{1, 3, 6, 1, 2, 1, 31, 1, 1, 1, 18, 1000};
    AgentxWriter test(AgentxKind::TestSet, 1, 2, 3);
    test.variable(alias, ValueType::Text, std::string_view("to Berlin"));
    EXPECT_EQ(faultOf(test.take()), static_cast<int>(AgentxFault::None));
    EXPECT_EQ(faultOf(AgentxKind::CommitSet), static_cast<int>(AgentxFault::None));
    auto const answered = ask(AgentxKind::Get, {{alias, false, {}}});
    ASSERT_EQ(answered.size(), 1U);
    EXPECT_EQ(answered[0].text, "to Berlin");
}

TEST_F(AgentxAnswersTest, EndOfASetIsNotAnsweredInAnyContext) {
    std::string request = AgentxWriter(AgentxKind::CleanupSet, 1, 2, 3).take();
    EXPECT_EQ(answer(request), "");
    request[2] |= 0x08;
    EXPECT_EQ(answer(request), "");
}

TEST_F(AgentxAnswersTest, OtherContextIsRefused) {
    std::string request = AgentxWriter(AgentxKind::Get, 1, 2, 3).take();
    request[2] |= 0x08;
    EXPECT_EQ(faultOf(request), static_cast<int>(AgentxFault::UnsupportedContext));
}

TEST_F(AgentxAnswersTest, RequestThatEndsTooSoonIsAnError) {
    AgentxWriter writer(AgentxKind::Get, 1, 2, 3);
    writer.name(m_name2);
    EXPECT_THROW(answer(writer.take()), AgentxError);
}

TEST_F(AgentxAnswersTest, DamagedRequestsAreAnsweredOrRefused) {
    AgentxWriter writer(AgentxKind::GetBulk, 1, 2, 3);
    writer.number16(1);
    writer.number16(2);
    for (Oid const& name : {m_name2, m_name5, m_name2, m_name5})
        writer.name(name);
    std::string const good = writer.take();
    std::mt19937 random(1);
    int answered = 0;
    int refused = 0;
    for (int round = 0; round < 5000; ++round) {
        std::string request = good;
        for (int damage = 0; damage < 3; ++damage)
            request[random() % request.size()] = static_cast<char>(random() % 256);
        request.resize(std::max<std::size_t>(AgentxHeader::kSize, random() % (good.size() * 2)));
        try {
            std::string const response = answer(request);
            EXPECT_TRUE(response.empty() ||
                        parseAgentxHeader(response).kind == AgentxKind::Response);
            ++answered;
        } catch (AgentxError const&) {
            ++refused;
        }
    }
    EXPECT_GT(answered, 100);
    EXPECT_GT(refused, 100);
}

} // namespace
} // namespace kvloamd
