// SPDX-License-Identifier: BSD-2-Clause
// kvlsim call: lists ISDN channels, sets calls up and releases them, also from a script.
#include "simulator/tool/CallTool.h"

#include <algorithm>
#include <chrono>
#include <fstream>
#include <iostream>
#include <sstream>
#include <thread>

#include "simulator/base/Text.h"
#include "simulator/chassis/Channels.h"
#include "simulator/description/Description.h"
#include "simulator/tool/CommandGroup.h"
#include "simulator/tool/TextTable.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

/// `CallOptions` are the options of all commands of `kvlsim call`.
struct CallOptions {
    std::string trunk;
    std::string channel;
    std::string state;
    std::string file;
    std::string peer;
    std::string subAddress;
    std::string information;
    std::string units;
    bool incoming = false;
    bool multirate = false;
    bool all = false;
    bool noWait = false;
    bool json = false;
};

constexpr double kMaxWait = 86400;

void listCalls(CallOptions const& options, Connect const& connect) {
    Json const reply = connect().request({{"command", "call-list"}});
    if (options.json) {
        std::cout << reply.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
        return;
    }
    std::vector<TextRow> rows = {{"TRUNK", "NAME", "BOARD", "SIGNALLING", "BEARERS", "IDLE",
                                  "CONNECTING", "CONNECTED", "ACTIVE"}};
    for (auto const& trunk : reply.at("trunks")) {
        Json const& channels = trunk.at("channels");
        TextRow row;
        for (char const* key : {"trunk", "name", "board", "signalling"})
            row.push_back(cellText(trunk.at(key)));
        row.push_back(std::to_string(channels.size()));
        for (auto const& state : kBearerStateNames)
            row.push_back(std::to_string(std::ranges::count(channels, Json(state))));
        rows.push_back(std::move(row));
    }
    printColumns(rows, std::cout);
}

Json setupCommand(CallOptions const& options) {
    Json command = {{"command", "call-setup"}, {"trunk", options.trunk}};
    if (!options.channel.empty()) command["channel"] = options.channel;
    if (!options.state.empty()) command["state"] = options.state;
    if (!options.peer.empty()) command["peer"] = options.peer;
    if (!options.subAddress.empty()) command["subaddress"] = options.subAddress;
    if (!options.information.empty()) command["information"] = options.information;
    if (options.incoming) command["incoming"] = true;
    if (options.multirate) command["multirate"] = true;
    return command;
}

Json releaseCommand(CallOptions const& options) {
    Json command = {{"command", "call-release"}, {"trunk", options.trunk}};
    if (options.all)
        command["all"] = true;
    else
        command["channel"] = options.channel;
    return command;
}

Json chargeCommand(CallOptions const& options) {
    return {{"command", "call-charge"},
            {"trunk", options.trunk},
            {"channel", options.channel},
            {"units", options.units}};
}

Json signallingCommand(CallOptions const& options) {
    return {{"command", "call-signalling"}, {"trunk", options.trunk}, {"state", options.state}};
}

Json change(CallOptions const& options, ControlClient& client, Json const& command) {
    Json reply = client.request(command);
    if (!options.noWait) client.request({{"command", "drain"}});
    return reply;
}

void setUp(CallOptions const& options, Connect const& connect) {
    auto client = connect();
    Json const reply = change(options, client, setupCommand(options));
    std::cout << "channel " << reply.at("channel").dump() << '\n';
}

void release(CallOptions const& options, Connect const& connect) {
    auto client = connect();
    change(options, client, releaseCommand(options));
}

void charge(CallOptions const& options, Connect const& connect) {
    auto client = connect();
    change(options, client, chargeCommand(options));
}

void signalling(CallOptions const& options, Connect const& connect) {
    auto client = connect();
    change(options, client, signallingCommand(options));
}

/// Executes one line of a script; throws ToolError when it is wrong.
void runLine(CallOptions const& options, ControlClient& client,
             std::vector<std::string> const& line) {
    CallOptions call = options;
    auto const requireWords = [&line](std::size_t least, std::size_t most, char const* usage) {
        if (line.size() < least || line.size() > most)
            throw ToolError("this is no " + line.front() + "; write " + usage);
    };
    if (line.front() == "wait") {
        requireWords(2, 2, "wait SECONDS");
        Description written;
        written.form = Description::Form::plain;
        written.scalar = line[1];
        auto const seconds = written.decimal();
        if (!seconds || *seconds < 0 || *seconds > kMaxWait)
            throw ToolError("cannot wait " + inQuotes(line[1]) +
                            "; write seconds from 0 to 86400, such as 0.5");
        std::this_thread::sleep_for(std::chrono::duration<double>(*seconds));
        return;
    }
    if (line.size() > 1) call.trunk = line[1];
    if (line.front() == "setup") {
        requireWords(2, 4, "setup TRUNK [CHANNEL [STATE]]");
        if (line.size() > 2) call.channel = line[2];
        if (line.size() > 3) call.state = line[3];
        change(options, client, setupCommand(call));
    } else if (line.front() == "release") {
        requireWords(3, 3, "release TRUNK CHANNEL, or release TRUNK all");
        call.all = line[2] == "all";
        call.channel = line[2];
        change(options, client, releaseCommand(call));
    } else if (line.front() == "signalling") {
        requireWords(3, 3, "signalling TRUNK inactive, l1 or l2");
        call.state = line[2];
        change(options, client, signallingCommand(call));
    } else {
        throw ToolError("unknown command " + inQuotes(line.front()) +
                        "; write setup, release, signalling or wait");
    }
}

void runScript(CallOptions const& options, Connect const& connect) {
    bool const standardInput = options.file == "-";
    std::string const name = standardInput ? "standard input" : options.file;
    std::ifstream file;
    if (!standardInput) {
        file.open(options.file);
        if (!file) throw ToolError(name + ": cannot be read; name a script that is readable");
    }
    std::istream& in = standardInput ? std::cin : file;
    auto client = connect();
    int number = 0;
    for (std::string text; std::getline(in, text);) {
        ++number;
        std::istringstream stream(text.substr(0, text.find('#')));
        std::vector<std::string> line;
        for (std::string word; stream >> word;)
            line.push_back(word);
        if (line.empty()) continue;
        try {
            runLine(options, client, line);
        } catch (ToolError const& error) {
            throw ToolError(name + ":" + std::to_string(number) + ": " + error.what());
        }
    }
    if (in.bad()) throw ToolError(name + ": cannot be read; name a script that is readable");
}

} // namespace

void addCallCommands(CLI::App& app, Connect connect, std::function<void()>& chosen) {
    CommandGroup<CallOptions> group(app, "call", "Calls on ISDN channels", connect, chosen);
    auto const& options = group.options();
    auto const addChange = [&](char const* name, char const* help, auto run) {
        CLI::App* const command = group.add(name, help, run);
        command->add_flag("--no-wait", options->noWait,
                          "Do not wait until the events are delivered to the process");
        return command;
    };
    constexpr char const* trunkHelp = "Handle or NAME of a device with ISDN channels";

    group.add("list", "List the trunks and the states of their channels", listCalls)
        ->add_flag("--json", options->json, "Print the reply as JSON");

    auto* command = addChange("setup", "Set a call up", setUp);
    command->add_option("trunk", options->trunk, trunkHelp)->required();
    command->add_option("channel", options->channel,
                        "Bearer channel, from 1 (default: the first idle one)");
    command->add_option("--state", options->state,
                        "How far: connecting, connected or active (default)");
    command->add_flag("--incoming", options->incoming, "The peer calls (default: it is called)");
    command->add_option("--peer", options->peer, "Address of the peer, at most 31 characters");
    command->add_option("--subaddress", options->subAddress,
                        "Subaddress of the peer, at most 23 characters");
    command->add_option("--information", options->information,
                        "What the call carries: speech (default), digital, audio-31 ...");
    command->add_flag("--multirate", options->multirate, "The call has several channels");

    command = addChange("release", "Release a call", release);
    command->add_option("trunk", options->trunk, trunkHelp)->required();
    auto* const which = command->add_option_group("which");
    which->add_option("channel", options->channel, "Bearer channel, from 1");
    which->add_flag("--all", options->all, "All calls of the trunk");
    which->require_option(1);

    command = addChange("charge", "Charge a call with units", charge);
    command->add_option("trunk", options->trunk, trunkHelp)->required();
    command->add_option("channel", options->channel, "Bearer channel, from 1")->required();
    command->add_option("units", options->units, "How many units more")->required();

    command = addChange("signalling", "Set the state of the signalling channel", signalling);
    command->add_option("trunk", options->trunk, trunkHelp)->required();
    command->add_option("state", options->state, "inactive, l1 or l2")->required();

    command = addChange("script", "Run commands from a file, one a line", runScript);
    command
        ->add_option("file", options->file,
                     "Script (- for standard input) of lines such as: setup 301 3; release 301 3; "
                     "signalling 301 l1; wait 0.5; # comment")
        ->type_name("FILE")
        ->required();
}

} // namespace kvlsim
