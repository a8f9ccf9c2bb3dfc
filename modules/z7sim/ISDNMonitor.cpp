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

void ISDNMonitor::add(std::vector<long> const& trunks,
                      ReferenceCounter<ISDNFeatureZ7> const& feature,
                      ISDNMessageReceiver& receiver) {
    std::scoped_lock const guard(m_mutex);
    for (long const device : trunks)
        m_receivers.emplace(device, Entry{feature, &receiver});
}

void ISDNMonitor::remove(ISDNMessageReceiver const& receiver) {
    std::vector<Entry> dropped; // the last handle may go with it, after the lock has been released
    std::scoped_lock const guard(m_mutex);
    for (auto entry = m_receivers.begin(); entry != m_receivers.end();) {
        if (entry->second.receiver != &receiver) {
            ++entry;
            continue;
        }
        dropped.push_back(entry->second);
        entry = m_receivers.erase(entry);
    }
}

std::vector<ISDNMonitor::Entry> ISDNMonitor::receiversOf(long device) {
    std::vector<Entry> receivers;
    std::scoped_lock const guard(m_mutex);
    auto const [first, last] = m_receivers.equal_range(device);
    for (auto entry = first; entry != last; ++entry)
        receivers.push_back(entry->second);
    return receivers;
}

int ISDNMonitor::HandleEvent(AdminCallbackMsg* message, void* /*context*/) {
    if (message->payload == nullptr) return 1;
    ISDNChannelMsg change;
    std::memcpy(&change, message->payload, sizeof change);
    for (auto const& entry : receiversOf(change.device))
        entry.receiver->apply(message->id, change);
    return 1;
}
