// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the decoder of AgentX packets: a header, then what its kind of packet contains.
#include "agent/fronts/agentx/AgentxPdu.h"

#include "tests/fuzz/FuzzInput.h"

namespace kvloamd {
namespace {

/// Decodes a name. Written and read again, it must be the same.
void readName(AgentxReader& reader) {
    Oid const name = reader.name().name;
    if (name.size() > 0xff) return; // a prefix makes it longer than a name can be written
    AgentxWriter writer(AgentxKind::Get, 0, 0, 0);
    writer.name(name);
    std::string const packet = writer.take();
    AgentxReader again(std::string_view(packet).substr(AgentxHeader::kSize), true);
    fuzz::require(again.name().name == name && again.atEnd(), "a name survives encoding");
}

void decode(AgentxHeader const& header, std::string_view payload) {
    AgentxReader reader(payload, header.networkOrder);
    switch (header.kind) {
    case AgentxKind::Response:
        reader.number();
        reader.number16();
        reader.number16();
        [[fallthrough]];
    case AgentxKind::TestSet:
    case AgentxKind::Notify:
        while (!reader.atEnd())
            reader.variable();
        break;
    case AgentxKind::GetBulk:
        reader.number16();
        reader.number16();
        [[fallthrough]];
    default:
        while (!reader.atEnd())
            readName(reader);
    }
}

} // namespace
} // namespace kvloamd

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    std::string_view const packet(reinterpret_cast<char const*>(octets), size);
    try {
        auto const header = kvloamd::parseAgentxHeader(packet);
        fuzz::require(header.payload <= kvloamd::AgentxHeader::kMaxPayload, "a packet is bounded");
        kvloamd::decode(header, packet.substr(kvloamd::AgentxHeader::kSize));
    } catch (kvloamd::AgentxError const&) { // the input is malformed, as most are
    }
    return 0;
}
