// SPDX-License-Identifier: BSD-2-Clause
// The board platform's fault messages, turned into events for listeners.
#pragma once

#include <cstdint>

#include "boardplatform/vqx_event_service.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// The messages of the channel "FAULT".
enum FaultMessage : std::uint32_t { FaultRaised = 0x30001, FaultCleared = 0x30002 };

/// An `ExternalFaultEvent` is one fault message.
class KVLOAM_API ExternalFaultEvent : public Object {
  public:
    ExternalFaultEvent(std::uint32_t id, std::int32_t board, std::uint16_t fault);
    ~ExternalFaultEvent() override;

    /// The platform's message identifier.
    virtual std::uint32_t GetEventID();

    /// The board's logical identifier, or its driver board identifier if it has no logical one.
    std::int32_t GetBoardID() const { return m_board; }
    /// The platform's fault value, unchanged.
    std::uint16_t GetFault() const { return m_fault; }

  private:
    std::uint32_t m_id;
    std::int32_t m_board;
    std::uint16_t m_fault;
};

/// An `ExternalFaultEventListener` receives fault messages, on the platform's delivery thread.
class KVLOAM_API ExternalFaultEventListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) = 0;

  protected:
    ~ExternalFaultEventListener() = default;
};

/// The `ExternalFaultEventAdaptor` subscribes to the channel "FAULT" and passes its messages to the
/// listeners, one after the other, on the platform's delivery thread. Thread-safe once the first
/// `get_instance()` has returned. Its lock is never held during a callback.
class KVLOAM_API ExternalFaultEventAdaptor final : public Object,
                                                   public VqxEventService::CEventHandlerAdaptor {
  public:
    /// The single instance, created and subscribed by the first call. It lives as long as the
    /// process, even if every returned handle is dropped.
    static ReferenceCounter<ExternalFaultEventAdaptor> get_instance();

    ~ExternalFaultEventAdaptor() override;
    /// Called by the platform. Returns 1.
    int HandleEvent(AdminCallbackMsg* message, void* context) override;

    void register_for_events();
    /// Does nothing: the subscription lasts as long as the process.
    void unregister_for_events();
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    int AddExternalFaultEventListener(ExternalFaultEventListener* listener);
    /// Returns 0, or 1 if `listener` is not among the listeners. A notification under way on
    /// another thread may still reach it.
    int RemoveExternalFaultEventListener(ExternalFaultEventListener* listener);
    /// Returns 0.
    int NotifyExternalFaultEventListeners(ReferenceCounter<ExternalFaultEvent> event);

  private:
    ExternalFaultEventAdaptor();

    ListenerTable m_listeners;
    VqxEventService::VqxAdminConsumer* m_consumer = nullptr;

    static ExternalFaultEventAdaptor* m_faultEventAdaptor;
};
