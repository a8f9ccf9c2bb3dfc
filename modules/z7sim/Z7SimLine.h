// SPDX-License-Identifier: BSD-2-Clause
// A DS1 line of a reference board.
#pragma once

#include <memory>
#include <string>

#include "LineState.h"
#include "Z7SimIntervalTable.h"
#include "board/DS1LineDevice.h"
#include "board/DS1LineImpedance.h"

/// The kinds of lines, by how many bits they carry.
enum class LineCarrier { t1, e1, unknown };

/// How a line is set up: what the device mapper says of it, read when the line is made.
struct LineSetup {
    std::string name;
    std::string circuit;
    int number = 0; ///< on its board, from 1
    int type = 1;   ///< dsx1LineType; 1 where it is not known
    int coding = 0;
    int length = 0;
    int buildOut = 0;
    int impedance = 1; ///< dsx1LineImpedance; 1 where it is not known
    int signalMode = 0;
    int clockSource = 0;
    int fdl = 0;
    bool channelized = false;

    LineFormat format() const;
    LineCarrier carrier() const;
};

/// A `Z7SimLine` answers from its set-up, its status and its history; no query waits for the
/// platform. Thread-safe.
class Z7SimLine final : public DS1LineDevice, public DS1LineImpedance {
  public:
    Z7SimLine(LineSetup setup, std::shared_ptr<LineState> state,
              ReferenceCounter<DS1IntervalTable> intervals);
    ~Z7SimLine() override;

    int GetDescription(std::string& description) override;
    int GetType() override;
    int GetMTU() override;
    int GetSpeed() override;
    int GetAdminStatus() override;
    int SetAdminStatus(int status) override;
    /// Down while the line carries nothing: no signal, no frame, AIS, or unavailable.
    int GetOperStatus() override;
    int GetLastChange(int& seconds, int& microseconds) override;
    // A DS1 line carries bits, not packets: these are not supported.
    int GetInOctets() override;
    int GetInUcastPkts() override;
    int GetInDiscards() override;
    int GetInErrors() override;
    int GetInUnknownProtos() override;
    int GetOutOctets() override;
    int GetOutUcastPkts() override;
    int GetOutDiscards() override;
    int GetOutErrors() override;

    int GetName(char* name) override;
    int GetLineIndex() override;
    /// Empty for a line of no known format: without it errors mean nothing.
    ReferenceCounter<DS1IntervalTable> GetIntervalTable() override;
    int GetLineType() override;
    int GetLineCoding() override;
    int GetSendCode() override;
    int GetCircuitIdentifier(char* identifier) override;
    int GetLoopbackConfig() override;
    int GetLineStatus() override;
    int GetSignalMode() override;
    /// The circuit identifier, as DS1-MIB has it of ifPhysAddress.
    int GetPhysAddressString(char* address) override;
    int GetTransmitClockSource() override;
    int GetFdl() override;
    int GetLineLength() override;
    long GetLineStatusLastChange() override;
    int GetLineStatusChangeTrapEnable() override;
    /// Returns 0, or -1 for a value that is neither 1 nor 2.
    int SetLineStatusChangeTrapEnable(int enable) override;
    int GetLoopbackStatus() override;
    int GetDs1ChannelNumber() override;
    int GetChannelization() override;
    int GetLineMode() override;
    int GetLineBuildOut() override;
    int GetLineImpedance() override { return m_setup.impedance; }

  private:
    /// The platform knows one kind of loopback, that of the line.
    bool isLooped() const;

    LineSetup m_setup;
    std::shared_ptr<LineState> m_state;
    ReferenceCounter<DS1IntervalTable> m_intervals;
};
