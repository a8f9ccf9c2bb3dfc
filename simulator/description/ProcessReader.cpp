// SPDX-License-Identifier: BSD-2-Clause
// Reads the part "processes" of a chassis; counters over time.
#include <algorithm>
#include <set>

#include "simulator/base/Text.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/chassis/ProcessDraft.h"
#include "simulator/description/Description.h"
#include "simulator/description/DescriptionChecks.h"
#include "simulator/description/ProcessReader.h"

namespace kvlsim {

namespace {

using Form = Description::Form;

constexpr std::array<std::string_view, 4> kProcessKeys = {"kind", "name", "counters", "rates"};
constexpr std::size_t kMaxNameLength = 4000;

std::size_t counterNamed(DescriptionEntry const& entry) {
    auto const* const found = std::ranges::find(kCounterNames, entry.key);
    if (found != kCounterNames.end())
        return static_cast<std::size_t>(found - kCounterNames.begin());
    std::string known;
    for (auto const& name : kCounterNames)
        appendToList(known, name);
    throw ChassisError(entry.line,
                       "no counter is called " + inQuotes(entry.key) + "; there are " + known);
}

void requireCounters(Description const& map, char const* what) {
    if (map.form != Form::map)
        throw ChassisError(map.line, std::string(what) + " cannot be " + map.words() +
                                         "; write one counter a line, such as NumberOfOpens: 3");
}

ProcessDraft readProcess(Description const& item) {
    requireMap(item, "a process", "kind:");
    refuseUnknownKeys(item, "a process", kProcessKeys);
    ProcessDraft draft;
    Description const* const kind = item.find("kind");
    if (kind == nullptr)
        throw ChassisError(item.line, "process without kind; give it \"kind:\" self, child or "
                                      "command");
    if (kind->scalar == "self")
        draft.kind = ProcessKind::self;
    else if (kind->scalar == "child")
        draft.kind = ProcessKind::child;
    else if (kind->scalar == "command")
        draft.kind = ProcessKind::command;
    else
        throw ChassisError(kind->line, "the kind of a process cannot be " + kind->words() +
                                           "; choose self, child or command");
    Description const* const name = item.find("name");
    if (draft.kind == ProcessKind::self && name != nullptr)
        throw ChassisError(name->line, "the process itself has a name already; remove \"name:\"");
    if (draft.kind != ProcessKind::self) {
        if (name == nullptr)
            throw ChassisError(item.line, "process without name; give it \"name:\"");
        if (!name->isScalar())
            throw ChassisError(name->line,
                               "a process's name cannot be " + name->words() + "; write a text");
        draft.name = name->scalar;
        refuseUnfitProcessName(draft.name, name->line);
    }
    draft.counters = readCounters(item.find("counters"), item.find("rates"));
    return draft;
}

} // namespace

void refuseUnfitProcessName(std::string_view name, int line) {
    if (name.empty()) throw ChassisError(line, "a process's name is empty; write one");
    if (name.size() > kMaxNameLength)
        throw ChassisError(line, "a process's name has " + std::to_string(name.size()) +
                                     " bytes; " + std::to_string(kMaxNameLength) + " is the most");
    if (name.find('\0') != std::string_view::npos)
        throw ChassisError(line, "a process's name cannot contain a NUL; remove it");
}

Counters readCounters(Description const* counters, Description const* rates) {
    Counters read;
    if (counters != nullptr) {
        requireCounters(*counters, "counters");
        for (auto const& entry : counters->entries) {
            auto& counter = read.start[counterNamed(entry)];
            auto const number = entry.value.integer();
            if (!number || *number < 0 || *number > INT32_MAX)
                throw ChassisError(entry.line, entry.key + " cannot be " + entry.value.words() +
                                                   "; write a number from 0 to 2147483647");
            counter = static_cast<std::int32_t>(*number);
        }
    }
    if (rates != nullptr) {
        requireCounters(*rates, "rates");
        for (auto const& entry : rates->entries) {
            auto& rate = read.rates[counterNamed(entry)];
            auto const number = entry.value.decimal();
            if (!number)
                throw ChassisError(entry.line, "the rate of " + entry.key + " cannot be " +
                                                   entry.value.words() +
                                                   "; write a number per second, such as 0.5");
            rate = *number;
        }
    }
    return read;
}

std::vector<ProcessDraft> readProcesses(Description const& processes, Findings& findings) {
    if (processes.form == Form::nothing) return {};
    if (processes.form != Form::list)
        throw ChassisError(processes.line,
                           "processes cannot be " + processes.words() +
                               "; write a list, each process beginning with \"- kind:\"");
    std::vector<ProcessDraft> drafts;
    std::set<std::pair<ProcessKind, std::string>> seen;
    for (auto const& item : processes.items) {
        findings.part([&] {
            ProcessDraft draft = readProcess(item);
            // Children may share a name, as processes do.
            if (draft.kind != ProcessKind::child && !seen.emplace(draft.kind, draft.name).second)
                throw ChassisError(item.line, draft.kind == ProcessKind::self
                                                  ? "the process itself is written twice; keep one"
                                                  : "command " + inQuotes(draft.name) +
                                                        " is written twice; keep one of them");
            drafts.push_back(std::move(draft));
        });
    }
    return drafts;
}

} // namespace kvlsim
