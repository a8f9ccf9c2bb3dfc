// SPDX-License-Identifier: BSD-2-Clause
// kvlsim: controls a running simulated board platform, generates and checks chassis files.
#include <algorithm>
#include <cstdlib>
#include <functional>
#include <iostream>
#include <optional>
#include <set>

#include <CLI/CLI.hpp>

#include "shells/Completion.h"
#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"
#include "simulator/chassis/Chassis.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/Findings.h"
#include "simulator/description/Generator.h"
#include "simulator/tool/BoardDescriptions.h"
#include "simulator/tool/CallTool.h"
#include "simulator/tool/ControlClient.h"
#include "simulator/tool/LineTool.h"
#include "simulator/tool/OutputFile.h"
#include "simulator/tool/ProcessTool.h"
#include "simulator/tool/ShowTable.h"
#include "simulator/tool/StoreTool.h"

namespace {

using kvlsim::ToolError;
using Json = nlohmann::json;

constexpr int kSuccess = 0;
constexpr int kFailure = 1;
constexpr int kUsage = 2;

/// `Options` are the options of all commands that are defined here.
struct Options {
    std::string socket;
    long timeout = 30;
    bool noWait = false;
    bool json = false;
    bool cleared = false;
    std::vector<std::string> boards;
    std::string board;
    std::string object;
    std::string attribute;
    std::string value;
    std::string form;
    std::string serial;
    std::string file;
    std::string output;
    std::vector<std::string> attributes;
    kvlsim::BoardOptions newBoard;
    kvlsim::GeneratorOptions generator;
};

kvlsim::ControlClient connect(Options const& options) {
    std::string path = options.socket;
    if (path.empty())
        if (char const* const named = std::getenv("KVLSIM_SOCKET")) path = named;
    if (path.empty()) throw ToolError("no platform named; give --socket PATH or set KVLSIM_SOCKET");
    return {path, std::chrono::seconds(options.timeout)};
}

/// Sends the commands one after the other and waits until their events are delivered.
void change(Options const& options, kvlsim::ControlClient& client,
            std::vector<Json> const& commands) {
    for (auto const& command : commands)
        client.request(command);
    if (!options.noWait) client.request({{"command", "drain"}});
}

void change(Options const& options, Json const& command) {
    auto client = connect(options);
    change(options, client, {command});
}

void changeBoards(Options const& options, char const* command) {
    auto client = connect(options);
    std::vector<Json> commands;
    std::set<std::int64_t> handles;
    // All are looked up before the first is changed: a wrong name changes nothing.
    for (auto const& board : options.boards) {
        Json const shown = client.request({{"command", "show"}, {"board", board}});
        auto const handle = shown.at("boards").at(0).at("handle").get<std::int64_t>();
        if (!handles.insert(handle).second)
            throw ToolError("board " + std::to_string(handle) + " is named twice; nothing is done");
        commands.push_back({{"command", command}, {"board", handle}});
    }
    change(options, client, commands);
}

void insert(Options const& options) {
    std::vector<Json> boards;
    if (!options.file.empty()) boards = kvlsim::readBoardFile(options.file);
    auto client = connect(options);
    if (options.file.empty())
        boards.push_back(makeBoard(options.newBoard, client.request({{"command", "show"}})));
    std::vector<Json> commands;
    commands.reserve(boards.size());
    for (auto const& board : boards)
        commands.push_back({{"command", "insert"}, {"board", board}});
    change(options, client, commands);
    for (auto const& board : boards)
        std::cout << "board " << board.at("handle") << ", serial number "
                  << board.at("attributes").at("SERIAL_NUMBER").get<std::string>() << '\n';
}

void replace(Options const& options) {
    Json command = {{"command", "replace"}, {"board", options.board}, {"serial", options.serial}};
    if (!options.attributes.empty())
        command["attributes"] = kvlsim::attributesFrom(options.attributes);
    change(options, command);
}

void fault(Options const& options) {
    change(options, {{"command", "fault"},
                     {"board", options.board},
                     {"value", options.value},
                     {"cleared", options.cleared}});
}

void set(Options const& options) {
    if (options.value.empty() && options.form != "empty" && options.form != "text" &&
        kvlsim::kindOf(options.attribute) != kvlsim::AttributeKind::text)
        throw ToolError("no value for " + options.attribute +
                        "; write one behind it (or --empty for an answer without bytes)");
    change(options,
           {{"command", "set"},
            {"object", options.object},
            {"attribute", options.attribute},
            {"value", kvlsim::attributeValue(options.attribute, options.value, options.form)}});
}

void unset(Options const& options) {
    change(options,
           {{"command", "unset"}, {"object", options.object}, {"attribute", options.attribute}});
}

void event(Options const& options) {
    Json command = {{"command", "event"}, {"id", options.object}};
    if (!options.board.empty()) command["board"] = options.board;
    if (!options.value.empty()) command["value"] = options.value;
    change(options, command);
}

void show(Options const& options) {
    Json command = {{"command", "show"}};
    if (!options.board.empty()) command["board"] = options.board;
    Json const reply = connect(options).request(command);
    if (options.json)
        std::cout << reply.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
    else if (options.board.empty())
        kvlsim::printBoards(reply, std::cout);
    else
        kvlsim::printDetails(reply, std::cout);
}

void drain(Options const& options) {
    connect(options).request({{"command", "drain"}});
}

void generate(Options const& options) {
    if (kvlsim::Generator::objects(options.generator) >
        static_cast<std::int64_t>(kvlsim::Chassis::kMaxObjects))
        throw ToolError("a chassis has at most " + std::to_string(kvlsim::Chassis::kMaxObjects) +
                        " objects; ask for fewer boards, devices or lines");
    std::string const text = kvlsim::Generator(options.generator).chassis();
    if (!options.output.empty()) {
        kvlsim::writeWholeFile(options.output, text);
        return;
    }
    std::cout << text;
}

void check(Options const& options) {
    kvlsim::Findings findings(kvlsim::Findings::OnError::collect);
    std::optional<kvlsim::Chassis> chassis;
    findings.part(
        [&] { chassis = kvlsim::readChassis(kvlsim::readChassisFile(options.file), findings); });
    for (auto const& warning : findings.warnings(options.file))
        std::cerr << "kvlsim: " << warning << '\n';
    if (!chassis) throw kvlsim::errorsOf(findings, options.file);
    std::cout << options.file << ": good, " << chassis->boardCount() << " boards\n";
}

using Run = std::function<void(Options const&)>;

CLI::App* addCommand(CLI::App& app, char const* name, char const* help, Run& chosen, Run run) {
    CLI::App* const command = app.add_subcommand(name, help);
    command->fallthrough();
    command->callback([&chosen, run = std::move(run)] { chosen = run; });
    return command;
}

CLI::App* addChange(CLI::App& app, char const* name, char const* help, Options& options,
                    Run& chosen, Run run) {
    CLI::App* const command = addCommand(app, name, help, chosen, std::move(run));
    command->add_flag("--no-wait", options.noWait,
                      "Do not wait until the events are delivered to the process");
    return command;
}

constexpr char const* kBoardHelp = "Handle, serial number, or NAME if only one board has it";
constexpr char const* kAttributeHelp = "Attribute as NAME=VALUE; repeat for more";

void addBoardCommands(CLI::App& app, Options& options, Run& chosen) {
    struct {
        char const* name;
        char const* help;
    } static constexpr simple[] = {{"remove", "Pull boards out"},
                                   {"start", "Start boards"},
                                   {"stop", "Stop boards"},
                                   {"fail", "Make boards fail"}};
    for (auto const& [name, help] : simple) {
        Run run = [name = name](Options const& given) { changeBoards(given, name); };
        addChange(app, name, help, options, chosen, std::move(run))
            ->add_option("board", options.boards, kBoardHelp)
            ->required();
    }

    auto* command = addChange(app, "insert", "Plug a board in", options, chosen, insert);
    auto* const file =
        command
            ->add_option(
                "file", options.file,
                "Board or chassis in YAML or JSON; without it, a board is made from the options")
            ->type_name("FILE");
    auto& made = options.newBoard;
    constexpr std::int64_t lastHandle = kvlsim::Chassis::kRootHandle - 1;
    for (auto* option :
         {command->add_option("--handle", made.handle, "Handle (default: the next free one)")
              ->check(CLI::Range(std::int64_t(1), lastHandle)),
          command->add_option("--serial", made.serial,
                              "Serial number (default: SIM and the handle)"),
          command->add_option("--name", made.name, "NAME, such as NX5-T1"),
          command->add_option("--family", made.family, "Family, such as NX5"),
          command->add_option("--platform", made.platform, "CTPLATFORM (default: the family)"),
          command->add_option("--description", made.description, "DESCRIPTION"),
          command->add_option("--devices", made.devices, "Number of devices (default: none)")
              ->check(CLI::Range(0, 100)),
          command->add_option("--attribute", made.attributes, kAttributeHelp)
              ->allow_extra_args(false)})
        option->excludes(file);

    command = addChange(app, "replace", "Swap a board for another of the same handle", options,
                        chosen, replace);
    command->add_option("board", options.board, kBoardHelp)->required();
    command->add_option("--serial", options.serial, "Serial number of the new board")->required();
    command->add_option("--attribute", options.attributes, kAttributeHelp)->allow_extra_args(false);

    command = addChange(app, "fault", "Raise or clear a fault of a board", options, chosen, fault);
    command->add_option("board", options.board, kBoardHelp)->required();
    command->add_option("value", options.value, "Fault value, 0 to 65535")->required();
    command->add_flag("--clear", options.cleared, "Clear the fault");
}

void addAttributeCommands(CLI::App& app, Options& options, Run& chosen) {
    constexpr char const* objectHelp = "Handle, serial number of a board, or unique NAME";
    auto* command = addChange(app, "set", "Set an attribute of any object; no event is sent",
                              options, chosen, set);
    command->add_option("object", options.object, objectHelp)->required();
    command->add_option("attribute", options.attribute, "Attribute, such as IRQ")->required();
    command->add_option("value", options.value, "Number, text, or four numbers for a descriptor");
    auto* const forms = command->add_option_group("form", "How the value is answered");
    for (char const* form : {"text", "number", "short", "byte", "empty", "descriptor"})
        forms->add_flag_callback(std::string("--") + form,
                                 [&options, form] { options.form = form; });
    forms->require_option(0, 1);

    command =
        addChange(app, "unset", "Remove an attribute; no event is sent", options, chosen, unset);
    command->add_option("object", options.object, objectHelp)->required();
    command->add_option("attribute", options.attribute, "Attribute, such as IRQ")->required();
}

void addOtherCommands(CLI::App& app, Options& options, Run& chosen) {
    auto* command =
        addChange(app, "event", "Send any event; no state changes", options, chosen, event);
    command->add_option("id", options.object, "Identifier, such as 0x40001")->required();
    command->add_option("--board", options.board, "Board; it need not exist");
    command->add_option("--value", options.value, "Fault value, 0 to 65535");

    command = addCommand(app, "show", "Show all boards in a table, or one in detail", chosen, show);
    command->add_option("board", options.board, kBoardHelp);
    command->add_flag("--json", options.json, "Print the reply as JSON");

    addCommand(app, "drain", "Wait until all events so far are delivered", chosen, drain);

    command = addCommand(app, "generate", "Generate a chassis file", chosen, generate);
    auto& generator = options.generator;
    command->add_option("--boards", generator.boards, "Number of boards")
        ->check(CLI::Range(0, 1000000))
        ->required();
    command->add_option("--devices", generator.devices, "Devices per board (default: 2)")
        ->check(CLI::Range(0, 1000));
    command->add_option("--subdevices", generator.subDevices, "Sub-devices per device (default: 1)")
        ->check(CLI::Range(0, 1000));
    command->add_option("--processors", generator.processors, "Processors per board (default: 1)")
        ->check(CLI::Range(0, 100));
    command->add_option("--lines", generator.lines, "DS1 lines per board (default: none)")
        ->check(CLI::Range(0, 1000));
    command->add_option("--seed", generator.seed, "The same seed gives the same chassis");
    command->add_option("--output", options.output, "File (default: standard output)")
        ->type_name("FILE");

    command = addCommand(app, "check", "Check a chassis file", chosen, check);
    command->add_option("file", options.file, "Chassis file")->type_name("FILE")->required();
}

/// A message for a word that is no command, with the one probably meant; empty when the words name
/// a command.
std::string unknownCommand(CLI::App const& app, std::vector<std::string> const& words) {
    CLI::App const* at = &app;
    std::string path;
    for (std::size_t i = 0; i < words.size(); ++i) {
        if (words[i].starts_with('-')) {
            if (words[i] == "--socket" || words[i] == "--timeout") ++i; // and its value
            continue;
        }
        auto const commands = at->get_subcommands([](auto const*) { return true; });
        if (commands.empty()) return {};
        std::vector<std::string> names;
        names.reserve(commands.size());
        for (auto const* command : commands)
            names.push_back(command->get_name());
        auto const found = std::ranges::find(names, words[i]);
        if (found != names.end()) {
            at = commands[static_cast<std::size_t>(found - names.begin())];
            path += words[i] + " ";
            continue;
        }
        std::string const meant = kvlsim::nearestWord(words[i], names);
        return "there is no command " + kvlsim::inQuotes(path + words[i]) +
               (meant.empty() ? std::string() : "; did you mean \"" + path + meant + "\"?");
    }
    return {};
}

} // namespace

// NOLINTNEXTLINE(bugprone-exception-escape): only a contradictory set-up of the options throws
int main(int argc, char** argv) {
    CLI::App app("Controls a running simulated board platform; generates and checks chassis "
                 "files.",
                 "kvlsim");
    Options options;
    Run chosen;
    app.set_version_flag("--version", "kvlsim " KVLSIM_VERSION);
    app.add_option("--socket", options.socket, "Control socket (default: KVLSIM_SOCKET)")
        ->type_name("FILE");
    app.add_option("--timeout", options.timeout, "Seconds to wait for an answer (default: 30)")
        ->check(CLI::Range(1L, 86400L));
    app.require_subcommand(0, 1);
    addBoardCommands(app, options, chosen);
    addAttributeCommands(app, options, chosen);
    addOtherCommands(app, options, chosen);
    kvlsim::Connect const toPlatform = [&options] { return connect(options); };
    std::function<void()> chosenNested;
    kvlsim::addStoreCommands(app, toPlatform, chosenNested);
    kvlsim::addProcessCommands(app, toPlatform, chosenNested);
    kvlsim::addLineCommands(app, toPlatform, chosenNested);
    kvlsim::addCallCommands(app, toPlatform, chosenNested);
    shells::addCompletionCommands(app, chosenNested);
    try {
        app.parse(argc, argv);
    } catch (CLI::Success const& success) {
        return app.exit(success);
    } catch (CLI::ParseError const& error) {
        std::string const unknown = unknownCommand(app, {argv + 1, argv + argc});
        std::cerr << "kvlsim: " << (unknown.empty() ? error.what() : unknown)
                  << (unknown.ends_with('?') ? " kvlsim --help lists the commands\n"
                                             : "; kvlsim --help explains\n");
        return kUsage;
    }
    if (chosenNested) chosen = [&chosenNested](Options const&) { chosenNested(); };
    if (!chosen) {
        std::cerr << "kvlsim: no command; kvlsim --help lists them\n";
        return kUsage;
    }
    try {
        chosen(options);
        if (std::cout.flush()) return kSuccess;
        std::cerr << "kvlsim: standard output cannot be written\n";
    } catch (std::exception const& error) {
        std::cerr << "kvlsim: " << error.what() << '\n';
    }
    return kFailure;
}
