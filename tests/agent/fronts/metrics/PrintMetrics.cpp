// SPDX-License-Identifier: BSD-2-Clause
// print_metrics plain|openmetrics|catalogue: the metrics of sample boards in one of the formats, or
// the table of all metrics for the documentation.
#include <cstdio>
#include <cstring>
#include <string>

#include "agent/fronts/metrics/Metrics.h"
#include "tests/agent/fronts/metrics/SampleBoards.h"

namespace {

using namespace kvloamd;

char const* labelsOf(MetricLabels labels) {
    switch (labels) {
    case MetricLabels::Board:
        return "`board`";
    case MetricLabels::Line:
        return "`board`, `line`";
    case MetricLabels::Interface:
        return "`board`, `interface`";
    case MetricLabels::Channel:
        return "`board`, `channel`";
    case MetricLabels::Process:
        return "`process`, `pid`";
    case MetricLabels::Module:
        return "`module`";
    case MetricLabels::Service:
        return "`service`";
    case MetricLabels::Fault:
        return "`board`, `fault`";
    case MetricLabels::None:
        break;
    }
    return "";
}

void printRow(MetricFamily const& family, MetricLabels labels, std::string const& source) {
    char const* const ending = family.type == MetricType::Counter ? "_total"
                               : family.type == MetricType::Info  ? "_info"
                                                                  : "";
    char const* const type = family.type == MetricType::Counter ? "counter"
                             : family.type == MetricType::Info  ? "info"
                                                                : "gauge";
    std::string all = labelsOf(labels);
    if (!family.states.empty()) all += all.empty() ? "`state`" : ", `state`";
    std::printf("| `%s%s` | %s | %s | %s | %s |\n", family.name.c_str(), ending, type, all.c_str(),
                family.help.c_str(), source.c_str());
}

std::string labelsOfAlarms(std::string const& name) {
    if (name == "kvloam_alarm_active") return "labels: board, kind, severity, resource";
    if (name == "kvloam_alarm_transitions") return "labels: kind, to";
    return name.starts_with("kvloam_alarm") ? "labels: kind" : "";
}

void printCatalogue() {
    std::printf("| metric | type | labels | meaning | object |\n|---|---|---|---|---|\n");
    for (MetricGroup const& group : metricGroups()) {
        if (!group.infoLabels.empty()) {
            std::string names;
            for (MetricGroup::InfoLabel const& label : group.infoLabels)
                names += (names.empty() ? "labels: " : ", ") + label.name;
            printRow(group.info, group.labels, names);
        }
        for (MetricFamily const& family : group.families)
            printRow(family, group.labels, family.source);
        if (group.labels != MetricLabels::Line) continue;
        for (MetricFamily const& family : lineTotalFamilies())
            printRow(family, group.labels, "");
        printRow(otherFamilies().front(), group.labels, "");
    }
    for (std::size_t i = 1; i < otherFamilies().size(); ++i)
        printRow(otherFamilies()[i], MetricLabels::None, labelsOfAlarms(otherFamilies()[i].name));
}

void printUnshown() {
    std::printf("| object | why it has no metric |\n|---|---|\n");
    for (UnshownObject const& object : unshownObjects())
        std::printf("| %s | %s |\n", object.name.c_str(), object.reason.c_str());
}

} // namespace

int main(int argc, char** argv) {
    std::string const what = argc == 2 ? argv[1] : "";
    if (what == "catalogue") {
        printCatalogue();
        return 0;
    }
    if (what == "unshown") {
        printUnshown();
        return 0;
    }
    auto const snapshot = sampleBoards();
    snapshot->modules = {{1, "z7sim", "boards", "1.0", ""}};
    FaultRow fault;
    fault.boardIndex = 1;
    fault.value = 300;
    fault.times = 2;
    snapshot->faults.rows = {fault};
    ProcessRow process;
    process.pid = 17;
    process.name = "telephony \"one\"";
    snapshot->processes = {process};
    EthernetRow ethernet;
    ethernet.ifIndex = kFirstLine;
    ethernet.counters[kFcsErrors] = 3;
    snapshot->interfaces.ethernets = {ethernet};
    auto alarms = std::make_shared<AlarmRows>();
    alarms->alarms.resize(1);
    alarms->alarms[0].kind = "dsx1LossOfSignal";
    alarms->alarms[0].boardIndex = 1;
    alarms->totals.resize(1);
    alarms->totals[0].kind = "dsx1LossOfSignal";
    snapshot->alarms = alarms;
    Counters const counters;
    MetricMoment moment;
    moment.now = 1'800'000'000'500;
    moment.started = 1'799'999'000;
    moment.process = readProcessUsage();
    MetricOptions options;
    options.channels = true;
    if (what == "openmetrics")
        options.format = MetricFormat::OpenMetrics;
    else if (what != "plain")
        return 2;
    std::fputs(metricsText({*snapshot, counters}, moment, options).c_str(), stdout);
    return 0;
}
