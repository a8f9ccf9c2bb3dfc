// SPDX-License-Identifier: BSD-2-Clause
// A vector that can be shared by handle.
#pragma once

#include <cstddef>
#include <utility>
#include <vector>

#include "core/Object.h"

/// A `kvlvector` is a vector of `T` that is an `Object`, so that handles can share it. Without a
/// lock; unsynchronised: its owner guards it.
template <class T>
class kvlvector : public Object {
  public:
    kvlvector() : Object(false) {}
    ~kvlvector() override = default;

    void push_back(T value) { m_elements.push_back(std::move(value)); }
    std::size_t size() const { return m_elements.size(); }
    /// Requires that `i` is below `size()`.
    T& operator[](std::size_t i) { return m_elements[i]; }
    auto begin() { return m_elements.begin(); }
    auto end() { return m_elements.end(); }

  private:
    std::vector<T> m_elements;
};
