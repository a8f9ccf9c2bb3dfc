// SPDX-License-Identifier: BSD-2-Clause
#include "z7/Z7Device.h"

#include <cstddef>
#include <cstring>

Z7Device::Z7Device(char const* name) {
    answer_to(iid());
    SetName(name);
}

Z7Device::~Z7Device() = default;

void Z7Device::SetName(char const* name) {
    std::size_t const length = strnlen(name, sizeof m_name);
    std::memcpy(m_name, name, length);
    std::memset(m_name + length, 0, sizeof m_name - length);
}

Z7VoiceDevice::Z7VoiceDevice(char const* name) : Z7Device(name) {
    answer_to(iid());
}

Z7VoiceDevice::~Z7VoiceDevice() = default;

Z7TRKDevice::Z7TRKDevice(char const* name) : Z7Device(name) {
    answer_to(iid());
}

Z7TRKDevice::~Z7TRKDevice() = default;

Z7ISDNDevice::Z7ISDNDevice(char const* name) : Z7TRKDevice(name) {
    answer_to(iid());
}

Z7ISDNDevice::~Z7ISDNDevice() = default;

Z7STNDevice::Z7STNDevice(char const* name) : Z7Device(name) {
    answer_to(iid());
}

Z7STNDevice::~Z7STNDevice() = default;
