// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/metrics/Metrics.h"

#include <algorithm>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "tests/agent/fronts/metrics/SampleBoards.h"

namespace kvloamd {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;
using ::testing::StartsWith;

class MetricsTest : public ::testing::Test {
  protected:
    MetricsTest() {
        m_moment.now = 1'800'000'000'500;
        m_moment.started = 1'700'000'000;
        m_moment.process.cpuSeconds = 1.5;
        m_moment.process.threads = 7;
    }

    std::string text() const {
        return metricsText({*m_snapshot, m_counters, &m_settings}, m_moment, m_options);
    }
    /// The samples whose names are `name`.
    std::vector<std::string> samples(std::string const& name) const {
        std::istringstream all(text());
        std::vector<std::string> found;
        for (std::string line; std::getline(all, line);)
            if (line.starts_with(name + "{") || line.starts_with(name + " ")) found.push_back(line);
        return found;
    }

    std::shared_ptr<Snapshot> m_snapshot = sampleBoards({1, 1, 0});
    Counters m_counters;
    Settings m_settings;
    MetricMoment m_moment;
    MetricOptions m_options;
};

TEST_F(MetricsTest, StateIsOneGaugeForEachState) {
    EXPECT_THAT(samples("kvloam_board_status"),
                ElementsAre("kvloam_board_status{board=\"NX50001\",state=\"none\"} 0",
                            "kvloam_board_status{board=\"NX50001\",state=\"started\"} 1",
                            "kvloam_board_status{board=\"NX50001\",state=\"stopped\"} 0",
                            "kvloam_board_status{board=\"NX50001\",state=\"added\"} 0",
                            "kvloam_board_status{board=\"NX50001\",state=\"removed\"} 0",
                            "kvloam_board_status{board=\"NX50001\",state=\"startPending\"} 0",
                            "kvloam_board_status{board=\"NX50001\",state=\"stopPending\"} 0",
                            "kvloam_board_status{board=\"NX50001\",state=\"failed\"} 0"));
}

TEST_F(MetricsTest, StatusOfALineIsOneGaugeForEachBit) {
    auto const all = samples("kvloam_line_status");
    EXPECT_THAT(all, SizeIs(17));
    std::string const labels = "kvloam_line_status{board=\"NX50001\",line=\"nx5-1-trunk-1\",state=";
    EXPECT_THAT(all, Contains(labels + "\"dsx1LossOfSignal\"} 1"));
    EXPECT_THAT(all, Contains(labels + "\"dsx1UnavailSigState\"} 1"));
    EXPECT_THAT(all, Contains(labels + "\"dsx1NoAlarm\"} 0"));
}

TEST_F(MetricsTest, InformationIsLabelsOfOneMetric) {
    auto const all = samples("kvloam_board_info");
    ASSERT_THAT(all, SizeIs(1));
    EXPECT_THAT(all[0], StartsWith("kvloam_board_info{board=\"NX50001\","));
    EXPECT_THAT(all[0], HasSubstr(",model=\"NX5-T1\","));
    EXPECT_THAT(samples("kvloam_line_info")[0], HasSubstr(",type=\"dsx1ESF\""));
}

TEST_F(MetricsTest, TwoTablesOfTheSameRowsHaveOneMetricOfInformation) {
    m_settings.exchange({Setting::InterfaceAlias, kFirstLine}, std::string("to the \"exchange\""));
    auto const all = samples("kvloam_interface_info");
    ASSERT_THAT(all, SizeIs(1));
    EXPECT_THAT(all[0], HasSubstr(",description=\"the interface nx5-1-trunk-1\""));
    EXPECT_THAT(all[0], HasSubstr(",alias=\"to the \\\"exchange\\\"\""));
}

TEST_F(MetricsTest, TotalsOfLinesAreCounters) {
    EXPECT_THAT(samples("kvloam_line_errored_seconds_total"),
                ElementsAre("kvloam_line_errored_seconds_total{board=\"NX50001\",line="
                            "\"nx5-1-trunk-1\"} 10"));
    EXPECT_THAT(samples("kvloam_line_degraded_seconds_total")[0], HasSubstr(" 120"));
}

TEST_F(MetricsTest, TotalThatIsNotKnownHasNoSample) {
    m_snapshot->interfaces.lines.edit(0).totals[kDegradedMinutes] = kUnknownTotal;
    EXPECT_THAT(samples("kvloam_line_degraded_seconds_total"), IsEmpty());
    EXPECT_THAT(text(), Not(HasSubstr("kvloam_line_degraded")));
}

TEST_F(MetricsTest, UnitsAreBaseUnits) {
    EXPECT_THAT(samples("kvloam_interface_speed_bytes_per_second")[0], HasSubstr(" 193000"));
    EXPECT_THAT(samples("kvloam_line_length_meters")[0], HasSubstr(" 300"));
    m_snapshot->refreshTime = std::chrono::milliseconds(1250);
    EXPECT_THAT(samples("kvloam_refresh_time_seconds"),
                ElementsAre("kvloam_refresh_time_seconds 1.25"));
    m_snapshot->interfaces.interfaces.edit(0).counters[kInOctets] = 0xffffffffffffffffU;
    EXPECT_THAT(samples("kvloam_interface_in_bytes_total")[0], HasSubstr(" 18446744073709551615"));
}

TEST_F(MetricsTest, TimesAreSecondsSinceTheEpoch) {
    EXPECT_THAT(samples("kvloam_line_status_last_change_timestamp_seconds")[0],
                HasSubstr(" 1700000012"));
    // 2026-11-22 13:15:30 at one hour ahead of UTC.
    EXPECT_THAT(samples("kvloam_board_change_timestamp_seconds")[0], HasSubstr(" 1795349730"));
    EXPECT_THAT(samples("kvloam_clock_timestamp_seconds"),
                ElementsAre("kvloam_clock_timestamp_seconds 1800000000.5"));
    m_snapshot->interfaces.lines.edit(0).statusLastChange = 0;
    EXPECT_THAT(samples("kvloam_line_status_last_change_timestamp_seconds"), IsEmpty());
}

TEST_F(MetricsTest, BoardThatIsNotThereHasNothing) {
    m_snapshot->boards.clear();
    std::string const all = text();
    EXPECT_THAT(all, Not(HasSubstr("board=")));
    EXPECT_THAT(all, Not(HasSubstr("line=")));
    EXPECT_THAT(all, HasSubstr("kvloam_boards 0\n"));
}

TEST_F(MetricsTest, NoTwoSamplesAreTheSame) {
    m_snapshot = sampleBoards({3, 2, 2});
    m_options.channels = true;
    m_snapshot->boards.editAll(
        [](BoardRow& board) { board.serialNumber = board.boardIndex == 3 ? "" : "SAME"; });
    m_snapshot->interfaces.interfaces.editAll([](InterfaceRow& row) { row.name = "same"; });
    m_snapshot->modules = {{1, "twice", "", "", ""}, {2, "twice", "", "", ""}};
    std::istringstream all(text());
    std::set<std::string> seen;
    for (std::string line; std::getline(all, line);) {
        std::string const series = line.substr(0, line.rfind(' '));
        EXPECT_TRUE(line.starts_with("#") || seen.insert(series).second) << line;
    }
    EXPECT_THAT(text(), HasSubstr("{board=\"SAME#2\","));
    EXPECT_THAT(text(), HasSubstr("{board=\"#3\","));
}

TEST_F(MetricsTest, ChannelsHaveSeriesOnlyIfAskedFor) {
    m_snapshot = sampleBoards({1, 1, 3});
    EXPECT_THAT(samples("kvloam_channel_oper_status"), IsEmpty());
    EXPECT_THAT(samples("kvloam_interface_speed_bytes_per_second"), SizeIs(3));
    m_options.channels = true;
    EXPECT_THAT(samples("kvloam_channel_oper_status"), SizeIs(3 * 4));
    EXPECT_THAT(samples("kvloam_interface_speed_bytes_per_second"), SizeIs(6));
}

TEST_F(MetricsTest, ChannelsOfALineAreCountedByState) {
    m_snapshot = sampleBoards({1, 2, 3});
    auto const all = samples("kvloam_line_channels");
    std::string const labels = "kvloam_line_channels{board=\"NX50001\",line=\"nx5-1-trunk-2\",";
    EXPECT_THAT(all, SizeIs(8));
    EXPECT_THAT(all, Contains(labels + "state=\"idle\"} 2"));
    EXPECT_THAT(all, Contains(labels + "state=\"active\"} 1"));
}

TEST_F(MetricsTest, TextsThatAreNoTextsAreMadeHarmless) {
    m_snapshot->boards.edit(0).model = "a\\b\nc\x01\xff";
    EXPECT_THAT(samples("kvloam_board_info")[0], HasSubstr("model=\"a\\\\b\\nc??\""));
}

TEST_F(MetricsTest, ShortAlarmsShowInCountersOfTheirKind) {
    auto alarms = std::make_shared<AlarmRows>();
    AlarmTotalRow total;
    total.kind = "boardFailed";
    total.raised = 5;
    total.cleared = 5;
    total.lasted = std::chrono::milliseconds(2500);
    alarms->totals = {total};
    m_snapshot->alarms = alarms;
    EXPECT_THAT(
        samples("kvloam_alarm_transitions_total"),
        ElementsAre("kvloam_alarm_transitions_total{kind=\"boardFailed\",to=\"raised\"} 5",
                    "kvloam_alarm_transitions_total{kind=\"boardFailed\",to=\"cleared\"} 5"));
    EXPECT_THAT(samples("kvloam_alarm_active_seconds_total"),
                ElementsAre("kvloam_alarm_active_seconds_total{kind=\"boardFailed\"} 2.5"));
    EXPECT_THAT(samples("kvloam_alarms_of_kind"),
                ElementsAre("kvloam_alarms_of_kind{kind=\"boardFailed\"} 0"));
}

TEST_F(MetricsTest, ActiveAlarmIsASeries) {
    auto alarms = std::make_shared<AlarmRows>();
    AlarmRow alarm;
    alarm.kind = "dsx1LossOfSignal";
    alarm.severity = 3;
    alarm.resource = "NX50001 nx5-1-trunk-1";
    alarm.boardIndex = 1;
    AlarmRow ofGoneBoard = alarm;
    ofGoneBoard.boardIndex = 9;
    alarms->alarms = {alarm, ofGoneBoard, alarm};
    m_snapshot->alarms = alarms;
    std::string const labels = "kind=\"dsx1LossOfSignal\",severity=\"critical\",resource="
                               "\"NX50001 nx5-1-trunk-1\"";
    EXPECT_THAT(samples("kvloam_alarm_active"),
                ElementsAre("kvloam_alarm_active{board=\"NX50001\"," + labels + "} 1",
                            "kvloam_alarm_active{" + labels + "} 1",
                            "kvloam_alarm_active{board=\"NX50001\"," + labels + ",copy=\"3\"} 1"));
}

TEST_F(MetricsTest, AgentTellsAboutItself) {
    m_counters.requests = 42;
    EXPECT_THAT(samples("kvloam_requests_total"), ElementsAre("kvloam_requests_total 42"));
    EXPECT_THAT(samples("kvloam_agent_info"), SizeIs(1));
    EXPECT_THAT(samples("process_threads"), ElementsAre("process_threads 7"));
    EXPECT_THAT(samples("process_cpu_seconds_total"), ElementsAre("process_cpu_seconds_total 1.5"));
    EXPECT_THAT(samples("process_open_fds"), IsEmpty());
}

TEST_F(MetricsTest, FormatsDifferInTheNamesOfFamiliesOnly) {
    EXPECT_THAT(text(), HasSubstr("# TYPE kvloam_requests_total counter\n"));
    EXPECT_THAT(text(), HasSubstr("# TYPE kvloam_board_info gauge\n"));
    auto const samplesOf = [](std::string const& all) {
        std::istringstream lines(all);
        std::vector<std::string> found;
        for (std::string line; std::getline(lines, line);)
            if (!line.starts_with("#") && !line.starts_with("kvloam_agent_up_time") &&
                !line.starts_with("kvloam_snapshot_age"))
                found.push_back(line);
        return found;
    };
    auto const plain = samplesOf(text());
    m_options.format = MetricFormat::OpenMetrics;
    std::string const open = text();
    EXPECT_THAT(open, HasSubstr("# TYPE kvloam_requests counter\n"));
    EXPECT_THAT(open, HasSubstr("# TYPE kvloam_board info\n"));
    EXPECT_THAT(open, HasSubstr("# UNIT kvloam_line_errored_seconds seconds\n"));
    EXPECT_TRUE(open.ends_with("\n# EOF\n"));
    EXPECT_EQ(samplesOf(open), plain);
}

TEST_F(MetricsTest, FormatFollowsTheRequest) {
    EXPECT_EQ(metricFormat("*/*"), MetricFormat::Plain);
    EXPECT_EQ(metricFormat(""), MetricFormat::Plain);
    EXPECT_EQ(metricFormat("text/plain;version=0.0.4;q=0.2,*/*;q=0.1"), MetricFormat::Plain);
    EXPECT_EQ(metricFormat("application/openmetrics-text;version=1.0.0,text/plain;q=0.5"),
              MetricFormat::OpenMetrics);
}

TEST_F(MetricsTest, SnapshotIsWrittenOnceInEachForm) {
    MetricsCache cache;
    Facts const facts{*m_snapshot, m_counters};
    auto const first = cache.text(facts, {});
    EXPECT_EQ(cache.text(facts, {}), first);
    EXPECT_NE(cache.text(facts, {MetricFormat::OpenMetrics, false}), first);
    EXPECT_EQ(cache.text(facts, {}), first);
    ++m_snapshot->number;
    EXPECT_NE(cache.text(facts, {}), first);
    EXPECT_THAT(*first, HasSubstr("\nprocess_resident_memory_bytes "));
    EXPECT_THAT(*first, HasSubstr("\nprocess_open_fds "));
}

TEST(MetricFamiliesTest, WordsAreSeparated) {
    EXPECT_EQ(snakeCase("InUcastPkts"), "in_unicast_packets");
    EXPECT_EQ(snakeCase("SQETestErrors"), "sqe_test_errors");
    EXPECT_EQ(snakeCase("FCSErrors"), "fcs_errors");
    EXPECT_EQ(snakeCase("Status"), "status");
}

/// Every family, with the ending of its samples.
std::vector<MetricFamily> allFamilies() {
    std::vector<MetricFamily> all;
    for (MetricGroup const& group : metricGroups()) {
        all.insert(all.end(), group.families.begin(), group.families.end());
        if (!group.infoLabels.empty()) all.push_back(group.info);
    }
    for (auto const& more : {lineTotalFamilies(), otherFamilies()})
        all.insert(all.end(), more.begin(), more.end());
    return all;
}

TEST(MetricFamiliesTest, NamesAreUniqueAndWellFormed) {
    std::set<std::string> names;
    std::regex const form("(kvloam|process)(_[a-z0-9]+)+");
    for (MetricFamily const& family : allFamilies()) {
        EXPECT_TRUE(names.insert(family.name).second) << family.name;
        EXPECT_TRUE(std::regex_match(family.name, form)) << family.name;
        EXPECT_TRUE(family.unit.empty() || family.name.ends_with("_" + family.unit)) << family.name;
        EXPECT_FALSE(family.help.empty()) << family.name;
        EXPECT_FALSE(family.help.ends_with(".")) << family.name;
    }
}

TEST(MetricFamiliesTest, LabelsOfInformationAreUnique) {
    for (MetricGroup const& group : metricGroups()) {
        std::set<std::string> names{"board", "line", "channel", "copy"};
        for (MetricGroup::InfoLabel const& label : group.infoLabels)
            EXPECT_TRUE(names.insert(label.name).second) << label.source;
    }
}

TEST(MetricFamiliesTest, EveryDescribedObjectIsShownOrHasAReasonNotToBe) {
    std::multiset<std::string> treated;
    for (MetricGroup const& group : metricGroups()) {
        for (MetricFamily const& family : group.families)
            treated.insert(family.source);
        for (MetricGroup::InfoLabel const& label : group.infoLabels)
            treated.insert(label.source);
    }
    for (UnshownObject const& object : unshownObjects()) {
        EXPECT_FALSE(object.reason.empty()) << object.name;
        treated.insert(object.name);
    }
    std::size_t described = 0;
    auto const expectOnce = [&](char const* name) {
        ++described;
        EXPECT_EQ(treated.count(name), 1U) << name;
    };
    for (auto const& all : {tables(), standardTables()})
        for (Table const* const table : all)
            for (std::size_t column = 0; column < table->columnCount(); ++column)
                expectOnce(table->column(column).name);
    for (Scalar const& scalar : scalars())
        expectOnce(scalar.name);
    for (Scalar const& scalar : standardScalars())
        expectOnce(scalar.name);
    EXPECT_EQ(treated.size(), described);
}

} // namespace
} // namespace kvloamd
