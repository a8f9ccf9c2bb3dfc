// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpValues.h"

#include <vector>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
// clang-format on

namespace kvloamd {

unsigned char asnTypeOf(ValueType type) {
    switch (type) {
    case ValueType::Integer:
        return ASN_INTEGER;
    case ValueType::Counter:
        return ASN_COUNTER;
    case ValueType::Counter64:
        return ASN_COUNTER64;
    case ValueType::Gauge:
        return ASN_GAUGE;
    case ValueType::TimeTicks:
    case ValueType::TimeStamp:
    case ValueType::BeginStamp:
        return ASN_TIMETICKS;
    case ValueType::ObjectId:
        return ASN_OBJECT_ID;
    case ValueType::Text:
    case ValueType::Octets:
    case ValueType::Date:
        break;
    }
    return ASN_OCTET_STR;
}

void setVariable(variable_list* variable, ValueType type, Value const& value) {
    u_char const asn = asnTypeOf(type);
    if (auto const octets = octetsOf(value)) {
        snmp_set_var_typed_value(variable, asn, octets->data(), octets->size());
    } else if (auto const* const named = std::get_if<NameView>(&value)) {
        std::vector<oid> const wide(named->name.begin(), named->name.end());
        snmp_set_var_typed_value(variable, asn, wide.data(), wide.size() * sizeof(oid));
    } else if (auto const* const number = std::get_if<std::int64_t>(&value)) {
        if (asn == ASN_COUNTER64) {
            auto const bits = static_cast<std::uint64_t>(*number);
            counter64 const halves{bits >> 32U, bits & 0xffffffffU};
            snmp_set_var_typed_value(variable, asn, &halves, sizeof halves);
            return;
        }
        // The library keeps every number of 32 bits in a long.
        long const narrow = static_cast<long>(*number);
        snmp_set_var_typed_value(variable, asn, &narrow, sizeof narrow);
    }
}

} // namespace kvloamd
