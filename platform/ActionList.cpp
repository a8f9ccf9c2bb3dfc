// SPDX-License-Identifier: BSD-2-Clause
#include "platform/ActionList.h"

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <new>
#include <utility>

namespace KVL {

namespace {

/// How many entries ahead a pass prefetches: some hundred nanoseconds where actions are short.
constexpr std::size_t kAhead = 12;

/// Prefetches an action's first fields: an interval table's running interval has three cache lines.
/// Nothing is read, so an object that is smaller, or gone, does no harm.
void fetch(Schedulable const* target) {
    auto const address = reinterpret_cast<std::uintptr_t>(target);
    for (std::uintptr_t offset = 0; offset <= 128; offset += 64)
        __builtin_prefetch(reinterpret_cast<void const*>(address + offset), 1);
}

} // namespace

SchedItem* ActionList::find(Schedulable* target) {
    auto const found = m_places.find(target);
    if (found == m_places.end()) return nullptr;
    return &found->second.run->items[found->second.index];
}

void ActionList::insert(SchedItem const& item) {
    auto const [place, isNew] = m_places.try_emplace(item.target);
    if (!isNew) return;
    try {
        place->second = append(item, nullptr);
    } catch (...) {
        m_places.erase(place);
        throw;
    }
}

void ActionList::erase(Schedulable* target) {
    auto const found = m_places.find(target);
    discard(found->second);
    m_places.erase(found);
}

void ActionList::change(Schedulable* target, long due, long period) {
    Place& place = m_places.find(target)->second;
    Place const next = append({target, due, period}, place.run->ready);
    discard(std::exchange(place, next));
}

void ActionList::setReady(Schedulable* target, Ready ready) {
    Place& place = m_places.find(target)->second;
    try {
        Place const next = append(place.run->items[place.index], ready);
        discard(std::exchange(place, next));
    } catch (...) {
        erase(target);
        throw;
    }
}

ActionList::Place ActionList::append(SchedItem const& item, Ready ready) {
    auto const after = m_runs.upper_bound(item.due);
    if (after != m_runs.begin()) {
        auto const& [due, last] = *std::prev(after);
        if (due == item.due && last->period == item.period && last->ready == ready) {
            last->items.push_back(item);
            return {last.get(), last->items.size() - 1};
        }
    }
    auto run = std::make_unique<Run>(Run{item.period, ready, {item}});
    auto const position = m_runs.emplace_hint(after, item.due, std::move(run));
    position->second->position = position;
    return {position->second.get(), 0};
}

void ActionList::discard(Place const& place) {
    Run& run = *place.run;
    run.items[place.index].target = nullptr;
    ++run.removed;
    if (run.removed == run.items.size())
        m_runs.erase(run.position);
    else if (run.removed > run.items.size() / 2)
        compact(run);
}

void ActionList::compact(Run& run) {
    std::size_t kept = 0;
    for (SchedItem const& item : run.items) {
        if (item.target == nullptr) continue;
        m_places.find(item.target)->second.index = kept;
        run.items[kept++] = item;
    }
    run.items.resize(kept);
    run.removed = 0;
}

long ActionList::callDue(long now, long never) {
    // An entry that is due again by now is called by the next pass: the runs leave the list first.
    while (!m_runs.empty() && m_runs.begin()->first <= now)
        m_due.insert(m_due.end(), m_runs.extract(m_runs.begin()));
    long next = never;
    while (!m_due.empty()) {
        auto node = m_due.extract(m_due.begin());
        Run& run = *node.mapped();
        if (run.removed > 0) compact(run);
        long const due = run.period > 0 ? add_saturated(node.key(), run.period) : never;
        call(run, due);
        if (run.period > 0) {
            next = std::min(next, due);
            enterAgain(std::move(node), due);
        } else {
            for (SchedItem const& item : run.items)
                m_places.erase(item.target);
        }
    }
    return next;
}

void ActionList::call(Run& run, long due) {
    std::size_t const count = run.items.size();
    SchedItem* const items = run.items.data();
    for (std::size_t i = 0; i < count; ++i) {
        // Targets lie all over memory; the next ones are fetched while this one works.
        if (i + kAhead < count) fetch(items[i + kAhead].target);
        if (run.ready == nullptr || run.ready(items[i].target)) items[i].target->ScheduledAction();
        items[i].due = due;
    }
}

void ActionList::enterAgain(Runs::node_type node, long due) {
    auto const after = m_runs.upper_bound(due);
    Run& run = *node.mapped();
    if (joinRunBefore(after, run, due)) return;
    node.key() = due;
    run.position = m_runs.insert(after, std::move(node));
}

/// Moves the entries of `run` behind those of the run before `after`, if that one is alike. Returns
/// whether it did; if memory runs out, the two stay apart.
bool ActionList::joinRunBefore(Runs::iterator after, Run& run, long due) {
    if (after == m_runs.begin()) return false;
    auto const& [lastDue, last] = *std::prev(after);
    if (lastDue != due || last->period != run.period || last->ready != run.ready) return false;
    std::size_t index = last->items.size();
    try {
        last->items.insert(last->items.end(), run.items.begin(), run.items.end());
    } catch (std::bad_alloc const&) {
        return false;
    }
    for (SchedItem const& item : run.items)
        m_places.find(item.target)->second = {last.get(), index++};
    return true;
}

} // namespace KVL
