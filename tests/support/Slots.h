// SPDX-License-Identifier: BSD-2-Clause
// The place of a virtual operation in its class's table, which is part of the binary contract.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

/// The slot of a virtual operation, counted from 0. A virtual destructor takes two slots. In the
/// Itanium C++ ABI (section 2.3) a pointer to a virtual member holds one plus the slot's offset.
template <class Member>
int slotOf(Member operation) {
    static_assert(sizeof operation == 2 * sizeof(std::ptrdiff_t));
    std::ptrdiff_t offset = 0;
    std::memcpy(&offset, &operation, sizeof offset);
    return static_cast<int>((offset - 1) / static_cast<std::ptrdiff_t>(sizeof(void*)));
}
