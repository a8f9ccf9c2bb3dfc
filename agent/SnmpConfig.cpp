// SPDX-License-Identifier: BSD-2-Clause
#include "agent/SnmpConfig.h"

#include <unistd.h>

#include <cstdlib>

#include "agent/Log.h"

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
#include <net-snmp/agent/mib_modules.h>
// clang-format on

namespace kvloamd {

namespace {

constexpr char kAppName[] = "kvloamd";

/// The parts of the library's own agent that an agent of its own needs: what it says of itself,
/// access control, users, and where notifications go. Everything about the host is left to others.
constexpr char kLibraryModules[] =
    "system_mib,sysORTable,snmp_mib,setSerialNo,vacm_vars,vacm_conf,vacm_context,snmpEngine,"
    "snmpMPDStats,usmConf,usmStats,usmUser,snmpNotifyTable,snmpNotifyTable_data,"
    "snmpNotifyFilterTable,snmpNotifyFilterTable_data_storage,snmpNotifyFilterTable_data_access,"
    "snmpNotifyFilterProfileTable,snmpNotifyFilterProfileTable_data,snmpTargetAddrEntry,"
    "snmpTargetAddrEntry_data,snmpTargetParamsEntry,snmpTargetParamsEntry_data,target_counters";

/// While the configuration is read, its faults are collected here instead of logged.
std::vector<std::string>* configFaults = nullptr;

LogLevel levelOf(int priority) {
    if (priority <= LOG_ERR) return LogLevel::Error;
    if (priority == LOG_WARNING) return LogLevel::Warning;
    // The library's own information is about its inner life.
    return LogLevel::Debug;
}

int takeLogLine(int, int, void* message, void*) {
    auto const* const entry = static_cast<snmp_log_message const*>(message);
    std::string text = entry->msg;
    while (!text.empty() && text.back() == '\n')
        text.pop_back();
    LogLevel const level = levelOf(entry->priority);
    if (configFaults != nullptr && level <= LogLevel::Warning)
        configFaults->push_back(std::move(text));
    else
        log(level, text);
    return SNMP_ERR_NOERROR;
}

void nameConfiguration(Options const& options) {
    if (!options.persistentDirectory.empty())
        netsnmp_ds_set_string(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_PERSISTENT_DIR,
                              options.persistentDirectory.c_str());
    if (options.snmpConfig.empty()) return;
    // Only this file counts then, and the state of former runs, which is read along with the
    // configuration directories: so those are reduced to that one.
    set_configuration_directory(get_persistent_directory());
    netsnmp_ds_set_string(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_OPTIONALCONFIG,
                          options.snmpConfig.c_str());
}

} // namespace

std::vector<std::string> startSnmp(Options const& options) {
    snmp_disable_stderrlog();
    snmp_enable_calllog();
    snmp_register_callback(SNMP_CALLBACK_LIBRARY, SNMP_CALLBACK_LOGGING, takeLogLine, nullptr);
    // The agent names objects by number: no MIB files are parsed.
    setenv("MIBS", "", 0);
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID, NETSNMP_DS_AGENT_ROLE, 0);
    // Not a line for every packet.
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID,
                           NETSNMP_DS_AGENT_DONT_LOG_TCPWRAPPERS_CONNECTS, 1);
    nameConfiguration(options);

    std::vector<std::string> faults;
    if (!options.snmpConfig.empty() && access(options.snmpConfig.c_str(), R_OK) != 0)
        faults.push_back(options.snmpConfig + ": can not be read; check --snmp-config");
    configFaults = &faults;
    std::string modules = kLibraryModules;
    add_to_init_list(modules.data());
    init_agent(kAppName);
    init_mib_modules();
    init_snmp(kAppName);
    configFaults = nullptr;
    return faults;
}

void stopSnmp() {
    snmp_shutdown(kAppName);
    shutdown_agent();
}

} // namespace kvloamd
