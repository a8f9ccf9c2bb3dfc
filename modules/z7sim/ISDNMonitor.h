// SPDX-License-Identifier: BSD-2-Clause
// The platform's messages about ISDN channels, handed to the features that have them.
#pragma once

#include <map>
#include <mutex>
#include <vector>

#include "Z7SimISDNFeature.h"
#include "boardplatform/vqx_event_service.h"

/// Subscribed to the messages of all trunks, once per process and for good. It keeps the features
/// that are added until they are removed. Any thread may add and remove, also from within a
/// callback: no lock is held while listeners are told.
class ISDNMonitor final : public VqxEventService::CEventHandlerAdaptor {
  public:
    /// The single instance, made and subscribed by the first call; never destroyed.
    static ISDNMonitor& instance();

    /// Messages reach the feature from now on.
    void add(ReferenceCounter<Z7SimISDNFeature> const& feature);
    /// No message that comes from now on reaches the feature; one under way on another thread may.
    void remove(Z7SimISDNFeature const& feature);
    /// Called by the platform. Returns 1.
    int HandleEvent(AdminCallbackMsg* message, void* context) override;

  private:
    using Handle = ReferenceCounter<Z7SimISDNFeature>;

    ISDNMonitor();
    std::vector<Handle> featuresOf(long device);

    std::mutex m_mutex; ///< guards the map
    /// By trunk. A device that two factories of the process serve has two features.
    std::multimap<long, Handle> m_features;
    VqxEventService::VqxAdminConsumer* m_consumer = nullptr; ///< never destroyed
};
