// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardFaults.h"

#include <exception>
#include <mutex>
#include <set>
#include <string>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

/// More are not logged.
constexpr std::size_t kMostFaults = 4096;

/// What cannot be read, and of which board.
class Faults {
  public:
    bool insert(std::uint32_t board, std::string const& what) {
        std::scoped_lock const guard(m_mutex);
        return m_faults.size() < kMostFaults && m_faults.emplace(board, what).second;
    }
    bool erase(std::uint32_t board, std::string const& what) {
        std::scoped_lock const guard(m_mutex);
        return !m_faults.empty() && m_faults.erase({board, what}) > 0;
    }

  private:
    std::mutex m_mutex;
    std::set<std::pair<std::uint32_t, std::string>> m_faults;
};

Faults& faults() {
    static Faults all;
    return all;
}

} // namespace

bool readGuarded(std::uint32_t boardIndex, char const* what, std::function<void()> const& read) {
    std::string why;
    try {
        read();
        if (faults().erase(boardIndex, what))
            log(LogLevel::Info,
                "board " + std::to_string(boardIndex) + ": its " + what + " can be read again");
        return true;
    } catch (std::exception const& error) {
        why = error.what();
    } catch (...) {
        why = "unknown exception";
    }
    if (faults().insert(boardIndex, what))
        log(LogLevel::Warning, "board " + std::to_string(boardIndex) + ": its " + what +
                                   " cannot be read: " + why + "; the other boards are read");
    return false;
}

} // namespace kvloamd
