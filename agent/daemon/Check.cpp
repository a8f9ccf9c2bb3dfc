// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Check.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <system_error>
#include <vector>

#include "agent/daemon/FrontChoice.h"
#include "agent/daemon/HttpSide.h"
#include "agent/daemon/ModuleLoader.h"
#include "agent/daemon/Platform.h"
#include "agent/fronts/snmp/Receivers.h"
#include "agent/fronts/snmp/SnmpSessions.h"
#include "agent/log/Log.h"
#include "agent/readers/StateDirectory.h"

namespace kvloamd {

namespace {

/// A directory that exists for a scope.
class TemporaryFolder {
  public:
    TemporaryFolder() {
        m_path = (std::filesystem::temp_directory_path() / "kvloamd-XXXXXX").string();
        if (mkdtemp(m_path.data()) == nullptr)
            throw std::system_error(errno, std::generic_category(), m_path);
    }
    ~TemporaryFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    TemporaryFolder(TemporaryFolder const&) = delete;
    TemporaryFolder& operator=(TemporaryFolder const&) = delete;

    std::string const& path() const { return m_path; }

  private:
    std::string m_path;
};

/// Whether a start could listen at the addresses. A port in use is no fault: the agent itself may
/// be running.
bool checkAddresses(std::vector<std::string> const& addresses) {
    bool good = true;
    for (auto address = addresses.begin(); address != addresses.end(); ++address) {
        std::string fault = SnmpSessions::check(*address);
        if (std::find(addresses.begin(), address, *address) != address)
            fault = "cannot listen on " + *address + ": the address is given twice";
        if (fault.empty()) continue;
        log(LogLevel::Error, fault);
        good = false;
    }
    return good;
}

/// Checks the SNMP configuration, and also the addresses if `withAddresses`.
bool checkSnmpSide(Options const& options, bool withAddresses) {
    // The SNMP library writes its state while it runs; a check must not leave any.
    TemporaryFolder const folder;
    Options withoutTrace = options;
    withoutTrace.persistentDirectory = folder.path();
    Receivers receivers;
    std::vector<std::string> const faults = startSnmp(snmpFiles(withoutTrace), receivers);
    for (std::string const& fault : faults)
        log(LogLevel::Error, fault);
    bool const good = !withAddresses || checkAddresses(options.listen);
    stopSnmp();
    return good && faults.empty();
}

} // namespace

int checkConfiguration(Options const& options) {
    // Reads the description of a simulated platform, for example.
    bool good = rootObjectAnswers();
    for (std::string const& name : options.modules) {
        try {
            LoadedModule(name, options.moduleDirectory).createFactory();
        } catch (ModuleError const& error) {
            log(LogLevel::Error, error.what());
            good = false;
        }
    }
    try {
        StateDirectory::check(persistentDirectory(snmpFiles(options)));
    } catch (std::runtime_error const& error) {
        log(LogLevel::Error, error.what());
        good = false;
    }
    for (std::string const& fault : checkHttpSide(options)) {
        log(LogLevel::Error, fault);
        good = false;
    }
    // A subagent's access control is the master's.
    if (options.agentx.empty()) good = checkSnmpSide(options, true) && good;
    if (good) log(LogLevel::Info, "the configuration is valid");
    return good ? 0 : kExitFailure;
}

int checkSnmpConfiguration(Options const& options) {
    return checkSnmpSide(options, false) ? 0 : kExitFailure;
}

} // namespace kvloamd
