// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Target.h"

#include <algorithm>
#include <charconv>

namespace kvloamd {

namespace {

/// Takes what is before the next `mark`, and the mark.
std::string_view takeUpTo(char mark, std::string_view& text) {
    std::size_t const end = std::min(text.find(mark), text.size());
    std::string_view const taken = text.substr(0, end);
    text.remove_prefix(std::min(end + 1, text.size()));
    return taken;
}

std::optional<std::string> unescaped(std::string_view text) {
    std::string plain;
    while (!text.empty()) {
        if (text.front() != '%') {
            plain += text.front();
            text.remove_prefix(1);
            continue;
        }
        unsigned octet = 0;
        std::string_view const digits = text.substr(1, 2);
        auto const [end, error] =
            std::from_chars(digits.data(), digits.data() + digits.size(), octet, 16);
        if (digits.size() < 2 || error != std::errc() || end != digits.data() + 2)
            return std::nullopt;
        plain += static_cast<char>(octet);
        text.remove_prefix(3);
    }
    return plain;
}

} // namespace

std::optional<Target> parseTarget(std::string_view text) {
    if (!text.starts_with('/')) return std::nullopt;
    Target target;
    std::string_view path = takeUpTo('?', text);
    path.remove_prefix(1);
    // "/" has no segment; "/a/" has an empty one after "a", and is another path than "/a".
    bool more = !path.empty();
    while (more) {
        more = path.find('/') != std::string_view::npos;
        auto segment = unescaped(takeUpTo('/', path));
        if (!segment) return std::nullopt;
        target.segments.push_back(*std::move(segment));
    }
    while (!text.empty()) {
        std::string_view value = takeUpTo('&', text);
        auto name = unescaped(takeUpTo('=', value));
        auto plain = unescaped(value);
        if (!name || !plain) return std::nullopt;
        target.query.emplace(*std::move(name), *std::move(plain));
    }
    return target;
}

} // namespace kvloamd
