// SPDX-License-Identifier: BSD-2-Clause
// One attribute's value as the simulated device mapper stores and answers it.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

namespace kvlsim {

/// The forms of an attribute's answer, which differ in their size.
enum class ValueForm : std::uint8_t {
    text,        ///< the characters and a terminating NUL
    number,      ///< four bytes, signed
    shortNumber, ///< two bytes, signed
    byte,        ///< one byte, signed
    empty,       ///< no byte at all, yet the attribute is there
    descriptor,  ///< eight bytes: four 16-bit words
};

using DescriptorWords = std::array<std::uint16_t, 4>;

/// An `AttributeValue` is one attribute's value: immutable, and compared by its bytes, as a search
/// does.
class AttributeValue {
  public:
    static AttributeValue text(std::string_view text);
    static AttributeValue number(std::int32_t value);
    static AttributeValue shortNumber(std::int16_t value);
    static AttributeValue byte(std::int8_t value);
    static AttributeValue empty();
    static AttributeValue descriptor(DescriptorWords const& words);
    /// `bytes`: in the format that `bytes()` returns.
    AttributeValue(ValueForm form, std::string_view bytes) : m_form(form), m_bytes(bytes) {}

    ValueForm form() const { return m_form; }
    /// The bytes that the client stores, a text's terminating NUL included.
    std::string_view bytes() const { return m_bytes; }
    /// Requires: a text.
    std::string_view asText() const;
    /// Requires: a number of any width, or empty (0).
    std::int32_t asNumber() const;
    /// Requires: a descriptor.
    DescriptorWords asDescriptor() const;

  private:
    ValueForm m_form;
    std::string m_bytes;
};

} // namespace kvlsim
