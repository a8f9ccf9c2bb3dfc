// SPDX-License-Identifier: BSD-2-Clause
// First and next steps over a vector of handles, and the search by name.
#pragma once

#include <cstring>
#include <vector>

#include "core/FindObject.h"

namespace KVL {

/// The first handle, or an empty one.
template <class T>
ReferenceCounter<T> first_in(std::vector<ReferenceCounter<T>> const& handles) {
    if (handles.empty()) return {};
    return handles.front();
}

/// The handle after the first one that refers to the object of `previous`; an empty handle when
/// that is the last one or is not in the vector.
template <class T>
ReferenceCounter<T> next_in(std::vector<ReferenceCounter<T>> const& handles,
                            ReferenceCounter<T> const& previous) {
    auto const found = find_object(handles, previous.get());
    if (found == handles.end() || found + 1 == handles.end()) return {};
    return found[1];
}

/// The longest name that a search can read, with its terminator.
inline constexpr int kNameSize = 256;

/// The first object of a walk whose `GetName(char*)` gives exactly `wanted`; an empty handle when
/// there is none. The walk begins at `handle`; `next(handle)` returns the handle after `handle`.
template <class T, class Next>
ReferenceCounter<T> find_named(ReferenceCounter<T> handle, Next const& next, char const* wanted) {
    for (; handle.get() != nullptr; handle = next(handle)) {
        char name[kNameSize] = "";
        handle->GetName(name);
        if (std::strcmp(name, wanted) == 0) break;
    }
    return handle;
}

/// Calls `next` until the walk ends. Returns the end, an empty handle.
template <class T, class Next>
ReferenceCounter<T> past_all(ReferenceCounter<T> handle, Next const& next) {
    while (handle.get() != nullptr)
        handle = next(handle);
    return handle;
}

} // namespace KVL
