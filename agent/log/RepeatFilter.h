// SPDX-License-Identifier: BSD-2-Clause
// Limits how often similar log lines are written.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <map>
#include <string>

namespace kvloamd {

/// A `RepeatFilter` passes each text once per minute, and at most `kPerKind` texts of one kind. The
/// kind is the text's first words: a flood of lines that differ in a name or an address does not
/// suppress the first line about another trouble. Unsynchronised.
class RepeatFilter {
  public:
    using Clock = std::chrono::steady_clock;

    static constexpr std::chrono::minutes kPause{1};
    static constexpr std::size_t kPerKind = 16;
    /// The kinds that are remembered; the one seen longest ago is forgotten for a new one.
    static constexpr std::size_t kKinds = 64;

    bool passes(std::string const& text, Clock::time_point now) {
        std::string const kind = kindOf(text);
        if (!m_kinds.contains(kind) && m_kinds.size() >= kKinds)
            m_kinds.erase(std::ranges::min_element(
                m_kinds, {}, [](auto const& entry) { return entry.second.seen; }));
        Kind& known = m_kinds.try_emplace(kind, Kind{}).first->second;
        known.seen = now;
        std::erase_if(known.passed,
                      [&](auto const& entry) { return now - entry.second >= kPause; });
        return known.passed.size() < kPerKind && known.passed.emplace(text, now).second;
    }

  private:
    struct Kind {
        Clock::time_point seen; ///< the latest line
        std::map<std::string, Clock::time_point> passed;
    };

    static std::string kindOf(std::string const& text) {
        constexpr int kWords = 3;
        std::size_t end = 0;
        for (int word = 0; word < kWords && end != std::string::npos; ++word)
            end = text.find_first_of(" 0123456789", word == 0 ? 0 : end + 1);
        return text.substr(0, end);
    }

    std::map<std::string, Kind> m_kinds;
};

} // namespace kvloamd
