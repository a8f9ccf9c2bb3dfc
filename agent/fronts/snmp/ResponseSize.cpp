// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/ResponseSize.h"

#include <algorithm>
#include <cstddef>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
// clang-format on

namespace kvloamd {

namespace {

/// The largest message that fits a UDP datagram.
constexpr std::size_t kLargestMessage = 65507;

/// The fields of a message around its variables, at their longest: those of version, PDU and
/// sequences; in SNMPv3 also the header, the authentication and privacy parameters, and padding.
constexpr std::size_t kFields = 48;
constexpr std::size_t kFieldsOfVersion3 = 180;

/// The size of a BER element with `content` octets.
std::size_t element(std::size_t content) {
    if (content < 0x80) return content + 2;
    if (content < 0x100) return content + 3;
    return content < 0x10000 ? content + 4 : content + 5;
}

std::size_t sizeOfName(oid const* name, std::size_t count) {
    std::size_t size = 1; // the first two numbers
    for (std::size_t i = 1; i < count; ++i)
        for (oid number = i == 1 ? name[0] * 40 + name[1] : name[i];; number >>= 7U) {
            if (i > 1 || number >= 0x80) ++size;
            if (number < 0x80) break;
        }
    return element(size);
}

std::size_t sizeOf(netsnmp_variable_list const& variable) {
    std::size_t value = 0;
    switch (variable.type) {
    case ASN_OBJECT_ID:
        value = sizeOfName(variable.val.objid, variable.val_len / sizeof(oid));
        break;
    case ASN_INTEGER:
    case ASN_COUNTER:
    case ASN_GAUGE:
    case ASN_TIMETICKS:
        value = element(5);
        break;
    case ASN_COUNTER64:
        value = element(9);
        break;
    default:
        value = element(variable.val_len);
    }
    return element(sizeOfName(variable.name, variable.name_length) + value);
}

std::size_t roomForVariables(netsnmp_pdu const& pdu) {
    std::size_t const accepted =
        pdu.msgMaxSize > 0 ? static_cast<std::size_t>(pdu.msgMaxSize) : kLargestMessage;
    std::size_t fields = kFields + pdu.community_len;
    if (pdu.version == SNMP_VERSION_3)
        fields = kFieldsOfVersion3 + pdu.securityEngineIDLen + pdu.securityNameLen +
                 pdu.contextEngineIDLen + pdu.contextNameLen;
    std::size_t const limit = std::min(accepted, kLargestMessage);
    return limit > fields ? limit - fields : 0;
}

void removeVariables(netsnmp_variable_list*& from) {
    snmp_free_varbind(from);
    from = nullptr;
}

void makeTooBig(netsnmp_pdu& pdu) {
    pdu.errstat = SNMP_ERR_TOOBIG;
    pdu.errindex = 0;
    snmp_increment_statistic(STAT_SNMPOUTTOOBIGS);
    if (pdu.version != SNMP_VERSION_1) return removeVariables(pdu.variables);
    for (auto* variable = pdu.variables; variable != nullptr; variable = variable->next_variable)
        snmp_set_var_typed_value(variable, ASN_NULL, nullptr, 0);
}

} // namespace

void fitResponse(snmp_pdu& pdu, bool answersGetBulk) {
    if (pdu.errstat == SNMP_ERR_TOOBIG && pdu.version != SNMP_VERSION_1)
        return removeVariables(pdu.variables);
    std::size_t const room = roomForVariables(pdu);
    std::size_t used = 0;
    for (netsnmp_variable_list** at = &pdu.variables; *at != nullptr; at = &(*at)->next_variable) {
        used += sizeOf(**at);
        if (used <= room) continue;
        // Without any variable, the response would look like the end of all objects.
        if (answersGetBulk && pdu.errstat == SNMP_ERR_NOERROR && at != &pdu.variables)
            return removeVariables(*at);
        return makeTooBig(pdu);
    }
}

} // namespace kvloamd
