// SPDX-License-Identifier: BSD-2-Clause
// kvlsim process: lists, adds and ends the processes of the runtime library.
#include "simulator/tool/ProcessTool.h"

#include <charconv>
#include <iostream>

#include "simulator/base/Text.h"
#include "simulator/chassis/ProcessDraft.h"
#include "simulator/tool/CommandGroup.h"
#include "simulator/tool/TextTable.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

/// `ProcessOptions` are the options of all commands of `kvlsim process`.
struct ProcessOptions {
    std::string name;
    std::int32_t pid = 0;
    std::string process;
    std::vector<std::string> counters; ///< NAME=VALUE
    std::vector<std::string> rates;    ///< NAME=VALUE
    std::string which;
    bool json = false;
};

/// NAME=VALUE words as numbers; the platform refuses a value that is no number.
Json numbersFrom(std::vector<std::string> const& words) {
    Json numbers = Json::object();
    for (auto const& word : words) {
        auto const equals = word.find('=');
        if (equals == std::string::npos || equals == 0)
            throw ToolError(inQuotes(word) +
                            " is no NAME=VALUE; write for example NumberOfOpens=3");
        Json const value = Json::parse(word.substr(equals + 1), nullptr, false);
        numbers[word.substr(0, equals)] = value.is_number() ? value : Json(word.substr(equals + 1));
    }
    return numbers;
}

void listProcesses(ProcessOptions const& options, Connect const& connect) {
    Json const reply = connect().request({{"command", "process-list"}});
    if (options.json) {
        std::cout << reply.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
        return;
    }
    std::vector<TextRow> rows = {
        {"PID", "NAME", "KIND", "OPENS", "CLOSES", "QUEUE", "QUEUED", "MAX", "TOTAL", "HANDLERS"}};
    for (auto const& process : reply.at("processes")) {
        TextRow row = {process.at("pid").dump(), oneLine(process.at("name").get<std::string>()),
                       process.at("kind").get<std::string>()};
        for (auto const& name : kCounterNames)
            row.push_back(process.at("counters").at(std::string(name)).dump());
        rows.push_back(std::move(row));
    }
    printColumns(rows, std::cout);
}

void addProcess(ProcessOptions const& options, Connect const& connect) {
    Json command = {{"command", "process-add"}};
    if (!options.name.empty()) command["name"] = options.name;
    if (options.pid != 0) command["pid"] = options.pid;
    if (!options.process.empty()) command["process"] = options.process;
    if (!options.counters.empty()) command["counters"] = numbersFrom(options.counters);
    if (!options.rates.empty()) command["rates"] = numbersFrom(options.rates);
    Json const reply = connect().request(command);
    if (reply.contains("pid")) std::cout << "process " << reply.at("pid").dump() << '\n';
}

/// A number is a process id.
void endProcess(ProcessOptions const& options, Connect const& connect) {
    Json command = {{"command", "process-end"}};
    std::int32_t pid = 0;
    char const* const last = options.which.data() + options.which.size();
    if (std::from_chars(options.which.data(), last, pid).ptr == last)
        command["pid"] = pid;
    else
        command["name"] = options.which;
    connect().request(command);
}

} // namespace

void addProcessCommands(CLI::App& app, Connect connect, std::function<void()>& chosen) {
    CommandGroup<ProcessOptions> group(app, "process", "Processes that use the runtime library",
                                       connect, chosen);
    auto const& options = group.options();

    auto* command = group.add("list", "List the processes and their counters", listProcesses);
    command->add_flag("--json", options->json, "Print the reply as JSON");

    command = group.add("add", "Add a process", addProcess);
    auto* const which = command->add_option_group("process");
    which->add_option("--name", options->name, "Start a child with this name or path");
    which->add_option("--pid", options->pid, "A process of this host")
        ->check(CLI::Range(1, 0x7FFFFFFF));
    which->add_option("--command", options->process,
                      "All processes of this host that run a program of this name");
    which->require_option(1);
    command
        ->add_option("--counter", options->counters,
                     "Counter to begin with as NAME=VALUE, such as NumberOfOpens=3; repeat")
        ->allow_extra_args(false);
    command
        ->add_option("--rate", options->rates,
                     "Its change per second as NAME=VALUE, such as TotalQueuedEvents=0.5; repeat")
        ->allow_extra_args(false);

    command = group.add("end", "End a child, or remove other processes from the list", endProcess);
    command->add_option("process", options->which, "Process id or name")->required();
}

} // namespace kvlsim
