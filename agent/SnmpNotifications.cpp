// SPDX-License-Identifier: BSD-2-Clause
#include "agent/SnmpNotifications.h"

#include <iterator>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

namespace kvloamd {

namespace {

/// snmpTrapOID.0, whose value says which notification it is.
constexpr oid kTrapOid[] = {1, 3, 6, 1, 6, 3, 1, 1, 4, 1, 0};

std::vector<oid> wide(Oid const& name) {
    return {name.begin(), name.end()};
}

void addVariable(netsnmp_variable_list*& variables, std::vector<oid> const& name, u_char type,
                 void const* value, std::size_t size) {
    snmp_varlist_add_variable(&variables, name.data(), name.size(), type, value, size);
}

} // namespace

void SnmpNotifications::sendStart() {
    send_easy_trap(SNMP_TRAP_COLDSTART, 0);
}

void SnmpNotifications::send(Notification const& notification, std::function<void()> taken) {
    std::vector<oid> const which = wide(notification.name);
    netsnmp_variable_list* variables = nullptr;
    addVariable(variables, {std::begin(kTrapOid), std::end(kTrapOid)}, ASN_OBJECT_ID, which.data(),
                which.size() * sizeof(oid));
    for (Instance const& variable : notification.variables) {
        if (auto const* const text = std::get_if<std::string_view>(&variable.value)) {
            addVariable(variables, wide(variable.name), ASN_OCTET_STR, text->data(), text->size());
        } else if (auto const* const number = std::get_if<std::int64_t>(&variable.value)) {
            long const value = static_cast<long>(*number);
            addVariable(variables, wide(variable.name), ASN_INTEGER, &value, sizeof value);
        }
    }
    send_v2trap(variables);
    snmp_free_varbind(variables);
    taken();
}

} // namespace kvloamd
