// SPDX-License-Identifier: BSD-2-Clause
// Encodes and decodes the packets of the AgentX protocol.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

#include "agent/objects/ObjectTree.h"

namespace kvloamd {

enum class AgentxKind : std::uint8_t {
    Open = 1,
    Close = 2,
    Register = 3,
    Unregister = 4,
    Get = 5,
    GetNext = 6,
    GetBulk = 7,
    TestSet = 8,
    CommitSet = 9,
    UndoSet = 10,
    CleanupSet = 11,
    Notify = 12,
    Ping = 13,
    AddAgentCaps = 16,
    Response = 18,
};

/// The error of a Response.
enum class AgentxFault : std::uint16_t {
    None = 0,
    WrongType = 7,
    WrongLength = 8,
    WrongValue = 10,
    NoCreation = 11,
    ResourceUnavailable = 13,
    CommitFailed = 14,
    NotWritable = 17,
    NotOpen = 257,
    UnsupportedContext = 262,
    DuplicateRegistration = 263,
    ParseError = 266,
    RequestDenied = 267,
    ProcessingError = 268,
};

/// A malformed packet.
class AgentxError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

struct AgentxHeader {
    static constexpr std::size_t kSize = 20;
    /// Far above the packets that a master sends.
    static constexpr std::size_t kMaxPayload = std::size_t{1024} * 1024;

    AgentxKind kind = AgentxKind::Ping;
    bool hasContext = false;
    bool networkOrder = true;
    std::uint32_t session = 0;
    std::uint32_t transaction = 0;
    std::uint32_t packet = 0;
    std::uint32_t payload = 0; ///< octets after the header
};

/// Reads the first `kSize` octets of a packet. Throws AgentxError.
AgentxHeader parseAgentxHeader(std::string_view octets);

/// A name, and whether a search from it includes the name itself.
struct AgentxName {
    Oid name;
    bool include = false;
};

/// A variable of a SET.
struct AgentxVariable {
    Oid name;
    Value value; ///< an integer or octets in the packet; nothing when it has another type
};

/// An `AgentxReader` decodes a packet's payload from beginning to end. Reading past the end throws
/// AgentxError. Unsynchronised.
class AgentxReader {
  public:
    AgentxReader(std::string_view payload, bool networkOrder)
        : m_rest(payload), m_networkOrder(networkOrder) {}

    bool atEnd() const { return m_rest.empty(); }
    std::uint8_t octet();
    std::uint16_t number16();
    std::uint32_t number();
    AgentxName name();
    /// Reads a variable with a value of any type.
    AgentxVariable variable();

  private:
    std::string_view take(std::size_t size);
    std::uint32_t numberAt(char const* octets) const;

    std::string_view m_rest;
    bool m_networkOrder;
};

/// An `AgentxWriter` encodes one packet, in network byte order. Unsynchronised.
class AgentxWriter {
  public:
    AgentxWriter(AgentxKind kind, std::uint32_t session, std::uint32_t transaction,
                 std::uint32_t packet);

    void octet(std::uint8_t value) { m_octets += static_cast<char>(value); }
    void number16(std::uint16_t value);
    void number(std::uint32_t value);
    void name(OidView name);
    void text(std::string_view value);
    /// Writes a variable and its value, which must be known.
    void variable(OidView name, ValueType type, Value const& value);
    /// Write a variable that has no value, and the reason.
    void noSuchObject(OidView name);
    void noSuchInstance(OidView name);
    void endOfView(OidView name);

    std::size_t size() const { return m_octets.size(); }
    /// Returns the packet, with its length filled in.
    std::string take();

  private:
    void head(std::uint16_t type, OidView name);
    void putNumber(std::size_t at, std::uint32_t value);

    std::string m_octets;
};

/// Encodes a complete response to `request`. `variable`: the number of the variable that caused the
/// fault, from 1; 0: none.
std::string agentxResponse(AgentxHeader const& request, AgentxFault fault,
                           std::uint16_t variable = 0);

/// Begins a response to `request`; the caller appends its variables.
AgentxWriter beginAgentxResponse(AgentxHeader const& request, AgentxFault fault = AgentxFault::None,
                                 std::uint16_t variable = 0);

} // namespace kvloamd
