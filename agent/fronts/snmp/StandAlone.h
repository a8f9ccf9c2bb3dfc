// SPDX-License-Identifier: BSD-2-Clause
// The agent on addresses of its own.
#pragma once

#include <list>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/fronts/Front.h"
#include "agent/fronts/snmp/SnmpConfig.h"
#include "agent/fronts/snmp/SnmpHandler.h"
#include "agent/fronts/snmp/SnmpLoop.h"
#include "agent/fronts/snmp/SnmpNotifications.h"

namespace kvloamd {

/// Starts the SNMP library when it opens, and stops it at its end.
class StandAlone final : public Front {
  public:
    /// `listen`: the addresses to serve, such as udp:127.0.0.1:1161; at least one.
    StandAlone(std::vector<std::string> listen, SnmpFiles files)
        : m_listen(std::move(listen)), m_files(std::move(files)) {}
    ~StandAlone() override;

    bool open() override;
    void serve(Served served) override;
    std::string place() const override { return "on " + m_listen.front(); }
    NotificationSink& notifications() override { return m_notifications; }
    void watch(int descriptor, std::function<void()> readable) override {
        m_loop.watch(descriptor, std::move(readable));
    }
    void beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) override {
        m_loop.beforeSleep(std::move(prepare));
    }
    void run(Clock::time_point until) override { m_loop.run(until); }
    void stop() override { m_loop.stop(); }

  private:
    std::vector<std::string> const m_listen;
    SnmpFiles const m_files;
    SnmpNotifications m_notifications;
    SnmpLoop m_loop;
    std::list<SnmpHandler> m_handlers; ///< the library keeps their addresses
};

} // namespace kvloamd
