// SPDX-License-Identifier: BSD-2-Clause
// The agent beside the host's own: the host's master asks it, and forwards its notifications.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "agent/fronts/Front.h"
#include "agent/fronts/agentx/AgentxAddress.h"
#include "agent/fronts/agentx/AgentxAnswers.h"
#include "agent/fronts/agentx/AgentxSession.h"
#include "agent/fronts/agentx/SharedRows.h"

namespace kvloamd {

class Subagent final : public Front {
  public:
    explicit Subagent(AgentxAddress address) : m_address(std::move(address)) {}

    /// A master need not be there yet.
    bool open() override { return true; }
    void serve(Served served) override;
    std::string place() const override { return "through the SNMP master at " + m_address.text; }
    NotificationSink& notifications() override { return *m_session; }
    void watch(int descriptor, std::function<void()> readable) override;
    void beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) override;
    void run(Clock::time_point until) override;
    void stop() override { m_stop = true; }

  private:
    struct Watched {
        int descriptor;
        std::function<void()> readable;
    };

    /// Has the master learn of rows that have come and gone.
    void updateRows();
    void step(Clock::time_point until);

    AgentxAddress m_address;
    std::function<std::shared_ptr<Snapshot const>()> m_newestSnapshot;
    Counters* m_counters = nullptr;
    std::optional<AgentxAnswers> m_answers;
    std::optional<SharedRows> m_rows;
    std::shared_ptr<Snapshot const> m_seen; ///< by the rows
    std::optional<AgentxSession> m_session;
    std::vector<Watched> m_watched;
    std::function<std::optional<Clock::time_point>()> m_prepare;
    bool m_stop = false;
};

} // namespace kvloamd
