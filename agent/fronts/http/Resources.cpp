// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Resources.h"

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

void writeName(JsonWriter& json, InterfaceRow const* interface) {
    interface == nullptr ? json.null() : json.text(interface->name);
}

void channelsLine(JsonWriter& json, View const& view, OidView index) {
    Ds0ChannelRow const* const slot = view.timeSlot(index[0]);
    writeName(json, slot == nullptr ? nullptr : view.interface(slot->line));
}

template <auto Field>
void channelsSlot(JsonWriter& json, View const& view, OidView index) {
    Ds0ChannelRow const* const slot = view.timeSlot(index[0]);
    slot == nullptr ? json.null() : json.number(std::int64_t{slot->*Field});
}

void linesChannels(JsonWriter& json, View const& view, OidView index) {
    json.number(std::int64_t{view.channelsOf(index[0]).all});
}

void linesChannelsInUse(JsonWriter& json, View const& view, OidView index) {
    json.number(std::int64_t{view.channelsOf(index[0]).inUse});
}

/// The closed intervals from the newest: errored, severely errored and unavailable seconds of each,
/// or null.
void linesStrip(JsonWriter& json, View const& view, OidView index) {
    LineRow const* const line = view.line(index[0]);
    if (line == nullptr || !line->keepsHistory()) {
        json.null();
        return;
    }
    constexpr std::size_t kShown[] = {0, 1, 3};
    json.beginArray();
    for (std::size_t interval = 1; interval <= line->closedIntervals(); ++interval) {
        if (!line->isValid(interval)) {
            json.null();
            continue;
        }
        json.beginArray();
        for (std::size_t const counter : kShown) {
            std::int32_t const count = line->closed->counts[interval - 1][counter];
            count < 0 ? json.null() : json.number(std::int64_t{count});
        }
        json.endArray();
    }
    json.endArray();
}

void alarmsBoard(JsonWriter& json, View const& view, OidView index) {
    AlarmRow const* const alarm = view.alarm(index[0]);
    BoardRow const* const board = alarm == nullptr ? nullptr : view.board(alarm->boardIndex);
    board == nullptr ? json.null() : json.text(board->serialNumber);
}

void alarmsLine(JsonWriter& json, View const& view, OidView index) {
    AlarmRow const* const alarm = view.alarm(index[0]);
    writeName(json, alarm == nullptr ? nullptr : view.interface(alarm->ifIndex));
}

Resource lines() {
    return {"lines",
            {{"lines",
              {"ifIndex"},
              {{&dsx1ConfigTable(), "dsx1", {}, {"dsx1LineIndex"}},
               {&ifTable(), "if", {"ifAdminStatus", "ifOperStatus"}},
               {&ifXTable(), "if", {"ifAlias"}},
               {&interfaceTable(), "kvlInterface", {"kvlInterfacePhysicalIndex"}},
               {&dsx1CurrentTable(), "dsx1Current", {}, {"dsx1CurrentIndex"}, "current"},
               {&dsx1TotalTable(), "dsx1Total", {}, {"dsx1TotalIndex"}, "total"}},
              {{"channels", linesChannels},
               {"channelsInUse", linesChannelsInUse},
               {"strip", linesStrip, true}}}}};
}

Resource channels() {
    return {"channels",
            {{"channels",
              {"ifIndex"},
              {{&isdnBearerTable(), "isdnBearer"}},
              {{"line", channelsLine},
               {"lineIfIndex", channelsSlot<&Ds0ChannelRow::line>},
               {"timeSlot", channelsSlot<&Ds0ChannelRow::timeSlot>}}},
             {"signallingChannels",
              {"ifIndex"},
              {{&isdnSignalingTable(), "isdnSignaling", {}, {"isdnSignalingIfIndex"}},
               {&isdnSignalingStatsTable(), "isdnSigStats"}}},
             {"dataLinks", {"ifIndex"}, {{&isdnLapdTable(), "isdnLapd"}}}}};
}

Resource devices() {
    return {"devices",
            {{"devices", {"boardIndex", "auid"}, {{&deviceTable(), "kvlDevice"}}},
             {"subDevices",
              {"boardIndex", "deviceAuid", "auid"},
              {{&subDeviceTable(), "kvlSubDevice"}}},
             {"processors", {"boardIndex", "auid"}, {{&processorTable(), "kvlProcessor"}}},
             {"resourceDevices",
              {"boardIndex", "index"},
              {{&resourceDeviceTable(), "kvlResourceDevice"}}}}};
}

Resource interfaces() {
    return {"interfaces",
            {{"interfaces",
              {"ifIndex"},
              {{&ifTable(), "if", {}, {"ifIndex"}},
               {&ifXTable(), "if", {}, {"ifName"}},
               {&interfaceTable(), "kvlInterface", {"kvlInterfacePhysicalIndex"}},
               {&dot3StatsTable(), "dot3Stats", {}, {"dot3StatsIndex"}, "ethernet"},
               {&dot3PauseTable(), "dot3", {}, {}, "ethernet"},
               {&dot3HCStatsTable(), "dot3", {}, {}, "ethernet"}}}}};
}

std::vector<Resource> makeResources() {
    return {
        {"boards", {{"boards", {"boardIndex"}, {{&boardTable(), "kvlBoard"}}}}},
        lines(),
        channels(),
        devices(),
        interfaces(),
        {"entities",
         {{"entities",
           {"physicalIndex"},
           {{&entPhysicalTable(), "entPhysical"},
            {&entStateTable(), "entState", {}, {}, "state"}}}}},
        {"alarms",
         {{"alarms",
           {"number"},
           {{&alarmTable(), "kvlAlarm"}},
           {{"board", alarmsBoard}, {"line", alarmsLine}}}}},
        {"faults", {{"faults", {"boardIndex", "value"}, {{&faultTable(), "kvlFault"}}}}},
        {"processes", {{"processes", {"id"}, {{&processTable(), "kvlProcess"}}}}},
        {"modules", {{"modules", {"index"}, {{&moduleTable(), "kvlModule"}}}}},
        {"services", {{"services", {"index"}, {{&serviceTable(), "kvlService"}}}}},
        {"store", {{"records", {"boardIndex"}, {{&storeTable(), "kvlStore"}}}}},
    };
}

} // namespace

std::vector<Resource> const& resources() {
    static std::vector<Resource> const made = makeResources();
    return made;
}

} // namespace kvloamd
