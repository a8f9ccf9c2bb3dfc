// SPDX-License-Identifier: BSD-2-Clause
// The T1 line of a card, its interval table, and the feature that contains it.
#pragma once

#include <cstring>
#include <memory>
#include <string>
#include <utility>

#include "Rack.h"
#include "kvloam.h"

inline int putText(std::string const& text, char* place) {
    std::memcpy(place, text.c_str(), text.size() + 1);
    return 0;
}

/// An interval table that counts what the card's reading has gained every second, on the scheduler
/// thread. The reading is in memory, so a tick never waits.
class RackIntervalTable final : public DS1IntervalTable {
  public:
    explicit RackIntervalTable(std::shared_ptr<Card> card)
        : m_card(std::move(card)), m_last(m_card->violations) {}
    /// Waits for a tick under way before any member is destroyed.
    ~RackIntervalTable() override { ActionScheduler_pthread::GetScheduler()->Remove(this); }

    int GetControlledSlipSeconds(int) override { return 0; }
    int GetDegradedMinutes(int) override { return 0; }
    int CollectSecond() override {
        long const violations = m_card->violations;
        if (violations > m_last) {
            m_current.ErrorSeconds += 1;
            m_current.PathCodingViolations += static_cast<std::int32_t>(violations - m_last);
        }
        m_last = violations;
        m_timeElapsed += 1;
        return 0;
    }
    int CloseInterval() override {
        ArchiveInterval(m_current);
        m_current = DS1Interval();
        return CollectSecond();
    }

  private:
    std::shared_ptr<Card> const m_card;
    long m_last;
};

/// The T1 line. The values are those of IF-MIB and DS1-MIB. Every query is thread-safe and answers
/// at once.
class RackLine final : public DS1LineDevice {
  public:
    explicit RackLine(std::shared_ptr<Card> card)
        : m_name(card->serialNumber + " trunk"), m_intervals(new RackIntervalTable(card)) {}

    int GetDescription(std::string& text) override {
        text = "T1 line " + m_name;
        return 0;
    }
    int GetType() override { return 18; } // ds1
    int GetMTU() override { return KVL::kNotSupported; }
    int GetSpeed() override { return 1544000; }
    int GetAdminStatus() override { return 1; }
    int SetAdminStatus(int) override { return KVL::kNotSupported; }
    int GetOperStatus() override { return 1; }
    int GetLastChange(int&, int&) override { return KVL::kNotSupported; }
    int GetInOctets() override { return KVL::kNotSupported; }
    int GetInUcastPkts() override { return KVL::kNotSupported; }
    int GetInDiscards() override { return KVL::kNotSupported; }
    int GetInErrors() override { return KVL::kNotSupported; }
    int GetInUnknownProtos() override { return KVL::kNotSupported; }
    int GetOutOctets() override { return KVL::kNotSupported; }
    int GetOutUcastPkts() override { return KVL::kNotSupported; }
    int GetOutDiscards() override { return KVL::kNotSupported; }
    int GetOutErrors() override { return KVL::kNotSupported; }

    int GetName(char* name) override { return putText(m_name, name); }
    int GetLineIndex() override { return 1; }
    ReferenceCounter<DS1IntervalTable> GetIntervalTable() override { return m_intervals; }
    int GetLineType() override { return 2; }   // ESF
    int GetLineCoding() override { return 2; } // B8ZS
    int GetSendCode() override { return 1; }
    int GetCircuitIdentifier(char* text) override { return putText("", text); }
    int GetLoopbackConfig() override { return 1; }
    int GetLineStatus() override { return DS1LineStatusNoAlarm; }
    int GetSignalMode() override { return 4; } // message oriented
    int GetPhysAddressString(char* text) override { return putText("", text); }
    int GetTransmitClockSource() override { return 1; }
    int GetFdl() override { return 2; }
    int GetLineLength() override { return 0; }
    long GetLineStatusLastChange() override { return 0; }
    int GetLineStatusChangeTrapEnable() override { return 2; }
    int SetLineStatusChangeTrapEnable(int) override { return KVL::kNotSupported; }
    int GetLoopbackStatus() override { return 1; }
    int GetDs1ChannelNumber() override { return 0; }
    int GetChannelization() override { return 2; } // DS0s
    int GetLineMode() override { return 1; }
    int GetLineBuildOut() override { return 1; }

  private:
    std::string const m_name;
    ReferenceCounter<DS1IntervalTable> const m_intervals;
};

/// The line of a card. Complete before it is added to the board, and not changed afterwards.
class RackLineFeature final : public DS1LineFeatureZ7 {
  public:
    explicit RackLineFeature(ReferenceCounter<DS1LineDevice> const& line) {
        SetFeatureName("DS1");
        m_lines.push_back(line);
    }
    int GetNumberOfLines() override { return 1; }
};
