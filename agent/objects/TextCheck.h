// SPDX-License-Identifier: BSD-2-Clause
// Whether octets that somebody wants to set are a text.
#pragma once

#include <string_view>

namespace kvloamd {

/// Whether `octets` are UTF-8 without control characters. They are shown in terminals and logs,
/// where a control character may do anything.
bool isText(std::string_view octets);

/// Whether every octet is ASCII.
bool isAscii(std::string_view octets);

} // namespace kvloamd
