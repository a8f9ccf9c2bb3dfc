// SPDX-License-Identifier: BSD-2-Clause
// Writes JSON as text.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

namespace kvloamd {

/// A `JsonWriter` appends values to a JSON text and sets the commas. The caller keeps objects and
/// arrays balanced, and writes a key before each value of an object. Unsynchronised.
class JsonWriter {
  public:
    JsonWriter& beginObject() { return begin('{'); }
    JsonWriter& endObject() { return end('}'); }
    JsonWriter& beginArray() { return begin('['); }
    JsonWriter& endArray() { return end(']'); }
    JsonWriter& key(std::string_view name);

    /// Octets that are not UTF-8 become replacement characters.
    JsonWriter& text(std::string_view octets);
    JsonWriter& number(std::int64_t value);
    JsonWriter& number(std::uint64_t value);
    /// `value` / 10^`places`: 1250 with 3 places is 1.25. `value` is not negative.
    JsonWriter& decimal(std::int64_t value, int places);
    JsonWriter& boolean(bool value) { return word(value ? "true" : "false"); }
    JsonWriter& null() { return word("null"); }

    std::size_t size() const { return m_text.size(); }
    std::string take() { return std::move(m_text); }

  private:
    JsonWriter& begin(char bracket);
    JsonWriter& end(char bracket);
    JsonWriter& word(std::string_view word);
    void separate();

    std::string m_text;
    bool m_follows = false; ///< a value precedes in the same object or array
};

} // namespace kvloamd
