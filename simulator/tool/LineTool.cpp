// SPDX-License-Identifier: BSD-2-Clause
// kvlsim line: lists DS1 lines, and gives them errors and alarms.
#include "simulator/tool/LineTool.h"

#include <array>
#include <iostream>
#include <optional>

#include "simulator/base/Text.h"
#include "simulator/chassis/Line.h"
#include "simulator/tool/CommandGroup.h"
#include "simulator/tool/TextTable.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

/// `LineOptions` are the options of all commands of `kvlsim line`.
struct LineOptions {
    std::string line;
    std::string alarm;
    std::array<std::optional<std::uint32_t>, kLineErrorNames.size()> errors;
    std::array<std::optional<double>, kLineErrorNames.size()> rates;
    bool clear = false;
    bool noWait = false;
    bool json = false;
};

void change(LineOptions const& options, Connect const& connect, Json const& command) {
    auto client = connect();
    client.request(command);
    if (!options.noWait) client.request({{"command", "drain"}});
}

/// The counts or rates that were given, by the errors' names.
template <typename Values>
Json given(Values const& values) {
    Json json = Json::object();
    for (std::size_t i = 0; i < values.size(); ++i)
        if (values[i]) json[std::string(kLineErrorNames[i])] = *values[i];
    return json;
}

std::string typeWords(Json const& type) {
    if (!type.is_number_integer()) return cellText(type);
    auto const name = nameOf(static_cast<DS1LineType>(type.get<std::int32_t>()));
    return name.empty() ? cellText(type) : std::string(name);
}

void listLines(LineOptions const& options, Connect const& connect) {
    Json const reply = connect().request({{"command", "line-list"}});
    if (options.json) {
        std::cout << reply.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
        return;
    }
    std::vector<TextRow> rows = {{"LINE", "NAME", "BOARD", "TYPE", "SECONDS", "CODE", "PATH",
                                  "FRAMING", "SLIPS", "LOS", "OOF", "AIS", "ALARMS"}};
    for (auto const& line : reply.at("lines")) {
        TextRow row;
        for (char const* key : {"line", "name", "board"})
            row.push_back(cellText(line.at(key)));
        row.push_back(typeWords(line.at("type")));
        row.push_back(line.at("seconds").dump());
        for (auto const& name : kLineErrorNames)
            row.push_back(line.at("errors").at(std::string(name)).dump());
        for (char const* key : {"los-seconds", "out-of-frame-seconds", "ais-seconds"})
            row.push_back(line.at(key).dump());
        std::string alarms;
        for (auto const& alarm : line.at("alarms"))
            appendToList(alarms, alarm.get<std::string>());
        row.push_back(alarms.empty() ? "-" : alarms);
        rows.push_back(std::move(row));
    }
    printColumns(rows, std::cout);
}

void addErrors(LineOptions const& options, Connect const& connect) {
    change(options, connect,
           {{"command", "line-errors"}, {"line", options.line}, {"errors", given(options.errors)}});
}

void setRates(LineOptions const& options, Connect const& connect) {
    change(options, connect,
           {{"command", "line-rates"}, {"line", options.line}, {"rates", given(options.rates)}});
}

void setAlarm(LineOptions const& options, Connect const& connect) {
    change(options, connect,
           {{"command", "line-alarm"},
            {"line", options.line},
            {"alarm", options.alarm},
            {"clear", options.clear}});
}

void mend(LineOptions const& options, Connect const& connect) {
    change(options, connect, {{"command", "line-mend"}, {"line", options.line}});
}

/// One option per kind of error, of which at least one must be given.
template <typename Values>
void addErrorOptions(CLI::App& command, Values& values, CLI::Validator const& check,
                     char const* help) {
    auto* const kinds = command.add_option_group("errors", help);
    for (std::size_t i = 0; i < values.size(); ++i)
        kinds->add_option("--" + std::string(kLineErrorNames[i]), values[i])->check(check);
    kinds->require_option(1, values.size());
}

} // namespace

void addLineCommands(CLI::App& app, Connect connect, std::function<void()>& chosen) {
    CommandGroup<LineOptions> group(app, "line", "DS1 lines: errors and alarms", connect, chosen);
    auto const& options = group.options();
    auto const addChange = [&](char const* name, char const* help, auto run) {
        CLI::App* const command = group.add(name, help, run);
        command->add_option("line", options->line, "Handle or NAME of a device with a line")
            ->required();
        command->add_flag("--no-wait", options->noWait,
                          "Do not wait until the events are delivered to the process");
        return command;
    };

    group.add("list", "List the lines and their counters", listLines)
        ->add_flag("--json", options->json, "Print the reply as JSON");

    addErrorOptions(*addChange("errors", "Count errors at once", addErrors), options->errors,
                    CLI::Range(std::int64_t(0), std::int64_t(UINT32_MAX)), "How many of each kind");

    addErrorOptions(
        *addChange("rates", "Set steady errors; other kinds stay as they are", setRates),
        options->rates, CLI::Range(0.0, static_cast<double>(kMaxLineRate)),
        "How many per second of each kind");

    auto* const alarm = addChange("alarm", "Raise or clear an alarm", setAlarm);
    std::string known;
    for (auto const& name : kLineAlarmNames)
        appendToList(known, name);
    alarm->add_option("alarm", options->alarm, "One of " + known)->required();
    alarm->add_flag("--clear", options->clear, "Clear the alarm");

    addChange("mend", "Clear all alarms and steady errors", mend);
}

} // namespace kvlsim
