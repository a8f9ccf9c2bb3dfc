// SPDX-License-Identifier: BSD-2-Clause
// kvloamd, the SNMP agent.
#include <cstdio>
#include <exception>
#include <string>

#include "agent/daemon/Check.h"
#include "agent/daemon/Daemon.h"
#include "agent/daemon/Options.h"
#include "agent/log/Log.h"

int main(int argc, char** argv) {
    using namespace kvloamd;
    try {
        auto const parsed = parseOptions(argc, argv);
        if (auto const* const exit = std::get_if<Exit>(&parsed)) {
            if (exit->status == 0)
                std::fputs(exit->text.c_str(), stdout);
            else
                log(LogLevel::Error, exit->text);
            return exit->status;
        }
        auto const& options = std::get<Options>(parsed);
        if (standardErrorIsJournal()) logToJournal();
        setLogLevel(options.logLevel);
        if (options.checkSnmpConfig) return checkSnmpConfiguration(options);
        if (options.checkConfig) return checkConfiguration(options);
        return runDaemon(options, [=] { return parseOptions(argc, argv); });
    } catch (std::exception const& error) {
        log(LogLevel::Error, error.what());
        return kExitFailure;
    }
}
