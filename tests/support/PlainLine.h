// SPDX-License-Identifier: BSD-2-Clause
// A DS1 line that knows only its name and its address.
#pragma once

#include <cstring>
#include <string>
#include <utility>

#include "board/DS1LineDevice.h"
#include "tests/support/BareInterface.h"

class PlainLine : public BareInterface<DS1LineDevice> {
  public:
    explicit PlainLine(std::string name) : m_name(std::move(name)) {}

    int GetName(char* name) override { return copy(m_name, name); }
    int GetLineIndex() override { return KVL::kNotSupported; }
    ReferenceCounter<DS1IntervalTable> GetIntervalTable() override { return {}; }
    int GetLineType() override { return KVL::kNotSupported; }
    int GetLineCoding() override { return KVL::kNotSupported; }
    int GetSendCode() override { return KVL::kNotSupported; }
    int GetCircuitIdentifier(char* identifier) override { return copy("", identifier); }
    int GetLoopbackConfig() override { return KVL::kNotSupported; }
    int GetLineStatus() override { return DS1LineStatusNoAlarm; }
    int GetSignalMode() override { return KVL::kNotSupported; }
    int GetPhysAddressString(char* address) override {
        return addressAnswer == 0 ? copy("00:11:22", address) : addressAnswer;
    }
    int GetTransmitClockSource() override { return KVL::kNotSupported; }
    int GetFdl() override { return KVL::kNotSupported; }
    int GetLineLength() override { return KVL::kNotSupported; }
    long GetLineStatusLastChange() override { return 0; }
    int GetLineStatusChangeTrapEnable() override { return KVL::kNotSupported; }
    int SetLineStatusChangeTrapEnable(int /*enable*/) override { return KVL::kNotSupported; }
    int GetLoopbackStatus() override { return KVL::kNotSupported; }
    int GetDs1ChannelNumber() override { return KVL::kNotSupported; }
    int GetChannelization() override { return KVL::kNotSupported; }
    int GetLineMode() override { return KVL::kNotSupported; }
    int GetLineBuildOut() override { return KVL::kNotSupported; }

    /// The result of the address query; there is an address only if it is 0.
    int addressAnswer = 0;

  private:
    static int copy(std::string const& text, char* buffer) {
        std::strcpy(buffer, text.c_str());
        return 0;
    }

    std::string m_name;
};
