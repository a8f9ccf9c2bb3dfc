// SPDX-License-Identifier: BSD-2-Clause
// The scheduler's list, found by target and by due time.
#pragma once

#include <cstddef>
#include <limits>
#include <map>
#include <memory>
#include <unordered_map>
#include <vector>

#include "platform/ActionScheduler.h"

namespace KVL {

/// The sum, or the first or last time that fits if the sum does not.
inline long add_saturated(long time, long seconds) {
    long sum = 0;
    if (!__builtin_add_overflow(time, seconds, &sum)) return sum;
    return seconds < 0 ? std::numeric_limits<long>::min() : std::numeric_limits<long>::max();
}

/// An `ActionList` holds the entries of a scheduler in the order of their due times; entries that
/// are due at the same time stand in the order in which they were entered. It finds an entry by its
/// target in constant time. Unsynchronised.
///
/// Entries of one due time, one period and one condition stand together in a run. A host has
/// thousands of entries with a period of a second: a pass calls their run and moves it as a whole,
/// and no entry changes its place in the run.
class ActionList {
  public:
    /// The condition of an entry's calls; null for none.
    using Ready = bool (*)(Schedulable*);

    ActionList() = default;
    ActionList(ActionList const&) = delete;
    ActionList& operator=(ActionList const&) = delete;

    bool empty() const { return m_places.empty(); }
    std::size_t size() const { return m_places.size(); }
    /// The earliest due time. Requires that the list is not empty.
    long firstDue() const { return m_runs.begin()->first; }

    /// The entry of `target`, or null. Valid until the list changes.
    SchedItem* find(Schedulable* target);
    /// Enters `item`. Requires that its target is not on the list. If memory runs out, the list
    /// stays as it was.
    void insert(SchedItem const& item);
    /// Takes the entry of `target`, which must be on the list, off the list.
    void erase(Schedulable* target);
    /// Gives the entry of `target`, which must be on the list, another due time and another period.
    /// If memory runs out, the list stays as it was.
    void change(Schedulable* target, long due, long period);

    /// Lets the entry of `target`, which must be on the list, be called only while `ready(target)`
    /// is true. If memory runs out, takes the entry off the list.
    void setReady(Schedulable* target, Ready ready);

    /// Calls every entry that is due at `now` once, in the order of the list; passes over targets
    /// that are not ready. Periodic entries are
    /// entered again with their next due times, in the order of their calls; the others leave the
    /// list. Returns the earliest of the next due times, or `never`.
    long callDue(long now, long never);

  private:
    struct Run;
    using Runs = std::multimap<long, std::unique_ptr<Run>>;
    struct Run {
        long period;
        Ready ready;
        std::vector<SchedItem> items; ///< without a target where an entry was removed
        std::size_t removed = 0;
        Runs::iterator position{};
    };
    struct Place {
        Run* run = nullptr;
        std::size_t index = 0;
    };

    Place append(SchedItem const& item, Ready ready);
    void discard(Place const& place);
    void compact(Run& run);
    void call(Run& run, long due);
    void enterAgain(Runs::node_type node, long due);
    bool joinRunBefore(Runs::iterator after, Run& run, long due);

    Runs m_runs;
    Runs m_due; ///< the runs that the present pass has yet to call
    std::unordered_map<Schedulable*, Place> m_places;
};

} // namespace KVL
