// SPDX-License-Identifier: BSD-2-Clause
// The agent as a subagent of the host's SNMP master.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/fronts/Front.h"
#include "agent/fronts/agentx/AgentxAddress.h"
#include "agent/fronts/agentx/AgentxAnswers.h"
#include "agent/fronts/agentx/AgentxSession.h"
#include "agent/fronts/agentx/SharedRows.h"

namespace kvloamd {

/// A `Subagent` is the front that serves through a master: the master forwards its clients'
/// requests to the agent, and the agent's notifications to its receivers.
class Subagent final : public Front, private EventLoop::Source {
  public:
    explicit Subagent(AgentxAddress address) : m_address(std::move(address)) {}

    /// Always succeeds: the master may be absent.
    bool open() override { return true; }
    void serve(Served served) override;
    std::string place() const override { return "through the SNMP master at " + m_address.text; }
    NotificationSink& notifications() override { return *m_session; }

  private:
    std::optional<Clock::time_point> prepare(std::vector<pollfd>& polled) override;
    void handle(std::span<pollfd const> polled) override;
    /// Registers rows that have appeared, and unregisters those that have been gone for long.
    void updateRows();

    AgentxAddress m_address;
    std::function<std::shared_ptr<Snapshot const>()> m_newestSnapshot;
    Counters* m_counters = nullptr;
    std::optional<AgentxAnswers> m_answers;
    std::optional<SharedRows> m_rows;
    std::shared_ptr<Snapshot const> m_seen; ///< the snapshot of which the rows were last updated
    std::optional<AgentxSession> m_session;
};

} // namespace kvloamd
