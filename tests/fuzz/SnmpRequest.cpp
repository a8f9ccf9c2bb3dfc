// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the stand-alone agent's way from a received message to its response, the SNMP library
// included: any octets by UDP or TCP, and messages that the library accepts with any request in
// them.
#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <fstream>
#include <optional>
#include <stdexcept>
#include <string>

#include "agent/fronts/snmp/StandAlone.h"
#include "agent/log/Log.h"
#include "tests/e2e/SnmpMessage.h"
#include "tests/fuzz/Folder.h"
#include "tests/fuzz/FuzzInput.h"
#include "tests/fuzz/SampleRows.h"

namespace kvloamd {
namespace {

constexpr char kEngine[] = "800079b804666f7236";
constexpr std::size_t kMaxVariables = 32;

int connected(int type, sockaddr_in const& address) {
    int const made = socket(AF_INET, type | SOCK_CLOEXEC, 0);
    if (connect(made, reinterpret_cast<sockaddr const*>(&address), sizeof address) != 0)
        throw std::runtime_error("the agent cannot be reached");
    return made;
}

/// A free port of loopback for both protocols, as likely as not still free when it is used.
sockaddr_in freePort() {
    int const probe = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    if (bind(probe, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
        getsockname(probe, reinterpret_cast<sockaddr*>(&address), &size) != 0)
        throw std::runtime_error("no free port");
    close(probe);
    return address;
}

/// An agent with a client of its own.
class Agent {
  public:
    Agent() {
        setLogLevel(LogLevel::Error);
        // The library reads a file snmp.conf of its state's folder as one of its own.
        std::string const config = m_folder.file("access.conf");
        std::string const port = std::to_string(ntohs(m_address.sin_port));
        std::ofstream(config) << "rocommunity public\nrwcommunity private\n"
                                 "exactEngineID 0x"
                              << kEngine << "\ncreateUser fuzz\nrwuser fuzz noauth\n";
        m_front.emplace(std::vector<std::string>{"udp:127.0.0.1:" + port, "tcp:127.0.0.1:" + port},
                        SnmpFiles{config, m_folder.path(), {}, {}});
        if (!m_front->open()) throw std::runtime_error("the agent does not start");
        auto const snapshot = [] {
            static auto const made = sampleSnapshot();
            return made;
        };
        m_front->serve({m_objects.served(), m_counters, snapshot, snapshot, m_settings, {}});
        m_front->beforeSleep([this]() -> std::optional<Clock::time_point> {
            if (m_turns-- == 0) m_front->stop();
            return Clock::now(); // never waits
        });
        m_udp = connected(SOCK_DGRAM, m_address);
    }

    void sendByUdp(std::string_view message) {
        ::send(m_udp, message.data(), message.size(), MSG_DONTWAIT);
        turn(1);
        char buffer[65536];
        for (ssize_t got = 0; (got = recv(m_udp, buffer, sizeof buffer, MSG_DONTWAIT)) > 0;)
            fuzz::require(e2e::parseMessage(std::string_view(buffer, static_cast<std::size_t>(got)))
                              .has_value(),
                          "a response is well-formed");
    }
    void sendByTcp(std::string_view octets) {
        int const client = connected(SOCK_STREAM, m_address);
        turn(1); // accepts
        ::send(client, octets.data(), octets.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
        turn(3);
        // A reset, which leaves no connection behind that waits for its end.
        linger const atOnce{1, 0};
        setsockopt(client, SOL_SOCKET, SO_LINGER, &atOnce, sizeof atOnce);
        close(client);
        turn(1);
    }

  private:
    void turn(int turns) {
        m_turns = turns;
        m_front->run();
    }

    fuzz::Folder m_folder;
    sockaddr_in const m_address = freePort();
    SampleTrees m_objects;
    Counters m_counters;
    Settings m_settings;
    std::optional<StandAlone> m_front;
    int m_udp = -1;
    int m_turns = 0;
};

/// A name at or near one of the agent's.
Oid nameFrom(fuzz::FuzzInput& input) {
    static Oid const starts[] = {{1, 3},
                                 {1, 3, 6, 1, 2, 1, 1},
                                 joined(kStandardArc, Oid{2, 2, 1}),
                                 joined(kStandardArc, Oid{31, 1, 1, 1}),
                                 joined(kStandardArc, Oid{10, 18}),
                                 joined(kStandardArc, Oid{47, 1}),
                                 joined(kSampleEnterprise, kObjectsPlace),
                                 {1, 3, 6, 1, 6, 3}};
    Oid name = starts[input.choice(std::size(starts))];
    std::size_t const more = input.choice(16);
    for (std::size_t i = 0; i < more; ++i) {
        std::uint8_t const part = input.octet();
        name.push_back(part < 250 ? part : input.number<std::uint32_t>());
    }
    return name;
}

int signedOctet(fuzz::FuzzInput& input) {
    int const octet = input.octet();
    return octet < 128 ? octet : octet - 256;
}

e2e::SnmpPdu pduFrom(fuzz::FuzzInput& input) {
    static constexpr e2e::PduKind kinds[] = {e2e::PduKind::Get, e2e::PduKind::GetNext,
                                             e2e::PduKind::Set, e2e::PduKind::GetBulk};
    e2e::SnmpPdu pdu;
    pdu.kind = kinds[input.choice(std::size(kinds))];
    if (pdu.kind == e2e::PduKind::GetBulk) {
        pdu.errorStatus = signedOctet(input);
        pdu.errorIndex = signedOctet(input);
    }
    while (!input.atEnd() && pdu.variables.size() < kMaxVariables) {
        e2e::Variable& variable = pdu.variables.emplace_back();
        variable.name = nameFrom(input);
        if (pdu.kind != e2e::PduKind::Set) continue;
        if (input.choice(2) == 0)
            variable.value = e2e::integerValue(input.number<std::int32_t>());
        else
            variable.value = e2e::textValue(input.text());
    }
    return pdu;
}

std::string engineId() {
    std::string id;
    for (std::size_t at = 0; at + 1 < sizeof kEngine; at += 2)
        id += static_cast<char>(std::stoi(std::string(kEngine + at, 2), nullptr, 16));
    return id;
}

void ask(Agent& agent, fuzz::FuzzInput& input) {
    switch (input.choice(4)) {
    case 0:
        return agent.sendByUdp(input.rest());
    case 1:
        return agent.sendByTcp(input.rest());
    case 2: {
        int const version = static_cast<int>(input.choice(2));
        char const* const community = input.choice(2) == 0 ? "public" : "private";
        return agent.sendByUdp(e2e::communityMessage(version, community, pduFrom(input)));
    }
    default:
        // The agent's first start has one boot; without authentication the time does not count.
        e2e::Engine const engine{engineId(), 1, 0, "fuzz", 484 + 16 * input.octet()};
        return agent.sendByUdp(e2e::userMessage(engine, pduFrom(input)));
    }
}

} // namespace
} // namespace kvloamd

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    // Never destroyed: the SNMP library does not start twice in a process.
    static auto* const agent = new kvloamd::Agent;
    fuzz::FuzzInput input(octets, size);
    kvloamd::ask(*agent, input);
    return 0;
}
