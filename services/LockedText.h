// SPDX-License-Identifier: BSD-2-Clause
// Copies texts of a record under the record's lock.
#pragma once

#include <cstring>
#include <string>

#include "core/Object.h"

namespace KVL {

/// Copies `text` with its terminator. The caller's buffer must be large enough.
inline void copy_text(Object& record, std::string const& text, char* buffer) {
    ObjectGuard const guard(record);
    std::memcpy(buffer, text.c_str(), text.size() + 1);
}

inline void set_text(Object& record, std::string& text, char const* value) {
    ObjectGuard const guard(record);
    text = value;
}

} // namespace KVL
