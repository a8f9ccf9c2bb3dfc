// SPDX-License-Identifier: BSD-2-Clause
// DS1-MIB's tables: the lines, their running intervals, their closed ones and the sums of these.
#include <algorithm>
#include <atomic>

#include "agent/objects/LineStatusBits.h"
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

constexpr NamedNumber kDsx1LineType[] = {
    {1, "other"},          {2, "dsx1ESF"},     {3, "dsx1D4"},         {4, "dsx1E1"},
    {5, "dsx1E1CRC"},      {6, "dsx1E1MF"},    {7, "dsx1E1CRCMF"},    {8, "dsx1Unframed"},
    {9, "dsx1E1Unframed"}, {10, "dsx1DS2M12"}, {11, "dsx1E2"},        {12, "dsx1E1Q50"},
    {13, "dsx1E1Q50CRC"},  {14, "dsx1J1ESF"},  {16, "dsx1J1Unframed"}};

constexpr NamedNumber kDsx1LineCoding[] = {{1, "dsx1JBZS"},  {2, "dsx1B8ZS"}, {3, "dsx1HDB3"},
                                           {4, "dsx1ZBTSI"}, {5, "dsx1AMI"},  {6, "other"},
                                           {7, "dsx1B6ZS"}};

constexpr NamedNumber kDsx1SendCode[] = {
    {1, "dsx1SendNoCode"},       {2, "dsx1SendLineCode"},
    {3, "dsx1SendPayloadCode"},  {4, "dsx1SendResetCode"},
    {5, "dsx1SendQRS"},          {6, "dsx1Send511Pattern"},
    {7, "dsx1Send3in24Pattern"}, {8, "dsx1SendOtherTestPattern"}};

constexpr NamedNumber kDsx1LoopbackConfig[] = {{1, "dsx1NoLoop"},     {2, "dsx1PayloadLoop"},
                                               {3, "dsx1LineLoop"},   {4, "dsx1OtherLoop"},
                                               {5, "dsx1InwardLoop"}, {6, "dsx1DualLoop"}};

constexpr NamedNumber kDsx1SignalMode[] = {
    {1, "none"}, {2, "robbedBit"}, {3, "bitOriented"}, {4, "messageOriented"}, {5, "other"}};

constexpr NamedNumber kDsx1TransmitClockSource[] = {
    {1, "loopTiming"}, {2, "localTiming"}, {3, "throughTiming"}, {4, "adaptive"}};

constexpr NamedNumber kEnabling[] = {{1, "enabled"}, {2, "disabled"}};

constexpr NamedNumber kDsx1Channelization[] = {
    {1, "disabled"}, {2, "enabledDs0"}, {3, "enabledDs1"}};

constexpr NamedNumber kDsx1LineMode[] = {{1, "csu"}, {2, "dsu"}};

constexpr NamedNumber kDsx1LineBuildOut[] = {
    {1, "notApplicable"}, {2, "neg75dB"}, {3, "neg15dB"}, {4, "neg225dB"}, {5, "zerodB"}};

constexpr NamedNumber kDsx1LineImpedance[] = {
    {1, "notApplicable"}, {2, "unbalanced75ohms"}, {3, "balanced100ohms"}, {4, "balanced120ohms"}};

/// Their sums are no enumerations in the MIB module, which describes the bits in words.
constexpr NamedNumber kDsx1LoopbackStatus[] = {{1, "dsx1NoLoopback"},
                                               {2, "dsx1NearEndPayloadLoopback"},
                                               {4, "dsx1NearEndLineLoopback"},
                                               {8, "dsx1NearEndOtherLoopback"},
                                               {16, "dsx1NearEndInwardLoopback"},
                                               {32, "dsx1FarEndPayloadLoopback"},
                                               {64, "dsx1FarEndLineLoopback"}};

constexpr NamedNumber kDsx1Fdl[] = {
    {1, "other"}, {2, "dsx1AnsiT1403"}, {4, "dsx1Att54016"}, {8, "dsx1FdlNone"}};

constexpr NamedNumber kTruthValues[] = {{1, "true"}, {2, "false"}};

constexpr Column<Row> kConfigColumns[] = {
    {"dsx1LineIndex", 1, Integer, index, about("The interface that is the line")},
    {"dsx1TimeElapsed", 3, Integer, number<&Row::timeElapsed>,
     about("The seconds since the running interval began").in("seconds").as(Kind::Gauge)},
    {"dsx1ValidIntervals", 4, Integer, validIntervals,
     about("How many closed intervals there are").in("intervals").as(Kind::Gauge)},
    {"dsx1LineType", 5, Integer, number<&Row::lineType>,
     about("The kind of the line and its framing").oneOf(kDsx1LineType).as(Kind::Information)},
    {"dsx1LineCoding", 6, Integer, number<&Row::lineCoding>,
     about("How the line represents zeroes").oneOf(kDsx1LineCoding).as(Kind::Information)},
    {"dsx1SendCode", 7, Integer, number<&Row::sendCode>,
     about("The test code that the line sends").oneOf(kDsx1SendCode).as(Kind::Information)},
    {"dsx1CircuitIdentifier", 8, Text, text<&Row::circuitIdentifier>,
     about("The name that the carrier has given to the circuit").settable(kCircuit).identifies()},
    {"dsx1LoopbackConfig", 9, Integer, number<&Row::loopbackConfig>,
     about("The loopback that is switched on").oneOf(kDsx1LoopbackConfig).as(Kind::Information)},
    {"dsx1LineStatus", 10, Integer, number<&Row::lineStatus>,
     about("The failures, loopbacks and test codes of the line, as a sum of bits")
         .sumOf(kLineStatusBits)
         .as(Kind::State)},
    {"dsx1SignalMode", 11, Integer, number<&Row::signalMode>,
     about("How channels are signalled").oneOf(kDsx1SignalMode).as(Kind::Information)},
    {"dsx1TransmitClockSource", 12, Integer, number<&Row::transmitClockSource>,
     about("Where the transmit clock comes from")
         .oneOf(kDsx1TransmitClockSource)
         .as(Kind::Information)},
    {"dsx1Fdl", 13, Integer, number<&Row::fdl>,
     about("The uses of the facility data link, as a sum of bits").sumOf(kDsx1Fdl)},
    {"dsx1InvalidIntervals", 14, Integer, invalidIntervals,
     about("How many closed intervals have no valid data").in("intervals").as(Kind::Gauge)},
    {"dsx1LineLength", 15, Integer, number<&Row::lineLength>,
     about("The length of the line").in("meters")},
    {"dsx1LineStatusLastChange", 16, TimeStamp, number<&Row::statusLastChange>,
     about("The value of sysUpTime when dsx1LineStatus last changed")},
    {"dsx1LineStatusChangeTrapEnable", 17, Integer, number<&Row::statusChangeTrapEnable>,
     about("Whether dsx1LineStatusChange is sent for the line")
         .oneOf(kEnabling)
         .settable(kTraps)
         .as(Kind::Information)},
    {"dsx1LoopbackStatus", 18, Integer, number<&Row::loopbackStatus>,
     about("The loopbacks at both ends, as a sum of bits")
         .sumOf(kDsx1LoopbackStatus)
         .as(Kind::State)},
    {"dsx1Ds1ChannelNumber", 19, Integer, number<&Row::ds1ChannelNumber>,
     about("Which channel of a DS3 the line is")},
    {"dsx1Channelization", 20, Integer, number<&Row::channelization>,
     about("Whether the line is divided into channels")
         .oneOf(kDsx1Channelization)
         .as(Kind::Information)},
    {"dsx1LineMode", 21, Integer, number<&Row::lineMode>,
     about("Whether the line serves a channel or a data unit")
         .oneOf(kDsx1LineMode)
         .as(Kind::Information)},
    {"dsx1LineBuildOut", 22, Integer, number<&Row::lineBuildOut>,
     about("The attenuation of the sent signal").oneOf(kDsx1LineBuildOut)},
    {"dsx1LineImpedance", 23, Integer, number<&Row::lineImpedance>,
     about("The impedance of the line").oneOf(kDsx1LineImpedance).as(Kind::Information)},
};

constexpr Column<Row> kCurrentColumns[] = {
    {"dsx1CurrentIndex", 1, Integer,
     [](Row const& row) { return row.keepsHistory() ? index(row) : Value{}; },
     about("The line, as in dsx1LineIndex")},
    {"dsx1CurrentESs", 2, Gauge, current<0>,
     about("Seconds with errors in the running interval").in("seconds")},
    {"dsx1CurrentSESs", 3, Gauge, current<1>,
     about("Seconds with many errors in the running interval").in("seconds")},
    {"dsx1CurrentSEFSs", 4, Gauge, current<2>,
     about("Seconds with severe framing faults in the running interval").in("seconds")},
    {"dsx1CurrentUASs", 5, Gauge, current<3>,
     about("Seconds in which the line was unavailable in the running interval").in("seconds")},
    {"dsx1CurrentCSSs", 6, Gauge, current<4>,
     about("Seconds with controlled slips in the running interval").in("seconds")},
    {"dsx1CurrentPCVs", 7, Gauge, current<5>,
     about("Path coding violations in the running interval").in("violations")},
    {"dsx1CurrentLESs", 8, Gauge, current<6>,
     about("Seconds with line code violations in the running interval").in("seconds")},
    {"dsx1CurrentBESs", 9, Gauge, current<7>,
     about("Seconds with some errors, between two thresholds in the running interval")
         .in("seconds")},
    {"dsx1CurrentDMs", 10, Gauge, current<8>,
     about("Minutes with a raised error rate in the running interval").in("minutes")},
    {"dsx1CurrentLCVs", 11, Gauge, current<9>,
     about("Line code violations in the running interval").in("violations")},
};

constexpr Column<Row> kTotalColumns[] = {
    {"dsx1TotalIndex", 1, Integer,
     [](Row const& row) { return row.keepsHistory() ? index(row) : Value{}; },
     about("The line, as in dsx1LineIndex")},
    {"dsx1TotalESs", 2, Gauge, total<0>,
     about("Seconds with errors in the closed intervals").in("seconds")},
    {"dsx1TotalSESs", 3, Gauge, total<1>,
     about("Seconds with many errors in the closed intervals").in("seconds")},
    {"dsx1TotalSEFSs", 4, Gauge, total<2>,
     about("Seconds with severe framing faults in the closed intervals").in("seconds")},
    {"dsx1TotalUASs", 5, Gauge, total<3>,
     about("Seconds in which the line was unavailable in the closed intervals").in("seconds")},
    {"dsx1TotalCSSs", 6, Gauge, total<4>,
     about("Seconds with controlled slips in the closed intervals").in("seconds")},
    {"dsx1TotalPCVs", 7, Gauge, total<5>,
     about("Path coding violations in the closed intervals").in("violations")},
    {"dsx1TotalLESs", 8, Gauge, total<6>,
     about("Seconds with line code violations in the closed intervals").in("seconds")},
    {"dsx1TotalBESs", 9, Gauge, total<7>,
     about("Seconds with some errors, between two thresholds in the closed intervals")
         .in("seconds")},
    {"dsx1TotalDMs", 10, Gauge, total<8>,
     about("Minutes with a raised error rate in the closed intervals").in("minutes")},
    {"dsx1TotalLCVs", 11, Gauge, total<9>,
     about("Line code violations in the closed intervals").in("violations")},
};

/// The columns of the closed intervals: the row's index, ten counters, whether they are valid.
constexpr ColumnHead kIntervalColumns[] = {
    {"dsx1IntervalIndex", 1, Integer, about("The line, as in dsx1LineIndex")},
    {"dsx1IntervalNumber", 2, Integer,
     about("The interval: 1 is the latest closed one, 96 the oldest")},
    {"dsx1IntervalESs", 3, Gauge, about("Seconds with errors in the interval").in("seconds")},
    {"dsx1IntervalSESs", 4, Gauge, about("Seconds with many errors in the interval").in("seconds")},
    {"dsx1IntervalSEFSs", 5, Gauge,
     about("Seconds with severe framing faults in the interval").in("seconds")},
    {"dsx1IntervalUASs", 6, Gauge,
     about("Seconds in which the line was unavailable in the interval").in("seconds")},
    {"dsx1IntervalCSSs", 7, Gauge,
     about("Seconds with controlled slips in the interval").in("seconds")},
    {"dsx1IntervalPCVs", 8, Gauge,
     about("Path coding violations in the interval").in("violations")},
    {"dsx1IntervalLESs", 9, Gauge,
     about("Seconds with line code violations in the interval").in("seconds")},
    {"dsx1IntervalBESs", 10, Gauge,
     about("Seconds with some errors, between two thresholds in the interval").in("seconds")},
    {"dsx1IntervalDMs", 11, Gauge,
     about("Minutes with a raised error rate in the interval").in("minutes")},
    {"dsx1IntervalLCVs", 12, Gauge, about("Line code violations in the interval").in("violations")},
    {"dsx1IntervalValidData", 13, Integer,
     about("Whether the interval has been counted in full").oneOf(kTruthValues)},
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
        return facts.snapshot.interfaces.intervalsBefore.back();
    }

    void appendIndex(Facts const& facts, std::size_t row, Oid& name) const override {
        Place const place = find(facts, row);
        name.push_back(place.line.ifIndex);
        name.push_back(static_cast<std::uint32_t>(place.interval));
    }

    std::size_t firstRow(Facts const& facts, OidView index, bool orEqual) const override {
        InterfaceRows const& rows = facts.snapshot.interfaces;
        if (index.empty()) return 0;
        std::size_t const place = firstLine(rows.lines, index[0]);
        if (place == rows.lines.size()) return rowCount(facts);
        LineRow const& line = rows.lines[place];
        std::size_t const before = rows.intervalsBefore[place];
        if (line.ifIndex != index[0] || index.size() < 2) return before;
        // Intervals are numbered from 1; a longer index follows the index that it begins with.
        std::size_t passed = index[1];
        if (passed > 0 && orEqual && index.size() == 2) --passed;
        return before + std::min(passed, line.closedIntervals());
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

    /// The place of the first line of this ifIndex or above.
    std::size_t firstLine(Rows<LineRow> const& lines, std::uint32_t ifIndex) const {
        // A walk mostly stays with a line.
        std::size_t place = m_lastLine.load(std::memory_order_relaxed);
        if (place < lines.size() && lines[place].ifIndex == ifIndex) return place;
        auto const found = std::ranges::lower_bound(lines, ifIndex, {}, &LineRow::ifIndex);
        place = static_cast<std::size_t>(found - lines.begin());
        m_lastLine.store(place, std::memory_order_relaxed);
        return place;
    }
    static Place find(Facts const& facts, std::size_t row) {
        InterfaceRows const& rows = facts.snapshot.interfaces;
        // The last line whose rows begin at `row` or before: lines without rows are passed over.
        auto const behind = std::ranges::upper_bound(rows.intervalsBefore, row);
        auto const line = static_cast<std::size_t>(behind - rows.intervalsBefore.begin()) - 1;
        return {rows.lines[line], row - rows.intervalsBefore[line] + 1};
    }

    Oid m_entry{10, 18, 8, 1};
    mutable std::atomic<std::size_t> m_lastLine{0}; ///< where to look first
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
