// SPDX-License-Identifier: BSD-2-Clause
#include "board/DS1LineDevice.h"

#include <cstring>

DS1LineDevice::DS1LineDevice() {
    answer_to(iid());
}

DS1LineDevice::~DS1LineDevice() = default;

int DS1LineDevice::GetPhysAddress(char* buffer, int& length) {
    length = 0;
    if (GetPhysAddressString(buffer) != 0) return 1;
    length = static_cast<int>(std::strlen(buffer));
    return 0;
}
