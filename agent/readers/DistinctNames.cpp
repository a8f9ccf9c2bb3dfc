// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/DistinctNames.h"

#include <algorithm>

#include "agent/readers/InterfaceNames.h"

namespace kvloamd {

namespace {

std::string withBoard(std::string const& name, BoardTexts const& texts) {
    return withSuffix(name, "@" + texts.board);
}

std::string describedWithBoard(std::string const& description, BoardTexts const& texts) {
    return withSuffix(description, " of board " + texts.board);
}

} // namespace

TextCounts::Count& TextCounts::changed(std::string const& text) {
    Count& count = m_counts[text];
    m_former.try_emplace(text, count);
    return count;
}

TextCounts::Count TextCounts::of(std::string const& text) const {
    auto const found = m_counts.find(text);
    return found == m_counts.end() ? Count{} : found->second;
}

bool TextCounts::hasCommonChanged() const {
    return std::ranges::any_of(m_former, [this](auto const& former) {
        Count const now = of(former.first);
        return now.isCommon() != former.second.isCommon() ||
               now.isCommonStill() != former.second.isCommonStill();
    });
}

void TextCounts::settle() {
    for (auto const& [text, former] : m_former)
        if (Count const now = of(text); now.given == 0 && now.followed == 0) m_counts.erase(text);
    m_former.clear();
}

void TextCounts::clear() {
    m_counts.clear();
    m_former.clear();
}

bool DistinctNames::update() {
    for (BoardTexts const& texts : m_removed)
        countGiven(texts, -1);
    for (BoardTexts const& texts : m_added)
        countGiven(texts, 1);
    // The same texts are common as when the removed ones were counted, so that the counts match.
    if (m_names.hasCommonChanged() || m_descriptions.hasCommonChanged()) return false;
    for (BoardTexts const& texts : m_removed)
        countFollowed(texts, -1);
    for (BoardTexts const& texts : m_added)
        countFollowed(texts, 1);
    if (m_names.hasCommonChanged() || m_descriptions.hasCommonChanged()) return false;
    m_names.settle();
    m_descriptions.settle();
    m_removed.clear();
    m_added.clear();
    return true;
}

void DistinctNames::countAnew(std::vector<BoardTexts const*> const& all) {
    m_removed.clear();
    m_added.clear();
    m_names.clear();
    m_descriptions.clear();
    for (BoardTexts const* const texts : all)
        countGiven(*texts, 1);
    for (BoardTexts const* const texts : all)
        countFollowed(*texts, 1);
    m_names.settle();
    m_descriptions.settle();
}

void DistinctNames::countGiven(BoardTexts const& texts, int change) {
    for (InterfaceTexts const& each : texts.interfaces) {
        m_names.countGiven(each.name, change);
        m_descriptions.countGiven(each.description, change);
    }
}

void DistinctNames::countFollowed(BoardTexts const& texts, int change) {
    for (InterfaceTexts const& each : texts.interfaces) {
        if (m_names.isCommon(each.name)) m_names.countFollowed(withBoard(each.name, texts), change);
        if (m_descriptions.isCommon(each.description))
            m_descriptions.countFollowed(describedWithBoard(each.description, texts), change);
    }
}

std::vector<InterfaceTexts> DistinctNames::distinguish(BoardTexts const& texts) const {
    std::vector<InterfaceTexts> all = texts.interfaces;
    for (InterfaceTexts& each : all) {
        std::string const index = "#" + std::to_string(each.ifIndex);
        if (m_names.isCommon(each.name)) each.name = withBoard(each.name, texts);
        if (m_names.isCommonStill(each.name)) each.name = withSuffix(each.name, index);
        if (m_descriptions.isCommon(each.description))
            each.description = describedWithBoard(each.description, texts);
        if (m_descriptions.isCommonStill(each.description))
            each.description = withSuffix(each.description, index);
    }
    return all;
}

} // namespace kvloamd
