// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpSessions.h"

#include <arpa/inet.h>
#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <string_view>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
#include <net-snmp/library/snmpTCPDomain.h>
// clang-format on

#include "agent/fronts/snmp/ResponseSize.h"
#include "agent/fronts/snmp/TransportKinds.h"

namespace kvloamd {

namespace {

/// The command of the request that is being answered.
int askedCommand = 0;

int takeRequest(int operation, netsnmp_session* session, int request, netsnmp_pdu* pdu,
                void* magic) {
    if (operation == NETSNMP_CALLBACK_OP_RECEIVED_MESSAGE && pdu != nullptr) {
        // SNMPv1 has no GETBULK: the message is malformed.
        if (pdu->version == SNMP_VERSION_1 && pdu->command == SNMP_MSG_GETBULK) {
            snmp_increment_statistic(STAT_SNMPINASNPARSEERRS);
            return 1;
        }
        askedCommand = pdu->command;
    }
    return handle_snmp_packet(operation, session, request, pdu, magic);
}

/// Encodes a message whose response PDU has been made to fit. The library would try again and again
/// to shorten one that does not; and the encoder that it chooses for a GETBULK whose response it
/// has shortened itself writes past the end of its buffer.
int buildMessage(netsnmp_session* session, netsnmp_pdu* pdu, u_char** packet, size_t* size,
                 size_t* length) {
    if (pdu->command == SNMP_MSG_RESPONSE) fitResponse(*pdu, askedCommand == SNMP_MSG_GETBULK);
    pdu->flags &= ~static_cast<u_long>(UCD_MSG_FLAG_FORWARD_ENCODE | UCD_MSG_FLAG_BULK_TOOBIG);
    int const result = snmp_build(packet, size, length, session, pdu);
    // The library encodes from the end of the buffer, but expects our message at its beginning.
    if (result == 0) std::memmove(*packet, *packet + *size - *length, *length);
    return result;
}

bool addSession(netsnmp_transport* transport) {
    netsnmp_session session;
    snmp_sess_init(&session);
    session.version = SNMP_DEFAULT_VERSION;
    session.callback = takeRequest;
    session.isAuthoritative = SNMP_SESS_AUTHORITATIVE;
    transport->flags |= NETSNMP_TRANSPORT_FLAG_OPENED;
    return snmp_add_full(
               &session, transport, netsnmp_agent_check_packet, nullptr,
               [](netsnmp_session* of, netsnmp_pdu* pdu, int result) {
                   return netsnmp_agent_check_parse(of, pdu, result);
               },
               nullptr, buildMessage, nullptr, nullptr) != nullptr;
}

/// The connections that a transport of ours stands for.
TcpConnections& connectionsOf(netsnmp_transport const& transport) {
    return **static_cast<TcpConnections**>(transport.data);
}

/// The library hands the address of a request's sender back with the response. The number of the
/// connection is where UDP keeps the number of the network interface.
int receiveMessage(netsnmp_transport* transport, void* buffer, int size, void** sender,
                   int* senderSize) {
    *sender = nullptr;
    *senderSize = 0;
    auto const message = connectionsOf(*transport).take();
    if (!message || message->octets.size() > static_cast<std::size_t>(size)) return -1;
    auto* const pair =
        static_cast<netsnmp_indexed_addr_pair*>(std::calloc(1, sizeof(netsnmp_indexed_addr_pair)));
    if (pair == nullptr) return -1;
    pair->remote_addr.sin = message->peer;
    pair->if_index = message->connection;
    *sender = pair;
    *senderSize = sizeof *pair;
    std::memcpy(buffer, message->octets.data(), message->octets.size());
    return static_cast<int>(message->octets.size());
}

int sendMessage(netsnmp_transport* transport, void const* buffer, int size, void** receiver,
                int* receiverSize) { // NOLINT(readability-non-const-parameter): the library's type
    if (receiver == nullptr || *receiver == nullptr || receiverSize == nullptr ||
        *receiverSize != static_cast<int>(sizeof(netsnmp_indexed_addr_pair)))
        return -1;
    auto const* const pair = static_cast<netsnmp_indexed_addr_pair const*>(*receiver);
    connectionsOf(*transport)
        .send(pair->if_index,
              std::string_view(static_cast<char const*>(buffer), static_cast<std::size_t>(size)));
    return size;
}

int closeNothing(netsnmp_transport* /*transport*/) {
    return 0;
}

char* describeSender(netsnmp_transport* /*transport*/, void const* sender, int size) {
    std::string text = "TCP: unknown";
    if (sender != nullptr && size == static_cast<int>(sizeof(netsnmp_indexed_addr_pair))) {
        sockaddr_in const& peer =
            static_cast<netsnmp_indexed_addr_pair const*>(sender)->remote_addr.sin;
        char host[INET_ADDRSTRLEN] = "";
        inet_ntop(AF_INET, &peer.sin_addr, host, sizeof host);
        text = std::string("TCP: [") + host + "]:" + std::to_string(ntohs(peer.sin_port));
    }
    return strdup(text.c_str());
}

/// One transport for all connections: like UDP's, it receives whole messages and their senders.
netsnmp_transport* makeTransport(TcpConnections& connections) {
    // The library frees both.
    auto* const transport =
        static_cast<netsnmp_transport*>(std::calloc(1, sizeof(netsnmp_transport)));
    // NOLINTNEXTLINE(bugprone-sizeof-expression): a pointer is kept
    auto* const held = static_cast<TcpConnections**>(std::malloc(sizeof(TcpConnections*)));
    if (transport == nullptr || held == nullptr) std::abort();
    *held = &connections;
    transport->domain = netsnmp_snmpTCPDomain;
    transport->domain_length = 7;
    transport->sock = connections.descriptor();
    transport->data = held;
    transport->data_length = sizeof *held; // NOLINT(bugprone-sizeof-expression): as above
    transport->msgMaxSize = TcpConnections::kLongestMessage;
    transport->f_recv = receiveMessage;
    transport->f_send = sendMessage;
    transport->f_close = closeNothing;
    transport->f_fmtaddr = describeSender;
    return transport;
}

std::string describeFailure(std::string const& address, int fault) {
    std::string const failed = "cannot listen on " + address + ": ";
    switch (fault) {
    case EADDRINUSE:
        return failed + "the port is in use; stop the program that uses it, or choose another port "
                        "with --port or --listen";
    case EACCES:
        return failed + "permission denied; ports below 1024 need the privilege to use them, or "
                        "choose another one with --port or --listen";
    case 0:
        return failed + "no such address; write it as udp:127.0.0.1:1161";
    default:
        return failed + std::strerror(fault) + "; check --listen, as in udp:127.0.0.1:1161";
    }
}

std::string describeKind(std::string const& address) {
    return "cannot listen on " + address + ": only udp:, udp6: and tcp: are supported";
}

constexpr std::string_view kTcp = "tcp:";

} // namespace

std::string SnmpSessions::listen(std::string const& address) {
    if (address.starts_with(kTcp)) return listenByTcp(address);
    if (isOfBlockingKind(address)) return describeKind(address);
    errno = 0;
    netsnmp_transport* const transport = netsnmp_transport_open_server("snmp", address.c_str());
    if (transport == nullptr) return describeFailure(address, errno);
    // A program that a board module starts may outlive the agent, and would keep the port in use.
    fcntl(transport->sock, F_SETFD, FD_CLOEXEC);
    if (!addSession(transport))
        return "cannot listen on " + address + ": the SNMP library refuses the address";
    return {};
}

std::string SnmpSessions::check(std::string const& address) {
    errno = 0;
    if (address.starts_with(kTcp)) {
        bool const good = TcpConnections().listen(address.substr(kTcp.size()));
        return good || errno == EADDRINUSE ? std::string() : describeFailure(address, errno);
    }
    if (isOfBlockingKind(address)) return describeKind(address);
    netsnmp_transport* const transport = netsnmp_transport_open_server("snmp", address.c_str());
    if (transport == nullptr)
        return errno == EADDRINUSE ? std::string() : describeFailure(address, errno);
    transport->f_close(transport);
    netsnmp_transport_free(transport);
    return {};
}

std::string SnmpSessions::listenByTcp(std::string const& address) {
    bool const isFirst = m_tcp == nullptr;
    if (isFirst) m_tcp = std::make_unique<TcpConnections>();
    if (!m_tcp->listen(address.substr(kTcp.size()))) return describeFailure(address, errno);
    if (isFirst && !addSession(makeTransport(*m_tcp)))
        return "cannot listen on " + address + ": the SNMP library refuses the address";
    return {};
}

void SnmpSessions::addTo(EventLoop& loop) {
    if (m_tcp) loop.add(*m_tcp);
}

} // namespace kvloamd
