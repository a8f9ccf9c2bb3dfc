// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Lists.h"

#include <algorithm>
#include <string_view>

#include "cli/Cells.h"

namespace kvloam {

namespace {

/// A field's name, as an argument of a template.
template <std::size_t Size>
struct Key {
    // NOLINTNEXTLINE(google-explicit-constructor): a text is a key
    constexpr Key(char const (&name)[Size]) { std::copy_n(name, Size, text); }
    char text[Size];
};

template <Key Name>
Cell known(Json const& row, Date) {
    Json const& value = field(row, Name.text);
    return {value.is_string() ? shortName(valueText(value)) : valueText(value)};
}

/// The same with the whole name, as the documents have it.
template <Key Name>
Cell wholeName(Json const& row, Date) {
    return {valueText(field(row, Name.text))};
}

/// The time since a date.
template <Key Name>
Cell age(Json const& row, Date now) {
    auto const date = dateIn(row, Name.text);
    return {date ? spanText(now - *date) : "-"};
}

template <Key Name>
Cell local(Json const& row, Date) {
    auto const date = dateIn(row, Name.text);
    return {date ? localDate(*date) : "-"};
}

/// A counter among a line's counts.
template <Key Group, Key Name>
Cell count(Json const& row, Date) {
    Json const& counts = field(row, Group.text);
    auto const number = numberIn(counts, Name.text);
    return {valueText(field(counts, Name.text)),
            number.value_or(0) > 0 ? Paint::Warning : Paint::Plain};
}

/// What a number of a call or an interface counts in.
template <Key Name>
Cell octets(Json const& row, Date) {
    auto const number = numberIn(row, Name.text);
    if (!number) return {"-"};
    constexpr char const* kUnits[] = {"", " k", " M", " G", " T", " P", " E"};
    auto rest = static_cast<double>(*number);
    std::size_t unit = 0;
    for (; rest >= 10000 && unit + 1 < std::size(kUnits); ++unit)
        rest /= 1000;
    char text[32];
    std::snprintf(text, sizeof text, "%.0f%s", rest, kUnits[unit]);
    return {text};
}

template <auto Function>
Cell by(Json const& row, Date) {
    return Function(row);
}

Cell channelState(Json const& row, Date) {
    std::string const status = textIn(row, "operStatus");
    return {valueText(field(row, "operStatus")),
            status == "idle" || status.empty() ? Paint::Plain : Paint::Good};
}

Cell linkState(Json const& row, Date) {
    std::string const status = textIn(row, "operStatus");
    return {valueText(field(row, "operStatus")),
            status == "l2Active" ? Paint::Good : Paint::Warning};
}

constexpr auto kRight = Align::Right;

TableColumn column(char const* title, int priority, Align align = Align::Left,
                   std::size_t least = 0) {
    return {title, priority, align, least};
}

// Priorities: what a row is about is 0, its state 1; what is told elsewhere, too, comes last.

std::vector<ListColumn> const kBoards = {
    {column("BOARD", 0), known<"serialNumber">},
    {column("INDEX", 5, kRight), known<"boardIndex">},
    {column("STATE", 1), by<boardState>},
    {column("MODEL", 2), known<"model">},
    {column("NAME", 6), known<"name">},
    {column("SHELF", 5, kRight), known<"shelfId">},
    {column("SLOT", 4, kRight), known<"pciSlotNumber">},
    {column("FIRMWARE", 7), known<"firmwareVersion">},
    {column("CHANGED", 8), local<"changeDate">},
    {column("AGE", 3, kRight), age<"changeDate">},
    {column("ERROR", 2, Align::Left, 10), known<"errorMessage">},
};

std::vector<ListColumn> const kLines = {
    {column("LINE", 0), known<"name">},
    {column("IFINDEX", 5, kRight), known<"ifIndex">},
    {column("BOARD", 2), known<"board">},
    {column("STATUS", 1, Align::Left, 12), by<lineStatus>},
    {column("TYPE", 4), known<"lineType">},
    {column("CODING", 8), known<"lineCoding">},
    {column("ES", 3, kRight), count<"current", "es">},
    {column("SES", 3, kRight), count<"current", "ses">},
    {column("UAS", 3, kRight), count<"current", "uas">},
    {column("ES 24H", 6, kRight), count<"total", "es">},
    {column("SES 24H", 6, kRight), count<"total", "ses">},
    {column("UAS 24H", 6, kRight), count<"total", "uas">},
    {column("CIRCUIT", 7, Align::Left, 8), known<"circuitIdentifier">},
};

std::vector<ListColumn> const kChannels = {
    {column("CHANNEL", 0), known<"name">},
    {column("IFINDEX", 7, kRight), known<"ifIndex">},
    {column("BOARD", 3), known<"board">},
    {column("LINE", 2), known<"line">},
    {column("SLOT", 4, kRight), known<"timeSlot">},
    {column("STATE", 1), channelState},
    {column("CALL", 5), known<"callOrigin">},
    {column("PEER", 2, Align::Left, 8), known<"peerAddress">},
    {column("CONTENTS", 6), known<"infoType">},
    {column("CHARGED", 8, kRight), known<"chargedUnits">},
};

std::vector<ListColumn> const kSignalling = {
    {column("CHANNEL", 0), known<"name">},
    {column("IFINDEX", 7, kRight), known<"ifIndex">},
    {column("BOARD", 3), known<"board">},
    {column("PROTOCOL", 2), known<"protocol">},
    {column("BEARERS", 4, kRight), known<"bchannelCount">},
    {column("CALLS IN", 1, kRight), known<"inCalls">},
    {column("CONNECTED", 5, kRight), known<"inConnected">},
    {column("CALLS OUT", 1, kRight), known<"outCalls">},
    {column("CONNECTED", 5, kRight), known<"outConnected">},
};

std::vector<ListColumn> const kDataLinks = {
    {column("DATA LINK", 0), known<"name">},
    {column("IFINDEX", 7, kRight), known<"ifIndex">},
    {column("BOARD", 3), known<"board">},
    {column("STATE", 1), linkState},
    {column("SABME", 4, kRight), known<"peerSabme">},
    {column("FRMR", 4, kRight), known<"recvdFrmr">},
};

std::vector<ListColumn> const kDevices = {
    {column("DEVICE", 0), known<"name">},
    {column("BOARD", 1), known<"board">},
    {column("HANDLE", 3, kRight), known<"auid">},
    {column("TYPE", 2), known<"type">},
    {column("CHANNELS", 4, kRight), known<"channelCount">},
    {column("PROTOCOLS", 5), known<"protocolTypes">},
};

std::vector<ListColumn> const kSubDevices = {
    {column("SUB-DEVICE", 0), known<"name">},
    {column("BOARD", 1), known<"board">},
    {column("DEVICE", 4, kRight), known<"deviceAuid">},
    {column("HANDLE", 3, kRight), known<"auid">},
    {column("TYPE", 2), known<"type">},
};

std::vector<ListColumn> const kResources = {
    {column("RESOURCE", 0), known<"name">},
    {column("BOARD", 1), known<"board">},
    {column("KIND", 2), known<"kind">},
    {column("NUMBER", 4, kRight), known<"number">},
    {column("LINE", 3, kRight), known<"lineNumber">},
    {column("BEARERS", 5, kRight), known<"bearerCount">},
    {column("SIGNALLING", 3), known<"signallingStatus">},
    {column("SLOTS", 5, kRight), known<"timeSlotCount">},
};

std::vector<ListColumn> const kProcessors = {
    {column("PROCESSOR", 0), known<"name">},
    {column("BOARD", 1), known<"board">},
    {column("NUMBER", 3, kRight), known<"number">},
    {column("BOOT KERNEL", 4), known<"bootKernelVersion">},
    {column("KERNEL", 2), known<"realTimeKernelVersion">},
};

std::vector<ListColumn> const kInterfaces = {
    {column("INTERFACE", 0), known<"name">},
    {column("IFINDEX", 4, kRight), known<"ifIndex">},
    {column("BOARD", 2), known<"board">},
    {column("TYPE", 2), known<"type">},
    {column("STATE", 1), by<operStatus>},
    {column("ADMIN", 6), known<"adminStatus">},
    {column("BIT/S", 5, kRight), octets<"speed">},
    {column("IN", 3, kRight), octets<"hcInOctets">},
    {column("OUT", 3, kRight), octets<"hcOutOctets">},
    {column("IN ERRORS", 4, kRight), known<"inErrors">},
    {column("OUT ERRORS", 4, kRight), known<"outErrors">},
    {column("ALIAS", 7, Align::Left, 8), known<"alias">},
    {column("DESCRIPTION", 8, Align::Left, 12), known<"descr">},
};

std::vector<ListColumn> const kAlarms = {
    {column("SEVERITY", 1), by<severity>},
    {column("KIND", 0), wholeName<"kind">},
    {column("RESOURCE", 2, Align::Left, 12), known<"resource">},
    {column("RAISED", 6), local<"date">},
    {column("AGE", 3, kRight), age<"date">},
    {column("TIMES", 5, kRight), known<"times">},
    {column("STATE", 7), known<"state">},
    {column("TEXT", 4, Align::Left, 16), known<"text">},
};

std::vector<ListColumn> const kFaults = {
    {column("BOARD", 0), known<"board">},    {column("FAULT", 1, kRight), known<"value">},
    {column("KIND", 1), known<"kind">},      {column("RAISED", 3), local<"date">},
    {column("AGE", 2, kRight), age<"date">}, {column("TIMES", 4, kRight), known<"timesRaised">},
};

std::vector<ListColumn> const kProcesses = {
    {column("PID", 0, kRight), known<"id">},
    {column("NAME", 1), known<"name">},
    {column("OPENS", 3, kRight), known<"opens">},
    {column("CLOSES", 3, kRight), known<"closes">},
    {column("QUEUE", 4, kRight), known<"eventQueueSize">},
    {column("WAITING", 2, kRight), known<"currentEvents">},
    {column("MOST", 5, kRight), known<"maxEvents">},
    {column("EVENTS", 2, kRight), known<"totalEvents">},
};

std::vector<ListColumn> const kModules = {
    {column("MODULE", 0), known<"name">},
    {column("VERSION", 1), known<"version">},
    {column("DATE", 3), local<"date">},
    {column("PURPOSE", 2, Align::Left, 12), known<"purpose">},
};

std::vector<ListColumn> const kServices = {
    {column("SERVICE", 0), known<"name">},          {column("UNIT", 2), known<"scmName">},
    {column("STATUS", 1, kRight), known<"status">}, {column("CHANGED", 4), local<"changeDate">},
    {column("AGE", 3, kRight), age<"changeDate">},
};

} // namespace

std::vector<List> const& lists() {
    static std::vector<List> const all = {
        {"boards", "All boards", {{"Boards", "boards", "no boards", kBoards}}},
        {"lines", "All DS1 lines", {{"Lines", "lines", "no lines", kLines}}},
        {"channels",
         "All ISDN channels and their data links",
         {{"Channels", "channels", "no channels", kChannels},
          {"Signalling channels", "signallingChannels", "no signalling channels", kSignalling},
          {"Data links", "dataLinks", "no data links", kDataLinks}}},
        {"devices",
         "All devices and processors of the boards",
         {{"Devices", "devices", "no devices", kDevices},
          {"Sub-devices", "subDevices", "no sub-devices", kSubDevices},
          {"Resource devices", "resourceDevices", "no resource devices", kResources},
          {"Processors", "processors", "no processors", kProcessors}}},
        {"interfaces",
         "All interfaces",
         {{"Interfaces", "interfaces", "no interfaces", kInterfaces}}},
        {"alarms",
         "The active alarms, the most severe first",
         {{"Alarms", "alarms", "no alarms", kAlarms}}},
        {"faults", "The faults that are raised", {{"Faults", "faults", "no faults", kFaults}}},
        {"processes",
         "The processes that use the platform's runtime library",
         {{"Processes", "processes", "no processes", kProcesses}}},
        {"modules", "The board modules", {{"Modules", "modules", "no modules", kModules}}},
        {"services", "The services", {{"Services", "services", "no services", kServices}}},
    };
    return all;
}

List const& listNamed(std::string_view command) {
    return *std::ranges::find(lists(), command, &List::command);
}

void printList(View const& view, List const& list, Json const& answer) {
    bool isFirst = true;
    for (Section const& section : list.sections) {
        if (!isFirst) view.out << '\n';
        isFirst = false;
        if (list.sections.size() > 1)
            view.out << view.screen.painted(section.heading, Paint::Heading) << '\n';
        Json const& rows = rowsIn(answer, section.key);
        printRows(view, section,
                  std::string_view(section.key) == "alarms" ? sortedAlarms(rows) : rows);
    }
}

void printRows(View const& view, Section const& section, Json const& rows) {
    if (rows.empty()) {
        view.out << section.none << '\n';
        return;
    }
    std::vector<TableColumn> heads;
    for (ListColumn const& one : section.columns)
        heads.push_back(one.head);
    Table table(std::move(heads));
    for (Json const& row : rows) {
        std::vector<Cell> cells;
        cells.reserve(section.columns.size());
        for (ListColumn const& one : section.columns)
            cells.push_back(one.cell(row, view.now));
        table.add(std::move(cells));
    }
    table.print(view.out, view.screen);
}

Json sortedAlarms(Json const& rows) {
    Json sorted = rows;
    std::stable_sort(sorted.begin(), sorted.end(), [](Json const& a, Json const& b) {
        int const graveA = gravity(textIn(a, "severity"));
        int const graveB = gravity(textIn(b, "severity"));
        if (graveA != graveB) return graveA > graveB;
        // Dates of one form compare as texts.
        return textIn(a, "date") > textIn(b, "date");
    });
    return sorted;
}

} // namespace kvloam
