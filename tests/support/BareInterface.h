// SPDX-License-Identifier: BSD-2-Clause
// A network interface that leaves every query of the interfaces group to its base.
#pragma once

#include <string>

#include "board/Interface.h"

template <class Base>
class BareInterface : public Base {
  public:
    int GetDescription(std::string& text) override { return Base::GetDescription(text); }
    int GetType() override { return Base::GetType(); }
    int GetMTU() override { return Base::GetMTU(); }
    int GetSpeed() override { return Base::GetSpeed(); }
    int GetPhysAddress(char* buffer, int& length) override {
        return Base::GetPhysAddress(buffer, length);
    }
    int GetAdminStatus() override { return Base::GetAdminStatus(); }
    int SetAdminStatus(int status) override { return Base::SetAdminStatus(status); }
    int GetOperStatus() override { return Base::GetOperStatus(); }
    int GetLastChange(int& seconds, int& microseconds) override {
        return Base::GetLastChange(seconds, microseconds);
    }
    int GetInOctets() override { return Base::GetInOctets(); }
    int GetInUcastPkts() override { return Base::GetInUcastPkts(); }
    int GetInDiscards() override { return Base::GetInDiscards(); }
    int GetInErrors() override { return Base::GetInErrors(); }
    int GetInUnknownProtos() override { return Base::GetInUnknownProtos(); }
    int GetOutOctets() override { return Base::GetOutOctets(); }
    int GetOutUcastPkts() override { return Base::GetOutUcastPkts(); }
    int GetOutDiscards() override { return Base::GetOutDiscards(); }
    int GetOutErrors() override { return Base::GetOutErrors(); }
};
