// SPDX-License-Identifier: BSD-2-Clause
// The receivers that acknowledge notifications.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <vector>

struct snmp_session;
struct snmp_pdu;

namespace kvloamd {

/// `Informs` send notifications to the receivers that acknowledge them, and say whether they did.
/// The SNMP library could send informs itself, but tells nobody what becomes of them.
///
/// Thread-bound to the SNMP thread; one object exists at a time, while the library is started.
class Informs {
  public:
    /// Informs that may wait to be acknowledged at the same time, of all receivers together.
    static constexpr std::size_t kMostPending = 8192;

    Informs() = default;
    ~Informs();
    Informs(Informs const&) = delete;
    Informs& operator=(Informs const&) = delete;

    /// Runs `parse`, by which the library opens a receiver of informs, and takes over its session.
    void takeOver(std::function<void()> const& parse);
    /// Closes all sessions. What waits to be acknowledged counts as not acknowledged.
    void closeAll();
    /// The same without telling anybody, before the library is stopped.
    void stop();

    enum class Fate {
        Done,    ///< there are no receivers of informs
        Refused, ///< at least one inform was not sent, because too many wait
        Pending  ///< receivers have yet to acknowledge it
    };
    /// Calls `send`, which makes the library send a notification, and sends that to the receivers
    /// of informs. If it is pending, `settled` is called once, later: with true when all receivers
    /// have acknowledged it, with false when at least one has not, as often as its session has
    /// asked.
    Fate follow(std::function<void()> const& send, std::function<void(bool)> settled);

  private:
    /// A notification on its way to all receivers of informs.
    struct Flight {
        std::size_t pending = 0;
        bool refused = false;
        bool acknowledged = true;          ///< by all that have answered so far
        std::function<void(bool)> settled; ///< empty: nobody asks
    };

    // What the library calls.
    static int registerSession(int major, int minor, void* arguments, void* none);
    static int sendTrap(int major, int minor, void* notification, void* none);
    static int takeAnswer(int operation, snmp_session* session, int request, snmp_pdu* answer,
                          void* number);

    void send(snmp_pdu const& notification);
    void end(std::uintptr_t number, bool acknowledged);

    std::vector<snmp_session*> m_sessions;
    std::map<std::uintptr_t, std::shared_ptr<Flight>> m_pending; ///< informs by number
    std::uintptr_t m_last = 0;                                   ///< the number of an inform
    std::shared_ptr<Flight> m_flight; ///< of the notification that is being sent; may be null
};

} // namespace kvloamd
