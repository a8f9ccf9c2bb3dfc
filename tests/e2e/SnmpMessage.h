// SPDX-License-Identifier: BSD-2-Clause
// SNMP messages as a test composes them, for requests that no SNMP tool sends.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/rows/Oid.h"

namespace kvloamd::e2e {

enum class PduKind : std::uint8_t {
    Get = 0xa0,
    GetNext = 0xa1,
    Response = 0xa2,
    Set = 0xa3,
    GetBulk = 0xa5,
    Report = 0xa8
};

struct Variable {
    Oid name;
    std::string value = std::string("\x05\x00", 2); ///< encoded; null by default
};

/// The engine of an SNMPv3 agent, and what the asker sends with it.
struct Engine {
    std::string id;
    int boots = 0;
    int time = 0;
    std::string user;
    int maxSize = 65507; ///< msgMaxSize
};

struct SnmpPdu {
    PduKind kind = PduKind::Get;
    int errorStatus = 0; ///< of a GetBulk: non-repeaters
    int errorIndex = 0;  ///< of a GetBulk: max-repetitions
    std::vector<Variable> variables;
};

/// Encodes an SNMPv1 (version 0) or SNMPv2c (version 1) message.
std::string communityMessage(int version, std::string const& community, SnmpPdu const& pdu);
/// Encodes an SNMPv3 message without authentication; without an engine id, a discovery.
std::string userMessage(Engine const& engine, SnmpPdu const& pdu);
/// Encodes an INTEGER or OCTET STRING value.
std::string integerValue(int value);
std::string textValue(std::string const& text);

/// Decodes a message of any version; fills in `engine` if the message has one. Nothing when the
/// message is malformed.
std::optional<SnmpPdu> parseMessage(std::string_view message, Engine* engine = nullptr);

/// A UDP or TCP connection to a port of loopback.
class SnmpSocket {
  public:
    SnmpSocket(int port, bool tcp);
    ~SnmpSocket();
    SnmpSocket(SnmpSocket const&) = delete;
    SnmpSocket& operator=(SnmpSocket const&) = delete;

    /// Sends without waiting; false when the connection takes no more, or has been closed.
    bool send(std::string const& message) const;
    /// Receives one message; empty when none comes within `milliseconds`, or at the end.
    std::string receive(int milliseconds) const;
    /// Whether the agent closes the connection within the time.
    bool isClosedWithin(int milliseconds) const;

  private:
    int m_socket;
};

} // namespace kvloamd::e2e
