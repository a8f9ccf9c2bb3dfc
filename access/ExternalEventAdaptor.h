// SPDX-License-Identifier: BSD-2-Clause
// The board platform's administrative messages, turned into events for listeners.
#pragma once

#include <cstdint>

#include "boardplatform/vqx_event_service.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// The messages of the channel "ADMIN". Those from `AdminBoardGone` on concern one board and carry
/// its identifier.
enum AdminMessage : std::uint32_t {
    AdminAllStarted = 0x40001,      ///< boards may have come or gone; all have started
    AdminAllStopped = 0x40002,      ///< all have stopped
    AdminAllStartPending = 0x40003, ///< all are about to start
    AdminAllStopPending = 0x40004,  ///< all are about to stop
    AdminBoardGone = 0x40005,       ///< boards may have come or gone; the board has stopped
    AdminBoardFailed = 0x40006,
    AdminBoardStarted = 0x40007, ///< boards may have come or gone; the board has started
    AdminBoardStopped = 0x40008,
    AdminBoardStartPending = 0x40009,
    AdminBoardStopPending = 0x4000A
};

/// An `ExternalEvent` is one administrative message.
class KVLOAM_API ExternalEvent : public Object {
  public:
    ExternalEvent(std::uint32_t id, std::int32_t data);
    ~ExternalEvent() override;

    /// The platform's message identifier.
    virtual std::uint32_t GetEventID();

    /// The board identifier of a message that concerns one board, else 0.
    std::int32_t GetData() const { return m_data; }

  private:
    std::uint32_t m_id;
    std::int32_t m_data;
};

/// An `ExternalEventListener` receives administrative messages, on the platform's delivery thread.
class KVLOAM_API ExternalEventListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessExternalEvent(ReferenceCounter<ExternalEvent> event) = 0;

  protected:
    ~ExternalEventListener() = default;
};

/// The `ExternalEventAdaptor` subscribes to the channel "ADMIN" and passes its messages to the
/// listeners, one after the other, on the platform's delivery thread. Thread-safe once the first
/// `get_instance()` has returned. Its lock is never held during a callback.
class KVLOAM_API ExternalEventAdaptor final : public Object,
                                              public VqxEventService::CEventHandlerAdaptor {
  public:
    /// The single instance, created and subscribed by the first call. It lives as long as the
    /// process, even if every returned handle is dropped.
    static ReferenceCounter<ExternalEventAdaptor> get_instance();

    ~ExternalEventAdaptor() override;
    /// Called by the platform. Returns 1.
    int HandleEvent(AdminCallbackMsg* message, void* context) override;

    void register_for_events();
    /// Does nothing: the subscription lasts as long as the process.
    void unregister_for_events();
    /// Adds `listener`, once. Returns 0. The listener is not owned and cannot be removed.
    int AddExternalEventListener(ExternalEventListener* listener);
    /// Returns 0.
    int NotifyExternalEventListeners(ReferenceCounter<ExternalEvent> event);

  private:
    ExternalEventAdaptor();

    ListenerTable m_listeners;
    VqxEventService::VqxAdminConsumer* m_consumer = nullptr;

    static ExternalEventAdaptor* m_eventAdaptor;
};
