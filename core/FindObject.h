// SPDX-License-Identifier: BSD-2-Clause
// The search for an object among handles.
#pragma once

#include <algorithm>
#include <utility>

#include "core/ReferenceCounter.h"

namespace KVL {

template <class T>
T* object_of(ReferenceCounter<T> const& handle) {
    return handle.unlocked();
}

template <class Index, class T>
T* object_of(std::pair<Index const, ReferenceCounter<T>> const& entry) {
    return entry.second.unlocked();
}

/// The first element that refers to `object`, or the end. `elements` are handles, or a map's
/// entries with handles. Takes no record's lock.
template <class Elements, class T>
auto find_object(Elements& elements, T const* object) {
    return std::find_if(elements.begin(), elements.end(),
                        [object](auto const& element) { return object_of(element) == object; });
}

} // namespace KVL
