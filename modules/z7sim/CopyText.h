// SPDX-License-Identifier: BSD-2-Clause
// Copying of texts into the buffers of callers.
#pragma once

#include <cstring>
#include <string>

/// Copies `text` with its terminator; returns 0. Texts of the device mapper have at most 128 bytes
/// with their terminator and fit every caller's buffer.
inline int copyText(std::string const& text, char* buffer) {
    std::memcpy(buffer, text.c_str(), text.size() + 1);
    return 0;
}
