// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/TextCheck.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>

namespace kvloamd {

namespace {

/// How the sequence of a first octet goes on.
struct Sequence {
    std::size_t more;     ///< octets after the first
    std::uint32_t first;  ///< the first octet's part of the character
    std::uint32_t lowest; ///< the lowest character that needs this many octets
};

/// `more` is 0 for an octet that begins no longer sequence.
Sequence sequenceOf(std::uint32_t octet) {
    if ((octet & 0xe0U) == 0xc0U) return {1, octet & 0x1fU, 0x80};
    if ((octet & 0xf0U) == 0xe0U) return {2, octet & 0x0fU, 0x800};
    if ((octet & 0xf8U) == 0xf0U) return {3, octet & 0x07U, 0x10000};
    return {0, octet, 0};
}

bool isControl(std::uint32_t character) {
    return character < 0x20 || (character >= 0x7f && character < 0xa0);
}

bool isSurrogate(std::uint32_t character) {
    return character >= 0xd800 && character < 0xe000;
}

} // namespace

bool isText(std::string_view octets) {
    auto const octetAt = [&](std::size_t at) {
        return std::uint32_t{static_cast<unsigned char>(octets[at])};
    };
    for (std::size_t at = 0; at < octets.size(); ++at) {
        Sequence const sequence = sequenceOf(octetAt(at));
        if (sequence.more == 0 && sequence.first >= 0x80) return false;
        if (octets.size() - at <= sequence.more) return false;
        std::uint32_t character = sequence.first;
        for (std::size_t i = 0; i < sequence.more; ++i) {
            std::uint32_t const next = octetAt(++at);
            if ((next & 0xc0U) != 0x80U) return false;
            character = character << 6U | (next & 0x3fU);
        }
        if (character < sequence.lowest || character > 0x10ffff) return false;
        if (isControl(character) || isSurrogate(character)) return false;
    }
    return true;
}

bool isAscii(std::string_view octets) {
    return std::ranges::all_of(octets,
                               [](char octet) { return static_cast<unsigned char>(octet) < 0x80; });
}

} // namespace kvloamd
