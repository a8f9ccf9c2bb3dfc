// SPDX-License-Identifier: BSD-2-Clause
// Fault messages of the board platform, turned into events for listeners.
#pragma once

#include <cstdint>

#include "boardplatform/vqx_event_service.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// The messages of the channel "FAULT".
enum FaultMessage : std::uint32_t { FaultRaised = 0x30001, FaultCleared = 0x30002 };

/// One fault message.
class KVLOAM_API ExternalFaultEvent : public Object {
  public:
    ExternalFaultEvent(std::uint32_t id, std::int32_t board, std::uint16_t fault);
    ~ExternalFaultEvent() override;

    /// The platform's message identifier.
    virtual std::uint32_t GetEventID();

    /// The board's logical identifier, or its driver board identifier where it has no logical one.
    std::int32_t GetBoardID() const { return m_board; }
    /// The platform's fault value, unchanged.
    std::uint16_t GetFault() const { return m_fault; }

  private:
    std::uint32_t m_id;
    std::int32_t m_board;
    std::uint16_t m_fault;
};

/// Told of fault messages, on the platform's delivery thread.
class KVLOAM_API ExternalFaultEventListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) = 0;

  protected:
    ~ExternalFaultEventListener() = default;
};

/// Subscribes to the channel "FAULT" and hands its messages to listeners, one after the other, on
/// the platform's delivery thread. Listeners may be added and removed from any thread; its lock is
/// never held during a callback.
class KVLOAM_API ExternalFaultEventAdaptor final : public Object,
                                                   public VqxEventService::CEventHandlerAdaptor {
  public:
    /// The single instance, made and subscribed by the first call, which must return before several
    /// threads use it. It lives as long as the process, whatever becomes of the returned handles.
    static ReferenceCounter<ExternalFaultEventAdaptor> get_instance();

    ~ExternalFaultEventAdaptor() override;
    /// Called by the platform. Returns 1.
    int HandleEvent(AdminCallbackMsg* message, void* context) override;

    void register_for_events();
    /// Does nothing: the subscription lasts as long as the process.
    void unregister_for_events();
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    int AddExternalFaultEventListener(ExternalFaultEventListener* listener);
    /// Returns 0, or 1 when `listener` is not among the listeners. A notification under way on
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
