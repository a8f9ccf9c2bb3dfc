// SPDX-License-Identifier: BSD-2-Clause
// Walks over handles by first and next: in a vector, and by name.
#pragma once

#include <algorithm>
#include <cstring>
#include <vector>

#include "core/ReferenceCounter.h"

namespace KVL {

/// The first handle, or an empty one.
template <class T>
ReferenceCounter<T> first_in(std::vector<ReferenceCounter<T>> const& handles) {
    if (handles.empty()) return {};
    return handles.front();
}

/// The handle behind the first one that refers to the object of `previous`; an empty one when that
/// is the last, or is not among them.
template <class T>
ReferenceCounter<T> next_in(std::vector<ReferenceCounter<T>> const& handles,
                            ReferenceCounter<T> const& previous) {
    auto const found = std::find_if(handles.begin(), handles.end(), [&](auto const& handle) {
        return handle.get() == previous.get();
    });
    if (found == handles.end() || found + 1 == handles.end()) return {};
    return found[1];
}

/// The longest name that a search reads, with its terminator.
inline constexpr int kNameSize = 256;

/// The first object of a walk whose `GetName(char*)` is `name`, byte by byte; an empty handle when
/// there is none. `next(handle)` answers the handle after `handle`.
template <class T, class Next>
ReferenceCounter<T> find_named(ReferenceCounter<T> handle, Next const& next, char const* wanted) {
    for (; handle.get() != nullptr; handle = next(handle)) {
        char name[kNameSize] = "";
        handle->GetName(name);
        if (std::strcmp(name, wanted) == 0) break;
    }
    return handle;
}

/// Goes past all objects of a walk. Returns its end, an empty handle.
template <class T, class Next>
ReferenceCounter<T> past_all(ReferenceCounter<T> handle, Next const& next) {
    while (handle.get() != nullptr)
        handle = next(handle);
    return handle;
}

} // namespace KVL
