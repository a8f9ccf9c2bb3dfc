// SPDX-License-Identifier: BSD-2-Clause
// Lines and channels whose answers a test chooses, and the features that hold them.
#pragma once

#include <algorithm>
#include <cstring>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "board/DS1IntervalValidity.h"
#include "board/ISDNCall.h"
#include "board/ISDNChannelOnLine.h"
#include "platform/ActionScheduler_pthread.h"
#include "z7/DS1LineFeatureZ7.h"
#include "z7/ISDNChannelZ7.h"
#include "z7/ISDNFeatureZ7.h"

/// An interval table that only the test fills.
class FakeHistory : public DS1IntervalTable {
  public:
    FakeHistory() { ActionScheduler_pthread::GetScheduler()->Remove(this); }

    bool knowsDegradedMinutes = true;
    std::shared_ptr<int> const alive = std::make_shared<int>(); ///< ends with the table

    int GetControlledSlipSeconds(int n) override { return interval(n)->ControlledSlipSeconds; }
    int GetDegradedMinutes(int n) override {
        return knowsDegradedMinutes ? static_cast<int>(interval(n)->DegradedMinutes)
                                    : KVL::kNotSupported;
    }
    int CollectSecond() override { return 0; }
    int CloseInterval() override { return 0; }

    /// Closes an interval with these error seconds, and degraded minutes of the same number.
    void close(int errorSeconds) {
        DS1Interval closed;
        closed.ErrorSeconds = errorSeconds;
        closed.DegradedMinutes = errorSeconds;
        ArchiveInterval(closed);
    }
    /// Corrects the interval that was closed last.
    void correctNewest(int errorSeconds) { interval(1)->ErrorSeconds = errorSeconds; }
    /// Sets the counters and the elapsed time of the running interval.
    void run(int errorSeconds, int timeElapsed) {
        m_current.ErrorSeconds = errorSeconds;
        m_timeElapsed = timeElapsed;
    }
};

/// The same, with intervals that missed data.
class FakeHistoryWithGaps final : public FakeHistory, public DS1IntervalValidity {
  public:
    std::vector<int> invalid;
    int closed = 0;

    bool IsIntervalValid(int n) override {
        return std::find(invalid.begin(), invalid.end(), n) == invalid.end();
    }
    int GetIntervalsClosed() override { return closed; }
};

/// A line that supports only its name, its circuit and the values that a test sets.
class FakeLine final : public DS1LineDevice {
  public:
    FakeLine(std::string name, std::string circuit)
        : m_name(std::move(name)), m_circuit(std::move(circuit)) {}

    int setUp = KVL::kNotSupported; ///< what every query of the line's set-up answers
    int lineType = KVL::kNotSupported;
    int lineStatus = KVL::kNotSupported;
    long statusLastChange = KVL::kNotSupported;
    int trapEnable = KVL::kNotSupported;
    ReferenceCounter<DS1IntervalTable> history;

    int GetDescription(std::string& description) override {
        return Interface::GetDescription(description);
    }
    int GetType() override { return Interface::GetType(); }
    int GetMTU() override { return Interface::GetMTU(); }
    int GetSpeed() override { return Interface::GetSpeed(); }
    int GetAdminStatus() override { return Interface::GetAdminStatus(); }
    int SetAdminStatus(int status) override { return Interface::SetAdminStatus(status); }
    int GetOperStatus() override { return Interface::GetOperStatus(); }
    int GetLastChange(int& seconds, int& microseconds) override {
        return Interface::GetLastChange(seconds, microseconds);
    }
    int GetInOctets() override { return Interface::GetInOctets(); }
    int GetInUcastPkts() override { return Interface::GetInUcastPkts(); }
    int GetInDiscards() override { return Interface::GetInDiscards(); }
    int GetInErrors() override { return Interface::GetInErrors(); }
    int GetInUnknownProtos() override { return Interface::GetInUnknownProtos(); }
    int GetOutOctets() override { return Interface::GetOutOctets(); }
    int GetOutUcastPkts() override { return Interface::GetOutUcastPkts(); }
    int GetOutDiscards() override { return Interface::GetOutDiscards(); }
    int GetOutErrors() override { return Interface::GetOutErrors(); }

    int GetName(char* name) override { return give(name, m_name); }
    int GetLineIndex() override { return KVL::kNotSupported; }
    ReferenceCounter<DS1IntervalTable> GetIntervalTable() override { return history; }
    int GetLineType() override { return lineType; }
    int GetLineCoding() override { return setUp; }
    int GetSendCode() override { return setUp; }
    int GetCircuitIdentifier(char* identifier) override { return give(identifier, m_circuit); }
    int GetLoopbackConfig() override { return setUp; }
    int GetLineStatus() override { return lineStatus; }
    int GetSignalMode() override { return setUp; }
    int GetPhysAddressString(char* address) override { return give(address, ""); }
    int GetTransmitClockSource() override { return setUp; }
    int GetFdl() override { return setUp; }
    int GetLineLength() override { return setUp; }
    long GetLineStatusLastChange() override { return statusLastChange; }
    int GetLineStatusChangeTrapEnable() override { return trapEnable; }
    int SetLineStatusChangeTrapEnable(int enable) override {
        trapEnable = enable;
        return 0;
    }
    int GetLoopbackStatus() override { return setUp; }
    int GetDs1ChannelNumber() override { return setUp; }
    int GetChannelization() override { return setUp; }
    int GetLineMode() override { return setUp; }
    int GetLineBuildOut() override { return setUp; }

  private:
    static int give(char* answer, std::string const& value) {
        std::strcpy(answer, value.c_str());
        return 0;
    }

    std::string m_name;
    std::string m_circuit;
};

class FakeLineFeature final : public DS1LineFeatureZ7 {
  public:
    explicit FakeLineFeature(std::vector<FakeLine*> const& lines) {
        for (FakeLine* const line : lines)
            m_lines.emplace_back(line);
    }
    int GetNumberOfLines() override { return static_cast<int>(m_lines.size()); }
    int NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> line,
                                  DS1LineStatusEnum status) override {
        ReferenceCounter<DS1LineStatusEvent> const event(
            new DS1LineStatusEvent(status, std::move(line)));
        for_each_listener<DS1LineStatusListener>(
            m_listeners, this, [&](auto* listener) { listener->ProcessLineStatusEvent(event); });
        return 0;
    }
    int listenerCount() {
        int count = 0;
        for_each_listener<DS1LineStatusListener>(m_listeners, this, [&](auto*) { ++count; });
        return count;
    }
};

class FakeBChannel : public ISDNBChannelZ7 {
  public:
    FakeBChannel(char const* name, int status, int timeSlot = KVL::kNotSupported)
        : ISDNBChannelZ7(name), m_status(status), m_timeSlot(timeSlot) {}
    int GetChannelType() override { return 1; }
    int GetOperStatus() override { return m_status; }
    int GetChannelNumber() override { return m_timeSlot; }

  private:
    int m_status;
    int m_timeSlot;
};

class FakeDChannel : public ISDNDChannelZ7 {
  public:
    FakeDChannel(char const* name, int status, int bearers, std::string callingAddress)
        : ISDNDChannelZ7(name),
          m_status(status),
          m_bearers(bearers),
          m_callingAddress(std::move(callingAddress)) {}
    int GetProtocol() override { return KVL::kNotSupported; }
    int GetOperStatus() override { return m_status; }
    int GetBChannelCount() override { return m_bearers; }
    int GetCallingAddress(char* address) override {
        std::strcpy(address, m_callingAddress.c_str());
        return 0;
    }

  private:
    int m_status;
    int m_bearers;
    std::string m_callingAddress;
};

/// A fake channel of either kind that says its line.
template <class FakeChannel>
class OnLine final : public FakeChannel, public ISDNChannelOnLine {
  public:
    template <class... Arguments>
    explicit OnLine(FakeLine* line, Arguments&&... arguments)
        : FakeChannel(std::forward<Arguments>(arguments)...), m_line(line) {}
    ReferenceCounter<DS1LineDevice> GetLine() override { return m_line; }

  private:
    ReferenceCounter<DS1LineDevice> m_line;
};

/// A bearer channel whose call a test chooses.
class FakeCallingChannel final : public FakeBChannel, public ISDNCallChannel {
  public:
    using FakeBChannel::FakeBChannel;
    ISDNCallDetails call;
    ISDNCallDetails GetCall() override { return call; }
};

/// A signalling channel whose counts a test chooses.
class FakeCountingChannel final : public FakeDChannel, public ISDNCountingChannel {
  public:
    using FakeDChannel::FakeDChannel;
    ISDNSignallingCounts counts;
    int result = 0; ///< of GetCounts
    int GetCounts(ISDNSignallingCounts& asked) override {
        asked = counts;
        return result;
    }
    int GetCallingSubAddress(char* address) override {
        std::strcpy(address, "sub");
        return 0;
    }
};

class FakeISDNFeature final : public ISDNFeatureZ7 {
  public:
    FakeISDNFeature(std::vector<ISDNDChannel*> const& signalling,
                    std::vector<ISDNBChannel*> const& bearers) {
        for (ISDNDChannel* const channel : signalling)
            m_signallingChannels.emplace_back(channel);
        for (ISDNBChannel* const channel : bearers)
            m_bearerChannels.emplace_back(channel);
    }
};
