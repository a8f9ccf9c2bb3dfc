// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Resources.h"

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

/// Where a bearer channel is: the line and its time slot.
void channelPlace(JsonWriter& json, View const& view, OidView index) {
    Ds0ChannelRow const* const slot = view.timeSlot(index[0]);
    InterfaceRow const* const line = slot == nullptr ? nullptr : view.interface(slot->line);
    json.key("line");
    line == nullptr ? json.null() : json.text(line->name);
    json.key("lineIfIndex");
    slot == nullptr ? json.null() : json.number(std::int64_t{slot->line});
    json.key("timeSlot");
    slot == nullptr ? json.null() : json.number(std::int64_t{slot->timeSlot});
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
               {&dsx1TotalTable(), "dsx1Total", {}, {"dsx1TotalIndex"}, "total"}}}}};
}

Resource channels() {
    return {"channels",
            {{"channels", {"ifIndex"}, {{&isdnBearerTable(), "isdnBearer"}}, channelPlace},
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
