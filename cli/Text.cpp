// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Text.h"

#include <clocale>
#include <cstdint>
#include <cwchar>
#include <optional>

namespace kvloam {

namespace {

/// One character of a text in UTF-8, and how many octets it has.
struct Character {
    char32_t code;
    std::size_t size;
};

/// The first character; nothing when the octets are not UTF-8. Requires: `text` is not empty.
std::optional<Character> firstCharacter(std::string_view text) {
    auto const octet = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    unsigned const lead = octet(0);
    if (lead < 0x80) return Character{lead, 1};
    std::size_t const size = lead >= 0xf0 ? 4 : lead >= 0xe0 ? 3 : 2;
    if (lead < 0xc2 || lead > 0xf4 || text.size() < size) return {};
    char32_t code = lead & (0x7fU >> size);
    for (std::size_t i = 1; i < size; ++i) {
        if ((octet(i) & 0xc0U) != 0x80) return {};
        code = code << 6U | (octet(i) & 0x3fU);
    }
    // Neither longer than needed, nor half of a pair, nor beyond the last character.
    constexpr char32_t least[] = {0, 0, 0x80, 0x800, 0x10000};
    if (code < least[size] || (code >= 0xd800 && code <= 0xdfff) || code > 0x10ffff) return {};
    return Character{code, size};
}

/// Characters that are formats rather than signs: they are invisible, or turn the writing around.
bool isFormat(char32_t code) {
    return code == 0xad || code == 0x61c || (code >= 0x200b && code <= 0x200f) ||
           (code >= 0x2028 && code <= 0x202e) || (code >= 0x2060 && code <= 0x206f) ||
           code == 0xfeff || (code >= 0xfff9 && code <= 0xfffb) ||
           (code >= 0xe0000 && code <= 0xe0fff);
}

/// How many columns the character takes; -1 when it is no printable one.
int columnsOf(char32_t code) {
    if (code < 0x80) return code >= 0x20 && code < 0x7f ? 1 : -1;
    if (code < 0xa0 || isFormat(code)) return -1;
    // The widths are those of the character set, whatever the user's language.
    static locale_t const unicode = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
    if (unicode == nullptr) return 1;
    locale_t const before = uselocale(unicode);
    int const columns = wcwidth(static_cast<wchar_t>(code));
    uselocale(before);
    return columns;
}

std::string cleaned(std::string_view text, char32_t last) {
    std::string result;
    result.reserve(text.size());
    while (!text.empty()) {
        auto const character = firstCharacter(text);
        std::size_t const size = character ? character->size : 1;
        if (character && (character->code == '\n' || character->code == '\t'))
            result += ' ';
        else if (character && character->code <= last && columnsOf(character->code) >= 0)
            result += text.substr(0, size);
        else
            result += '?';
        text.remove_prefix(size);
    }
    return result;
}

} // namespace

std::string printable(std::string_view text) {
    return cleaned(text, 0x10ffff);
}

std::string printableAscii(std::string_view text) {
    return cleaned(text, 0x7e);
}

std::size_t width(std::string_view text) {
    std::size_t columns = 0;
    while (!text.empty()) {
        auto const character = firstCharacter(text);
        int const own = character ? columnsOf(character->code) : 1;
        columns += static_cast<std::size_t>(own > 0 ? own : 0);
        text.remove_prefix(character ? character->size : 1);
    }
    return columns;
}

std::string cut(std::string_view text, std::size_t columns, std::string_view mark) {
    if (width(text) <= columns) return std::string(text);
    if (columns == 0) return {};
    std::string result;
    std::size_t taken = 0;
    while (!text.empty()) {
        auto const character = firstCharacter(text);
        std::size_t const size = character ? character->size : 1;
        std::size_t const own = width(text.substr(0, size));
        if (taken + own > columns - 1) break;
        result += text.substr(0, size);
        taken += own;
        text.remove_prefix(size);
    }
    return result + std::string(mark);
}

} // namespace kvloam
