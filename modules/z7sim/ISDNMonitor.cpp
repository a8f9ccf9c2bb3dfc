// SPDX-License-Identifier: BSD-2-Clause
#include "ISDNMonitor.h"

#include <cstring>

#include <iterator>

ISDNMonitor& ISDNMonitor::instance() {
    static auto* const s_instance = new ISDNMonitor;
    return *s_instance;
}

ISDNMonitor::ISDNMonitor() {
    VqxEventService::AdminConsumer::FilterCallbackAssoc filters[] = {
        {this, nullptr, kISDNBearerChanged, 1},
        {this, nullptr, kISDNSignallingChanged, 1},
    };
    m_consumer = new VqxEventService::VqxAdminConsumer("ADMIN", L"ISDNMonitor", filters,
                                                       std::size(filters), nullptr, 0);
    m_consumer->Start();
}

void ISDNMonitor::add(ReferenceCounter<Z7SimISDNFeature> const& feature) {
    std::scoped_lock const guard(m_mutex);
    for (long const device : feature->trunks())
        m_features.emplace(device, feature);
}

void ISDNMonitor::remove(Z7SimISDNFeature const& feature) {
    std::vector<Handle> dropped; // the last handle may go with it, after the lock was given back
    std::scoped_lock const guard(m_mutex);
    for (long const device : feature.trunks()) {
        auto [entry, end] = m_features.equal_range(device);
        while (entry != end) {
            if (entry->second.get() != &feature) {
                ++entry;
                continue;
            }
            dropped.push_back(entry->second);
            entry = m_features.erase(entry);
        }
    }
}

std::vector<ISDNMonitor::Handle> ISDNMonitor::featuresOf(long device) {
    std::vector<Handle> features;
    std::scoped_lock const guard(m_mutex);
    auto const [first, last] = m_features.equal_range(device);
    for (auto entry = first; entry != last; ++entry)
        features.push_back(entry->second);
    return features;
}

int ISDNMonitor::HandleEvent(AdminCallbackMsg* message, void* /*context*/) {
    if (message->payload == nullptr) return 1;
    ISDNChannelMsg change;
    std::memcpy(&change, message->payload, sizeof change);
    for (auto const& feature : featuresOf(change.device))
        feature->apply(message->id, change);
    return 1;
}
