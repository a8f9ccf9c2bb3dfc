// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/StandAlone.h"

#include <stdexcept>
#include <utility>

#include "agent/fronts/snmp/WriteAccess.h"
#include "agent/log/Log.h"

namespace kvloamd {

StandAlone::~StandAlone() {
    m_receivers.informs().stop();
    stopSnmp();
}

bool StandAlone::open() {
    std::vector<std::string> faults = startSnmp(m_files, m_receivers);
    if (faults.empty()) {
        for (std::string const& address : m_listen)
            if (std::string fault = m_sessions.listen(address); !fault.empty())
                faults.push_back(std::move(fault));
    }
    for (std::string const& fault : faults)
        log(LogLevel::Error, fault);
    return faults.empty();
}

void StandAlone::serve(Served served) {
    served.counters.setSysUpTime(snmpUpTime(), Clock::now());
    m_trees = std::move(served.trees);
    for (ServedTree const& each : m_trees) {
        SnmpHandler& handler = m_handlers.emplace_back(each.tree, served.counters, each.arc,
                                                       served.takeSnapshot, served.settings);
        for (Place const& place : each.places)
            if (!handler.serve(place.place))
                throw std::runtime_error("the SNMP library refuses to register the agent's "
                                         "objects; check --enterprise-oid");
    }
    restrictWriters(m_trees);
    for (Capability const& capability : served.capabilities)
        addCapability(capability);
    m_sessions.addTo(loop());
    loop().add(m_library);
    loop().add(m_receivers);
    m_receivers.begin([] {});
}

std::vector<std::string> StandAlone::readConfigurationAgain() {
    std::vector<std::string> faults = readSnmpConfigAgain();
    restrictWriters(m_trees);
    m_receivers.begin([] {});
    return faults;
}

} // namespace kvloamd
