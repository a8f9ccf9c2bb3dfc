// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/Informs.h"

#include <cstdlib>
#include <utility>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
#include <net-snmp/agent/agent_callbacks.h>
#include <net-snmp/agent/agent_trap.h>
// clang-format on

// The library's module of notifications, which enters every session that is registered in its own
// tables and sends to it. Exported, but in none of the library's headers.
extern "C" int notifyTable_register_notifications(int major, int minor, void* arguments,
                                                  void* ours);

namespace kvloamd {

namespace {

/// The object that the library's callbacks are for. The library would free an argument of theirs.
Informs* current = nullptr;

} // namespace

Informs::~Informs() {
    if (current == this) current = nullptr;
}

void Informs::takeOver(std::function<void()> const& parse) {
    constexpr int kMajor = SNMP_CALLBACK_APPLICATION;
    constexpr int kMinor = SNMPD_CALLBACK_REGISTER_NOTIFICATIONS;
    if (current != this) {
        current = this;
        snmp_register_callback(kMajor, SNMPD_CALLBACK_SEND_TRAP2, sendTrap, nullptr);
    }
    snmp_unregister_callback(kMajor, kMinor, notifyTable_register_notifications, nullptr, 0);
    snmp_register_callback(kMajor, kMinor, registerSession, nullptr);
    parse();
    snmp_unregister_callback(kMajor, kMinor, registerSession, nullptr, 0);
    snmp_register_callback(kMajor, kMinor, notifyTable_register_notifications, nullptr);
}

int Informs::registerSession(int /*major*/, int /*minor*/, void* arguments, void* /*none*/) {
    if (current != nullptr)
        current->m_sessions.push_back(static_cast<agent_add_trap_args*>(arguments)->ss);
    return SNMPERR_SUCCESS;
}

void Informs::closeAll() {
    for (auto const& [number, flight] : std::exchange(m_pending, {})) {
        flight->acknowledged = false;
        if (--flight->pending == 0 && flight->settled) flight->settled(false);
    }
    stop();
}

void Informs::stop() {
    m_pending.clear();
    for (snmp_session* const session : std::exchange(m_sessions, {}))
        snmp_close(session);
}

Informs::Fate Informs::follow(std::function<void()> const& send,
                              std::function<void(bool)> settled) {
    auto const flight = std::make_shared<Flight>();
    m_flight = flight;
    send();
    m_flight.reset();
    if (flight->refused) return Fate::Refused;
    if (flight->pending == 0) return flight->acknowledged ? Fate::Done : Fate::Refused;
    flight->settled = std::move(settled);
    return Fate::Pending;
}

int Informs::sendTrap(int /*major*/, int /*minor*/, void* notification, void* /*none*/) {
    if (current != nullptr) current->send(*static_cast<snmp_pdu const*>(notification));
    return SNMPERR_SUCCESS;
}

void Informs::send(snmp_pdu const& notification) {
    auto const flight = m_flight ? m_flight : std::make_shared<Flight>();
    for (snmp_session* const session : m_sessions) {
        if (m_pending.size() >= kMostPending) {
            flight->refused = true;
            return;
        }
        snmp_pdu* const inform = snmp_pdu_create(SNMP_MSG_INFORM);
        if (inform == nullptr) std::abort();
        inform->variables = snmp_clone_varbind(notification.variables);
        std::uintptr_t const number = ++m_last;
        m_pending.emplace(number, flight);
        ++flight->pending;
        // NOLINTNEXTLINE(performance-no-int-to-ptr): the library keeps it and hands it back
        void* const magic = reinterpret_cast<void*>(number);
        if (snmp_async_send(session, inform, takeAnswer, magic) != 0) continue;
        snmp_free_pdu(inform);
        end(number, false);
    }
}

int Informs::takeAnswer(int operation, snmp_session* /*session*/, int /*request*/, snmp_pdu* answer,
                        void* number) {
    // The library tries again by itself.
    if (operation == NETSNMP_CALLBACK_OP_RESEND || current == nullptr) return 1;
    bool const acknowledged = operation == NETSNMP_CALLBACK_OP_RECEIVED_MESSAGE &&
                              answer != nullptr && answer->command == SNMP_MSG_RESPONSE &&
                              answer->errstat == SNMP_ERR_NOERROR;
    current->end(reinterpret_cast<std::uintptr_t>(number), acknowledged);
    return 1;
}

void Informs::end(std::uintptr_t number, bool acknowledged) {
    auto const found = m_pending.find(number);
    if (found == m_pending.end()) return;
    auto const flight = std::move(found->second);
    m_pending.erase(found);
    flight->acknowledged = flight->acknowledged && acknowledged;
    if (--flight->pending == 0 && flight->settled) flight->settled(flight->acknowledged);
}

} // namespace kvloamd
