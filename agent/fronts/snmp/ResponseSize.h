// SPDX-License-Identifier: BSD-2-Clause
// Makes responses fit the messages that their receivers accept.
#pragma once

struct snmp_pdu;

namespace kvloamd {

/// Makes a response PDU fit into one message for its receiver: removes variables from the end of a
/// GETBULK's response, and replaces any other one by tooBig. A response tooBig has no variables, in
/// SNMPv1 those of the request without values.
void fitResponse(snmp_pdu& pdu, bool answersGetBulk);

} // namespace kvloamd
