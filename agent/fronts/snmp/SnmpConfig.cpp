// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpConfig.h"

#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>

#include "agent/fronts/snmp/LibraryLog.h"
#include "agent/fronts/snmp/Receivers.h"
#include "agent/log/Log.h"

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
#include <net-snmp/agent/mib_modules.h>
#include <net-snmp/agent/agent_read_config.h>
#include <net-snmp/agent/agent_sysORTable.h>
// clang-format on

namespace kvloamd {

namespace {

constexpr char kAppName[] = "kvloamd";

/// The library's MIB modules that a stand-alone agent needs: the system group, access control,
/// users and notification receivers. Its modules about the host are left out.
constexpr char kLibraryModules[] =
    "system_mib,sysORTable,snmp_mib,setSerialNo,vacm_vars,vacm_conf,vacm_context,snmpEngine,"
    "snmpMPDStats,usmConf,usmStats,usmUser,snmpNotifyTable,snmpNotifyTable_data,"
    "snmpNotifyFilterTable,snmpNotifyFilterTable_data_storage,snmpNotifyFilterTable_data_access,"
    "snmpNotifyFilterProfileTable,snmpNotifyFilterProfileTable_data,snmpTargetAddrEntry,"
    "snmpTargetAddrEntry_data,snmpTargetParamsEntry,snmpTargetParamsEntry_data,target_counters";

bool started = false;

void nameConfiguration(SnmpFiles const& files) {
    if (!files.persistentDirectory.empty())
        netsnmp_ds_set_string(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_PERSISTENT_DIR,
                              files.persistentDirectory.c_str());
    if (files.configuration.empty()) return;
    // Read this file only, and the persistent state, which the library reads separately. No file
    // can exist below /dev/null.
    set_configuration_directory("/dev/null");
    unsetenv("SNMPCONFPATH");
    netsnmp_ds_set_string(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_OPTIONALCONFIG,
                          files.configuration.c_str());
}

/// Carries out a directive of the library's configuration, which is not read yet.
void configure(char const* token, std::string value) {
    for (config_line* each = read_config_get_handlers(kAppName); each != nullptr; each = each->next)
        if (std::strcmp(each->config_token, token) == 0) each->parse_line(token, value.data());
}

/// Sets what the library would otherwise say about itself. The configuration, which is read later,
/// takes precedence.
void describeSystem(SnmpFiles const& files) {
    // sysServices: end-to-end (RFC 3418's layer 4) and applications (layer 7).
    configure("sysservices", "72");
    if (!files.systemDescription.empty()) configure("sysdescr", files.systemDescription);
    if (files.systemObjectId.empty()) return;
    std::string name;
    for (std::uint32_t const part : files.systemObjectId)
        name += "." + std::to_string(part);
    configure("sysobjectid", name);
}

/// Saves engine ID, engine boots and users before the first request, so that no end of the process
/// loses them.
void keepEngineState(SnmpFiles const& files) {
    snmp_store(kAppName);
    std::string const path = persistentDirectory(files) + "/" + kAppName + ".conf";
    std::ifstream state(path);
    for (std::string line; std::getline(state, line);)
        if (line.starts_with("engineBoots")) return;
    log(LogLevel::Warning, path + ": SNMPv3 engine state cannot be saved, so SNMPv3 managers will "
                                  "refuse the agent after a restart; check --persistent-dir");
}

void warnIfNobodyMayAsk(LibraryFaults const& faults) {
    if (faults.nobodyMayAsk() && faults.lines().empty())
        log(LogLevel::Warning, "no community and no user is configured, so nobody gets an answer; "
                               "configure them in the file that --snmp-config names");
}

} // namespace

std::vector<std::string> startSnmp(SnmpFiles const& files, Receivers& receivers) {
    if (!files.configuration.empty() && access(files.configuration.c_str(), R_OK) != 0)
        return {files.configuration + ": cannot be read: " + std::strerror(errno) +
                "; check --snmp-config"};
    takeLibraryLog();
    // The agent names objects by number, so the library need not parse MIB files.
    setenv("MIBS", "", 0);
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID, NETSNMP_DS_AGENT_ROLE, 0);
    // Without this, the library logs a line for every packet.
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID,
                           NETSNMP_DS_AGENT_DONT_LOG_TCPWRAPPERS_CONNECTS, 1);
    nameConfiguration(files);

    LibraryFaults const faults;
    std::string modules = kLibraryModules;
    add_to_init_list(modules.data());
    init_agent(kAppName);
    init_mib_modules();
    receivers.takeDirectives();
    describeSystem(files);
    init_snmp(kAppName);
    started = true;
    keepEngineState(files);
    warnIfNobodyMayAsk(faults);
    return faults.lines();
}

std::vector<std::string> readSnmpConfigAgain() {
    LibraryFaults const faults;
    // What the library keeps is newer in memory than in its file.
    netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DISABLE_PERSISTENT_LOAD, 1);
    update_config();
    netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DISABLE_PERSISTENT_LOAD, 0);
    snmp_store(kAppName);
    warnIfNobodyMayAsk(faults);
    return faults.lines();
}

std::string persistentDirectory(SnmpFiles const& files) {
    if (!files.persistentDirectory.empty()) return files.persistentDirectory;
    char const* const directory = get_persistent_directory();
    return directory == nullptr ? std::string() : std::string(directory);
}

void addCapability(Capability const& capability) {
    std::vector<oid> id(capability.id.begin(), capability.id.end());
    register_sysORTable(id.data(), id.size(), capability.description.c_str());
}

std::uint32_t snmpUpTime() {
    return static_cast<std::uint32_t>(netsnmp_get_agent_uptime());
}

void stopSnmp() {
    if (!started) return;
    snmp_shutdown(kAppName);
    shutdown_agent();
}

} // namespace kvloamd
