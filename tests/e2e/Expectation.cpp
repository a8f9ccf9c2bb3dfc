// SPDX-License-Identifier: BSD-2-Clause
#include "tests/e2e/Expectation.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <fstream>
#include <iterator>
#include <span>

namespace kvloamd::e2e {

namespace {

/// How many names one request has.
constexpr std::size_t kBatch = 30;
constexpr int kRepetitions = 20;

/// The lowest index of an interface of ours.
constexpr std::uint32_t kFirstOwnIndex = 1000;

/// What an agent serves, in ascending order; without ALARM-MIB, whose names contain
/// dates, and NOTIFICATION-LOG-MIB, which only some serve.
std::array<Oid, 10> const kPlaces{{{1, 3, 6, 1, 2, 1, 2},
                                   {1, 3, 6, 1, 2, 1, 10, 7, 2},
                                   {1, 3, 6, 1, 2, 1, 10, 7, 11},
                                   {1, 3, 6, 1, 2, 1, 10, 18},
                                   {1, 3, 6, 1, 2, 1, 10, 20},
                                   {1, 3, 6, 1, 2, 1, 10, 81},
                                   {1, 3, 6, 1, 2, 1, 31, 1},
                                   {1, 3, 6, 1, 2, 1, 47, 1},
                                   {1, 3, 6, 1, 2, 1, 131, 1},
                                   {1, 3, 6, 1, 4, 1, 32473, 1, 1}}};

/// The tables in which a master has rows of its own. The last number of a name is an ifIndex.
std::array<Oid, 3> const kSharedTables{
    {{1, 3, 6, 1, 2, 1, 2, 2}, {1, 3, 6, 1, 2, 1, 10, 7, 2}, {1, 3, 6, 1, 2, 1, 31, 1, 1}}};

/// The objects that only the master serves.
std::array<Oid, 2> const kMasterScalars{
    {{1, 3, 6, 1, 2, 1, 2, 1, 0}, {1, 3, 6, 1, 2, 1, 31, 1, 5, 0}}};

std::string text(Oid const& name) {
    std::string joined;
    for (std::uint32_t const number : name)
        joined += "." + std::to_string(number);
    return joined;
}

std::string contentOf(std::string const& file) {
    std::ifstream stream(file);
    EXPECT_TRUE(stream.is_open()) << file;
    return {std::istreambuf_iterator<char>(stream), {}};
}

/// The type of "TYPE: value"; all of a value that has none.
std::string typeOf(std::string const& value) {
    return value.substr(0, value.find(": "));
}

/// Removes trailing blanks, which the tools print after some values.
std::string trimmed(std::string value) {
    value.erase(value.find_last_not_of(' ') + 1);
    return value;
}

void expectSame(Answer const& answered, Answer const& expected) {
    EXPECT_EQ(answered.name, expected.name) << text(answered.name) << " " << text(expected.name);
    if (expected.value.ends_with(": *"))
        EXPECT_EQ(typeOf(answered.value), typeOf(expected.value)) << text(expected.name);
    else
        EXPECT_EQ(trimmed(answered.value), expected.value) << text(expected.name);
}

/// The name from which to continue after one that another agent serves: that name itself or,
/// outside the shared tables, the next object that we serve.
Oid pastForeign(Oid const& name) {
    auto const next = std::ranges::upper_bound(kPlaces, name);
    bool const around = next != kPlaces.begin() && startsWith(name, *std::prev(next));
    return around || next == kPlaces.end() ? name : *next;
}

bool isBelowAny(Oid const& name, std::span<Oid const> places) {
    return std::ranges::any_of(places, [&](Oid const& place) { return startsWith(name, place); });
}

} // namespace

Expectation::Expectation(std::string const& file, Served served, int agentPid, Ask ask)
    : m_served(served), m_ask(std::move(ask)) {
    std::string lines;
    for (std::string line : linesOf(contentOf(file))) {
        if (line.empty() || line.starts_with('#')) continue;
        std::string const other = served == Served::Alone ? "beside " : "alone ";
        std::string const own = served == Served::Alone ? "alone " : "beside ";
        if (line.starts_with(other)) continue;
        if (line.starts_with(own)) line.erase(0, own.size());
        if (auto const at = line.find("PID"); at != std::string::npos)
            line.replace(at, 3, std::to_string(agentPid));
        lines += line + "\n";
    }
    m_all = parseAnswers(lines);
    EXPECT_GT(m_all.size(), 500U);
    EXPECT_TRUE(std::ranges::is_sorted(m_all, {}, &Answer::name));
}

/// Whether our agent does not serve this name.
bool Expectation::isForeign(Oid const& name) const {
    if (!isBelowAny(name, kPlaces)) return true;
    if (m_served == Served::Alone) return false;
    return isBelowAny(name, kMasterScalars) ||
           (isBelowAny(name, kSharedTables) && name.back() < kFirstOwnIndex);
}

void Expectation::expectGet() const {
    for (std::size_t begin = 0; begin < m_all.size(); begin += kBatch) {
        std::span<Answer const> const batch =
            std::span(m_all).subspan(begin, std::min(kBatch, m_all.size() - begin));
        std::vector<std::string> names;
        for (Answer const& expected : batch)
            names.push_back(text(expected.name));
        auto const answered = m_ask("snmpget", names);
        ASSERT_EQ(answered.size(), batch.size());
        for (std::size_t i = 0; i < batch.size(); ++i)
            expectSame(answered[i], batch[i]);
    }
}

/// The next answer of our agent after each name. Answers of other agents in between are skipped.
std::vector<Answer> Expectation::nextOwn(std::vector<Oid> const& names) const {
    std::vector<Answer> found(names.size());
    std::vector<std::size_t> open;
    std::vector<Oid> from = names;
    for (std::size_t i = 0; i < names.size(); ++i)
        open.push_back(i);
    while (!open.empty()) {
        std::vector<std::string> asked;
        for (std::size_t const i : open)
            asked.push_back(text(from[i]));
        auto const answered = m_ask("snmpgetnext", asked);
        if (answered.size() != open.size()) return {};
        std::vector<std::size_t> left;
        for (std::size_t k = 0; k < open.size(); ++k) {
            std::size_t const i = open[k];
            if (isForeign(answered[k].name) && answered[k].name < m_all.back().name) {
                from[i] = pastForeign(answered[k].name);
                left.push_back(i);
            } else {
                found[i] = answered[k];
            }
        }
        open = std::move(left);
    }
    return found;
}

void Expectation::expectGetNext() const {
    for (std::size_t begin = 0; begin + 1 < m_all.size(); begin += kBatch) {
        std::size_t const size = std::min(kBatch, m_all.size() - 1 - begin);
        std::vector<Oid> names;
        for (std::size_t i = begin; i < begin + size; ++i)
            names.push_back(m_all[i].name);
        auto const answered = nextOwn(names);
        ASSERT_EQ(answered.size(), size);
        for (std::size_t i = 0; i < size; ++i)
            expectSame(answered[i], m_all[begin + i + 1]);
    }
}

void Expectation::expectGetBulk() const {
    std::string const repetitions = "-Cr" + std::to_string(kRepetitions);
    for (std::size_t i = 0; i + 1 < m_all.size(); i += 7) {
        auto const answered = m_ask("snmpbulkget", {repetitions, text(m_all[i].name)});
        EXPECT_EQ(answered.size(), static_cast<std::size_t>(kRepetitions)) << text(m_all[i].name);
        std::size_t next = i + 1;
        for (Answer const& answer : answered) {
            if (isForeign(answer.name)) continue;
            ASSERT_LT(next, m_all.size()) << text(answer.name);
            expectSame(answer, m_all[next++]);
        }
    }
}

void Expectation::expectWalk() const {
    std::vector<Answer> walked;
    for (Oid const& place : kPlaces) {
        for (Answer& answer : m_ask("snmpwalk", {text(place)}))
            if (!isForeign(answer.name)) walked.push_back(std::move(answer));
    }
    ASSERT_EQ(walked.size(), m_all.size());
    for (std::size_t i = 0; i < walked.size(); ++i)
        expectSame(walked[i], m_all[i]);
}

} // namespace kvloamd::e2e
