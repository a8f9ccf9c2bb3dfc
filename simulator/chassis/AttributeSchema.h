// SPDX-License-Identifier: BSD-2-Clause
// What the simulator knows of the platform's attributes and object types.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace kvlsim {

inline constexpr std::int32_t kBoardType = 200;
inline constexpr std::int32_t kProcessorType = 800;

/// The most characters of a text: it fits a reader's 128-byte buffer with its terminating NUL.
inline constexpr std::size_t kMaxTextLength = 127;

/// Values of BOARD_CONDITION.
enum class BoardCondition : std::int32_t {
    started = 3,
    stopped = 4,
    startPending = 13,
    stopPending = 14,
    failed = 15,
};

/// The kind that a known attribute must have; `any` for names that the simulator does not know.
enum class AttributeKind : std::uint8_t { any, text, number, byte, descriptor };

AttributeKind kindOf(std::string_view attribute);

/// The known attribute that an unknown one was probably meant to be; empty when none is near
/// enough.
std::string knownNameLike(std::string_view attribute);

/// The numbers from `lowest` to `highest`.
struct LegalNumbers {
    std::int32_t lowest;
    std::int32_t highest;
};

/// What DS1-MIB allows for an attribute that has one of its numbers; nothing for others.
std::optional<LegalNumbers> legalNumbersOf(std::string_view attribute);

/// Whether a line or ISDN channels answer the attribute, so that nobody writes it.
bool isLiveAttribute(std::string_view attribute);

std::span<std::int32_t const> deviceTypes();
std::span<std::int32_t const> subDeviceTypes();

} // namespace kvlsim
