// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceNames.h"

#include <algorithm>
#include <cstdint>
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

/// `text` with `suffix`, of the longest length that is served.
std::string withSuffix(std::string const& text, std::string const& suffix) {
    std::size_t const room = kLongestText - std::min(suffix.size(), kLongestText);
    return printable(text.substr(0, room) + suffix);
}

/// Appends to each text that others have too. Returns whether there was one.
template <class Suffix>
bool appendToCommon(std::vector<InterfaceTexts>& interfaces, std::string InterfaceTexts::*text,
                    Suffix suffix) {
    std::unordered_map<std::string_view, int> counts;
    counts.reserve(interfaces.size());
    for (InterfaceTexts const& each : interfaces)
        ++counts[each.*text];
    if (counts.size() == interfaces.size()) return false;
    std::vector<InterfaceTexts*> common;
    for (InterfaceTexts& each : interfaces)
        if (counts.at(each.*text) > 1) common.push_back(&each);
    for (InterfaceTexts* const each : common)
        each->*text = withSuffix(each->*text, suffix(*each));
    return true;
}

} // namespace

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

void distinguishNames(std::vector<InterfaceTexts>& interfaces,
                      std::unordered_map<std::uint32_t, std::string> const& boards) {
    auto const board = [&](InterfaceTexts const& row) {
        auto const found = boards.find(row.boardIndex);
        return found == boards.end() ? std::string() : found->second;
    };
    auto const index = [](InterfaceTexts const& row) { return "#" + std::to_string(row.ifIndex); };
    if (appendToCommon(interfaces, &InterfaceTexts::name,
                       [&](InterfaceTexts const& row) { return "@" + board(row); }))
        appendToCommon(interfaces, &InterfaceTexts::name, index);
    if (appendToCommon(interfaces, &InterfaceTexts::description,
                       [&](InterfaceTexts const& row) { return " of board " + board(row); }))
        appendToCommon(interfaces, &InterfaceTexts::description, index);
}

} // namespace kvloamd
