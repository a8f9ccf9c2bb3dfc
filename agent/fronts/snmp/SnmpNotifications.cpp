// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpNotifications.h"

#include <vector>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

#include "agent/fronts/snmp/SnmpValues.h"

namespace kvloamd {

namespace {

void addVariable(netsnmp_variable_list*& variables, Oid const& name, ValueType type,
                 Value const& value) {
    std::vector<oid> const wide(name.begin(), name.end());
    setVariable(
        snmp_varlist_add_variable(&variables, wide.data(), wide.size(), ASN_NULL, nullptr, 0), type,
        value);
}

} // namespace

void SnmpNotifications::send(Notification const& notification, Delivered delivered) {
    netsnmp_variable_list* variables = nullptr;
    if (notification.sysUpTime)
        addVariable(variables, kSysUpTime, ValueType::TimeTicks,
                    std::int64_t{*notification.sysUpTime});
    addVariable(variables, kSnmpTrapOid, ValueType::ObjectId, NameView{notification.name});
    for (NotifiedObject const& object : notification.objects)
        addVariable(variables, object.name, object.type, object.view());
    bool const reachesAll = m_receivers.allOpen();
    auto const settled = [reachesAll, delivered](bool acknowledged) {
        if (reachesAll) delivered(acknowledged ? Delivery::Acknowledged : Delivery::Unacknowledged);
    };
    auto const fate =
        m_receivers.informs().follow([variables] { send_v2trap(variables); }, settled);
    snmp_free_varbind(variables);
    if (!reachesAll || fate == Informs::Fate::Refused)
        delivered(Delivery::Dropped);
    else
        delivered(fate == Informs::Fate::Pending ? Delivery::Awaited : Delivery::Sent);
}

} // namespace kvloamd
