// SPDX-License-Identifier: BSD-2-Clause
// A channel status listener that remembers what it was told.
#pragma once

#include <mutex>
#include <string>
#include <vector>

#include "board/ISDNFeature.h"

/// Callable from any thread. Several logs may share one list, which then shows their order.
class ChannelLog final : public ISDNChannelStatusListener {
  public:
    using Entries = std::vector<std::string>;

    /// `who`: begins every entry, as in "feature B1.1 4".
    explicit ChannelLog(std::string who, Entries* entries) : m_who(who), m_entries(entries) {}

    int ProcessBChannelStatusEvent(ReferenceCounter<ISDNBChannelStatusEvent> event) override {
        add(*event->GetBChannel().get(), event->GetChannelStatus());
        return 0;
    }
    int ProcessDChannelStatusEvent(ReferenceCounter<ISDNDChannelStatusEvent> event) override {
        add(*event->GetDChannel().get(), event->GetChannelStatus());
        return 0;
    }

  private:
    template <class Channel>
    void add(Channel& channel, int status) {
        char name[64];
        channel.GetName(name);
        // The channel is in the new state already when listeners hear of it.
        std::string const state =
            channel.GetOperStatus() == status ? std::to_string(status) : "not yet";
        m_entries->push_back(m_who + " " + name + " " + state);
    }

    std::string m_who;
    Entries* m_entries;
};
