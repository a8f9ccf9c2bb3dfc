// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/metrics/MetricFamilies.h"

#include <algorithm>
#include <cctype>
#include <initializer_list>
#include <iterator>
#include <map>
#include <string_view>
#include <utility>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

/// A table whose columns become metrics.
struct Shown {
    Table const& (*table)();
    char const* stem;  ///< of the metrics' names
    char const* thing; ///< what a row is
    /// What the columns' names begin with, and the metrics' names do not; the longest first.
    std::initializer_list<std::string_view> prefixes;
    MetricLabels labels;
    bool ofChannels = false;
};

Shown const kShown[] = {
    {boardTable, "board", "board", {"kvlBoard"}, MetricLabels::Board},
    {dsx1ConfigTable, "line", "line", {"dsx1Line", "dsx1"}, MetricLabels::Line},
    {ifTable, "interface", "interface", {"if"}, MetricLabels::Interface},
    {ifXTable, "interface", "interface", {"ifHC", "if"}, MetricLabels::Interface},
    {dot3StatsTable, "ethernet", "Ethernet interface", {"dot3Stats"}, MetricLabels::Interface},
    {dot3PauseTable, "ethernet", "Ethernet interface", {"dot3HC", "dot3"}, MetricLabels::Interface},
    {dot3HCStatsTable, "ethernet", "Ethernet interface", {"dot3HCStats"}, MetricLabels::Interface},
    {isdnSignalingTable,
     "signalling",
     "signalling channel",
     {"isdnSignaling"},
     MetricLabels::Channel},
    {isdnSignalingStatsTable,
     "signalling",
     "signalling channel",
     {"isdnSigStats"},
     MetricLabels::Channel},
    {isdnLapdTable,
     "lapd",
     "data link of a signalling channel",
     {"isdnLapd"},
     MetricLabels::Channel},
    {isdnBearerTable, "channel", "bearer channel", {"isdnBearer"}, MetricLabels::Channel, true},
    {dsx0ConfigTable, "channel", "bearer channel", {"dsx0"}, MetricLabels::Channel, true},
    {faultTable, "fault", "fault", {"kvlFault"}, MetricLabels::Fault},
    {processTable, "process", "process", {"kvlProcess"}, MetricLabels::Process},
    {moduleTable, "module", "module", {"kvlModule"}, MetricLabels::Module},
    {serviceTable, "service", "service", {"kvlService"}, MetricLabels::Service},
};

/// Tables without metrics.
struct Hidden {
    char const* table;
    char const* reason;
};

constexpr char kInventory[] = "inventory, which does not change by itself; see the JSON API";
constexpr char kFromSettled[] = "falls, and begins anew every 15 minutes; see the totals of lines";
constexpr char kStructure[] = "structure, which does not change by itself; see the JSON API";
constexpr char kAlarms[] = "see kvloam_alarm_active";
constexpr char kLimits[] = "limits, which operators set; see the JSON API";
constexpr char kLog[] = "a log of what was sent; see kvloam_notifications_sent_total";
constexpr char kFollows[] = "follows from the states of boards and lines";

constexpr Hidden kHidden[] = {
    {"dsx1CurrentTable", kFromSettled},
    {"dsx1IntervalTable", kFromSettled},
    {"dsx1TotalTable", kFromSettled},
    {"dsx0ChanMappingTable", kStructure},
    {"ifStackTable", kStructure},
    {"ifRcvAddressTable", kStructure},
    {"kvlInterfaceTable", kStructure},
    {"entPhysicalTable", kInventory},
    {"entAliasMappingTable", kInventory},
    {"entPhysicalContainsTable", kInventory},
    {"entStateTable", kFollows},
    {"kvlDeviceTable", kInventory},
    {"kvlSubDeviceTable", kInventory},
    {"kvlProcessorTable", kInventory},
    {"kvlStoreTable", kInventory},
    {"kvlResourceDeviceTable", kInventory},
    {"kvlThresholdTable", kLimits},
    {"kvlAlarmTable", kAlarms},
    {"alarmActiveTable", kAlarms},
    {"alarmActiveVariableTable", kAlarms},
    {"alarmActiveStatsTable", "the same as kvlAlarmCount and kvlAlarmsRaised"},
    {"alarmClearTable", "past; see kvloam_alarm_transitions_total"},
    {"alarmModelTable", kStructure},
    {"nlmConfigLogTable", kLog},
    {"nlmStatsLogTable", kLog},
    {"nlmLogTable", kLog},
    {"nlmLogVariableTable", kLog},
};

/// Objects whose metric has another name than the rule gives, or that have none.
struct Exception {
    char const* object;
    char const* name; ///< null: it has none
    char const* reason = "";
};

constexpr Exception kExceptions[] = {
    {"kvlBoardCount", "boards"},
    {"kvlFaultCount", "faults"},
    {"kvlInterfaceCount", "interfaces"},
    {"kvlLineCount", "lines"},
    {"kvlAlarmCount", "alarms"},
    {"kvlModuleDate", "module_loaded"},
    {"isdnLapdRecvdFrmr", "lapd_received_frmr"},
    {"kvlBoardErrorMessage", nullptr, "a text that changes would begin new series"},
    {"kvlFaultDate", nullptr, "the same as kvlFaultTime"},
    {"dsx1LoopbackStatus", nullptr, "kvloam_line_status has the state dsx1LoopbackState"},
    {"dsx1TimeElapsed", nullptr, "tells about the running interval only"},
    {"kvlProcessName", nullptr, "the label process"},
    {"kvlModuleName", nullptr, "the label module"},
    {"kvlServiceName", nullptr, "the label service"},
    {"ifName", nullptr, "the label interface"},
    {"dot3StatsIndex", nullptr, "kvloam_interface_info has it"},
    {"isdnSignalingIfIndex", nullptr, "kvloam_interface_info has it"},
    {"ifHighSpeed", nullptr, "the same as ifSpeed, less precise"},
    {"kvlHealthNotificationsDropped", nullptr, "the same as kvlNotificationsDropped"},
    {"kvlHealthFaultCount", nullptr, "the same as kvlFaultCount"},
    {"kvlHealthFaultsUnlisted", nullptr, "the same as kvlFaultsUnlisted"},
    {"isdnSignalingStatus", nullptr, "always the same"},
};

/// Enumerations that change only when somebody changes the set-up.
constexpr std::string_view kSetUp[] = {"dsx1LineBuildOut", "dot3StatsRateControlAbility",
                                       "dsx0RobbedBitSignalling", "dsx0TransmitCodesEnable"};

/// What a unit becomes.
struct Unit {
    std::string_view described;
    char const* base;
    std::int64_t factor = 1;
    std::int64_t divisor = 1;
};

constexpr Unit kUnits[] = {
    {"seconds", "seconds"},
    {"milliseconds", "seconds", 1, 1000},
    {"minutes", "seconds", 60},
    {"octets", "bytes"},
    {"bits per second", "bytes_per_second", 1, 8},
    {"meters", "meters"},
};

/// Words of the MIB modules, and what they are called here.
constexpr std::pair<std::string_view, std::string_view> kWords[] = {
    {"pkts", "packets"},
    {"ucast", "unicast"},
    {"descr", "description"},
    {"protos", "protocols"},
};

Exception const* exceptionFor(std::string_view object) {
    auto const* const found = std::ranges::find_if(
        kExceptions, [&](Exception const& each) { return object == each.object; });
    return found == std::end(kExceptions) ? nullptr : found;
}

bool endsWith(std::string const& text, std::string const& ending) {
    return text == ending || text.ends_with("_" + ending);
}

void dropEnding(std::string& name, std::string const& ending) {
    if (name.ends_with("_" + ending)) name.resize(name.size() - ending.size() - 1);
}

/// Everything that is described, and what has been made of it.
class Catalogue {
  public:
    Catalogue() {
        for (auto const& all : {tables(), standardTables()})
            for (Table const* const table : all)
                for (std::size_t column = 0; column < table->columnCount(); ++column)
                    m_heads.emplace(table->column(column).name, table->column(column));
        addScalars();
        for (Shown const& shown : kShown)
            addTable(shown);
        for (auto const& all : {tables(), standardTables()})
            for (Table const* const table : all)
                hide(*table);
        for (Scalar const& scalar : standardScalars()) {
            std::string_view const name = scalar.name;
            unshown.push_back({scalar.name, name.starts_with("nlm") ? kLog
                                            : name.starts_with("alarm")
                                                ? kAlarms
                                                : "the size of a table, or its changes"});
        }
    }

    std::vector<MetricGroup> groups;
    std::vector<UnshownObject> unshown;

  private:
    void addScalars() {
        MetricGroup& group = groups.emplace_back();
        group.stem = "agent";
        std::size_t place = 0;
        for (Scalar const& scalar : scalars())
            add(group, {scalar.name, 0, scalar.type, scalar.details}, nullptr, place++, {"kvl"});
    }

    void addTable(Shown const& shown) {
        Table const& table = shown.table();
        auto known = std::ranges::find(groups, shown.stem, &MetricGroup::stem);
        if (known == groups.end()) {
            groups.emplace_back();
            known = std::prev(groups.end());
            known->stem = shown.stem;
            known->thing = shown.thing;
            known->table = &table;
            known->labels = shown.labels;
            known->ofChannels = shown.ofChannels;
        }
        MetricGroup& group = *known;
        for (std::size_t column = 0; column < table.columnCount(); ++column)
            add(group, table.column(column), &table, column, shown.prefixes);
    }

    void hide(Table const& table) {
        auto const* const hidden = std::ranges::find_if(kHidden, [&](Hidden const& each) {
            return std::string_view(each.table) == table.name();
        });
        if (hidden == std::end(kHidden)) return;
        for (std::size_t column = 0; column < table.columnCount(); ++column)
            unshown.push_back({table.column(column).name, hidden->reason});
    }

    /// The column that counts the same with 32 or with 64 bits.
    ColumnHead const* twin(std::string const& object, bool long_) const {
        for (std::string const stem : {"if", "dot3"}) {
            std::string const from = long_ ? stem : stem + "HC";
            if (!object.starts_with(from)) continue;
            auto const found =
                m_heads.find((long_ ? stem + "HC" : stem) + object.substr(from.size()));
            if (found != m_heads.end()) return &found->second;
        }
        return nullptr;
    }

    void add(MetricGroup& group, ColumnHead head, Table const* table, std::size_t column,
             std::initializer_list<std::string_view> prefixes) {
        Exception const* const exception = exceptionFor(head.name);
        if (exception != nullptr && exception->name == nullptr) {
            unshown.push_back({head.name, exception->reason});
            return;
        }
        if (head.type == ValueType::Counter && twin(head.name, true) != nullptr) {
            unshown.push_back(
                {head.name, std::string("the same as ") + twin(head.name, true)->name});
            return;
        }
        if (head.type == ValueType::Octets || head.type == ValueType::ObjectId) {
            unshown.push_back({head.name, "neither a number nor a text"});
            return;
        }
        // The 64-bit column is described as being the same as the 32-bit one.
        if (head.type == ValueType::Counter64)
            if (ColumnHead const* const described = twin(head.name, false))
                head.details = described->details;
        std::string_view own = head.name;
        for (std::string_view const prefix : prefixes)
            if (own.starts_with(prefix)) {
                own.remove_prefix(prefix.size());
                break;
            }
        bool const isInformation = kindOf(head.type, head.details) == Kind::Information ||
                                   std::ranges::find(kSetUp, head.name) != std::end(kSetUp);
        if (isInformation && *head.details.unit == '\0') {
            group.info = {"kvloam_" + group.stem, MetricType::Info, "",
                          table == nullptr ? "The versions and the set-up of the agent"
                                           : "What is known about each " + group.thing};
            group.infoLabels.push_back({snakeCase(own), head.name, table, column});
            return;
        }
        MetricFamily family;
        family.name = exception != nullptr
                          ? exception->name
                          : (table == nullptr ? "" : group.stem + "_") + snakeCase(own);
        complete(family, head);
        family.name = "kvloam_" + family.name;
        family.source = head.name;
        family.table = table;
        family.column = column;
        group.families.push_back(std::move(family));
    }

    static void complete(MetricFamily& family, ColumnHead const& head) {
        Details const& details = head.details;
        family.help = details.help;
        family.is64 = head.type == ValueType::Counter64;
        switch (kindOf(head.type, details)) {
        case Kind::Counter:
            family.type = MetricType::Counter;
            break;
        case Kind::State:
            family.states = details.bits.empty() ? details.names : details.bits;
            if (!details.bits.empty())
                family.shape = MetricShape::Bits;
            else if (!details.names.empty())
                family.shape = MetricShape::States;
            return;
        case Kind::Time:
            addTime(family, head.type);
            return;
        default:
            break;
        }
        auto const* const unit = std::ranges::find(kUnits, details.unit, &Unit::described);
        if (unit == std::end(kUnits)) return;
        family.unit = unit->base;
        family.factor = unit->factor;
        family.divisor = unit->divisor;
        dropEnding(family.name, "octets");
        // The metric has another unit than the one that the description speaks of.
        if (std::string const told = " in " + std::string(details.unit);
            family.divisor != 1 && family.help.ends_with(told))
            family.help.resize(family.help.size() - told.size());
        if (!endsWith(family.name, family.unit)) family.name += "_" + family.unit;
    }

    static void addTime(MetricFamily& family, ValueType type) {
        family.unit = "seconds";
        if (type == ValueType::TimeTicks) {
            family.divisor = 100;
            family.name += "_seconds";
            return;
        }
        family.shape = type == ValueType::Date ? MetricShape::Date : MetricShape::Stamp;
        dropEnding(family.name, "time");
        dropEnding(family.name, "date");
        family.name += "_timestamp_seconds";
        // Of the description, which speaks of SNMP's clock.
        std::string const wrong = "The value of sysUpTime when ";
        if (family.help.starts_with(wrong)) family.help.replace(0, wrong.size(), "When ");
    }

    std::map<std::string, ColumnHead> m_heads;
};

Catalogue const& catalogue() {
    static Catalogue const all;
    return all;
}

} // namespace

std::string snakeCase(std::string_view name) {
    std::vector<std::string> words;
    auto const isUpper = [](char c) { return std::isupper(static_cast<unsigned char>(c)) != 0; };
    for (std::size_t i = 0; i < name.size(); ++i) {
        bool const begins =
            i == 0 || (isUpper(name[i]) &&
                       (!isUpper(name[i - 1]) || (i + 1 < name.size() && !isUpper(name[i + 1]))));
        if (begins) words.emplace_back();
        words.back() += static_cast<char>(std::tolower(static_cast<unsigned char>(name[i])));
    }
    std::string all;
    for (std::string& word : words) {
        for (auto const& [mib, ours] : kWords)
            if (word == mib) word = ours;
        all += (all.empty() ? "" : "_") + word;
    }
    return all;
}

std::vector<MetricGroup> const& metricGroups() {
    return catalogue().groups;
}

std::vector<UnshownObject> const& unshownObjects() {
    return catalogue().unshown;
}

} // namespace kvloamd
