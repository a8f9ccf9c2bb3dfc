// SPDX-License-Identifier: BSD-2-Clause
// The abstract DS1 line.
#pragma once

#include "board/DS1IntervalTable.h"
#include "board/Interface.h"
#include "core/ReferenceCounter.h"

/// The states of a line: the bits of DS1-MIB's dsx1LineStatus (RFC 4805). Several may be set at
/// once, except `DS1LineStatusNoAlarm`, which is set alone.
enum DS1LineStatusEnum : int {
    DS1LineStatusNoAlarm = 1,
    DS1LineStatusRcvFarEndLOF = 2, ///< yellow alarm received
    DS1LineStatusXmtFarEndLOF = 4,
    DS1LineStatusRcvAIS = 8,
    DS1LineStatusXmtAIS = 16,
    DS1LineStatusLossOfFrame = 32,
    DS1LineStatusLossOfSignal = 64,
    DS1LineStatusLoopbackState = 128,
    DS1LineStatusT16AIS = 256,
    DS1LineStatusRcvFarEndLOMF = 512,
    DS1LineStatusXmtFarEndLOMF = 1024,
    DS1LineStatusRcvTestCode = 2048,
    DS1LineStatusOtherFailure = 4096,
    DS1LineStatusUnavailSigState = 8192,
    DS1LineStatusNetEquipOOS = 16384,
    DS1LineStatusRcvPayloadAIS = 32768,
    DS1LineStatusDs2PerfThreshold = 65536
};

/// A `DS1LineDevice` is a DS1 (T1 or E1) line of a board: the interface queries, then those of
/// DS1-MIB's dsx1ConfigTable (RFC 4805), in the MIB's units and values. A query that a line does
/// not support, or whose answer it does not know, returns `KVL::kNotSupported`. The concrete line
/// says which queries are thread-safe.
class KVLOAM_API DS1LineDevice : public KVL::Interface {
  public:
    DS1LineDevice();
    ~DS1LineDevice() override;

    /// Fills `buffer` from `GetPhysAddressString` and sets `length` to its length. Returns 0. If
    /// there is no address, sets `length` to 0 and returns 1.
    int GetPhysAddress(char* buffer, int& length) override;

    /// Writes the terminated name, at most 63 characters. Returns 0.
    virtual int GetName(char* name) = 0;
    virtual int GetLineIndex() = 0;
    /// The line's performance history; an empty handle if it has none.
    virtual ReferenceCounter<DS1IntervalTable> GetIntervalTable() = 0;
    virtual int GetLineType() = 0;
    virtual int GetLineCoding() = 0;
    virtual int GetSendCode() = 0;
    /// Writes a terminated text of at most 255 characters. Returns 0.
    virtual int GetCircuitIdentifier(char* identifier) = 0;
    virtual int GetLoopbackConfig() = 0;
    /// The bits of `DS1LineStatusEnum`.
    virtual int GetLineStatus() = 0;
    virtual int GetSignalMode() = 0;
    /// Writes a terminated text of at most 255 characters. Returns 0.
    virtual int GetPhysAddressString(char* address) = 0;
    virtual int GetTransmitClockSource() = 0;
    virtual int GetFdl() = 0;
    virtual int GetLineLength() = 0; ///< metres
    /// Seconds since the epoch; 0 if the status has not changed yet.
    virtual long GetLineStatusLastChange() = 0;
    /// 1 enabled, 2 disabled.
    virtual int GetLineStatusChangeTrapEnable() = 0;
    virtual int SetLineStatusChangeTrapEnable(int enable) = 0;
    virtual int GetLoopbackStatus() = 0;
    virtual int GetDs1ChannelNumber() = 0;
    virtual int GetChannelization() = 0;
    virtual int GetLineMode() = 0;
    virtual int GetLineBuildOut() = 0;

    static KVL::IID iid() { return KVL::IID("13DS1LineDevice"); }
};
