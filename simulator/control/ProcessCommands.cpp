// SPDX-License-Identifier: BSD-2-Clause
// The control commands for the processes of the runtime library.
#include <cstdint>
#include <limits>

#include "simulator/control/CommandContext.h"
#include "simulator/description/Description.h"
#include "simulator/description/ProcessReader.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

char const* nameOf(ProcessKind kind) {
    switch (kind) {
    case ProcessKind::self:
        return "self";
    case ProcessKind::child:
        return "child";
    case ProcessKind::command:
        return "command";
    case ProcessKind::pid:
        return "pid";
    }
    return "process";
}

std::string nameFrom(CommandContext const& context, char const* argument) {
    std::string name = context.arguments.text(argument);
    refuseUnfitProcessName(name, 0);
    return name;
}

std::int32_t pidFrom(CommandContext const& context) {
    return static_cast<std::int32_t>(
        context.arguments.number("pid", 1, std::numeric_limits<std::int32_t>::max()));
}

std::size_t given(CommandContext const& context, std::initializer_list<char const*> names) {
    std::size_t count = 0;
    for (char const* name : names)
        if (context.arguments.has(name)) ++count;
    return count;
}

} // namespace

Json listProcesses(CommandContext const& context) {
    context.arguments.allow({});
    Json processes = Json::array();
    for (auto const& process : context.platform.processes().list()) {
        Json counters = Json::object();
        for (std::size_t i = 0; i < kCounterNames.size(); ++i)
            counters[std::string(kCounterNames[i])] = process.counters[i];
        processes.push_back({{"pid", process.pid},
                             {"kind", nameOf(process.kind)},
                             {"name", process.name},
                             {"counters", counters}});
    }
    return {{"processes", processes}};
}

Json addProcess(CommandContext const& context) {
    context.arguments.allow({"name", "pid", "process", "counters", "rates"});
    if (given(context, {"name", "pid", "process"}) != 1)
        throw CommandError("give one of \"name\", to start a child, \"pid\", for a process of "
                           "this host, or \"process\", for all that run a program of that name");
    ProcessDraft draft;
    if (context.arguments.has("name")) {
        draft.kind = ProcessKind::child;
        draft.name = nameFrom(context, "name");
    } else if (context.arguments.has("pid")) {
        draft.kind = ProcessKind::pid;
        draft.pid = pidFrom(context);
    } else {
        draft.kind = ProcessKind::command;
        draft.name = nameFrom(context, "process");
    }
    Description counters;
    Description rates;
    bool const hasCounters = context.arguments.has("counters");
    bool const hasRates = context.arguments.has("rates");
    if (hasCounters) counters = describeJson(context.arguments.value("counters"));
    if (hasRates) rates = describeJson(context.arguments.value("rates"));
    draft.counters = readCounters(hasCounters ? &counters : nullptr, hasRates ? &rates : nullptr);
    pid_t const pid = context.platform.processes().add(draft);
    return pid == 0 ? Json::object() : Json{{"pid", pid}};
}

Json endProcess(CommandContext const& context) {
    context.arguments.allow({"name", "pid"});
    if (given(context, {"name", "pid"}) != 1) throw CommandError("give either \"pid\" or \"name\"");
    if (context.arguments.has("name"))
        return {{"ended", context.platform.processes().end(nameFrom(context, "name"))}};
    context.platform.processes().end(pidFrom(context));
    return {{"ended", 1}};
}

} // namespace kvlsim
