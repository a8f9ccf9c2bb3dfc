// SPDX-License-Identifier: BSD-2-Clause
#include "board/Feature.h"

#include <cstring>

int min(int a, int b) {
    return a < b ? a : b;
}

int max(int a, int b) {
    return a > b ? a : b;
}

Feature::Feature() : Object(true) {
    m_name[0] = '\0';
}

Feature::~Feature() = default;

int Feature::SetFeatureName(char const* name) {
    auto const length = strnlen(name, kMaxNameLength);
    std::memmove(m_name, name, length);
    m_name[length] = '\0';
    return 1;
}
