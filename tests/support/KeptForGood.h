// SPDX-License-Identifier: BSD-2-Clause
// Objects that must outlive the process's threads.
#pragma once

#include <utility>

/// Makes a `T` that is never destroyed, because the event adaptors never release their listeners.
/// It stays reachable, so leak checks do not report it.
template <class T, class... Arguments>
T& keptForGood(Arguments&&... arguments) {
    struct Node {
        T object;
        Node* next;
    };
    static Node* s_kept = nullptr;
    s_kept = new Node{T(std::forward<Arguments>(arguments)...), s_kept};
    return s_kept->object;
}
