// SPDX-License-Identifier: BSD-2-Clause
#include "cli/CommandLine.h"

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <ostream>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>

#include "cli/Commands.h"
#include "shells/Completion.h"

namespace kvloam {

namespace {

constexpr char const* kDefaultSocket = "/run/kvloam/kvloamd.socket";

/// What the command line says.
struct Options {
    std::string socket;
    std::string host;
    std::string tokenFile;
    double timeout = 10;
    bool asJson = false;
    bool isWatched = false;
    double interval = 2;

    std::string name; ///< of a board or table
    std::string kind;
    std::string line;
    std::vector<std::string> lines;
    bool asOpenMetrics = false;
    JournalOptions journal;
    std::string input;
    std::string output;
    int port = 8161;
    CheckLimits limits;
    Action action = showOverview;
};

std::string variable(char const* name) {
    char const* const value = std::getenv(name);
    return value == nullptr ? std::string() : value;
}

/// The command line comes before the environment, and the environment before the default.
AgentAddress addressOf(Options const& options) {
    AgentAddress address{options.socket, options.host, options.tokenFile};
    if (address.socket.empty() && address.host.empty()) address.host = variable("KVLOAM_HOST");
    if (address.socket.empty()) address.socket = variable("KVLOAM_SOCKET");
    if (address.socket.empty()) address.socket = kDefaultSocket;
    if (address.tokenFile.empty()) address.tokenFile = variable("KVLOAM_TOKEN_FILE");
    address.timeout = std::chrono::milliseconds(static_cast<std::int64_t>(options.timeout * 1000));
    return address;
}

CLI::App* addCommand(CLI::App& app, Options& options, char const* name, char const* help,
                     Action action) {
    CLI::App* const command = app.add_subcommand(name, help);
    command->fallthrough();
    command->callback([&options, action = std::move(action)] { options.action = action; });
    return command;
}

void addWatch(CLI::App& command, Options& options) {
    command.add_flag("--watch", options.isWatched, "Show it again and again until interrupted");
    command
        .add_option("--interval", options.interval,
                    "Seconds between two looks with --watch (default: 2)")
        ->type_name("SECONDS")
        ->check(CLI::Range(0.1, 86400.0));
}

void addGlobalOptions(CLI::App& app, Options& options) {
    app.set_version_flag("--version", "kvloam " KVLOAM_VERSION);
    auto* const socket =
        app.add_option(
               "--socket", options.socket,
               std::string("Socket of the agent on this host (default: KVLOAM_SOCKET, or ") +
                   kDefaultSocket + ")")
            ->type_name("FILE");
    app.add_option("--host", options.host,
                   "Agent on another host: HOST:PORT, or a URL of http or https "
                   "(default: KVLOAM_HOST)")
        ->type_name("ADDRESS")
        ->excludes(socket);
    app.add_option("--token-file", options.tokenFile,
                   "File with the token of the agent (default: KVLOAM_TOKEN_FILE)")
        ->type_name("FILE");
    app.add_option("--timeout", options.timeout, "Seconds to wait for an answer (default: 10)")
        ->type_name("SECONDS")
        ->check(CLI::Range(0.1, 86400.0));
    app.add_flag("--json", options.asJson, "Print JSON, as the agent answers");
}

void addViews(CLI::App& app, Options& options) {
    for (List const& list : lists()) {
        addWatch(*addCommand(app, options, list.command, list.help,
                             [&list](Session& session) { return showList(session, list); }),
                 options);
        // What is one of the list comes after it.
        if (std::string_view(list.command) == "boards") {
            auto* const board = addCommand(
                app, options, "board", "One board with its lines and devices",
                [&options](Session& session) { return showBoard(session, options.name); });
            board->add_option("board", options.name, "Serial number or board index")
                ->type_name("BOARD")
                ->required();
            addWatch(*board, options);
        }
        if (std::string_view(list.command) == "lines") {
            auto* const line = addCommand(
                app, options, "line", "One line with its counters",
                [&options](Session& session) { return showLine(session, options.line); });
            line->add_option("line", options.line, "Name or ifIndex")
                ->type_name("LINE")
                ->required();
            addWatch(*line, options);
            auto* const history =
                addCommand(app, options, "history", "The last 24 hours of lines as plots",
                           [&options](Session& session) {
                               return options.asOpenMetrics ? exportHistory(session, options.lines)
                                                            : showHistory(session, options.lines);
                           });
            history->add_option("line", options.lines, "Names or ifIndices (default: all lines)")
                ->type_name("LINE");
            addWatch(*history, options);
            history
                ->add_flag("--openmetrics", options.asOpenMetrics,
                           "Print samples for \"promtool tsdb create-blocks-from openmetrics\"")
                ->excludes("--watch");
        }
    }
}

void addFleet(CLI::App& app, Options& options) {
    auto* const fleet = app.add_subcommand("fleet", "What monitoring engines need to know");
    fleet->fallthrough()->require_subcommand(1);
    auto* const targets = addCommand(
        *fleet, options, "targets", "Make Prometheus's file of targets from a list of agents",
        [&options](Session& session) {
            return makeTargets(session, options.input, options.output, options.port);
        });
    targets
        ->add_option("list", options.input,
                     "Lines of ADDRESS [SITE [CHASSIS]] (default: standard input)")
        ->type_name("FILE");
    targets->add_option("--output", options.output, "File (default: standard output)")
        ->type_name("FILE");
    targets->add_option("--port", options.port, "Port of addresses that have none (default: 8161)")
        ->type_name("NUMBER")
        ->check(CLI::Range(1, 65535));
}

void addOthers(CLI::App& app, Options& options) {
    auto* const journal =
        addCommand(app, options, "journal", "What has happened, the newest entry last",
                   [&options](Session& session) { return showJournal(session, options.journal); });
    journal->add_flag("--follow", options.journal.follow,
                      "Print new entries as they come, until interrupted");
    journal->add_option("--limit", options.journal.limit, "At most so many entries (default: 50)")
        ->type_name("NUMBER")
        ->check(CLI::Range(1, 1000));
    journal
        ->add_option("--after", options.journal.after, "Only entries after the one of this number")
        ->type_name("NUMBER")
        ->check(CLI::Range(std::int64_t{0}, std::int64_t{0xffffffff}));

    addWatch(*addCommand(app, options, "health", "The agent, and how it is", showHealth), options);

    auto* const plugin =
        addCommand(app, options, "check", "The state of everything, as a monitoring plugin",
                   [&options](Session& session) { return runCheck(session, options.limits); });
    auto const severities =
        CLI::IsMember({"indeterminate", "warning", "minor", "major", "critical"});
    plugin
        ->add_option("--warning", options.limits.warning,
                     "Least severity of an alarm for WARNING (default: indeterminate)")
        ->type_name("SEVERITY")
        ->check(severities);
    plugin
        ->add_option("--critical", options.limits.critical,
                     "Least severity of an alarm for CRITICAL (default: major)")
        ->type_name("SEVERITY")
        ->check(severities);
    plugin
        ->add_option("--max-age", options.limits.oldest,
                     "Seconds since the boards were read, for CRITICAL when exceeded (default: 60)")
        ->type_name("SECONDS")
        ->check(CLI::Range(1.0, 86400.0));

    addCommand(app, options, "tables", "The names of all tables in the MIB modules", showTables);
    auto* const table =
        addCommand(app, options, "table", "One table with the names of the MIB module",
                   [&options](Session& session) { return showTable(session, options.name); });
    table->add_option("table", options.name, "Name, such as kvlBoardTable")
        ->type_name("TABLE")
        ->required();
    addWatch(*table, options);
    addWatch(*addCommand(app, options, "scalars", "All scalars with the names of the MIB modules",
                         showScalars),
             options);

    auto* const names = addCommand(app, options, "names", "", [&options](Session& session) {
        return printNames(session, options.kind);
    });
    names->group(""); // of the completion scripts
    // A user who presses Tab does not wait.
    names->preparse_callback([&options](std::size_t) { options.timeout = 2; });
    names->add_option("kind", options.kind)->check(CLI::IsMember({"board", "line", "table"}));
}

} // namespace

int run(int argc, char const* const* argv, std::function<Screen()> const& screen, std::ostream& out,
        std::ostream& errors) {
    CLI::App app("Shows what the agent knows about the telephony boards of its host; without a "
                 "command, the health of everything.",
                 "kvloam");
    Options options;
    addGlobalOptions(app, options);
    addWatch(app, options);
    app.require_subcommand(0, 1);
    addViews(app, options);
    addOthers(app, options);
    addFleet(app, options);
    std::function<void()> printScript;
    shells::addCompletionCommands(app, printScript, {"BOARD", "LINE", "TABLE"});
    auto const isCheck = [&] { return app.got_subcommand("check"); };
    try {
        app.parse(argc, argv);
    } catch (CLI::Success const& success) {
        return app.exit(success, out, errors);
    } catch (CLI::ParseError const& error) {
        std::string const what = Screen().clean(error.what());
        // A plugin's status 2 would be an alarm.
        if (isCheck()) {
            auto const result = unknownResult(what);
            out << result.text;
            return static_cast<int>(result.state);
        }
        errors << "kvloam: " << what << "; kvloam --help explains\n";
        return kUsage;
    }
    if (printScript) {
        printScript();
        return kSuccess;
    }
    try {
        Client client(addressOf(options));
        Session session{client, screen, screen(), out, errors, options.asJson};
        int const status = options.isWatched ? watch(session, options.action, options.interval)
                                             : options.action(session);
        if (out.flush()) return status;
        errors << "kvloam: standard output cannot be written\n";
        return kFailure;
    } catch (CliError const& error) {
        if (isCheck()) {
            auto const result = unknownResult(error.what());
            out << result.text;
            return static_cast<int>(result.state);
        }
        errors << "kvloam: " << screen().clean(error.what()) << '\n';
        return error.status();
    } catch (std::exception const& error) {
        errors << "kvloam: " << error.what() << '\n';
        return kFailure;
    }
}

} // namespace kvloam
