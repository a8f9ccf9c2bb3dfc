// SPDX-License-Identifier: BSD-2-Clause
// The objects of KVL-OAM-MIB that have one instance.
#include <algorithm>
#include <chrono>
#include <limits>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "agent/rows/Uptime.h"
#include "services/oam.h"

namespace kvloamd {

namespace {

// What kvlAgentFront says.
constexpr std::int64_t kStandAlone = 1;
constexpr std::int64_t kSubagent = 2;

Value milliseconds(Clock::duration time) {
    // What does not fit shows as the most that does.
    return std::clamp<std::int64_t>(
        std::chrono::duration_cast<std::chrono::milliseconds>(time).count(), 0,
        std::numeric_limits<std::uint32_t>::max());
}

template <class Row>
Value size(std::vector<Row> const& rows) {
    return static_cast<std::int64_t>(rows.size());
}

Value count(std::atomic<std::uint32_t> const& counter) {
    return std::int64_t{counter.load(std::memory_order_relaxed)};
}

} // namespace

std::span<Scalar const> scalars() {
    static Scalar const described[] = {
        {"kvlLibraryVersion",
         {1, 1, 1, 1},
         ValueType::Text,
         [](Facts const&) -> Value { return std::string_view(OAM_VersionString()); }},
        {"kvlAgentVersion",
         {1, 1, 1, 2},
         ValueType::Text,
         [](Facts const&) -> Value { return std::string_view(KVLOAM_VERSION); }},
        {"kvlNotificationsDropped",
         {1, 1, 1, 3},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsDropped); }},
        {"kvlBoardCount",
         {1, 1, 2, 1},
         ValueType::Gauge,
         [](Facts const& facts) { return size(facts.snapshot.boards); }},
        {"kvlBoardTableLastChange",
         {1, 1, 2, 2},
         ValueType::TimeStamp,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.lastChange}; }},
        {"kvlBoardStatusChanges",
         {1, 1, 2, 3},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.statusChanges); }},
        {"kvlPlatformServiceStatus",
         {1, 1, 4, 1},
         ValueType::Integer,
         [](Facts const& facts) {
             return number<&PlatformService::status>(facts.snapshot.platformService);
         }},
        {"kvlPlatformServiceChangeDate",
         {1, 1, 4, 2},
         ValueType::Date,
         [](Facts const& facts) {
             return textIfKnown<&PlatformService::changeDate>(facts.snapshot.platformService);
         }},
        {"kvlFaultCount",
         {1, 1, 8, 1},
         ValueType::Gauge,
         [](Facts const& facts) { return size(facts.snapshot.faults.rows); }},
        {"kvlFaultsRaised",
         {1, 1, 8, 2},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.raised}; }},
        {"kvlFaultTableLastChange",
         {1, 1, 8, 3},
         ValueType::TimeStamp,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.faults.lastChange};
         }},
        {"kvlFaultsUnlisted",
         {1, 1, 8, 4},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.unlisted}; }},
        {"kvlAgentUpTime",
         {1, 1, 9, 1},
         ValueType::TimeTicks,
         [](Facts const& facts) -> Value {
             return std::int64_t{timeTicks(Clock::now() - facts.counters.started)};
         }},
        {"kvlNotificationsSent",
         {1, 1, 9, 2},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsSent); }},
        {"kvlNotificationsWaiting",
         {1, 1, 9, 3},
         ValueType::Gauge,
         [](Facts const& facts) { return count(facts.counters.notificationsWaiting); }},
        {"kvlRequests",
         {1, 1, 9, 4},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.requests); }},
        {"kvlSnapshots",
         {1, 1, 9, 5},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.number}; }},
        {"kvlSnapshotAge",
         {1, 1, 9, 6},
         ValueType::Gauge,
         [](Facts const& facts) { return milliseconds(Clock::now() - facts.snapshot.begun); }},
        {"kvlRefreshTime",
         {1, 1, 9, 7},
         ValueType::Gauge,
         [](Facts const& facts) { return milliseconds(facts.snapshot.refreshTime); }},
        {"kvlLongestRefreshTime",
         {1, 1, 9, 8},
         ValueType::Gauge,
         [](Facts const& facts) { return milliseconds(facts.snapshot.longestRefreshTime); }},
        {"kvlInterfaceCount",
         {1, 1, 9, 9},
         ValueType::Gauge,
         [](Facts const& facts) { return size(facts.snapshot.interfaces.interfaces); }},
        {"kvlLineCount",
         {1, 1, 9, 10},
         ValueType::Gauge,
         [](Facts const& facts) { return size(facts.snapshot.interfaces.lines); }},
        {"kvlAgentFront",
         {1, 1, 9, 11},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             return facts.counters.master == Master::None ? kStandAlone : kSubagent;
         }},
        {"kvlMasterState",
         {1, 1, 9, 12},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             Master const master = facts.counters.master;
             if (master == Master::None) return {};
             return static_cast<std::int64_t>(master);
         }},
        {"kvlMasterLosses",
         {1, 1, 9, 13},
         ValueType::Counter,
         [](Facts const& facts) {
             return facts.counters.master == Master::None ? Value{}
                                                          : count(facts.counters.masterLosses);
         }},
        {"kvlInterfaceConflicts",
         {1, 1, 9, 15},
         ValueType::Gauge,
         [](Facts const& facts) -> Value {
             if (facts.counters.master == Master::None) return {};
             return std::int64_t{facts.snapshot.interfaceConflicts};
         }},
        {"kvlHealthNotificationsDropped",
         {1, 1, 9, 16},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsDropped); }},
        {"kvlHealthFaultCount",
         {1, 1, 9, 17},
         ValueType::Gauge,
         [](Facts const& facts) { return size(facts.snapshot.faults.rows); }},
        {"kvlHealthFaultsUnlisted",
         {1, 1, 9, 18},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.unlisted}; }},
        {"kvlPersistence",
         {1, 1, 9, 14},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             return static_cast<std::int64_t>(facts.snapshot.persistence);
         }},
    };
    return described;
}

} // namespace kvloamd
