// SPDX-License-Identifier: BSD-2-Clause
// Texts of a record, copied under the record's lock.
#pragma once

#include <cstring>
#include <string>

#include "core/Object.h"

namespace KVL {

/// Copies `text` with its terminator; the buffer's size is the caller's affair.
inline void copy_text(Object& record, std::string const& text, char* buffer) {
    ObjectGuard const guard(record);
    std::memcpy(buffer, text.c_str(), text.size() + 1);
}

inline void set_text(Object& record, std::string& text, char const* value) {
    ObjectGuard const guard(record);
    text = value;
}

} // namespace KVL
