// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/Capabilities.h"

#include <sys/utsname.h>

#include <array>

namespace kvloamd {

namespace {

// Relative to the enterprise arc.
Oid const kOwnModule{1};
Oid const kCapabilityStatement{1, 3, 1};
Oid const kAgentProduct{1, 4, 1};

struct StandardModule {
    char const* name;
    Oid identity; ///< absolute
};

std::array<StandardModule, 9> const kModules{{{"IF-MIB", {1, 3, 6, 1, 2, 1, 31}},
                                              {"EtherLike-MIB", {1, 3, 6, 1, 2, 1, 35}},
                                              {"DS1-MIB", {1, 3, 6, 1, 2, 1, 10, 18}},
                                              {"DS0-MIB", {1, 3, 6, 1, 2, 1, 10, 81}},
                                              {"ISDN-MIB", {1, 3, 6, 1, 2, 1, 10, 20}},
                                              {"ENTITY-MIB", {1, 3, 6, 1, 2, 1, 47}},
                                              {"NOTIFICATION-LOG-MIB", {1, 3, 6, 1, 2, 1, 92}},
                                              {"ALARM-MIB", {1, 3, 6, 1, 2, 1, 118}},
                                              {"ENTITY-STATE-MIB", {1, 3, 6, 1, 2, 1, 131}}}};

} // namespace

std::vector<Capability> capabilities(Oid const& enterprise, std::string const& version) {
    std::vector<Capability> all;
    all.push_back({joined(enterprise, kCapabilityStatement),
                   "kvloamd " + version + ", as KVL-OAM-CAPABILITIES-MIB states"});
    all.push_back({joined(enterprise, kOwnModule), "The MIB module KVL-OAM-MIB"});
    for (StandardModule const& module : kModules)
        all.push_back({module.identity, std::string("The MIB module ") + module.name});
    return all;
}

std::string systemDescription(std::string const& version) {
    std::string description = "KVL OAM agent kvloamd " + version;
    utsname host{};
    if (uname(&host) != 0) return description;
    return description + " on " + host.nodename + " (" + host.sysname + " " + host.release + " " +
           host.machine + ")";
}

Oid systemObjectId(Oid const& enterprise) {
    return joined(enterprise, kAgentProduct);
}

} // namespace kvloamd
