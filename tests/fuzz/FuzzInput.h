// SPDX-License-Identifier: BSD-2-Clause
// A fuzzer's input as a sequence of values.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

/// The entry point of a fuzz target.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size);

namespace fuzz {

/// A `FuzzInput` is read from front to back; behind its end there are zeros. Unsynchronised.
class FuzzInput {
  public:
    FuzzInput(std::uint8_t const* octets, std::size_t size)
        : m_rest(reinterpret_cast<char const*>(octets), size) {}
    explicit FuzzInput(std::string_view octets) : m_rest(octets) {}

    bool atEnd() const { return m_rest.empty(); }
    template <class Number>
    Number number() {
        Number value{};
        take(sizeof value).copy(reinterpret_cast<char*>(&value), sizeof value);
        return value;
    }
    std::uint8_t octet() { return number<std::uint8_t>(); }
    /// One of `count` choices.
    std::size_t choice(std::size_t count) { return octet() % count; }
    /// At most `size` octets.
    std::string_view take(std::size_t size) {
        std::string_view const taken = m_rest.substr(0, size);
        m_rest.remove_prefix(taken.size());
        return taken;
    }
    /// As many octets as the next one says.
    std::string text() { return std::string(take(octet())); }
    std::string_view rest() { return take(m_rest.size()); }
    /// The octets up to the next zero, or to the end.
    std::string_view line(char end = '\0') {
        std::string_view const taken = take(std::min(m_rest.find(end), m_rest.size()));
        take(1);
        return taken;
    }

  private:
    std::string_view m_rest;
};

/// Ends the process, as a finding, unless `holds`.
inline void require(bool holds, char const* what) {
    if (holds) return;
    std::fprintf(stderr, "does not hold: %s\n", what);
    std::abort();
}

} // namespace fuzz
