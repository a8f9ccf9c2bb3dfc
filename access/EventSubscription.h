// SPDX-License-Identifier: BSD-2-Clause
// What the two event adaptors have in common.
#pragma once

#include <cstdint>
#include <initializer_list>

#include "boardplatform/vqx_event_service.h"
#include "core/ReferenceCounter.h"

namespace KVL {

/// Subscribes `handler` to the messages `ids` of `channel`, in their order, and begins their
/// delivery. The subscription lasts as long as the process.
VqxEventService::VqxAdminConsumer* subscribe(VqxEventService::CEventHandlerAdaptor& handler,
                                             char const* channel, wchar_t const* consumer,
                                             std::initializer_list<std::uint32_t> ids);

/// Prints that no event has the identifier `id`, on standard output. Returns what `HandleEvent`
/// returns.
int report_unknown_message(std::uint32_t id);

/// A handle of the adaptor at `instance`, which the first call creates by `make`. One handle that
/// is never dropped keeps the adaptor.
template <class Adaptor, class Make>
ReferenceCounter<Adaptor> only_adaptor(Adaptor*& instance, Make const& make) {
    static ReferenceCounter<Adaptor> const* keeper = nullptr;
    if (instance == nullptr) {
        keeper = new ReferenceCounter<Adaptor>(make());
        instance = keeper->get();
    }
    return {instance};
}

} // namespace KVL
