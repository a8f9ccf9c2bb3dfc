// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Front.h"

#include <stdexcept>

#include "agent/StandAlone.h"
#include "agent/Subagent.h"

namespace kvloamd {

std::unique_ptr<Front> makeFront(Options const& options) {
    if (options.agentx.empty()) return std::make_unique<StandAlone>(options);
    auto address = parseAgentxAddress(options.agentx);
    if (!address) throw std::runtime_error("--agentx: '" + options.agentx + "' is no address");
    return std::make_unique<Subagent>(std::move(*address));
}

} // namespace kvloamd
