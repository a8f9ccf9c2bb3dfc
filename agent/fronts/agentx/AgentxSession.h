// SPDX-License-Identifier: BSD-2-Clause
// The agent's connection to the master of the host's SNMP agents, made again whenever it is lost.
#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/fronts/agentx/AgentxAddress.h"
#include "agent/fronts/agentx/AgentxPdu.h"
#include "agent/fronts/agentx/SharedRows.h"
#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// How long the agent waits for a master.
struct AgentxPace {
    std::chrono::milliseconds retry{1000};    ///< between two attempts to connect
    std::chrono::milliseconds ping{10000};    ///< of silence, before the master is asked
    std::chrono::milliseconds patience{5000}; ///< without an answer; then the master counts as lost
    /// Without an answer; then the connection is made anew. Long: a master that hangs and goes on
    /// finds everything in place.
    std::chrono::milliseconds surrender{60000};
};

/// Everything below a name is asked of the agent.
struct AgentxRoot {
    Oid name;         ///< absolute
    std::string what; ///< is there, for a message
    bool needed;      ///< without it there is no session
};

/// Never blocks: whoever owns it waits for its descriptor and its deadline. One log line per change
/// of the master's state. Used on one thread only.
class AgentxSession final : public NotificationSink {
  public:
    /// The response to a request of the master; empty: none. May throw AgentxError.
    using Answer = std::function<std::string(AgentxHeader const&, std::string_view payload)>;

    /// What is below `roots`, and the cells of `rows`, which outlives the session, is asked of
    /// `answer`. Begins to connect.
    AgentxSession(AgentxAddress address, std::vector<AgentxRoot> roots, SharedRows& rows,
                  Answer answer, AgentxPace pace = {});
    /// Takes leave of the master, whose clients see the names go.
    ~AgentxSession() override;
    AgentxSession(AgentxSession const&) = delete;
    AgentxSession& operator=(AgentxSession const&) = delete;

    /// The descriptor to wait for, negative while there is none, and poll()'s events.
    int descriptor() const { return m_socket; }
    short events() const;
    /// When `advance` is to be called at the latest.
    Clock::time_point deadline() const;
    /// Does what can be done: `happened` is what poll() has told of the descriptor.
    void advance(short happened);
    /// Has the master learn what is new among the rows. There is one registration under way at a
    /// time, so that requests come in between.
    void registerRows();

    /// Whether the master serves our names, the rows apart, and answers.
    bool isConnected() const { return m_told == Told::Connected; }
    /// How often the master has been lost after it was connected.
    std::uint32_t timesLost() const { return m_timesLost; }

    bool ready() const override { return isConnected() && !m_taken; }
    void send(Notification const& notification, std::function<void()> taken) override;

  private:
    enum class Told { Nothing, Connected, Lost };
    enum class Stage { Away, Connecting, Opening, Registering, Serving };
    struct Awaited {
        std::uint32_t packet;
        AgentxKind kind;
        std::size_t root = 0; ///< that is being registered
    };

    void connectNow();
    void connected();
    void receive();
    void takePacket(AgentxHeader const& header, std::string_view payload);
    void takeResponse(AgentxHeader const& header, std::string_view payload);
    void checkTime();
    void registerRoots();
    void takeRegistered(std::size_t root, AgentxFault fault);
    AgentxWriter request(AgentxKind kind);
    void queue(std::string packet);
    void flush();
    /// Gives the connection up, to try again later.
    void drop(std::string const& why);
    void disconnect();
    void tellConnected();
    void tellLost(std::string const& why);

    AgentxAddress m_address;
    std::vector<AgentxRoot> m_roots;
    SharedRows& m_rows;
    Answer m_answer;
    AgentxPace m_pace;

    int m_socket = -1;
    Stage m_stage = Stage::Away;
    Told m_told = Told::Nothing;
    std::uint32_t m_timesLost = 0;
    std::uint32_t m_session = 0;
    std::uint32_t m_lastPacket = 0;
    std::vector<Awaited> m_awaited;
    std::vector<std::string> m_refused; ///< of the roots, what has been told
    std::function<void()> m_taken;      ///< set while a notification is under way
    Clock::time_point m_retryAt;        ///< while away
    Clock::time_point m_heard;          ///< the master's last word, or when it was asked after that
    std::string m_in;
    std::string m_out;
};

} // namespace kvloamd
