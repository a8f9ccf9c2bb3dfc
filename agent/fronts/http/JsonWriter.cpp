// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/JsonWriter.h"

#include <algorithm>
#include <charconv>

namespace kvloamd {

namespace {

constexpr std::string_view kReplacement = "\xef\xbf\xbd";

/// How many octets the UTF-8 character has that `octets` begin with; 0: they begin with none.
std::size_t characterLength(std::string_view octets) {
    auto const at = [&](std::size_t i) { return static_cast<unsigned char>(octets[i]); };
    auto const continues = [&](std::size_t i, unsigned lowest = 0x80, unsigned highest = 0xbf) {
        return i < octets.size() && at(i) >= lowest && at(i) <= highest;
    };
    unsigned const first = at(0);
    if (first < 0x80) return 1;
    if (first >= 0xc2 && first <= 0xdf) return continues(1) ? 2 : 0;
    // The limits of the second octet exclude what has a shorter form, surrogates, and what is
    // beyond U+10FFFF.
    if (first >= 0xe0 && first <= 0xef) {
        bool const second = continues(1, first == 0xe0 ? 0xa0 : 0x80, first == 0xed ? 0x9f : 0xbf);
        return second && continues(2) ? 3 : 0;
    }
    if (first >= 0xf0 && first <= 0xf4) {
        bool const second = continues(1, first == 0xf0 ? 0x90 : 0x80, first == 0xf4 ? 0x8f : 0xbf);
        return second && continues(2) && continues(3) ? 4 : 0;
    }
    return 0;
}

bool isPlain(char character) {
    auto const octet = static_cast<unsigned char>(character);
    return octet >= 0x20 && octet < 0x7f && character != '"' && character != '\\';
}

void appendEscaped(std::string& text, unsigned char octet) {
    constexpr char kDigits[] = "0123456789abcdef";
    switch (octet) {
    case '"':
    case '\\':
        text += '\\';
        text += static_cast<char>(octet);
        return;
    case '\n':
        text += "\\n";
        return;
    case '\t':
        text += "\\t";
        return;
    default:
        text += "\\u00";
        text += kDigits[octet >> 4U];
        text += kDigits[octet & 0x0fU];
    }
}

template <class Number>
void appendNumber(std::string& text, Number value) {
    char digits[24];
    text.append(digits, std::to_chars(std::begin(digits), std::end(digits), value).ptr);
}

} // namespace

JsonWriter& JsonWriter::begin(char bracket) {
    separate();
    m_text += bracket;
    m_follows = false;
    return *this;
}

JsonWriter& JsonWriter::end(char bracket) {
    m_text += bracket;
    m_follows = true;
    return *this;
}

void JsonWriter::separate() {
    if (m_follows) m_text += ',';
    m_follows = true;
}

JsonWriter& JsonWriter::key(std::string_view name) {
    text(name);
    m_text += ':';
    m_follows = false;
    return *this;
}

JsonWriter& JsonWriter::text(std::string_view octets) {
    separate();
    m_text += '"';
    while (!octets.empty()) {
        auto const plain =
            static_cast<std::size_t>(std::ranges::find_if_not(octets, isPlain) - octets.begin());
        m_text.append(octets.substr(0, plain));
        octets.remove_prefix(plain);
        if (octets.empty()) break;
        std::size_t const length = characterLength(octets);
        if (length == 0)
            m_text += kReplacement;
        else if (length == 1)
            appendEscaped(m_text, static_cast<unsigned char>(octets[0]));
        else
            m_text.append(octets.substr(0, length));
        octets.remove_prefix(std::max<std::size_t>(length, 1));
    }
    m_text += '"';
    return *this;
}

JsonWriter& JsonWriter::number(std::int64_t value) {
    separate();
    appendNumber(m_text, value);
    return *this;
}

JsonWriter& JsonWriter::number(std::uint64_t value) {
    separate();
    appendNumber(m_text, value);
    return *this;
}

JsonWriter& JsonWriter::decimal(std::int64_t value, int places) {
    std::int64_t unit = 1;
    for (int i = 0; i < places; ++i)
        unit *= 10;
    number(value / unit);
    std::string fraction = std::to_string(unit + value % unit).substr(1);
    fraction.erase(fraction.find_last_not_of('0') + 1);
    if (!fraction.empty()) m_text += '.' + fraction;
    return *this;
}

JsonWriter& JsonWriter::word(std::string_view word) {
    separate();
    m_text += word;
    return *this;
}

} // namespace kvloamd
