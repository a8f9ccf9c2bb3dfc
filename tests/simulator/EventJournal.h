// SPDX-License-Identifier: BSD-2-Clause
// Records the events of boards, their faults and their ISDN channels.
#pragma once

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "boardplatform/isdn_channels.h"
#include "boardplatform/vqx_event_service.h"
#include "simulator/exports/Control.h"

namespace support {

/// An `EventJournal` is a consumer that records events. Unsynchronised: they are read after a
/// drain.
class EventJournal final : public VqxEventService::CEventHandlerAdaptor {
  public:
    EventJournal() {
        subscribe("ADMIN", {0x40005, 0x40007, kISDNBearerChanged, kISDNSignallingChanged});
        subscribe("FAULT", {0x30001, 0x30002});
    }

    int HandleEvent(AdminCallbackMsg* message, void*) override {
        std::array<char, 80> line{};
        ISDNChannelMsg channel{};
        std::uint16_t fault = 0;
        bool const isChannel = message->id >> 16 == 5;
        std::memcpy(&channel, message->payload, isChannel ? sizeof channel : 4);
        std::memcpy(&fault, static_cast<char*>(message->payload) + 4, sizeof fault);
        if (isChannel)
            std::snprintf(line.data(), line.size(), "%X board %d device %d channel %d is %d",
                          message->id, channel.board, channel.device, channel.channel,
                          channel.state);
        else if (message->id >> 16 == 3)
            std::snprintf(line.data(), line.size(), "%X board %d value %04X", message->id,
                          channel.board, fault);
        else
            std::snprintf(line.data(), line.size(), "%X board %d", message->id, channel.board);
        m_lines.emplace_back(line.data());
        return 1;
    }

    /// The events since the last call.
    std::vector<std::string> take() {
        EXPECT_EQ(kvlsim::execute({{"command", "drain"}})["ok"], true);
        return std::exchange(m_lines, {}); // the drain orders this after the handler's calls
    }

  private:
    void subscribe(char const* channel, std::vector<std::uint32_t> const& ids) {
        std::vector<VqxEventService::AdminConsumer::FilterCallbackAssoc> filters;
        for (std::uint32_t const id : ids)
            filters.push_back({this, nullptr, id, 1});
        m_consumers.push_back(std::make_unique<VqxEventService::VqxAdminConsumer>(
            channel, L"EventJournal", filters.data(), static_cast<int>(filters.size()), nullptr,
            0));
        EXPECT_EQ(m_consumers.back()->Start(), 0);
    }

    std::vector<std::string> m_lines;
    std::vector<std::unique_ptr<VqxEventService::VqxAdminConsumer>> m_consumers;
};

} // namespace support
