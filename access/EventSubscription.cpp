// SPDX-License-Identifier: BSD-2-Clause
#include "access/EventSubscription.h"

#include <cstdio>
#include <vector>

namespace KVL {

VqxEventService::VqxAdminConsumer* subscribe(VqxEventService::CEventHandlerAdaptor& handler,
                                             char const* channel, wchar_t const* consumer,
                                             std::initializer_list<std::uint32_t> ids) {
    std::vector<VqxEventService::AdminConsumer::FilterCallbackAssoc> filters;
    filters.reserve(ids.size());
    for (std::uint32_t const id : ids)
        filters.push_back({&handler, nullptr, id, 1});
    auto* const subscription = new VqxEventService::VqxAdminConsumer(
        channel, consumer, filters.data(), static_cast<int>(filters.size()), nullptr, 0);
    subscription->Start();
    return subscription;
}

int report_unknown_message(std::uint32_t id) {
    std::printf("UNKNOWN MSG:%u\n", id);
    return 1;
}

} // namespace KVL
