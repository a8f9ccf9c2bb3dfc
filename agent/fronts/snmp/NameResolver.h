// SPDX-License-Identifier: BSD-2-Clause
// Resolves host names without delaying the SNMP thread.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace kvloamd {

/// A `NameResolver` asks the system for the numbers of host names on a thread of its own, one name
/// after the other, because a name server may take as long as it likes. The thread starts with the
/// first question. It is detached, so that a name server that never answers does not delay the end
/// of the resolver. Thread-bound to the SNMP thread.
class NameResolver {
  public:
    struct Answer {
        std::uint64_t question;
        std::optional<std::string> number; ///< nothing: the name does not resolve
        std::string fault;                 ///< why, if it does not
    };

    NameResolver();
    ~NameResolver();
    NameResolver(NameResolver const&) = delete;
    NameResolver& operator=(NameResolver const&) = delete;

    /// Readable when there are answers.
    int descriptor() const;
    /// Asks for a number of `family` (AF_INET, AF_INET6). Returns the number of the question.
    std::uint64_t ask(std::string const& name, int family);
    /// Drops the questions that the thread has not begun to ask.
    void dropQuestions();
    /// Removes the answers that have come.
    std::vector<Answer> take();

  private:
    struct State;

    static void run(std::shared_ptr<State> const& state);

    std::shared_ptr<State> m_state; ///< shared with the thread
    std::uint64_t m_lastQuestion = 0;
    bool m_started = false;
};

} // namespace kvloamd
