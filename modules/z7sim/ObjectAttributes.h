// SPDX-License-Identifier: BSD-2-Clause
// Single attributes of the device mapper's objects, read at each call.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

/// A number of 4, 2 or 1 bytes; nothing when the object has no such attribute. `object`: its
/// handle.
std::optional<std::int32_t> numberAttribute(long object, char const* name);
/// The same, or `usual`.
int numberAttributeOr(long object, char const* name, int usual);

/// A text of at most 127 bytes; empty when the object has no such attribute.
std::string textAttribute(long object, char const* name);

/// Copies the bytes of an attribute that fits `size` bytes. Returns how many there are; 0 when the
/// object has no such attribute.
std::size_t bytesAttribute(long object, char const* name, void* bytes, std::size_t size);
