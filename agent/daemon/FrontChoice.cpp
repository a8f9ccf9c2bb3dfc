// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/FrontChoice.h"

#include <stdexcept>

#include "agent/fronts/agentx/Subagent.h"
#include "agent/fronts/snmp/StandAlone.h"

namespace kvloamd {

std::unique_ptr<Front> makeFront(Options const& options) {
    if (options.agentx.empty())
        return std::make_unique<StandAlone>(options.listen, snmpFiles(options));
    auto address = parseAgentxAddress(options.agentx);
    if (!address) throw std::runtime_error("--agentx: '" + options.agentx + "' is not an address");
    return std::make_unique<Subagent>(std::move(*address));
}

SnmpFiles snmpFiles(Options const& options) {
    return {options.snmpConfig, options.persistentDirectory, systemDescription(KVLOAM_VERSION),
            systemObjectId(options.enterprise)};
}

} // namespace kvloamd
