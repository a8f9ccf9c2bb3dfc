// SPDX-License-Identifier: BSD-2-Clause
// DS1-MIB's tables: the lines, their running intervals, their closed ones and the sums of these.
#include <algorithm>

#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"
#include "board/DS1IntervalTable.h"

namespace kvloamd {

namespace {

Value index(LineRow const& row) {
    return std::int64_t{row.ifIndex};
}

Value validIntervals(LineRow const& row) {
    return row.keepsHistory() ? static_cast<std::int64_t>(row.closedIntervals()) : Value{};
}

Value invalidIntervals(LineRow const& row) {
    if (!row.keepsHistory()) return {};
    return static_cast<std::int64_t>(std::ranges::count(row.closed->valid, false));
}

Value countValue(std::int32_t count) {
    return count < 0 ? Value{} : Value{std::int64_t{count}};
}

template <std::size_t Counter>
Value current(LineRow const& row) {
    return row.keepsHistory() ? countValue(row.running[Counter]) : Value{};
}

template <std::size_t Counter>
Value total(LineRow const& row) {
    return row.keepsHistory() ? countValue(row.closed->total[Counter]) : Value{};
}

using enum ValueType;
using Row = LineRow;

constexpr Writable kTraps{Setting::LineStatusChangeTraps, kEnabled, kDisabled};

constexpr Writable kCircuit{Setting::CircuitIdentifier, 0, 255, Characters::Ascii};

constexpr Column<Row> kConfigColumns[] = {
    {"dsx1LineIndex", 1, Integer, index},
    {"dsx1TimeElapsed", 3, Integer, number<&Row::timeElapsed>},
    {"dsx1ValidIntervals", 4, Integer, validIntervals},
    {"dsx1LineType", 5, Integer, number<&Row::lineType>},
    {"dsx1LineCoding", 6, Integer, number<&Row::lineCoding>},
    {"dsx1SendCode", 7, Integer, number<&Row::sendCode>},
    {"dsx1CircuitIdentifier", 8, Text, text<&Row::circuitIdentifier>, kCircuit},
    {"dsx1LoopbackConfig", 9, Integer, number<&Row::loopbackConfig>},
    {"dsx1LineStatus", 10, Integer, number<&Row::lineStatus>},
    {"dsx1SignalMode", 11, Integer, number<&Row::signalMode>},
    {"dsx1TransmitClockSource", 12, Integer, number<&Row::transmitClockSource>},
    {"dsx1Fdl", 13, Integer, number<&Row::fdl>},
    {"dsx1InvalidIntervals", 14, Integer, invalidIntervals},
    {"dsx1LineLength", 15, Integer, number<&Row::lineLength>},
    {"dsx1LineStatusLastChange", 16, TimeStamp, number<&Row::statusLastChange>},
    {"dsx1LineStatusChangeTrapEnable", 17, Integer, number<&Row::statusChangeTrapEnable>, kTraps},
    {"dsx1LoopbackStatus", 18, Integer, number<&Row::loopbackStatus>},
    {"dsx1Ds1ChannelNumber", 19, Integer, number<&Row::ds1ChannelNumber>},
    {"dsx1Channelization", 20, Integer, number<&Row::channelization>},
    {"dsx1LineMode", 21, Integer, number<&Row::lineMode>},
    {"dsx1LineBuildOut", 22, Integer, number<&Row::lineBuildOut>},
    {"dsx1LineImpedance", 23, Integer, number<&Row::lineImpedance>},
};

constexpr Column<Row> kCurrentColumns[] = {
    {"dsx1CurrentIndex", 1, Integer,
     [](Row const& row) { return row.keepsHistory() ? index(row) : Value{}; }},
    {"dsx1CurrentESs", 2, Gauge, current<0>},
    {"dsx1CurrentSESs", 3, Gauge, current<1>},
    {"dsx1CurrentSEFSs", 4, Gauge, current<2>},
    {"dsx1CurrentUASs", 5, Gauge, current<3>},
    {"dsx1CurrentCSSs", 6, Gauge, current<4>},
    {"dsx1CurrentPCVs", 7, Gauge, current<5>},
    {"dsx1CurrentLESs", 8, Gauge, current<6>},
    {"dsx1CurrentBESs", 9, Gauge, current<7>},
    {"dsx1CurrentDMs", 10, Gauge, current<8>},
    {"dsx1CurrentLCVs", 11, Gauge, current<9>},
};

constexpr Column<Row> kTotalColumns[] = {
    {"dsx1TotalIndex", 1, Integer,
     [](Row const& row) { return row.keepsHistory() ? index(row) : Value{}; }},
    {"dsx1TotalESs", 2, Gauge, total<0>},
    {"dsx1TotalSESs", 3, Gauge, total<1>},
    {"dsx1TotalSEFSs", 4, Gauge, total<2>},
    {"dsx1TotalUASs", 5, Gauge, total<3>},
    {"dsx1TotalCSSs", 6, Gauge, total<4>},
    {"dsx1TotalPCVs", 7, Gauge, total<5>},
    {"dsx1TotalLESs", 8, Gauge, total<6>},
    {"dsx1TotalBESs", 9, Gauge, total<7>},
    {"dsx1TotalDMs", 10, Gauge, total<8>},
    {"dsx1TotalLCVs", 11, Gauge, total<9>},
};

/// The columns of the closed intervals: the row's index, ten counters, whether they are valid.
constexpr ColumnHead kIntervalColumns[] = {
    {"dsx1IntervalIndex", 1, Integer},      {"dsx1IntervalNumber", 2, Integer},
    {"dsx1IntervalESs", 3, Gauge},          {"dsx1IntervalSESs", 4, Gauge},
    {"dsx1IntervalSEFSs", 5, Gauge},        {"dsx1IntervalUASs", 6, Gauge},
    {"dsx1IntervalCSSs", 7, Gauge},         {"dsx1IntervalPCVs", 8, Gauge},
    {"dsx1IntervalLESs", 9, Gauge},         {"dsx1IntervalBESs", 10, Gauge},
    {"dsx1IntervalDMs", 11, Gauge},         {"dsx1IntervalLCVs", 12, Gauge},
    {"dsx1IntervalValidData", 13, Integer},
};

constexpr std::size_t kFirstCounter = 2;
constexpr std::size_t kValidData = 12;

/// A row is a closed interval of a line, and is nowhere but in the line's array: its number among
/// the rows is the count of all closed intervals of the lines before, and of those before it.
class IntervalTable final : public Table {
  public:
    char const* name() const override { return "dsx1IntervalTable"; }
    Oid const& entry() const override { return m_entry; }
    std::size_t columnCount() const override { return std::size(kIntervalColumns); }
    ColumnHead column(std::size_t column) const override { return kIntervalColumns[column]; }

    std::size_t rowCount(Facts const& facts) const override {
        auto const& all = facts.snapshot.interfaces.lines;
        return all.empty() ? 0 : all.back().intervalsBefore + all.back().closedIntervals();
    }

    void appendIndex(Facts const& facts, std::size_t row, Oid& name) const override {
        Place const place = find(facts, row);
        name.push_back(place.line.ifIndex);
        name.push_back(static_cast<std::uint32_t>(place.interval));
    }

    std::size_t firstRow(Facts const& facts, OidView index, bool orEqual) const override {
        auto const& all = facts.snapshot.interfaces.lines;
        if (index.empty()) return 0;
        auto const line = std::ranges::lower_bound(all, index[0], {}, &LineRow::ifIndex);
        if (line == all.end()) return rowCount(facts);
        if (line->ifIndex != index[0] || index.size() < 2) return line->intervalsBefore;
        // Intervals are numbered from 1; a longer index follows the index that it begins with.
        std::size_t passed = index[1];
        if (passed > 0 && orEqual && index.size() == 2) --passed;
        return line->intervalsBefore + std::min(passed, line->closedIntervals());
    }

    Value value(Facts const& facts, std::size_t column, std::size_t row) const override {
        Place const place = find(facts, row);
        if (column == 0) return std::int64_t{place.line.ifIndex};
        if (column == 1) return static_cast<std::int64_t>(place.interval);
        bool const isValid = place.line.isValid(place.interval);
        if (column == kValidData) return std::int64_t{isValid ? kTrue : kFalse};
        // An interval that missed data has no counts, rather than too low ones.
        if (!isValid) return {};
        return countValue(place.line.closed->counts[place.interval - 1][column - kFirstCounter]);
    }

  private:
    struct Place {
        LineRow const& line;
        std::size_t interval;
    };

    static Place find(Facts const& facts, std::size_t row) {
        auto const& all = facts.snapshot.interfaces.lines;
        // The last line whose rows begin at `row` or before: lines without rows are passed over.
        auto const behind = std::ranges::upper_bound(all, row, {}, &LineRow::intervalsBefore);
        LineRow const& line = *std::prev(behind);
        return {line, row - line.intervalsBefore + 1};
    }

    Oid m_entry{10, 18, 8, 1};
};

} // namespace

Table const& dsx1ConfigTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::lines>> const table(
        "dsx1ConfigTable", {10, 18, 6, 1}, kConfigColumns);
    return table;
}

Table const& dsx1CurrentTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::lines>> const table(
        "dsx1CurrentTable", {10, 18, 7, 1}, kCurrentColumns);
    return table;
}

Table const& dsx1IntervalTable() {
    static IntervalTable const table;
    return table;
}

Table const& dsx1TotalTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::lines>> const table(
        "dsx1TotalTable", {10, 18, 9, 1}, kTotalColumns);
    return table;
}

} // namespace kvloamd
