// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Parameters.h"

#include <algorithm>
#include <cstdint>

namespace kvloamd {

std::optional<Oid> indexIn(std::string_view text) {
    Oid index;
    for (;;) {
        std::size_t const end = std::min(text.find('.'), text.size());
        auto const number = numberIn<std::uint32_t>(text.substr(0, end));
        if (!number) return std::nullopt;
        index.push_back(*number);
        if (end == text.size()) return index;
        text.remove_prefix(end + 1);
    }
}

void checkParameters(Target const& target, std::initializer_list<std::string_view> known) {
    for (auto const& [name, value] : target.query)
        if (std::ranges::find(known, name) == known.end())
            throw HttpFault(400, "this address has no parameter '" + name + "'");
}

std::vector<std::string> wordsParameter(Target const& target, std::string const& name) {
    std::vector<std::string> words;
    std::string const* const asked = target.parameter(name);
    if (asked == nullptr) return words;
    for (std::size_t begin = 0; begin <= asked->size();) {
        std::size_t const end = std::min(asked->find(',', begin), asked->size());
        words.push_back(asked->substr(begin, end - begin));
        begin = end + 1;
    }
    return words;
}

} // namespace kvloamd
