// SPDX-License-Identifier: BSD-2-Clause
// The processes that use the simulated runtime library.
#include "simulator/runtime/ProcessTable.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>

#include "simulator/base/Text.h"

namespace kvlsim {

ProcessTable::ProcessTable(std::function<std::vector<ProcessDraft>()> described)
    : m_described(std::move(described)) {}

void ProcessTable::restart() {
    std::lock_guard const lock(m_mutex);
    m_entries.clear();
    m_begun = false;
}

void ProcessTable::setClock(Clock* clock) {
    std::lock_guard const lock(m_mutex);
    m_clock = clock;
    for (auto& entry : m_entries) {
        entry.since = now();
        entry.found.clear();
    }
}

ProcessTable::Time ProcessTable::now() const {
    return m_clock != nullptr ? m_clock() : std::chrono::steady_clock::now().time_since_epoch();
}

void ProcessTable::begin() {
    if (m_begun) return;
    m_begun = true;
    for (auto const& draft : m_described()) {
        try {
            enter(draft);
        } catch (std::exception const& error) {
            std::fprintf(stderr, "kvlsim: process %s: %s\n", inQuotes(draft.name).c_str(),
                         error.what());
        }
    }
}

void ProcessTable::enter(ProcessDraft const& draft) {
    if (m_entries.size() >= kCapacity)
        throw ProcessError("there are " + std::to_string(kCapacity) +
                           " processes already; end one first");
    Entry entry;
    entry.draft = draft;
    entry.since = now();
    switch (draft.kind) {
    case ProcessKind::child:
        entry.child = std::make_unique<WaitingChild>(draft.name);
        break;
    case ProcessKind::command:
        break;
    case ProcessKind::self:
    case ProcessKind::pid: {
        pid_t const pid = draft.kind == ProcessKind::self ? getpid() : draft.pid;
        auto const process = runningProcess(pid);
        if (!process)
            throw ProcessError("no process " + std::to_string(pid) +
                               " runs on this host; name one that does");
        entry.process = *process;
        break;
    }
    }
    m_entries.push_back(std::move(entry));
}

void ProcessTable::dropEnded() {
    std::erase_if(m_entries, [](Entry& entry) {
        switch (entry.draft.kind) {
        case ProcessKind::child:
            return !entry.child->runs();
        case ProcessKind::pid:
            return runningProcess(entry.process.pid) != entry.process;
        default:
            return false;
        }
    });
}

/// When a process of this command was first seen. A process that is found again keeps its time; one
/// that has the id of an ended process starts again.
ProcessTable::Time ProcessTable::firstSeen(Entry& entry, HostProcess const& process) const {
    auto const [seen, isNew] = entry.found.try_emplace(process.pid, process, now());
    if (!isNew && seen->second.first != process) seen->second = {process, now()};
    return seen->second.second;
}

ListedProcess ProcessTable::describe(Entry const& entry, pid_t pid, Time age) {
    double const seconds = std::chrono::duration<double>(age).count();
    return {pid, entry.draft.kind, programOf(pid), entry.draft.counters.after(seconds)};
}

std::vector<ListedProcess> ProcessTable::listed() {
    begin();
    dropEnded();
    std::vector<ListedProcess> processes;
    auto const add = [&](Entry const& entry, pid_t pid, Time since) {
        // A process may be named by its id and found by its command: the first entry counts.
        if (std::ranges::find(processes, pid, &ListedProcess::pid) == processes.end())
            processes.push_back(describe(entry, pid, now() - since));
    };
    for (auto& entry : m_entries) {
        if (entry.draft.kind != ProcessKind::command) {
            add(entry, entry.pid(), entry.since);
            continue;
        }
        auto const running = processesRunning(entry.draft.name);
        std::erase_if(entry.found, [&](auto const& seen) {
            return std::ranges::find(running, seen.first, &HostProcess::pid) == running.end();
        });
        for (auto const& process : running)
            add(entry, process.pid, firstSeen(entry, process));
    }
    return processes;
}

std::vector<ListedProcess> ProcessTable::list() {
    std::lock_guard const lock(m_mutex);
    return listed();
}

std::optional<ListedProcess> ProcessTable::find(pid_t pid) {
    std::lock_guard const lock(m_mutex);
    begin();
    dropEnded();
    for (auto& entry : m_entries) {
        if (entry.draft.kind == ProcessKind::command) {
            auto const process = runningProcess(pid);
            if (process && programOf(pid) == entry.draft.name)
                return describe(entry, pid, now() - firstSeen(entry, *process));
        } else if (entry.pid() == pid) {
            return describe(entry, pid, now() - entry.since);
        }
    }
    return std::nullopt;
}

pid_t ProcessTable::add(ProcessDraft const& draft) {
    std::lock_guard const lock(m_mutex);
    auto const processes = listed();
    if (draft.kind == ProcessKind::pid &&
        std::ranges::find(processes, draft.pid, &ListedProcess::pid) != processes.end())
        throw ProcessError("process " + std::to_string(draft.pid) + " is listed already");
    bool const again =
        draft.kind == ProcessKind::command && std::ranges::any_of(m_entries, [&](Entry const& e) {
            return e.draft.kind == ProcessKind::command && e.draft.name == draft.name;
        });
    if (again) throw ProcessError("command " + inQuotes(draft.name) + " is listed already");
    enter(draft);
    return m_entries.back().pid();
}

void ProcessTable::end(pid_t pid) {
    std::lock_guard const lock(m_mutex);
    begin();
    dropEnded();
    auto const found = std::ranges::find(m_entries, pid, &Entry::pid);
    if (found == m_entries.end())
        throw ProcessError(
            "no process " + std::to_string(pid) +
            " was added; \"kvlsim process list\" lists what is there (a process found by "
            "its command is taken off the list by that name)");
    if (found->draft.kind == ProcessKind::self)
        throw ProcessError("process " + std::to_string(pid) +
                           " runs the platform itself; it cannot be taken off its own list");
    m_entries.erase(found);
}

std::size_t ProcessTable::end(std::string const& name) {
    std::lock_guard const lock(m_mutex);
    begin();
    dropEnded();
    auto const ended = std::erase_if(m_entries, [&](Entry const& entry) {
        return !entry.draft.name.empty() &&
               (entry.draft.name == name ||
                entry.draft.name.substr(entry.draft.name.rfind('/') + 1) == name);
    });
    if (ended == 0)
        throw ProcessError("no process " + inQuotes(name) +
                           " was added; \"kvlsim process list\" lists what is there");
    return ended;
}

} // namespace kvlsim
