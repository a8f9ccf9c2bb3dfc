// SPDX-License-Identifier: BSD-2-Clause
// The agent's connection to the SNMP master.
#pragma once

#include <chrono>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/fronts/Capabilities.h"
#include "agent/fronts/agentx/AgentxAddress.h"
#include "agent/fronts/agentx/AgentxPdu.h"
#include "agent/fronts/agentx/SharedRows.h"
#include "agent/log/RepeatFilter.h"
#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// The intervals of a session.
struct AgentxPace {
    std::chrono::milliseconds retry{1000}; ///< between two attempts to connect
    std::chrono::milliseconds ping{10000}; ///< of silence, then the session sends a Ping
    std::chrono::milliseconds patience{
        5000}; ///< without a response, then the master counts as lost
    /// Without a response, then the session reconnects. Long, so that a master that hangs and
    /// recovers finds everything in place.
    std::chrono::milliseconds surrender{60000};
    /// The longest pause before the agent connects again to a master that misbehaves.
    std::chrono::milliseconds longestRetry{60000};
    /// A connection that lasts so long ends such pauses.
    std::chrono::milliseconds steady{60000};
};

/// A subtree that the agent registers.
struct AgentxRoot {
    Oid name;         ///< absolute
    std::string what; ///< the MIB module, for a message
    bool needed;      ///< the session ends when the master refuses it
};

/// An `AgentxSession` is the connection to a master. It connects again whenever it is lost, and
/// logs one line for each change of state. The pause before that doubles each time that the master
/// has sent something malformed, or that the connection has lasted only for a short time, so that
/// such a master causes neither load nor many log lines. It never blocks: its owner waits for the
/// descriptor and the deadline, and calls `advance`. Thread-bound to the SNMP thread.
class AgentxSession final : public NotificationSink {
  public:
    /// Returns the response to a request of the master, empty if there is none. May throw
    /// AgentxError.
    using Answer = std::function<std::string(AgentxHeader const&, std::string_view payload)>;
    using Now = std::function<Clock::time_point()>;

    /// Registers `roots` and the cells of `rows`, and answers requests for them by `answer`. Adds
    /// `capabilities` to the master's sysORTable. Begins to connect. `rows` outlives the session.
    /// `now`: the clock that `pace` refers to.
    AgentxSession(AgentxAddress address, std::vector<AgentxRoot> roots, SharedRows& rows,
                  Answer answer, AgentxPace pace = {}, std::vector<Capability> capabilities = {},
                  Now now = &Clock::now);
    /// Closes the session, so that the master removes the agent's objects at once.
    ~AgentxSession() override;
    AgentxSession(AgentxSession const&) = delete;
    AgentxSession& operator=(AgentxSession const&) = delete;

    /// The descriptor to wait for, negative while there is none, and the events for poll().
    int descriptor() const { return m_socket; }
    short events() const;
    /// The latest time of the next `advance`.
    Clock::time_point deadline() const;
    /// Continues the session. `happened`: the events that poll() returned for the descriptor.
    void advance(short happened);
    /// Registers the next range of rows that is not yet registered. One registration is under way
    /// at a time, so that the master can send requests in between.
    void registerRows();

    /// Whether the roots are registered and the master responds.
    bool isConnected() const { return m_told == Told::Connected; }
    /// How often an established connection was lost.
    std::uint32_t timesLost() const { return m_timesLost; }

    /// The master's sysUpTime as its last response had it, and when that came.
    struct MasterTime {
        std::uint32_t ticks;
        Clock::time_point when;
    };
    /// Nothing before the first response.
    std::optional<MasterTime> const& masterTime() const { return m_masterTime; }

    bool ready() const override { return isConnected() && !m_delivered; }
    void send(Notification const& notification, Delivered delivered) override;

  private:
    enum class Told { Nothing, Connected, Lost };
    enum class Stage { Away, Connecting, Opening, Registering, Serving };
    struct Awaited {
        std::uint32_t packet;
        AgentxKind kind;
        std::size_t root; ///< index of the root that it registers
        Clock::time_point sent;
    };

    void connectNow();
    void connected();
    void receive();
    void takePacket(AgentxHeader const& header, std::string_view payload);
    void takeResponse(AgentxHeader const& header, std::string_view payload);
    void checkTime();
    /// Whether the master has answered other requests, but not this one for too long.
    bool isOverdue(Awaited const& awaited, Clock::time_point now) const;
    /// Gives overdue requests up, so that they do not block others.
    void expireRequests();
    void registerRoots();
    void takeRegistered(std::size_t root, AgentxFault fault);
    void addCapabilities();
    AgentxWriter request(AgentxKind kind);
    void queue(std::string packet);
    void flush();
    /// Closes the connection and schedules the next attempt.
    void drop(std::string const& why);
    /// The same for a master that does not follow the protocol.
    void dropMisbehaving(std::string const& why);
    /// The pause before the next attempt to connect.
    std::chrono::milliseconds nextPause(bool misbehaves);
    void disconnect();
    void tellConnected();
    void tellLost(std::string const& why);

    AgentxAddress m_address;
    std::vector<AgentxRoot> m_roots;
    SharedRows& m_rows;
    Answer m_answer;
    AgentxPace m_pace;
    std::vector<Capability> m_capabilities;
    Now const m_now;

    int m_socket = -1;
    Stage m_stage = Stage::Away;
    Told m_told = Told::Nothing;
    std::uint32_t m_timesLost = 0;
    std::uint32_t m_session = 0;
    std::uint32_t m_lastPacket = 0;
    std::vector<Awaited> m_awaited;
    std::optional<MasterTime> m_masterTime;
    std::vector<std::string> m_refused; ///< roots whose refusal has been logged
    Delivered m_delivered;              ///< set while a notification awaits its response
    Clock::time_point m_retryAt;        ///< while away
    std::chrono::milliseconds m_pause;  ///< before connecting to a master that misbehaves
    Clock::time_point m_connectedAt;
    Clock::time_point m_heard; ///< the master's last word, or when it was asked after that
    RepeatFilter m_repeats;    ///< of lines about notifications
    std::string m_in;
    std::string m_out;
};

} // namespace kvloamd
