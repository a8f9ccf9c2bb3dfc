// SPDX-License-Identifier: BSD-2-Clause
// The board's T1 line, its interval table, and the feature that contains it.
#pragma once

#include <cstring>
#include <string>

#include "boardplatform/ds1_line.h"
#include "kvloam.h"

// Most operations store their answer in a variable of the caller's and return 0.
template <class Value, class Place>
int put(Value const& value, Place& place) {
    place = value;
    return 0;
}
inline int putText(std::string const& text, char* place) {
    std::memcpy(place, text.c_str(), text.size() + 1);
    return 0;
}

/// An interval table that reads the card's counters once a second, on the scheduler thread. It
/// counts errored seconds only; a real one counts more.
class SpanIntervalTable final : public DS1IntervalTable {
  public:
    explicit SpanIntervalTable(long device) : m_device(device) { read(); }
    /// Waits for a tick under way before any member is destroyed.
    ~SpanIntervalTable() override { ActionScheduler_pthread::GetScheduler()->Remove(this); }

    int GetControlledSlipSeconds(int) override { return 0; }
    int GetDegradedMinutes(int) override { return 0; }
    int CollectSecond() override {
        auto const before = m_last.pathCodeViolations;
        read();
        if (m_last.pathCodeViolations != before) m_current.ErrorSeconds += 1;
        m_timeElapsed += 1;
        return 0;
    }
    int CloseInterval() override {
        ArchiveInterval(m_current);
        m_current = DS1Interval();
        return CollectSecond(); // the tick that closes an interval also counts a second
    }

  private:
    /// If the card does not answer, the counters keep their values.
    void read() {
        DMAttribute request{kDS1LineCounters, &m_last, 0, 0, sizeof m_last};
        DeviceMapperIf::get_interface()->GetDMClient()->GetAttributes(m_device, 1, &request);
    }

    long m_device;
    DS1LineCounters m_last{};
};

/// A T1 line. The values are those of IF-MIB and DS1-MIB. Every query is thread-safe and answers at
/// once.
class SpanLine final : public DS1LineDevice {
  public:
    explicit SpanLine(long device)
        : m_name(DevMapDeviceIf(device).Name()), m_intervals(new SpanIntervalTable(device)) {}

    int GetDescription(std::string& text) override { return put("T1 line " + m_name, text); }
    int GetType() override { return 18; }
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
    int GetSignalMode() override { return 1; }
    int GetPhysAddressString(char* text) override { return putText("", text); }
    int GetTransmitClockSource() override { return 1; }
    int GetFdl() override { return 2; }
    int GetLineLength() override { return 0; }
    long GetLineStatusLastChange() override { return 0; }
    int GetLineStatusChangeTrapEnable() override { return 2; }
    int SetLineStatusChangeTrapEnable(int) override { return KVL::kNotSupported; }
    int GetLoopbackStatus() override { return 1; }
    int GetDs1ChannelNumber() override { return 0; }
    int GetChannelization() override { return 1; }
    int GetLineMode() override { return 1; }
    int GetLineBuildOut() override { return 1; }

  private:
    std::string m_name;
    ReferenceCounter<DS1IntervalTable> m_intervals;
};

/// The board's lines. Filled before it is added to the board, and not changed afterwards.
class SpanLineFeature final : public DS1LineFeatureZ7 {
  public:
    explicit SpanLineFeature(long device) { m_lines.emplace_back(new SpanLine(device)); }
    int GetNumberOfLines() override { return 1; }
};
