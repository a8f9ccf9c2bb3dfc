// SPDX-License-Identifier: BSD-2-Clause
// ISDN channels that know only their name.
#pragma once

#include <cstring>
#include <string>
#include <utility>

#include "board/ISDNChannel.h"

class PlainBChannel : public ISDNBChannel {
  public:
    explicit PlainBChannel(std::string name) : m_name(std::move(name)) {}

    int GetName(char* name) override {
        std::strcpy(name, m_name.c_str());
        return 0;
    }
    int GetChannelType() override { return 1; }
    int GetOperStatus() override { return ISDNBChannelStatusIdle; }
    int GetChannelNumber() override { return 1; }
    int GetBoardIndex() override { return -1; }
    int SetBoardIndex(int /*index*/) override { return 0; }
    int AddISDNStatusListener(ISDNChannelStatusListener* /*listener*/) override { return 0; }

  private:
    std::string m_name;
};

class PlainDChannel : public ISDNDChannel {
  public:
    explicit PlainDChannel(std::string name) : m_name(std::move(name)) {}

    int GetName(char* name) override {
        std::strcpy(name, m_name.c_str());
        return 0;
    }
    int GetProtocol() override { return 1; }
    int GetOperStatus() override { return ISDNDChannelStatusInactive; }
    int GetBChannelCount() override { return 30; }
    int GetCallingAddress(char* address) override {
        address[0] = '\0';
        return 0;
    }
    int GetBoardIndex() override { return -1; }
    int SetBoardIndex(int /*index*/) override { return 0; }
    int AddISDNStatusListener(ISDNChannelStatusListener* /*listener*/) override { return 0; }

  private:
    std::string m_name;
};
