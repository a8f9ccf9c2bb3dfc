// SPDX-License-Identifier: BSD-2-Clause
// Keeps a line that comes again and again from filling the log.
#pragma once

#include <chrono>
#include <map>
#include <string>

namespace kvloamd {

/// Passes a text once in every `pause`. Used on one thread.
class RepeatFilter {
  public:
    using Clock = std::chrono::steady_clock;

    static constexpr std::chrono::minutes kPause{1};
    static constexpr std::size_t kRemembered = 256;

    bool passes(std::string const& text, Clock::time_point now) {
        std::erase_if(m_passed, [&](auto const& entry) { return now - entry.second >= kPause; });
        if (m_passed.contains(text)) return false;
        // Texts that differ every time, a port in each, are not worth all the memory.
        if (m_passed.size() >= kRemembered) return false;
        m_passed.emplace(text, now);
        return true;
    }

  private:
    std::map<std::string, Clock::time_point> m_passed;
};

} // namespace kvloamd
