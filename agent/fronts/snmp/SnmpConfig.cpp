// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpConfig.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string_view>
#include <utility>

#include "agent/log/Log.h"
#include "agent/log/RepeatFilter.h"

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

/// The library's MIB modules that a stand-alone agent needs: the system group, access control,
/// users and notification receivers. Its modules about the host are left out.
constexpr char kLibraryModules[] =
    "system_mib,sysORTable,snmp_mib,setSerialNo,vacm_vars,vacm_conf,vacm_context,snmpEngine,"
    "snmpMPDStats,usmConf,usmStats,usmUser,snmpNotifyTable,snmpNotifyTable_data,"
    "snmpNotifyFilterTable,snmpNotifyFilterTable_data_storage,snmpNotifyFilterTable_data_access,"
    "snmpNotifyFilterProfileTable,snmpNotifyFilterProfileTable_data,snmpTargetAddrEntry,"
    "snmpTargetAddrEntry_data,snmpTargetParamsEntry,snmpTargetParamsEntry_data,target_counters";

/// While the library reads the configuration, its errors are collected here instead of logged.
std::vector<std::string>* configFaults = nullptr;

bool started = false;

/// The configuration names no community and no user.
bool nobodyMayAsk = false;

LogLevel levelOf(int priority) {
    if (priority <= LOG_ERR) return LogLevel::Error;
    if (priority == LOG_WARNING) return LogLevel::Warning;
    // The library's informational messages are about its internals.
    return LogLevel::Debug;
}

/// Joins the lines of a library message to one.
std::string oneLine(std::string_view message) {
    std::string line;
    for (char const character : message) {
        if (character != '\n' && character != ' ')
            line += character;
        else if (!line.empty() && line.back() != ' ')
            line += ' ';
    }
    while (line.ends_with(' '))
        line.pop_back();
    return line;
}

int takeLogLine(int /*major*/, int /*minor*/, void* message, void* /*argument*/) {
    auto const* const entry = static_cast<snmp_log_message const*>(message);
    std::string text = oneLine(entry->msg);
    if (text.starts_with("Warning: no access control information configured")) {
        nobodyMayAsk = true;
        return SNMP_ERR_NOERROR;
    }
    // Only a count of errors that were reported before.
    if (text.find("error(s) in config file(s)") != std::string::npos) return SNMP_ERR_NOERROR;
    // The library reads the file twice and reports some errors in both rounds.
    if (configFaults != nullptr && text.find(": line ") != std::string::npos) {
        if (std::ranges::find(*configFaults, text) == configFaults->end())
            configFaults->push_back(std::move(text));
    } else if (static RepeatFilter filter; filter.passes(text, RepeatFilter::Clock::now())) {
        log(levelOf(entry->priority), text);
    }
    return SNMP_ERR_NOERROR;
}

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

} // namespace

std::vector<std::string> startSnmp(SnmpFiles const& files) {
    if (!files.configuration.empty() && access(files.configuration.c_str(), R_OK) != 0)
        return {files.configuration + ": cannot be read: " + std::strerror(errno) +
                "; check --snmp-config"};
    snmp_disable_stderrlog();
    snmp_enable_calllog();
    snmp_register_callback(SNMP_CALLBACK_LIBRARY, SNMP_CALLBACK_LOGGING, takeLogLine, nullptr);
    // The agent names objects by number, so the library need not parse MIB files.
    setenv("MIBS", "", 0);
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID, NETSNMP_DS_AGENT_ROLE, 0);
    // Without this, the library logs a line for every packet.
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID,
                           NETSNMP_DS_AGENT_DONT_LOG_TCPWRAPPERS_CONNECTS, 1);
    nameConfiguration(files);

    std::vector<std::string> faults;
    configFaults = &faults;
    std::string modules = kLibraryModules;
    add_to_init_list(modules.data());
    init_agent(kAppName);
    init_mib_modules();
    init_snmp(kAppName);
    configFaults = nullptr;
    started = true;
    keepEngineState(files);
    if (nobodyMayAsk && faults.empty())
        log(LogLevel::Warning, "no community and no user is configured, so nobody gets an answer; "
                               "configure them in the file that --snmp-config names");
    return faults;
}

std::string persistentDirectory(SnmpFiles const& files) {
    if (!files.persistentDirectory.empty()) return files.persistentDirectory;
    char const* const directory = get_persistent_directory();
    return directory == nullptr ? std::string() : std::string(directory);
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
