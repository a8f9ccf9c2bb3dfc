// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceNames.h"

#include <algorithm>
#include <cstddef>
#include <string_view>

#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

struct Words {
    std::string_view name;
    std::string_view description;
};

Words wordsOf(IndexKind kind) {
    switch (kind) {
    case IndexKind::Line:
        return {"line", "line"};
    case IndexKind::Ethernet:
        return {"eth", "Ethernet interface"};
    case IndexKind::Ip:
        return {"ip", "IP interface"};
    default:
        return {"if", "interface"};
    }
}

} // namespace

std::string withSuffix(std::string const& text, std::string const& suffix) {
    std::size_t const room = kLongestText - std::min(suffix.size(), kLongestText);
    return printable(text.substr(0, room) + suffix);
}

void completeName(InterfaceRow& row, IndexKey const& key, std::string const& board) {
    Words const words = wordsOf(key.kind);
    if (row.name.empty())
        row.name = withSuffix(std::string(words.name) + key.name, "@" + board);
    else if (key.name.starts_with(row.name + "#")) // another of its board has its name
        row.name = key.name;
    if (row.description.empty())
        row.description =
            withSuffix(std::string(words.description) + " " + key.name, " of board " + board);
}

} // namespace kvloamd
