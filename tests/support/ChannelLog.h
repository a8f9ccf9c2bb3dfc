// SPDX-License-Identifier: BSD-2-Clause
// A listener that records channel status events.
#pragma once

#include <functional>
#include <utility>
#include <vector>

#include "board/ISDNChannel.h"

class ChannelLog final : public ISDNChannelStatusListener {
  public:
    int ProcessBChannelStatusEvent(ReferenceCounter<ISDNBChannelStatusEvent> event) override {
        bearer.push_back(std::move(event));
        if (meanwhile) meanwhile();
        return 0;
    }
    int ProcessDChannelStatusEvent(ReferenceCounter<ISDNDChannelStatusEvent> event) override {
        signalling.push_back(std::move(event));
        if (meanwhile) meanwhile();
        return 0;
    }

    std::vector<ReferenceCounter<ISDNBChannelStatusEvent>> bearer;
    std::vector<ReferenceCounter<ISDNDChannelStatusEvent>> signalling;
    /// Called during every notification, where set.
    std::function<void()> meanwhile;
};
