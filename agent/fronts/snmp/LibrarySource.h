// SPDX-License-Identifier: BSD-2-Clause
// The SNMP library's descriptors and timers in the agent's event loop.
#pragma once

#include "agent/fronts/EventLoop.h"

namespace kvloamd {

/// A `LibrarySource` lets the SNMP library read its descriptors and run its timers. Thread-bound to
/// the SNMP thread; used while the library is started.
class LibrarySource final : public EventLoop::Source {
  public:
    std::optional<Clock::time_point> prepare(std::vector<pollfd>& polled) override;
    void handle(std::span<pollfd const> polled) override;
};

} // namespace kvloamd
