// SPDX-License-Identifier: BSD-2-Clause
// The agent as an SNMP agent with addresses of its own.
#pragma once

#include <list>
#include <string>
#include <utility>
#include <vector>

#include "agent/fronts/Front.h"
#include "agent/fronts/snmp/LibrarySource.h"
#include "agent/fronts/snmp/Receivers.h"
#include "agent/fronts/snmp/SnmpConfig.h"
#include "agent/fronts/snmp/SnmpHandler.h"
#include "agent/fronts/snmp/SnmpNotifications.h"
#include "agent/fronts/snmp/SnmpSessions.h"

namespace kvloamd {

/// A `StandAlone` is the front that answers SNMP requests itself, by the SNMP library. `open`
/// starts the library, the destructor stops it.
class StandAlone final : public Front {
  public:
    /// `listen`: the addresses to listen at, such as udp:127.0.0.1:1161; at least one.
    StandAlone(std::vector<std::string> listen, SnmpFiles files)
        : m_listen(std::move(listen)), m_files(std::move(files)) {}
    ~StandAlone() override;

    bool open() override;
    void serve(Served served) override;
    std::vector<std::string> readConfigurationAgain() override;
    std::string place() const override { return "on " + m_listen.front(); }
    NotificationSink& notifications() override { return m_notifications; }

  private:
    std::vector<std::string> const m_listen;
    SnmpFiles const m_files;
    Receivers m_receivers;
    SnmpNotifications m_notifications{m_receivers};
    SnmpSessions m_sessions;
    LibrarySource m_library;
    std::list<SnmpHandler> m_handlers; ///< the library keeps pointers to them
    std::vector<ServedTree> m_trees;
};

} // namespace kvloamd
