// SPDX-License-Identifier: BSD-2-Clause
// Makes the names and descriptions of all boards' interfaces different from each other.
#pragma once

#include <cstdint>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace kvloamd {

/// What an interface is called.
struct InterfaceTexts {
    std::uint32_t ifIndex = 0;
    std::string name;
    std::string description;

    bool operator==(InterfaceTexts const&) const = default;
};

/// What the interfaces of a board are called.
struct BoardTexts {
    std::string board; ///< what to call the board
    std::vector<InterfaceTexts> interfaces;

    bool operator==(BoardTexts const&) const = default;
};

/// A `TextCounts` counts how many interfaces have a text as their boards give it, and how many have
/// it because the name of their board follows. Unsynchronised.
class TextCounts {
  public:
    void countGiven(std::string const& text, int change) { changed(text).given += change; }
    void countFollowed(std::string const& text, int change) { changed(text).followed += change; }

    /// Whether several interfaces are given the text.
    bool isCommon(std::string const& text) const { return of(text).isCommon(); }
    /// Whether several interfaces have the text once the names of boards follow the common ones.
    bool isCommonStill(std::string const& text) const { return of(text).isCommonStill(); }

    /// Whether a text has become common since the last `settle`, or has ceased to be so, in either
    /// way.
    bool hasCommonChanged() const;
    /// Makes the present counts those with which `hasCommonChanged` compares.
    void settle();
    void clear();

  private:
    struct Count {
        int given = 0;
        int followed = 0;

        bool isCommon() const { return given > 1; }
        bool isCommonStill() const { return followed + (given == 1 ? 1 : 0) > 1; }
    };

    Count& changed(std::string const& text);
    Count of(std::string const& text) const;

    std::unordered_map<std::string, Count> m_counts;
    std::unordered_map<std::string, Count> m_former; ///< of the texts whose counts have changed
};

/// A `DistinctNames` makes the names of all interfaces different from each other, and the
/// descriptions as well. While several interfaces have the same name, "@" and the board follow
/// each; interfaces that still have the same name are told apart by their ifIndex.
///
/// It counts the names, because most names that come or go leave those of other boards as they
/// are. Unsynchronised.
class DistinctNames {
  public:
    // What interfaces are called by their boards. Takes effect with `update` or `countAnew`.
    void add(BoardTexts const& texts) { m_added.push_back(texts); }
    void remove(BoardTexts texts) { m_removed.push_back(std::move(texts)); } ///< was added

    /// Returns false if interfaces of other boards than those that were added may now be called
    /// otherwise, and everything has to be counted anew.
    bool update();
    void countAnew(std::vector<BoardTexts const*> const& all);

    /// Makes the texts of a board, which are counted, different from all others.
    std::vector<InterfaceTexts> distinguish(BoardTexts const& texts) const;

  private:
    void countGiven(BoardTexts const& texts, int change);
    void countFollowed(BoardTexts const& texts, int change);

    TextCounts m_names;
    TextCounts m_descriptions;
    std::vector<BoardTexts> m_added;
    std::vector<BoardTexts> m_removed;
};

} // namespace kvloamd
