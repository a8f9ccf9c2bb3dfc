// SPDX-License-Identifier: BSD-2-Clause
#include "access/ExternalEventAdaptor.h"

#include <cstdio>
#include <cstring>

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
    if (m_eventAdaptor == nullptr) {
        m_eventAdaptor = new ExternalEventAdaptor;
        // One handle that nobody drops keeps the instance.
        static auto const* const keeper =
            new ReferenceCounter<ExternalEventAdaptor>(m_eventAdaptor);
        static_cast<void>(keeper);
    }
    return {m_eventAdaptor};
}

void ExternalEventAdaptor::register_for_events() {
    VqxEventService::AdminConsumer::FilterCallbackAssoc filters[] = {
        {this, nullptr, AdminBoardStarted, 1},      {this, nullptr, AdminBoardStopped, 1},
        {this, nullptr, AdminAllStarted, 1},        {this, nullptr, AdminAllStopped, 1},
        {this, nullptr, AdminAllStartPending, 1},   {this, nullptr, AdminAllStopPending, 1},
        {this, nullptr, AdminBoardGone, 1},         {this, nullptr, AdminBoardFailed, 1},
        {this, nullptr, AdminBoardStartPending, 1}, {this, nullptr, AdminBoardStopPending, 1},
    };
    m_consumer = new VqxEventService::VqxAdminConsumer("ADMIN", L"SNMPMonitor", filters,
                                                       std::size(filters), nullptr, 0);
    m_consumer->Start();
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
    if (id < AdminAllStarted || id > AdminBoardStopPending) {
        std::printf("UNKNOWN MSG:%u\n", id);
        return 1;
    }
    std::int32_t board = 0;
    if (id >= AdminBoardGone) std::memcpy(&board, message->payload, sizeof board);
    NotifyExternalEventListeners(ReferenceCounter<ExternalEvent>(new ExternalEvent(id, board)));
    return 1;
}
