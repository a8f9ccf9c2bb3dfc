// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Options.h"

#include <charconv>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <set>
#include <sstream>
#include <system_error>
#include <utility>

#include <CLI/CLI.hpp>

#include "agent/daemon/ConfigFile.h"
#include "agent/fronts/agentx/AgentxAddress.h"
#include "agent/fronts/http/HttpSockets.h"
#include "services/oam.h"

namespace kvloamd {

namespace {

std::map<std::string, LogLevel> const kLogLevels{{"error", LogLevel::Error},
                                                 {"warning", LogLevel::Warning},
                                                 {"info", LogLevel::Info},
                                                 {"debug", LogLevel::Debug}};

std::string checkOid(std::string const& text) {
    return parseOid(text)
               ? std::string()
               : "'" + text + "' is not an object identifier; write it like 1.3.6.1.4.1.32473";
}

std::string checkLogLevel(std::string const& text) {
    return kLogLevels.contains(CLI::detail::to_lower(text))
               ? std::string()
               : "'" + text + "' is not a log level; write error, warning, info or debug";
}

std::string checkAlarm(std::string const& text) {
    return AlarmPolicies().configure(text);
}

std::string checkThreshold(std::string const& text) {
    return TypeLimits().configure(text);
}

/// Enters `entries`, which are right one by one, in `configured`. Returns the first fault.
template <class Configured>
std::string configureAll(Configured& configured, std::vector<std::string> const& entries) {
    for (std::string const& entry : entries)
        if (std::string fault = configured.configure(entry); !fault.empty()) return fault;
    return {};
}

/// The SNMP library takes an empty address for port 161 on all interfaces.
std::string checkAddress(std::string const& text) {
    return text.empty() ? "the address is empty; write it like udp:127.0.0.1:1161" : std::string();
}

/// Where the modules are: as the environment says; else beside the running program, in an
/// installation or a build tree; else where they would be installed.
std::string defaultModuleDirectory() {
    char const* const directory = std::getenv("KVLOAM_MODULE_DIR");
    if (directory != nullptr && *directory != '\0') return directory;
    std::error_code error;
    auto const program = std::filesystem::read_symlink("/proc/self/exe", error);
    if (!error) {
        for (char const* const libraries : {KVLOAM_LIBRARIES_FROM_PROGRAM, "../lib"}) {
            auto const beside = (program.parent_path() / libraries / "kvloam").lexically_normal();
            if (std::filesystem::is_directory(beside, error)) return beside;
        }
    }
    return KVLOAM_MODULE_DIRECTORY;
}

/// The Unix socket of a service, whose manager names the directory for it. Otherwise there is none.
std::string defaultHttpSocket() {
    char const* const directories = std::getenv("RUNTIME_DIRECTORY");
    if (directories == nullptr || *directories == '\0') return {};
    std::string const all = directories;
    return all.substr(0, all.find(':')) + "/kvloamd.socket";
}

/// The configuration file, checked line by line before CLI11 reads it.
class CheckedConfig final : public CLI::ConfigTOML {
  public:
    explicit CheckedConfig(CLI::App const& app) : m_app(app) {}

    std::vector<CLI::ConfigItem> from_config(std::istream& input) const override {
        std::stringstream text;
        text << input.rdbuf();
        std::set<std::string> keys;
        for (CLI::Option const* const option : m_app.get_options())
            if (option->get_configurable() && !option->get_lnames().empty())
                keys.insert(option->get_lnames().front());
        m_lines = checkConfigFile(text, keys);
        text.clear();
        text.seekg(0);
        return CLI::ConfigTOML::from_config(text);
    }
    /// The line that sets the option of which `message` complains, as CLI11 writes it:
    /// "--port: ..."; 0 if there is none.
    int lineOf(std::string const& message) const {
        for (auto const& [key, line] : m_lines)
            if (message.starts_with("--" + key + ":") || message.starts_with("--" + key + " "))
                return line;
        return 0;
    }

  private:
    CLI::App const& m_app;
    mutable std::map<std::string, int> m_lines;
};

/// The conflict between options that are valid by themselves; empty: none.
std::string checkTogether(Options const& options, bool listens) {
    if (!options.http.empty() && parseHostAndPort(options.http).host.empty())
        return "--http: '" + options.http + "' is not an address; write it like 127.0.0.1:8161";
    if (!options.httpTokenFile.empty() && options.http.empty())
        return "--http-token-file: without --http, no client sends a token; leave it out";
    if (options.agentx.empty()) return {};
    if (listens)
        return "--agentx excludes --port and --listen: a subagent has no port of its own; leave "
               "out "
               "one of them";
    if (!options.snmpConfig.empty())
        return "--agentx excludes --snmp-config: for a subagent, the master's configuration "
               "controls "
               "access and notification receivers; leave out one of them";
    if (!parseAgentxAddress(options.agentx))
        return "--agentx: '" + options.agentx +
               "' is not an address; write it like unix:/var/agentx/master or tcp:127.0.0.1:705";
    return {};
}

/// Joins the lines of the parser's messages, because ours have one line.
std::string oneLine(std::string text) {
    while (!text.empty() && text.back() == '\n')
        text.pop_back();
    for (char& character : text)
        if (character == '\n') character = ' ';
    return text;
}

} // namespace

std::optional<Oid> parseOid(std::string_view text) {
    if (text.starts_with('.')) text.remove_prefix(1);
    Oid oid;
    for (;;) {
        std::uint32_t number = 0;
        auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
        if (error != std::errc()) return std::nullopt;
        oid.push_back(number);
        text.remove_prefix(static_cast<std::size_t>(end - text.data()));
        if (text.empty()) break;
        if (!text.starts_with('.')) return std::nullopt;
        text.remove_prefix(1);
    }
    // BER encodes the first two numbers in one octet. The library accepts 128 numbers at most, and
    // the objects below need room for theirs.
    if (oid.size() < 2 || oid.size() > 100 || oid[0] > 2 || (oid[0] < 2 && oid[1] > 39))
        return std::nullopt;
    return oid;
}

std::variant<Options, Exit> parseOptions(int argc, char const* const* argv) {
    Options options;
    options.moduleDirectory = defaultModuleDirectory();
    options.httpSocket = defaultHttpSocket();
    int port = 0;
    std::string enterprise = "1.3.6.1.4.1.32473";
    std::vector<std::string> listen;

    CLI::App app("Serves the telephony boards of this host over SNMP.", "kvloamd");
    app.set_version_flag("--version",
                         std::string("kvloamd " KVLOAM_VERSION " (") + OAM_VersionString() + ")");
    auto* const portOption =
        app.add_option("--port", port, "Listen on this UDP port of the loopback address")
            ->check(CLI::Range(1, 65535));
    app.add_option("--listen", listen,
                   "Listen on this address, by default udp:127.0.0.1:1161; repeatable")
        ->type_name("ADDRESS")
        ->check(checkAddress)
        ->excludes(portOption);
    auto* const agentxOption =
        app.add_option("--agentx", options.agentx,
                       "Serve as a subagent of the SNMP master at this address, by default "
                       "unix:/var/agentx/master, instead of on a port")
            ->type_name("[ADDRESS]")
            ->expected(0, 1);
    app.add_option("--module", options.modules, "Load the board module <name>kvl.so; repeatable")
        ->type_name("NAME");
    app.add_option("--module-dir", options.moduleDirectory,
                   "Directory of board modules (environment: KVLOAM_MODULE_DIR)")
        ->type_name("DIR")
        ->capture_default_str();
    app.add_option("--snmp-config", options.snmpConfig,
                   "Communities, users, views and notification receivers, in the syntax of "
                   "snmpd.conf(5); by default kvloamd.conf in Net-SNMP's directories")
        ->type_name("FILE");
    app.add_option("--persistent-dir", options.persistentDirectory,
                   "Directory for SNMPv3 engine state, settings and the indices of interfaces and "
                   "entities")
        ->type_name("DIR");
    app.add_option("--enterprise-oid", enterprise, "The arc above KVL-OAM-MIB")
        ->type_name("OID")
        ->check(checkOid)
        ->capture_default_str();
    app.add_option("--interface-base", options.interfaceBase,
                   "The lowest ifIndex for new interfaces")
        ->check(CLI::Range(1, 1000000000))
        ->capture_default_str();
    app.add_option("--http-socket", options.httpSocket,
                   "Answer HTTP at this Unix socket; empty: at none. By default kvloamd.socket in "
                   "the directory that the service manager provides")
        ->type_name("PATH")
        ->capture_default_str();
    app.add_option("--http", options.http,
                   "Answer HTTP also at this TCP address, as in 127.0.0.1:8161")
        ->type_name("HOST:PORT");
    app.add_option("--http-token-file", options.httpTokenFile,
                   "File with the token that HTTP clients must send over TCP; required where other "
                   "hosts can reach the address")
        ->type_name("FILE");
    std::string logLevel = "info";
    app.add_option("--log-level", logLevel, "The least severe messages to write")
        ->type_name("error|warning|info|debug")
        ->check(checkLogLevel)
        ->capture_default_str();
    std::vector<std::string> alarms;
    app.add_option(
           "--alarm", alarms,
           "Severity and hold times of a kind of alarm, as in linkDown=minor,raise=5,clear=60 "
           "or agentStoreUnreadable=off; repeatable")
        ->type_name("KIND=POLICY")
        ->check(checkAlarm);
    std::vector<std::string> thresholds;
    app.add_option("--threshold", thresholds,
                   "Limits on what lines of a type (t1, e1, j1) may count before that is an alarm, "
                   "as in t1=es15m=65,es24h=648,uas15m=10; repeatable")
        ->type_name("TYPE=LIMITS")
        ->check(checkThreshold);
    app.add_flag("--check-config", options.checkConfig,
                 "Check options, modules and configuration, then exit")
        ->configurable(false);
    app.add_flag("--check-snmp-config", options.checkSnmpConfig)->configurable(false)->group("");
    app.set_config("--config", "", "Read options from this file, as in module=[\"z7sim\"]")
        ->type_name("FILE");
    app.allow_config_extras(CLI::config_extras_mode::error);
    auto const config = std::make_shared<CheckedConfig>(app);
    app.config_formatter(config);
    // Where the fault is: "kvloamd.toml:3: ".
    auto const inFile = [&](int line) {
        return app.get_config_ptr()->as<std::string>() + ':' + std::to_string(line) + ": ";
    };

    try {
        app.parse(argc, argv);
    } catch (CLI::FileError const& error) {
        return Exit{kExitFailure, oneLine(error.what()) + "; check --config"};
    } catch (ConfigFault const& fault) {
        return Exit{kExitFailure, inFile(fault.line()) + fault.what()};
    } catch (CLI::ParseError const& error) {
        if (error.get_exit_code() == 0) {
            std::ostringstream text;
            app.exit(error, text, text);
            return Exit{0, text.str()};
        }
        std::string text = oneLine(error.what());
        // An option of the command line replaces that of the file, which is then not read.
        if (int const line = config->lineOf(text); line > 0)
            return Exit{kExitFailure, inFile(line) + text};
        return Exit{kExitUsage, std::move(text) + "; try kvloamd --help"};
    }
    for (auto const& [option, fault] :
         {std::pair("--alarm: ", configureAll(options.alarmPolicies, alarms)),
          std::pair("--threshold: ", configureAll(options.typeLimits, thresholds))}) {
        if (fault.empty()) continue;
        if (int const line = config->lineOf(option); line > 0)
            return Exit{kExitFailure, inFile(line) + option + fault};
        return Exit{kExitUsage, option + fault + "; try kvloamd --help"};
    }
    options.logLevel = kLogLevels.at(CLI::detail::to_lower(logLevel));
    if (agentxOption->count() > 0 && options.agentx.empty()) options.agentx = kMasterAddress;
    if (std::string fault = checkTogether(options, !listen.empty() || port != 0); !fault.empty())
        return Exit{kExitUsage, std::move(fault) + "; try kvloamd --help"};
    if (!listen.empty()) options.listen = listen;
    if (port != 0) options.listen = {"udp:127.0.0.1:" + std::to_string(port)};
    options.enterprise = *parseOid(enterprise);
    return options;
}

} // namespace kvloamd
