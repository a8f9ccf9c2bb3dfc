// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a card's trunk, and the feature that contains them.
#pragma once

#include "RackLine.h"

/// A bearer channel. Its state is that of the card's last reading.
class RackBearer final : public ISDNBChannelZ7, public ISDNChannelOnLine {
  public:
    RackBearer(std::shared_ptr<Card> card, ReferenceCounter<DS1LineDevice> line, int timeSlot)
        : ISDNBChannelZ7(("B" + std::to_string(timeSlot)).c_str()),
          m_card(std::move(card)),
          m_line(std::move(line)),
          m_timeSlot(timeSlot) {}

    int GetChannelType() override { return 1; } // dial-up
    int GetOperStatus() override {
        return m_timeSlot <= m_card->calls ? ISDNBChannelStatusActive : ISDNBChannelStatusIdle;
    }
    int GetChannelNumber() override { return m_timeSlot; }
    ReferenceCounter<DS1LineDevice> GetLine() override { return m_line; }

  private:
    std::shared_ptr<Card> const m_card;
    ReferenceCounter<DS1LineDevice> const m_line;
    int const m_timeSlot;
};

/// The signalling channel.
class RackSignalling final : public ISDNDChannelZ7, public ISDNChannelOnLine {
  public:
    static constexpr int kBearers = 23;

    explicit RackSignalling(ReferenceCounter<DS1LineDevice> line)
        : ISDNDChannelZ7("D"), m_line(std::move(line)) {}

    int GetProtocol() override { return KVL::kNotSupported; }
    int GetOperStatus() override { return ISDNDChannelStatusL2Active; }
    int GetBChannelCount() override { return kBearers; }
    int GetCallingAddress(char* address) override { return putText("", address); }
    ReferenceCounter<DS1LineDevice> GetLine() override { return m_line; }

  private:
    ReferenceCounter<DS1LineDevice> const m_line;
};

/// The channels of a card. Complete before it is added to the board, and not changed afterwards.
class RackISDNFeature final : public ISDNFeatureZ7 {
  public:
    RackISDNFeature(std::shared_ptr<Card> const& card,
                    ReferenceCounter<DS1LineDevice> const& line) {
        SetFeatureName("ISDN");
        m_signallingChannels.emplace_back(new RackSignalling(line));
        for (int slot = 1; slot <= RackSignalling::kBearers; ++slot)
            m_bearerChannels.emplace_back(new RackBearer(card, line, slot));
    }
};
