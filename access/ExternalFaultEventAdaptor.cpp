// SPDX-License-Identifier: BSD-2-Clause
#include "access/ExternalFaultEventAdaptor.h"

#include <cstring>

#include "access/DevMapBoardIf.h"
#include "access/EventSubscription.h"

ExternalFaultEventAdaptor* ExternalFaultEventAdaptor::m_faultEventAdaptor = nullptr;

ExternalFaultEvent::ExternalFaultEvent(std::uint32_t id, std::int32_t board, std::uint16_t fault)
    : Object(false), m_id(id), m_board(board), m_fault(fault) {}

ExternalFaultEvent::~ExternalFaultEvent() = default;

std::uint32_t ExternalFaultEvent::GetEventID() {
    return m_id;
}

ExternalFaultEventAdaptor::ExternalFaultEventAdaptor() : Object(true) {
    register_for_events();
}

ExternalFaultEventAdaptor::~ExternalFaultEventAdaptor() {
    unregister_for_events();
}

ReferenceCounter<ExternalFaultEventAdaptor> ExternalFaultEventAdaptor::get_instance() {
    return KVL::only_adaptor(m_faultEventAdaptor, [] { return new ExternalFaultEventAdaptor; });
}

void ExternalFaultEventAdaptor::register_for_events() {
    m_consumer =
        KVL::subscribe(*this, "FAULT", L"SNMPFaultChannelMonitor", {FaultRaised, FaultCleared});
}

void ExternalFaultEventAdaptor::unregister_for_events() {}

int ExternalFaultEventAdaptor::AddExternalFaultEventListener(ExternalFaultEventListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

int ExternalFaultEventAdaptor::RemoveExternalFaultEventListener(
    ExternalFaultEventListener* listener) {
    ObjectGuard const guard(*this);
    return m_listeners.RemoveListener(listener);
}

int ExternalFaultEventAdaptor::NotifyExternalFaultEventListeners(
    ReferenceCounter<ExternalFaultEvent> event) {
    for_each_listener<ExternalFaultEventListener>(
        m_listeners, this,
        [&](ExternalFaultEventListener* listener) { listener->ProcessExternalFaultEvent(event); });
    return 0;
}

int ExternalFaultEventAdaptor::HandleEvent(AdminCallbackMsg* message, void* /*context*/) {
    std::uint32_t const id = message->id;
    if (id != FaultRaised && id != FaultCleared) return KVL::report_unknown_message(id);
    auto const* const payload = static_cast<unsigned char const*>(message->payload);
    std::int32_t auid = 0;
    std::uint16_t fault = 0;
    std::memcpy(&auid, payload, sizeof auid);
    std::memcpy(&fault, payload + sizeof auid, sizeof fault);

    DevMapBoardIf board(auid);
    long identifier = board.LogicalID();
    if (identifier == -1) identifier = board.VORNDriverBoardID();
    NotifyExternalFaultEventListeners(ReferenceCounter<ExternalFaultEvent>(
        new ExternalFaultEvent(id, static_cast<std::int32_t>(identifier), fault)));
    return 1;
}
