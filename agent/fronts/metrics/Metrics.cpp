// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/metrics/Metrics.h"

#include <algorithm>
#include <chrono>
#include <optional>
#include <span>
#include <utility>
#include <vector>

#include "agent/fronts/metrics/MetricRows.h"
#include "agent/objects/OwnObjects.h"

namespace kvloamd {

namespace {

/// Octets of a date as seconds since the epoch; nothing when they are none.
std::optional<std::int64_t> secondsOf(std::string_view date) {
    using namespace std::chrono;
    constexpr std::size_t kShort = 8;
    constexpr std::size_t kLong = 11;
    if (date.size() != kShort && date.size() != kLong) return std::nullopt;
    auto const octet = [&](std::size_t i) { return static_cast<unsigned char>(date[i]); };
    year_month_day const day{year{octet(0) * 256 + octet(1)}, month{octet(2)},
                             std::chrono::day{octet(3)}};
    if (!day.ok()) return std::nullopt;
    seconds time =
        sys_days{day}.time_since_epoch() + hours(octet(4)) + minutes(octet(5)) + seconds(octet(6));
    if (date.size() == kLong) {
        seconds const offset = hours(octet(9)) + minutes(octet(10));
        time += date[8] == '+' ? -offset : offset;
    }
    return time.count();
}

/// The value as the text of a label.
std::string labelText(Details const& details, Value const& value) {
    if (auto const octets = octetsOf(value)) return std::string(*octets);
    auto const* const number = std::get_if<std::int64_t>(&value);
    if (number == nullptr) return {};
    for (NamedNumber const& named : details.names)
        if (named.number == *number) return named.name;
    return std::to_string(*number);
}

std::string stateLabel(char const* name) {
    std::string label;
    MetricText::label(label, "state", name);
    return label;
}

/// Writes the metrics of one scrape.
class Scrape {
  public:
    Scrape(Facts const& facts, MetricMoment const& moment, MetricOptions const& options,
           std::size_t expectedSize)
        : m_facts(facts),
          m_moment(moment),
          m_options(options),
          m_rows(facts.snapshot, options.channels),
          m_text(options.format, expectedSize) {}

    std::string write() {
        for (MetricGroup const& group : metricGroups())
            if (!group.ofChannels || m_options.channels) writeGroup(group);
        writeAlarms();
        writeProcess();
        return m_text.take();
    }

  private:
    using Labels = std::vector<std::string>;

    void writeGroup(MetricGroup const& group) {
        Labels const labels = group.table == nullptr ? Labels{""} : m_rows.labels(group, m_facts);
        if (!group.infoLabels.empty()) writeInfo(group, labels);
        for (MetricFamily const& family : group.families)
            writeFamily(family, labels);
        if (group.labels != MetricLabels::Line) return;
        writeTotals(labels);
        writeChannelsInUse(labels);
    }

    bool hasSeries(MetricGroup const& group, std::string const& labels) const {
        return group.table == nullptr || !labels.empty();
    }

    Value valueOf(Table const* table, std::size_t column, std::size_t row) const {
        return table == nullptr ? scalars()[column].get(m_facts)
                                : table->value(m_facts, column, row);
    }

    void writeInfo(MetricGroup const& group, Labels const& labels) {
        m_text.begin(group.info);
        std::string all;
        for (std::size_t row = 0; row < labels.size(); ++row) {
            if (!hasSeries(group, labels[row])) continue;
            all = labels[row];
            for (MetricGroup::InfoLabel const& label : group.infoLabels) {
                Details const& details = label.table == nullptr
                                             ? scalars()[label.column].details
                                             : label.table->column(label.column).details;
                MetricText::label(all, label.name,
                                  labelText(details, valueOf(label.table, label.column, row)));
            }
            m_text.sample(all, std::int64_t{1});
        }
    }

    void writeFamily(MetricFamily const& family, Labels const& labels) {
        m_text.begin(family);
        std::vector<std::string> states;
        states.reserve(family.states.size());
        for (NamedNumber const& named : family.states)
            states.push_back(stateLabel(named.name));
        for (std::size_t row = 0; row < labels.size(); ++row) {
            if (family.table != nullptr && labels[row].empty()) continue;
            Value const value = valueOf(family.table, family.column, row);
            if (family.shape == MetricShape::Date) {
                auto const octets = octetsOf(value);
                auto const seconds = octets ? secondsOf(*octets) : std::nullopt;
                if (seconds) m_text.sample(labels[row], *seconds);
                continue;
            }
            if (auto const* const number = std::get_if<std::int64_t>(&value))
                writeNumber(family, labels[row], states, *number);
        }
    }

    void writeNumber(MetricFamily const& family, std::string const& labels,
                     std::span<std::string const> states, std::int64_t number) {
        switch (family.shape) {
        case MetricShape::States:
            for (std::size_t state = 0; state < states.size(); ++state)
                m_text.state(labels, states[state], family.states[state].number == number);
            break;
        case MetricShape::Bits:
            for (std::size_t state = 0; state < states.size(); ++state)
                m_text.state(labels, states[state], (family.states[state].number & number) != 0);
            break;
        case MetricShape::Stamp:
            // 0: not since the agent's start.
            if (number > 0) m_text.sample(labels, m_moment.started + number / kHundredths);
            break;
        default:
            m_text.sample(labels, number);
            break;
        }
    }

    void writeTotals(Labels const& labels) {
        auto const& lines = m_facts.snapshot.interfaces.lines;
        for (std::size_t counter = 0; counter < kLineCounters; ++counter) {
            m_text.begin(lineTotalFamilies()[counter]);
            for (std::size_t row = 0; row < lines.size(); ++row)
                if (!labels[row].empty() && lines[row].totals[counter] != kUnknownTotal)
                    m_text.sample(labels[row], lines[row].totals[counter]);
        }
    }

    /// The bearer channels of each line, by state.
    void writeChannelsInUse(Labels const& labels) {
        InterfaceRows const& rows = m_facts.snapshot.interfaces;
        Names const states = otherFamilies()[kLineChannels].states;
        std::vector<std::string> names;
        for (NamedNumber const& named : states)
            names.push_back(stateLabel(named.name));
        m_text.begin(otherFamilies()[kLineChannels]);
        auto slot = rows.ds0Channels.begin();
        std::string all;
        for (std::size_t row = 0; row < rows.lines.size(); ++row) {
            std::uint32_t const line = rows.lines[row].ifIndex;
            while (slot != rows.ds0Channels.end() && slot->line < line)
                ++slot;
            std::vector<std::int64_t> counts(states.size());
            bool hasChannels = false;
            for (; slot != rows.ds0Channels.end() && slot->line == line; ++slot) {
                auto const bearer =
                    std::ranges::lower_bound(rows.bearers, slot->channel, {}, &BearerRow::ifIndex);
                if (bearer == rows.bearers.end() || bearer->ifIndex != slot->channel) continue;
                for (std::size_t state = 0; state < states.size(); ++state)
                    if (states[state].number == bearer->operStatus) ++counts[state];
                hasChannels = true;
            }
            if (!hasChannels || labels[row].empty()) continue;
            for (std::size_t state = 0; state < states.size(); ++state) {
                all = labels[row];
                all.append(",").append(names[state]);
                m_text.sample(all, counts[state]);
            }
        }
    }

    void writeAlarms() {
        auto const& families = otherFamilies();
        AlarmRows const& rows = *m_facts.snapshot.alarms;
        writeActiveAlarms(rows);
        m_text.begin(families[kAlarmsOfKind]);
        for (AlarmTotalRow const& row : rows.totals)
            m_text.sample(kindLabel(row), std::int64_t{row.active});
        m_text.begin(families[kAlarmTransitions]);
        for (AlarmTotalRow const& row : rows.totals) {
            m_text.sample(kindLabel(row) + ",to=\"raised\"", static_cast<std::int64_t>(row.raised));
            m_text.sample(kindLabel(row) + ",to=\"cleared\"",
                          static_cast<std::int64_t>(row.cleared));
        }
        m_text.begin(families[kAlarmSeconds]);
        for (AlarmTotalRow const& row : rows.totals)
            m_text.sample(kindLabel(row), std::int64_t{row.lastedAt(Clock::now()).count()});
    }

    void writeActiveAlarms(AlarmRows const& rows) {
        Labels labels;
        for (AlarmRow const& row : rows.alarms) {
            std::string const* const board = m_rows.boardOf(row.boardIndex);
            std::string& all = labels.emplace_back(board == nullptr ? "" : *board);
            MetricText::label(all, "kind", row.kind);
            MetricText::label(all, "severity", severityOf(row));
            MetricText::label(all, "resource", row.resource);
        }
        MetricRows::distinguish(labels);
        m_text.begin(otherFamilies()[kAlarm]);
        for (std::string const& all : labels)
            m_text.sample(all, std::int64_t{1});
    }

    static std::string kindLabel(AlarmTotalRow const& row) {
        std::string label;
        MetricText::label(label, "kind", row.kind);
        return label;
    }

    static std::string severityOf(AlarmRow const& row) {
        for (std::size_t column = 0; column < alarmTable().columnCount(); ++column)
            if (ColumnHead const head = alarmTable().column(column);
                head.name == std::string_view("kvlAlarmSeverity"))
                return labelText(head.details, std::int64_t{row.severity});
        return {};
    }

    void writeProcess() {
        auto const& families = otherFamilies();
        ProcessUsage const& usage = m_moment.process;
        m_text.begin(families[kClock]);
        m_text.sample("", m_moment.now);
        m_text.begin(families[kStart]);
        m_text.sample("", m_moment.started);
        m_text.begin(families[kCpu]);
        if (usage.cpuSeconds) m_text.sample("", *usage.cpuSeconds);
        std::pair<Other, std::optional<std::int64_t>> const numbers[] = {
            {kResident, usage.residentBytes},
            {kVirtual, usage.virtualBytes},
            {kThreads, usage.threads},
            {kOpenDescriptors, usage.openDescriptors},
            {kMostDescriptors, usage.mostDescriptors}};
        for (auto const& [place, number] : numbers) {
            m_text.begin(families[place]);
            if (number) m_text.sample("", *number);
        }
    }

  public:
    /// The places of `otherFamilies`.
    enum Other : std::size_t {
        kLineChannels,
        kAlarm,
        kAlarmsOfKind,
        kAlarmTransitions,
        kAlarmSeconds,
        kClock,
        kStart,
        kCpu,
        kResident,
        kVirtual,
        kThreads,
        kOpenDescriptors,
        kMostDescriptors
    };

  private:
    static constexpr std::int64_t kHundredths = 100;

    Facts const& m_facts;
    MetricMoment const& m_moment;
    MetricOptions m_options;
    MetricRows m_rows;
    MetricText m_text;
};

/// The states that isdnBearerOperStatus names.
Names bearerStates() {
    for (MetricGroup const& group : metricGroups())
        for (MetricFamily const& family : group.families)
            if (family.source == "isdnBearerOperStatus") return family.states;
    return {};
}

} // namespace

std::vector<MetricFamily> const& otherFamilies() {
    static std::vector<MetricFamily> const all = [] {
        using enum MetricType;
        std::vector<MetricFamily> families{
            {"kvloam_line_channels", Gauge, "", "Bearer channels of the line in this state"},
            {"kvloam_alarm_active", Gauge, "", "An alarm that is active: always 1"},
            {"kvloam_alarms_of_kind", Gauge, "", "Active alarms of this kind"},
            {"kvloam_alarm_transitions", Counter, "",
             "How many alarms of this kind have been raised, and cleared"},
            {"kvloam_alarm_active_seconds", Counter, "seconds",
             "How long alarms of this kind have been active, added up"},
            {"kvloam_clock_timestamp_seconds", Gauge, "seconds",
             "The time of day of the agent's host when the metrics were written"},
            {"process_start_time_seconds", Gauge, "seconds", "When the agent was started"},
            {"process_cpu_seconds", Counter, "seconds", "Processor time that the agent has used"},
            {"process_resident_memory_bytes", Gauge, "bytes", "Memory of the agent in use"},
            {"process_virtual_memory_bytes", Gauge, "bytes", "Address space of the agent"},
            {"process_threads", Gauge, "", "Threads of the agent"},
            {"process_open_fds", Gauge, "", "Descriptors that the agent has open"},
            {"process_max_fds", Gauge, "", "Descriptors that the agent may have open"}};
        families[Scrape::kLineChannels].states = bearerStates();
        families[Scrape::kAlarmSeconds].divisor = 1000;
        families[Scrape::kClock].divisor = 1000;
        return families;
    }();
    return all;
}

std::string metricsText(Facts const& facts, MetricMoment const& moment,
                        MetricOptions const& options, std::size_t expectedSize) {
    return Scrape(facts, moment, options, expectedSize).write();
}

MetricFormat metricFormat(std::string_view accept) {
    return accept.find("application/openmetrics-text") == std::string_view::npos
               ? MetricFormat::Plain
               : MetricFormat::OpenMetrics;
}

MetricsCache::Text MetricsCache::text(Facts const& facts, MetricOptions const& options) {
    using namespace std::chrono;
    if (facts.snapshot.number != m_number) {
        m_number = facts.snapshot.number;
        m_texts.clear();
    }
    Key const key{options.format, options.channels};
    Text& text = m_texts[key];
    if (text) return text;
    MetricMoment moment;
    auto const now = system_clock::now().time_since_epoch();
    moment.now = duration_cast<milliseconds>(now).count();
    // The two clocks are read one after the other: dates must not swing by that.
    auto const started =
        duration_cast<seconds>(now - (Clock::now() - facts.counters.started)).count();
    if (started < m_started - 1 || started > m_started + 1) m_started = started;
    moment.started = m_started;
    moment.process = readProcessUsage();
    std::size_t& size = m_sizes[key];
    text =
        std::make_shared<std::string const>(metricsText(facts, moment, options, size + size / 16));
    size = text->size();
    return text;
}

} // namespace kvloamd
