// SPDX-License-Identifier: BSD-2-Clause
// The agent on addresses of its own.
#pragma once

#include <list>
#include <optional>

#include "agent/Front.h"
#include "agent/SnmpHandler.h"
#include "agent/SnmpLoop.h"
#include "agent/SnmpNotifications.h"

namespace kvloamd {

/// Starts the SNMP library when it opens, and stops it at its end.
class StandAlone final : public Front {
  public:
    /// `options` outlive the front.
    explicit StandAlone(Options const& options) : m_options(options) {}
    ~StandAlone() override;

    bool open() override;
    void serve(Served served) override;
    std::string place() const override { return "on " + m_options.listen.front(); }
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
    Options const& m_options;
    SnmpNotifications m_notifications;
    SnmpLoop m_loop;
    std::list<SnmpHandler> m_handlers; ///< the library keeps their addresses
};

} // namespace kvloamd
