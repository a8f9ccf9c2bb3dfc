// SPDX-License-Identifier: BSD-2-Clause
#include "access/ExternalEventAdaptor.h"

#include <cstring>

#include "access/EventSubscription.h"

ExternalEventAdaptor* ExternalEventAdaptor::m_eventAdaptor = nullptr;

ExternalEvent::ExternalEvent(std::uint32_t id, std::int32_t data)
    : Object(false), m_id(id), m_data(data) {}

ExternalEvent::~ExternalEvent() = default;

std::uint32_t ExternalEvent::GetEventID() {
    return m_id;
}

ExternalEventAdaptor::ExternalEventAdaptor() : Object(true) {
    register_for_events();
}

ExternalEventAdaptor::~ExternalEventAdaptor() {
    unregister_for_events();
}

ReferenceCounter<ExternalEventAdaptor> ExternalEventAdaptor::get_instance() {
    return KVL::only_adaptor(m_eventAdaptor, [] { return new ExternalEventAdaptor; });
}

void ExternalEventAdaptor::register_for_events() {
    m_consumer =
        KVL::subscribe(*this, "ADMIN", L"SNMPMonitor",
                       {AdminBoardStarted, AdminBoardStopped, AdminAllStarted, AdminAllStopped,
                        AdminAllStartPending, AdminAllStopPending, AdminBoardGone, AdminBoardFailed,
                        AdminBoardStartPending, AdminBoardStopPending});
}

void ExternalEventAdaptor::unregister_for_events() {}

int ExternalEventAdaptor::AddExternalEventListener(ExternalEventListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

int ExternalEventAdaptor::NotifyExternalEventListeners(ReferenceCounter<ExternalEvent> event) {
    for_each_listener<ExternalEventListener>(
        m_listeners, this,
        [&](ExternalEventListener* listener) { listener->ProcessExternalEvent(event); });
    return 0;
}

int ExternalEventAdaptor::HandleEvent(AdminCallbackMsg* message, void* /*context*/) {
    std::uint32_t const id = message->id;
    if (id < AdminAllStarted || id > AdminBoardStopPending) return KVL::report_unknown_message(id);
    std::int32_t board = 0;
    if (id >= AdminBoardGone) std::memcpy(&board, message->payload, sizeof board);
    NotifyExternalEventListeners(ReferenceCounter<ExternalEvent>(new ExternalEvent(id, board)));
    return 1;
}
