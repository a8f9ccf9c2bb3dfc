// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Notifier.h"

#include <utility>
#include <vector>

#include "agent/Objects.h"

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

std::vector<oid> absolute(Oid const& enterprise, Oid const& place,
                          std::initializer_list<oid> rest = {}) {
    std::vector<oid> name(enterprise.begin(), enterprise.end());
    name.insert(name.end(), place.begin(), place.end());
    name.insert(name.end(), rest);
    return name;
}

void addVariable(netsnmp_variable_list*& variables, std::vector<oid> const& name, u_char type,
                 void const* value, std::size_t size) {
    snmp_varlist_add_variable(&variables, name.data(), name.size(), type, value, size);
}

} // namespace

Notifier::Notifier(StatusQueue& queue, Oid enterprise)
    : m_queue(queue), m_enterprise(std::move(enterprise)) {}

void Notifier::announceStart() {
    send_easy_trap(SNMP_TRAP_COLDSTART, 0);
}

std::optional<Clock::time_point> Notifier::announce(Clock::time_point snapshotBegun) {
    while (auto const oldest = m_queue.oldest()) {
        if (*oldest > snapshotBegun && Clock::now() < *oldest + kPatience)
            return *oldest + kPatience;
        if (auto const change = m_queue.pop()) send(*change);
    }
    return std::nullopt;
}

void Notifier::announceAll() {
    while (auto const change = m_queue.pop())
        send(*change);
}

void Notifier::send(StatusChange const& change) const {
    std::vector<oid> const notification = absolute(m_enterprise, kBoardStatusChangePlace);
    long const index = change.boardIndex;
    long const status = change.status;
    netsnmp_variable_list* variables = nullptr;
    addVariable(variables, {std::begin(kTrapOid), std::end(kTrapOid)}, ASN_OBJECT_ID,
                notification.data(), notification.size() * sizeof(oid));
    addVariable(variables, absolute(m_enterprise, kNotifyObjectsPlace, {1, 0}), ASN_INTEGER, &index,
                sizeof index);
    addVariable(variables, absolute(m_enterprise, kNotifyObjectsPlace, {2, 0}), ASN_OCTET_STR,
                change.serialNumber.data(), change.serialNumber.size());
    addVariable(variables, absolute(m_enterprise, kNotifyObjectsPlace, {3, 0}), ASN_INTEGER,
                &status, sizeof status);
    send_v2trap(variables);
    snmp_free_varbind(variables);
}

} // namespace kvloamd
