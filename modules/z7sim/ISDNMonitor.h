// SPDX-License-Identifier: BSD-2-Clause
// The platform's messages about ISDN channels, delivered to the features that have them.
#pragma once

#include <cstdint>

#include <map>
#include <mutex>
#include <vector>

#include "boardplatform/isdn_channels.h"
#include "boardplatform/vqx_event_service.h"
#include "core/ReferenceCounter.h"
#include "z7/ISDNFeatureZ7.h"

/// An `ISDNMessageReceiver` takes the messages about its trunks.
class ISDNMessageReceiver {
  public:
    /// Called on the platform's delivery thread, one message after the other.
    virtual void apply(std::uint32_t id, ISDNChannelMsg const& message) = 0;

  protected:
    ~ISDNMessageReceiver() = default;
};

/// The `ISDNMonitor` is subscribed to the messages of all trunks, once per process and for good. It
/// keeps the features that are added until they are removed.
///
/// Thread-safe, also from within a callback: no lock is held while a receiver is called.
class ISDNMonitor final : public VqxEventService::CEventHandlerAdaptor {
  public:
    /// The single instance, made and subscribed by the first call; never destroyed.
    static ISDNMonitor& instance();

    /// Delivers the messages of these trunks to `receiver` from now on. `feature` owns it, and is
    /// kept meanwhile.
    void add(std::vector<long> const& trunks, ReferenceCounter<ISDNFeatureZ7> const& feature,
             ISDNMessageReceiver& receiver);
    /// Delivers nothing that comes from now on; a message under way on another thread may still
    /// arrive.
    void remove(ISDNMessageReceiver const& receiver);
    /// Called by the platform. Returns 1.
    int HandleEvent(AdminCallbackMsg* message, void* context) override;

  private:
    struct Entry {
        ReferenceCounter<ISDNFeatureZ7> feature;
        ISDNMessageReceiver* receiver;
    };

    ISDNMonitor();
    std::vector<Entry> receiversOf(long device);

    std::mutex m_mutex; ///< guards the map
    /// By trunk. A device that two factories of the process serve has two features.
    std::multimap<long, Entry> m_receivers;
    VqxEventService::VqxAdminConsumer* m_consumer = nullptr; ///< never destroyed
};
