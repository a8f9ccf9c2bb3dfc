// SPDX-License-Identifier: BSD-2-Clause
// Asks an SNMPv3 receiver for its engine ID.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "agent/fronts/snmp/ReceiverLine.h"

namespace kvloamd {

/// Encodes an SNMPv3 discovery (RFC 3414, section 4): a request without an engine ID, which the
/// receiver answers by a report with its own.
std::string discoveryMessage(std::uint32_t messageId);
/// The engine ID in the answer to the discovery `messageId`; nothing if `message` is none.
std::optional<std::string> engineIn(std::string_view message, std::uint32_t messageId);

/// An `EngineProbe` is one attempt to learn the engine ID of a receiver. It never waits: the SNMP
/// library's own discovery does, for as long as its retries take. Thread-bound to the SNMP thread.
class EngineProbe {
  public:
    /// Sends the discovery; `number`: the address's host as a number.
    EngineProbe(ReceiverAddress const& address, std::string const& number);
    ~EngineProbe();
    EngineProbe(EngineProbe const&) = delete;
    EngineProbe& operator=(EngineProbe const&) = delete;

    /// Readable when there is an answer or a fault; negative if there was a fault at once.
    int descriptor() const { return m_socket; }
    /// Reads what has come. Returns the engine ID once it is there.
    std::optional<std::string> receive();
    /// Why there will be no answer; empty while there may be one.
    std::string const& fault() const { return m_fault; }

  private:
    void fail();

    int m_socket = -1;
    std::uint32_t m_messageId = 0;
    std::string m_fault;
};

} // namespace kvloamd
