// SPDX-License-Identifier: BSD-2-Clause
// Metrics and JSON of one snapshot say the same.
#include <algorithm>
#include <map>
#include <set>
#include <sstream>
#include <string>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "agent/fronts/http/HttpAnswers.h"
#include "agent/fronts/metrics/MetricRows.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "tests/agent/fronts/metrics/SampleBoards.h"

namespace kvloamd {
namespace {

using Json = nlohmann::json;

class SameValuesTest : public ::testing::Test {
  protected:
    SameValuesTest() {
        InterfaceRows& rows = m_snapshot->interfaces;
        rows.interfaces.edit(0).counters[kInOctets] = 0xfffffffffffffffeU;
        InterfaceRow& second = rows.interfaces.edit(1);
        second.mtu = 1500;
        second.operStatus.reset();
        EthernetRow ethernet;
        ethernet.ifIndex = kFirstLine;
        ethernet.counters[kFcsErrors] = 3;
        ethernet.duplexStatus = 3;
        rows.ethernets = {ethernet};
        ProcessRow process;
        process.pid = 17;
        process.name = "telephony";
        process.opens = 5;
        m_snapshot->processes = {process};
        std::istringstream text(get("/metrics?channels=1"));
        for (std::string line; std::getline(text, line);)
            if (auto const space = line.rfind(' '); !line.starts_with('#'))
                m_samples.emplace(line.substr(0, space), line.substr(space + 1));
    }

    std::string get(std::string const& target) {
        HttpAnswer const answer =
            m_answers.answer({.method = "GET", .target = target, .isLocal = true});
        EXPECT_EQ(answer.status, 200) << target;
        return *answer.body;
    }

    /// The rows of a table as JSON shows them.
    Json const& rowsOf(Table const& table) {
        Json& rows = m_rows[table.name()];
        if (rows.is_null())
            rows = Json::parse(get(std::string("/api/v1/tables/") + table.name()))["rows"];
        return rows;
    }

    /// Takes the sample of a series away; empty if there is none.
    std::string take(std::string const& series) {
        auto const found = m_samples.find(series);
        if (found == m_samples.end()) return "";
        std::string value = found->second;
        m_samples.erase(found);
        return value;
    }

    /// Whether JSON says that the state holds: by its name, as a truth value, or in a list.
    static bool holds(Json const& value, std::string const& state) {
        if (value.is_array()) return std::ranges::find(value, Json(state)) != value.end();
        if (value.is_boolean()) return value.get<bool>() == (state == "true");
        return value == Json(state);
    }

    void compareStates(MetricFamily const& family, std::string const& labels, Json const& value) {
        for (NamedNumber const& named : family.states) {
            std::string all = labels;
            MetricText::label(all, "state", named.name);
            std::string const expected =
                value.is_null() ? "" : (holds(value, named.name) ? "1" : "0");
            EXPECT_EQ(take(family.name + "{" + all + "}"), expected) << family.source;
            ++m_compared;
        }
    }

    void compareNumber(MetricFamily const& family, std::string const& labels, Json const& value) {
        std::string const name =
            family.name + (family.type == MetricType::Counter ? "_total" : "") + "{" + labels + "}";
        std::string const sample = take(name);
        ++m_compared;
        if (value.is_null())
            EXPECT_EQ(sample, "") << name;
        else if (family.factor == 1 && family.divisor == 1)
            EXPECT_EQ(sample, value.dump()) << name;
        else
            EXPECT_DOUBLE_EQ(std::stod(sample) * static_cast<double>(family.divisor),
                             value.get<double>() * static_cast<double>(family.factor))
                << name;
    }

    std::shared_ptr<Snapshot> m_snapshot = sampleBoards({3, 2, 3});
    Counters m_counters;
    Settings m_settings;
    HttpAnswers m_answers{{{[] {
                                auto all = tables();
                                auto const standard = standardTables();
                                all.insert(all.end(), standard.begin(), standard.end());
                                return all;
                            }(),
                            {scalars(), standardScalars()}},
                           m_counters,
                           m_settings,
                           [this] { return m_snapshot; },
                           [](JournalQuery const&) { return std::optional<JournalPage>(); },
                           [] { return 0U; }}};
    std::map<std::string, std::string> m_samples; ///< by series
    std::map<std::string, Json> m_rows;           ///< by table
    std::size_t m_compared = 0;
};

TEST_F(SameValuesTest, EveryValueOfATableIsTheSameInMetricsAndInJson) {
    Facts const facts{*m_snapshot, m_counters, &m_settings};
    MetricRows const rows(*m_snapshot, true);
    std::set<std::string> families;
    for (MetricGroup const& group : metricGroups()) {
        if (group.table == nullptr) continue;
        auto const labels = rows.labels(group, facts);
        for (MetricFamily const& family : group.families) {
            if (family.shape == MetricShape::Stamp || family.shape == MetricShape::Date) continue;
            families.insert(family.name);
            Json const& shown = rowsOf(*family.table);
            ASSERT_EQ(shown.size(), labels.size()) << family.name;
            for (std::size_t row = 0; row < labels.size(); ++row) {
                Json const& value = shown[row].at(family.source);
                if (family.shape == MetricShape::Number)
                    compareNumber(family, labels[row], value);
                else
                    compareStates(family, labels[row], value);
            }
        }
    }
    EXPECT_GT(m_compared, 1000U);
    // Metrics have no values of these that JSON does not have.
    for (auto const& [series, value] : m_samples) {
        std::string name = series.substr(0, series.find('{'));
        if (name.ends_with("_total")) name.resize(name.size() - std::string("_total").size());
        EXPECT_FALSE(families.contains(name)) << series;
    }
}

} // namespace
} // namespace kvloamd
