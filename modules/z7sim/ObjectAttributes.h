// SPDX-License-Identifier: BSD-2-Clause
// Single attributes of device mapper objects, for those that the library's records do not have.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

// Each asks the platform, and answers nothing when the object has no such attribute.

/// A number of one, two or four bytes.
std::optional<std::int32_t> readNumber(long object, char const* attribute);
/// A text of at most 128 bytes; what is longer is cut.
std::optional<std::string> readText(long object, char const* attribute);
/// As many bytes as there are, at most `capacity`.
std::optional<std::string> readBytes(long object, char const* attribute, std::size_t capacity);
