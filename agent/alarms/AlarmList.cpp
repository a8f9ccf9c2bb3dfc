// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmList.h"

#include <algorithm>
#include <set>
#include <utility>

#include "agent/alarms/AlarmCauses.h"

namespace kvloamd {

namespace {

/// More than there are causes one above the other.
constexpr int kTurns = 8;

std::optional<Clock::time_point> earlier(std::optional<Clock::time_point> one,
                                         std::optional<Clock::time_point> other) {
    if (!one || !other) return one ? one : other;
    return std::min(*one, *other);
}

/// Takes over what describes the condition; a text or place that is not said now stays. Returns
/// whether anything has changed.
bool describe(Condition& known, Condition const& said) {
    Condition described = said;
    if (said.text.empty()) described.text = known.text;
    if (said.place.empty()) described.place = known.place;
    if (described == known) return false;
    known = std::move(described);
    return true;
}

} // namespace

AlarmList::AlarmList(AlarmPolicies policies, Report report, std::size_t capacity)
    : m_report(std::move(report)), m_capacity(capacity), m_policies(std::move(policies)) {}

void AlarmList::begin(Condition const& condition, Instant now, bool again) {
    std::scoped_lock const guard(m_mutex);
    if (auto const begun = beginLocked(condition, now, again); begun != m_records.end())
        explainAndSettle(begun, now);
}

void AlarmList::end(AlarmKey const& key, Instant now) {
    std::scoped_lock const guard(m_mutex);
    auto const found = m_records.find(key);
    if (found == m_records.end() || !found->second.present) return;
    endLocked(found->second, now);
    settleAndKeep(found, now);
}

void AlarmList::change(std::vector<Condition> const& begun, std::vector<AlarmKey> const& ended,
                       Instant now) {
    std::scoped_lock const guard(m_mutex);
    // Settled when all are known, so that no consequence is an alarm for a moment.
    std::vector<Records::iterator> changed;
    for (Condition const& condition : begun)
        if (auto const at = beginLocked(condition, now, false); at != m_records.end())
            changed.push_back(at);
    for (AlarmKey const& key : ended) {
        auto const found = m_records.find(key);
        if (found == m_records.end() || !found->second.present) continue;
        endLocked(found->second, now);
        changed.push_back(found);
    }
    for (auto const& record : changed)
        explainAndSettle(record, now);
}

void AlarmList::compare(AlarmScope scope, std::vector<Condition> const& present,
                        Clock::time_point read, Instant now) {
    std::scoped_lock const guard(m_mutex);
    std::set<AlarmKey> keys;
    std::vector<Records::iterator> changed; // settled as in `change`
    for (Condition const& condition : present) {
        keys.insert(condition.key);
        auto const found = m_records.find(condition.key);
        if (found != m_records.end() && !found->second.present && found->second.changed > read)
            continue; // it ended after the snapshot was read
        if (auto const at = beginLocked(condition, now, false); at != m_records.end())
            changed.push_back(at);
    }
    for (auto record = m_records.begin(); record != m_records.end(); ++record) {
        if (!record->second.present || alarmKind(record->first.kind).scope != scope ||
            keys.contains(record->first) || record->second.changed > read)
            continue;
        endLocked(record->second, now);
        changed.push_back(record);
    }
    for (auto const& record : changed)
        explainAndSettle(record, now);
}

std::optional<Clock::time_point> AlarmList::advance(Instant now) {
    std::scoped_lock const guard(m_mutex);
    // An alarm that is cleared may have consequences that have been settled before it.
    for (int turn = 0; turn < kTurns && m_next && now.steady >= *m_next; ++turn) {
        m_next.reset();
        std::set<std::string> const boards = std::exchange(m_changedBoards, {});
        bool const all = boards.contains({});
        for (auto at = m_records.begin(); at != m_records.end();) {
            auto const record = at++;
            if (all || boards.contains(record->first.board))
                explainAndSettle(record, now);
            else
                settleAndKeep(record, now);
        }
    }
    return m_next;
}

void AlarmList::apply(AlarmPolicies policies, Instant now) {
    std::scoped_lock const guard(m_mutex);
    if (policies == m_policies) return;
    m_policies = std::move(policies);
    m_applied = now.steady;
    ++m_version;
    m_next.reset();
    for (auto at = m_records.begin(); at != m_records.end();) {
        auto const entry = at++;
        Record& record = entry->second;
        AlarmPolicy const policy = m_policies.of(entry->first.kind, entry->first.number);
        if (record.raised && !policy.enabled) {
            clear(record, now);
        } else if (record.raised && record.alarm.severity != policy.severity) {
            record.alarm.severity = policy.severity;
            m_report(AlarmEvent::SeverityChanged, record.alarm);
        }
        settleAndKeep(entry, now);
    }
    // What has been switched off or on may be a cause.
    m_changedBoards.insert(std::string());
    m_next = now.steady;
}

void AlarmList::restore(std::vector<Alarm> const& alarms, Instant now) {
    std::scoped_lock const guard(m_mutex);
    for (Alarm const& alarm : alarms) {
        Record record;
        record.alarm = alarm;
        record.present = record.raised = true;
        record.changed = record.held = now.steady;
        record.alarm.severity =
            m_policies.of(alarm.condition.key.kind, alarm.condition.key.number).severity;
        if (m_records.insert_or_assign(alarm.condition.key, std::move(record)).second)
            countActive(alarm.condition.key.kind, true, now.steady);
    }
    m_changedBoards.insert(std::string());
    m_next = now.steady;
    ++m_version;
}

bool AlarmList::isPresent(AlarmKey const& key) const {
    std::scoped_lock const guard(m_mutex);
    auto const found = m_records.find(key);
    return found != m_records.end() && found->second.present;
}

std::vector<Condition> AlarmList::present(AlarmKind kind) const {
    std::scoped_lock const guard(m_mutex);
    std::vector<Condition> conditions;
    for (auto at = m_records.lower_bound({kind, {}, 0});
         at != m_records.end() && at->first.kind == kind; ++at)
        if (at->second.present) conditions.push_back(at->second.alarm.condition);
    return conditions;
}

std::vector<Alarm> AlarmList::active() const {
    std::scoped_lock const guard(m_mutex);
    std::vector<Alarm> alarms;
    for (auto const& [key, record] : m_records)
        if (record.raised) alarms.push_back(record.alarm);
    return alarms;
}

std::vector<Alarm> AlarmList::cleared() const {
    std::scoped_lock const guard(m_mutex);
    return {m_cleared.begin(), m_cleared.end()};
}

AlarmList::Counts AlarmList::counts() const {
    std::scoped_lock const guard(m_mutex);
    return m_counts;
}

std::uint64_t AlarmList::version() const {
    std::scoped_lock const guard(m_mutex);
    return m_version;
}

AlarmList::Contents AlarmList::contents(std::uint64_t known) const {
    std::scoped_lock const guard(m_mutex);
    Contents contents{m_version, {}, {}, m_counts, m_kinds, m_policies, m_applied};
    if (m_version == known) return contents;
    for (auto const& [key, record] : m_records)
        if (record.raised) contents.active.push_back({record.alarm, record.present});
    contents.cleared.assign(m_cleared.begin(), m_cleared.end());
    return contents;
}

AlarmList::Records::iterator AlarmList::beginLocked(Condition const& condition, Instant now,
                                                    bool again) {
    auto found = m_records.find(condition.key);
    bool const known = found != m_records.end() && found->second.present;
    if (!known || again) ++m_counts.begun;
    if (found == m_records.end()) {
        if (m_records.size() >= m_capacity) {
            ++m_counts.unlisted;
            ++m_version;
            return m_records.end();
        }
        found = m_records.try_emplace(condition.key).first;
        found->second.alarm.condition = condition;
    }
    Record& record = found->second;
    if (describe(record.alarm.condition, condition) && record.raised) ++m_version;
    if (known && !again) return m_records.end();
    if (!known) {
        record.present = true;
        record.changed = record.held = now.steady;
        causeChanged(condition.key, now);
    }
    countBeginning(record, now);
    return found;
}

void AlarmList::endLocked(Record& record, Instant now) {
    record.present = false;
    record.changed = now.steady;
    record.cause.reset();
    causeChanged(record.alarm.condition.key, now);
    if (record.raised) ++m_version;
    auto const& oldest = record.beginnings[record.next];
    if (!oldest || now.steady - *oldest >= kFlapWindow) record.flapping = false;
}

void AlarmList::countBeginning(Record& record, Instant now) {
    if (record.alarm.count == 0) record.alarm.began = now.date;
    ++record.alarm.count;
    // A raised alarm shows its count, and an alarm that is held shows that it is.
    if (record.raised) ++m_version;
    record.beginnings[record.next] = now.steady;
    record.next = (record.next + 1) % kFlaps;
    auto const& oldest = record.beginnings[record.next];
    if (oldest && now.steady - *oldest < kFlapWindow) record.flapping = true;
}

void AlarmList::causeChanged(AlarmKey const& key, Instant now) {
    if (!isCause(key.kind)) return;
    m_changedBoards.insert(key.board);
    m_next = now.steady;
}

bool AlarmList::stands(Record const& record) const {
    AlarmKey const& key = record.alarm.condition.key;
    return record.raised || (record.present && m_policies.of(key.kind, key.number).enabled);
}

AlarmList::Record const* AlarmList::causeOf(Condition const& condition) const {
    AlarmKey const& key = condition.key;
    for (AlarmCause const& cause : causesOf(key.kind, key.number)) {
        AlarmKey sought{cause.cause, key.board, 0};
        if (cause.where == CausedBy::Interface) sought.number = key.number;
        if (cause.where == CausedBy::LineBelow) sought.number = condition.line;
        if (cause.where == CausedBy::Agent) sought.board.clear();
        bool const ofAnyLine = cause.where == CausedBy::LineOfBoard;
        for (auto at = m_records.lower_bound(sought);
             at != m_records.end() && at->first.kind == sought.kind &&
             at->first.board == sought.board && (ofAnyLine || at->first.number == sought.number);
             ++at)
            if (stands(at->second)) return &at->second;
    }
    return nullptr;
}

void AlarmList::explain(Record& record, Instant now) {
    Record const* const cause = causeOf(record.alarm.condition);
    if (cause == nullptr) {
        if (record.cause) record.held = now.steady;
        record.cause.reset();
        record.alarm.cause.clear();
        return;
    }
    Condition const& condition = cause->alarm.condition;
    if (record.cause == condition.key) return;
    record.cause = condition.key;
    record.alarm.cause =
        std::string(alarmKind(condition.key.kind).name) + " on " + condition.resource;
    m_report(AlarmEvent::Explained, record.alarm);
}

bool AlarmList::settle(Record& record, Instant now) {
    AlarmKey const& key = record.alarm.condition.key;
    AlarmPolicy const policy = m_policies.of(key.kind, key.number);
    if (record.present) {
        if (record.cause) {
            if (record.raised) clear(record, now);
            return true;
        }
        bool const isHeld = !record.flapping && now.steady - record.held < policy.raiseHold;
        if (!record.raised && policy.enabled && !isHeld) raise(record, now);
        return true;
    }
    Clock::duration const lasted = now.steady - record.changed;
    Clock::duration const quiet = kFlapWindow;
    if (record.raised) {
        Clock::duration const hold = policy.clearHold;
        if (lasted >= (record.flapping ? std::max(hold, quiet) : hold)) clear(record, now);
        if (record.raised) return true;
    }
    if (lasted < quiet) return true; // remembered, to see whether it flaps
    if (record.alarm.count > 0) ++m_version;
    m_counts.suppressed += record.alarm.count;
    return false;
}

void AlarmList::raise(Record& record, Instant now) {
    AlarmKey const& key = record.alarm.condition.key;
    record.raised = true;
    // Nothing has begun since the last alarm if the kind was switched off meanwhile.
    if (record.alarm.count == 0) record.alarm.began = now.date;
    record.alarm.severity = m_policies.of(key.kind, key.number).severity;
    record.alarm.raised = now.date;
    ++m_counts.raised;
    ++countActive(key.kind, true, now.steady).raised;
    m_counts.lastRaised = now.steady;
    ++m_version;
    record.alarm.number = m_report(AlarmEvent::Raised, record.alarm);
}

void AlarmList::clear(Record& record, Instant now) {
    record.raised = false;
    record.flapping = false;
    record.alarm.cleared = now.date;
    ++m_counts.cleared;
    ++countActive(record.alarm.condition.key.kind, false, now.steady).cleared;
    m_counts.lastCleared = now.steady;
    ++m_version;
    m_report(AlarmEvent::Cleared, record.alarm);
    if (m_cleared.size() >= kClearedCapacity) m_cleared.pop_front();
    m_cleared.push_back(record.alarm);
    record.alarm.count = 0;
    causeChanged(record.alarm.condition.key, now);
}

AlarmList::KindCounts& AlarmList::countActive(AlarmKind kind, bool more, Clock::time_point now) {
    KindCounts& counts = m_kinds[kind];
    // Threads read the clock before they wait for the lock.
    if (now > counts.counted) {
        if (counts.active > 0) counts.lasted += counts.active * (now - counts.counted);
        counts.counted = now;
    }
    if (more)
        ++counts.active;
    else
        --counts.active;
    return counts;
}

std::optional<Clock::time_point> AlarmList::deadline(Record const& record) const {
    AlarmKey const& key = record.alarm.condition.key;
    AlarmPolicy const policy = m_policies.of(key.kind, key.number);
    Clock::duration const quiet = kFlapWindow;
    if (record.present) {
        if (record.raised || !policy.enabled || record.cause) return std::nullopt;
        return record.held + policy.raiseHold;
    }
    if (!record.raised) return record.changed + quiet;
    Clock::duration const hold = policy.clearHold;
    return record.changed + (record.flapping ? std::max(hold, quiet) : hold);
}

void AlarmList::settleAndKeep(Records::iterator at, Instant now) {
    if (settle(at->second, now))
        m_next = earlier(m_next, deadline(at->second));
    else
        m_records.erase(at);
}

void AlarmList::explainAndSettle(Records::iterator at, Instant now) {
    if (at->second.present) explain(at->second, now);
    settleAndKeep(at, now);
}

} // namespace kvloamd
