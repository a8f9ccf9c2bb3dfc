// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxPdu.h"

#include <endian.h>

#include <array>
#include <cstring>
#include <utility>

namespace kvloamd {

namespace {

constexpr std::uint8_t kVersion = 1;
constexpr std::uint8_t kHasContext = 0x08;
constexpr std::uint8_t kNetworkOrder = 0x10;
constexpr std::size_t kLengthAt = 16;
/// Enough for most packets.
constexpr std::size_t kUsualSize = 512;

/// A name that begins with these numbers and one from 1 to 255 is encoded without the former.
constexpr std::array<std::uint32_t, 4> kInternet{1, 3, 6, 1};

constexpr std::uint16_t kInteger = 2;
constexpr std::uint16_t kOctetString = 4;
constexpr std::uint16_t kNull = 5;
constexpr std::uint16_t kObjectId = 6;
constexpr std::uint16_t kIpAddress = 64;
constexpr std::uint16_t kCounter = 65;
constexpr std::uint16_t kGauge = 66;
constexpr std::uint16_t kTimeTicks = 67;
constexpr std::uint16_t kOpaque = 68;
constexpr std::uint16_t kCounter64 = 70;
constexpr std::uint16_t kNoSuchObject = 128;
constexpr std::uint16_t kNoSuchInstance = 129;
constexpr std::uint16_t kEndOfView = 130;

std::uint16_t typeOf(ValueType type) {
    switch (type) {
    case ValueType::Integer:
        return kInteger;
    case ValueType::Counter:
        return kCounter;
    case ValueType::Gauge:
        return kGauge;
    case ValueType::TimeTicks:
    case ValueType::TimeStamp:
    case ValueType::BeginStamp:
        return kTimeTicks;
    case ValueType::Counter64:
        return kCounter64;
    case ValueType::ObjectId:
        return kObjectId;
    case ValueType::Text:
    case ValueType::Octets:
    case ValueType::Date:
        break;
    }
    return kOctetString;
}

} // namespace

AgentxHeader parseAgentxHeader(std::string_view octets) {
    AgentxHeader header;
    AgentxReader start(octets, true);
    if (start.octet() != kVersion) throw AgentxError("another version of the protocol");
    header.kind = static_cast<AgentxKind>(start.octet());
    std::uint8_t const flags = start.octet();
    start.octet();
    header.hasContext = (flags & kHasContext) != 0;
    header.networkOrder = (flags & kNetworkOrder) != 0;
    AgentxReader rest(octets.substr(4), header.networkOrder);
    header.session = rest.number();
    header.transaction = rest.number();
    header.packet = rest.number();
    header.payload = rest.number();
    if (header.payload > AgentxHeader::kMaxPayload) throw AgentxError("a packet that is too long");
    return header;
}

std::string_view AgentxReader::take(std::size_t size) {
    if (m_rest.size() < size) throw AgentxError("a packet that ends too soon");
    std::string_view const taken = m_rest.substr(0, size);
    m_rest.remove_prefix(size);
    return taken;
}

std::uint8_t AgentxReader::octet() {
    return static_cast<std::uint8_t>(take(1)[0]);
}

std::uint16_t AgentxReader::number16() {
    std::uint16_t value = 0;
    std::memcpy(&value, take(sizeof value).data(), sizeof value);
    return m_networkOrder ? be16toh(value) : le16toh(value);
}

std::uint32_t AgentxReader::number() {
    return numberAt(take(sizeof(std::uint32_t)).data());
}

std::uint32_t AgentxReader::numberAt(char const* octets) const {
    std::uint32_t value = 0;
    std::memcpy(&value, octets, sizeof value);
    return m_networkOrder ? be32toh(value) : le32toh(value);
}

AgentxName AgentxReader::name() {
    AgentxName result;
    std::size_t const count = octet();
    std::uint32_t const prefix = octet();
    result.include = octet() != 0;
    octet();
    result.name.reserve(kInternet.size() + 1 + count);
    if (prefix != 0) {
        result.name.assign(kInternet.begin(), kInternet.end());
        result.name.push_back(prefix);
    }
    std::string_view const parts = take(count * sizeof(std::uint32_t));
    for (std::size_t at = 0; at < parts.size(); at += sizeof(std::uint32_t))
        result.name.push_back(numberAt(parts.data() + at));
    return result;
}

AgentxVariable AgentxReader::variable() {
    std::uint16_t const type = number16();
    number16();
    AgentxVariable result;
    result.name = name().name;
    switch (type) {
    case kInteger:
        result.value = std::int64_t{static_cast<std::int32_t>(number())};
        break;
    case kCounter:
    case kGauge:
    case kTimeTicks:
        number();
        break;
    case kCounter64:
        take(8);
        break;
    case kOctetString:
    case kIpAddress:
    case kOpaque: {
        std::size_t const size = number();
        std::string_view const octets = take(size);
        if (type == kOctetString) result.value = octets;
        take((4 - size % 4) % 4);
        break;
    }
    case kObjectId:
        name();
        break;
    case kNull:
        break;
    default:
        throw AgentxError("a value of an unknown type");
    }
    return result;
}

AgentxWriter::AgentxWriter(AgentxKind kind, std::uint32_t session, std::uint32_t transaction,
                           std::uint32_t packet) {
    m_octets.reserve(kUsualSize);
    octet(kVersion);
    octet(static_cast<std::uint8_t>(kind));
    octet(kNetworkOrder);
    octet(0);
    number(session);
    number(transaction);
    number(packet);
    number(0);
}

void AgentxWriter::number16(std::uint16_t value) {
    octet(static_cast<std::uint8_t>(value >> 8U));
    octet(static_cast<std::uint8_t>(value & 0xffU));
}

void AgentxWriter::number(std::uint32_t value) {
    m_octets.append(sizeof value, '\0');
    putNumber(m_octets.size() - sizeof value, value);
}

void AgentxWriter::putNumber(std::size_t at, std::uint32_t value) {
    std::uint32_t const octets = htobe32(value);
    std::memcpy(m_octets.data() + at, &octets, sizeof octets);
}

void AgentxWriter::name(OidView name) {
    std::uint32_t prefix = 0;
    if (name.size() > kInternet.size() && startsWith(name, kInternet) && name[4] > 0 &&
        name[4] <= 255) {
        prefix = name[4];
        name = name.subspan(kInternet.size() + 1);
    }
    octet(static_cast<std::uint8_t>(name.size()));
    octet(static_cast<std::uint8_t>(prefix));
    octet(0);
    octet(0);
    std::size_t at = m_octets.size();
    m_octets.resize(at + name.size_bytes());
    for (std::uint32_t const part : name) {
        putNumber(at, part);
        at += sizeof part;
    }
}

void AgentxWriter::text(std::string_view value) {
    number(static_cast<std::uint32_t>(value.size()));
    m_octets += value;
    m_octets.append((4 - value.size() % 4) % 4, '\0');
}

void AgentxWriter::head(std::uint16_t type, OidView named) {
    number16(type);
    number16(0);
    name(named);
}

void AgentxWriter::variable(OidView named, ValueType type, Value const& value) {
    head(typeOf(type), named);
    if (auto const octets = octetsOf(value)) return text(*octets);
    if (auto const* const place = std::get_if<NameView>(&value)) return name(place->name);
    auto const bits = static_cast<std::uint64_t>(std::get<std::int64_t>(value));
    if (type == ValueType::Counter64) number(static_cast<std::uint32_t>(bits >> 32U));
    number(static_cast<std::uint32_t>(bits));
}

void AgentxWriter::noSuchObject(OidView named) {
    head(kNoSuchObject, named);
}

void AgentxWriter::noSuchInstance(OidView named) {
    head(kNoSuchInstance, named);
}

void AgentxWriter::endOfView(OidView named) {
    head(kEndOfView, named);
}

std::string AgentxWriter::take() {
    putNumber(kLengthAt, static_cast<std::uint32_t>(m_octets.size() - AgentxHeader::kSize));
    return std::move(m_octets);
}

AgentxWriter beginAgentxResponse(AgentxHeader const& request, AgentxFault fault,
                                 std::uint16_t variable) {
    AgentxWriter response(AgentxKind::Response, request.session, request.transaction,
                          request.packet);
    response.number(0); // sysUpTime, which is the master's to report
    response.number16(static_cast<std::uint16_t>(fault));
    response.number16(variable);
    return response;
}

std::string agentxResponse(AgentxHeader const& request, AgentxFault fault, std::uint16_t variable) {
    return beginAgentxResponse(request, fault, variable).take();
}

} // namespace kvloamd
