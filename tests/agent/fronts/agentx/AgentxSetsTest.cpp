// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxSets.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

constexpr std::uint32_t kMissing = 99;
constexpr std::uint32_t kText = 98;

/// Names are the number of a row: 98 takes texts, 99 does not exist, 100 is read-only.
SetFault testRow(OidView name, Value const& asked, std::optional<Change>& change) {
    auto const* const integer = std::get_if<std::int64_t>(&asked);
    if (name.front() == 100) return SetFault::NotWritable;
    if (auto const text = octetsOf(asked); text && name.front() == kText) {
        change = {{Setting::EntityAlias, kText}, std::string(*text)};
        return SetFault::None;
    }
    if (integer == nullptr) return SetFault::WrongType;
    if (*integer < 1 || *integer > 9) return SetFault::WrongValue;
    if (name.front() == kMissing) return SetFault::NoCreation;
    change = {{Setting::LinkUpDownTraps, name.front()}, static_cast<int>(*integer)};
    return SetFault::None;
}

struct Asked {
    std::uint32_t row;
    std::int64_t value;
};

class AgentxSetsTest : public ::testing::Test {
  protected:
    /// The fault of a response, and the variable that it is of: {17, 2}.
    using Fault = std::pair<int, int>;
    static constexpr Fault kGood{0, 0};

    Fault send(std::string const& request) {
        AgentxHeader const header = parseAgentxHeader(request);
        AgentxReader const reader(std::string_view(request).substr(AgentxHeader::kSize), true);
        std::string const response = m_sets.answer(header, reader, testRow);
        if (response.empty()) return {-1, -1};
        AgentxReader read(std::string_view(response).substr(AgentxHeader::kSize), true);
        read.number();
        int const fault = read.number16();
        return {fault, read.number16()};
    }
    Fault test(std::vector<Asked> const& asked) {
        AgentxWriter writer(AgentxKind::TestSet, m_session, m_transaction, 1);
        for (Asked const& variable : asked)
            writer.variable(Oid{variable.row}, ValueType::Integer, variable.value);
        return send(writer.take());
    }
    Fault step(AgentxKind kind) {
        return send(AgentxWriter(kind, m_session, m_transaction, 1).take());
    }
    std::optional<int> valueOf(std::uint32_t row) const {
        return m_settings.find({Setting::LinkUpDownTraps, row});
    }

    Settings m_settings;
    AgentxSets m_sets{m_settings};
    std::uint32_t m_session = 1;
    std::uint32_t m_transaction = 1;
};

TEST_F(AgentxSetsTest, NothingIsSetBeforeTheCommit) {
    EXPECT_EQ(test({{1, 5}}), kGood);
    EXPECT_EQ(valueOf(1), std::nullopt);
    EXPECT_EQ(step(AgentxKind::CommitSet), kGood);
    EXPECT_EQ(valueOf(1), 5);
    EXPECT_EQ(step(AgentxKind::CleanupSet), Fault(-1, -1));
    EXPECT_EQ(valueOf(1), 5);
}

TEST_F(AgentxSetsTest, FaultsNameTheVariable) {
    EXPECT_EQ(test({{1, 5}, {100, 5}}), Fault(17, 2));
    EXPECT_EQ(test({{1, 10}}), Fault(10, 1));
    EXPECT_EQ(test({{1, 5}, {2, 5}, {kMissing, 5}}), Fault(11, 3));
}

TEST_F(AgentxSetsTest, ValueOfEveryOtherTypeIsOfTheWrongType) {
    Oid const row{1};
    Oid const place{1, 3};
    auto const fault = [&](ValueType type, Value const& value) {
        AgentxWriter writer(AgentxKind::TestSet, 1, 1, 1);
        writer.variable(Oid{2}, type, value);
        writer.variable(row, ValueType::Integer, std::int64_t{5});
        return send(writer.take());
    };
    Fault const wrongType(7, 1);
    EXPECT_EQ(fault(ValueType::Text, std::string_view("hello")), wrongType);
    EXPECT_EQ(fault(ValueType::Octets, std::string_view()), wrongType);
    EXPECT_EQ(fault(ValueType::Counter, std::int64_t{5}), wrongType);
    EXPECT_EQ(fault(ValueType::Counter64, std::int64_t{5}), wrongType);
    EXPECT_EQ(fault(ValueType::Gauge, std::int64_t{5}), wrongType);
    EXPECT_EQ(fault(ValueType::TimeTicks, std::int64_t{5}), wrongType);
    EXPECT_EQ(fault(ValueType::ObjectId, NameView{place}), wrongType);
}

TEST_F(AgentxSetsTest, TextIsSetAndUndone) {
    SettingKey const key{Setting::EntityAlias, kText};
    m_settings.exchange(key, "before");
    AgentxWriter writer(AgentxKind::TestSet, 1, 1, 1);
    writer.variable(Oid{kText}, ValueType::Text, std::string_view("after"));
    writer.variable(Oid{1}, ValueType::Integer, std::int64_t{5});
    EXPECT_EQ(send(writer.take()), kGood);
    EXPECT_EQ(m_settings.findText(key), "before");
    step(AgentxKind::CommitSet);
    EXPECT_EQ(m_settings.findText(key), "after");
    EXPECT_EQ(valueOf(1), 5);
    step(AgentxKind::UndoSet);
    EXPECT_EQ(m_settings.findText(key), "before");
    EXPECT_EQ(valueOf(1), std::nullopt);
}

TEST_F(AgentxSetsTest, NegativeIntegersAreRead) {
    EXPECT_EQ(test({{1, -1}}), Fault(10, 1));
}

TEST_F(AgentxSetsTest, FailedTestSetsNothing) {
    EXPECT_EQ(test({{1, 5}, {100, 5}}), Fault(17, 2));
    EXPECT_EQ(step(AgentxKind::CommitSet), Fault(14, 1));
    EXPECT_EQ(valueOf(1), std::nullopt);
}

TEST_F(AgentxSetsTest, UndoRestoresWhatWasSetBefore) {
    m_settings.exchange({Setting::LinkUpDownTraps, 1}, 3);
    test({{1, 5}, {2, 6}, {1, 7}});
    step(AgentxKind::CommitSet);
    EXPECT_EQ(valueOf(1), 7);
    EXPECT_EQ(step(AgentxKind::UndoSet), kGood);
    EXPECT_EQ(valueOf(1), 3);
    EXPECT_EQ(valueOf(2), std::nullopt);
}

TEST_F(AgentxSetsTest, UndoOfWhatIsNotCommittedChangesNothing) {
    test({{1, 5}});
    EXPECT_EQ(step(AgentxKind::UndoSet), kGood);
    EXPECT_EQ(step(AgentxKind::CommitSet), Fault(14, 1));
    EXPECT_EQ(valueOf(1), std::nullopt);
}

TEST_F(AgentxSetsTest, VariablesOfOneSetMayComeInSeveralPackets) {
    EXPECT_EQ(test({{1, 5}}), kGood);
    EXPECT_EQ(test({{2, 6}}), kGood);
    EXPECT_EQ(step(AgentxKind::CommitSet), kGood);
    EXPECT_EQ(step(AgentxKind::CommitSet), kGood);
    EXPECT_EQ(valueOf(1), 5);
    EXPECT_EQ(valueOf(2), 6);
    EXPECT_EQ(step(AgentxKind::UndoSet), kGood);
    EXPECT_EQ(step(AgentxKind::UndoSet), kGood);
    EXPECT_EQ(valueOf(1), std::nullopt);
    EXPECT_EQ(valueOf(2), std::nullopt);
}

TEST_F(AgentxSetsTest, TransactionsAreApart) {
    test({{1, 5}});
    m_transaction = 2;
    test({{2, 6}});
    step(AgentxKind::CommitSet);
    EXPECT_EQ(valueOf(1), std::nullopt);
    EXPECT_EQ(valueOf(2), 6);
    m_transaction = 1;
    EXPECT_EQ(step(AgentxKind::CommitSet), kGood);
    EXPECT_EQ(valueOf(1), 5);
}

TEST_F(AgentxSetsTest, NewSessionKnowsNothingOfTheOldOne) {
    test({{1, 5}});
    m_session = 2;
    EXPECT_EQ(step(AgentxKind::CommitSet), Fault(14, 1));
    m_session = 1;
    EXPECT_EQ(step(AgentxKind::CommitSet), Fault(14, 1));
    EXPECT_EQ(valueOf(1), std::nullopt);
}

TEST_F(AgentxSetsTest, MasterThatNeverCleansUpCanStillSet) {
    for (m_transaction = 1; m_transaction <= 1000; ++m_transaction) {
        ASSERT_EQ(test({{m_transaction + 1000, 5}}), kGood);
        ASSERT_EQ(step(AgentxKind::CommitSet), kGood);
        ASSERT_EQ(valueOf(m_transaction + 1000), 5);
    }
}

TEST_F(AgentxSetsTest, EndlessSetIsRefused) {
    constexpr int resourceUnavailable = 13;
    std::vector<Asked> const many(1000, Asked{1, 5});
    int packets = 0;
    while (packets < 100 && test(many) == kGood)
        ++packets;
    EXPECT_EQ(packets, 4);
    EXPECT_EQ(test(many), Fault(resourceUnavailable, 0));
    EXPECT_EQ(step(AgentxKind::CommitSet), kGood);
}

TEST_F(AgentxSetsTest, UnknownTypeIsAnError) {
    AgentxWriter writer(AgentxKind::TestSet, 1, 1, 1);
    writer.number16(77);
    writer.number16(0);
    writer.name(Oid{1});
    EXPECT_THROW(send(writer.take()), AgentxError);
}

} // namespace
} // namespace kvloamd
