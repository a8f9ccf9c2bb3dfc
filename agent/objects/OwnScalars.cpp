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

template <class All>
Value sizeOf(All const& rows) {
    return static_cast<std::int64_t>(rows.size());
}

Value count(std::atomic<std::uint32_t> const& counter) {
    return std::int64_t{counter.load(std::memory_order_relaxed)};
}

constexpr NamedNumber kKvlAgentFront[] = {{1, "standAlone"}, {2, "subagent"}};

constexpr NamedNumber kKvlMasterState[] = {{1, "connected"}, {2, "lost"}};

constexpr NamedNumber kKvlPersistence[] = {{1, "kept"}, {2, "inUse"}, {3, "failing"}};

} // namespace

std::span<Scalar const> scalars() {
    static Scalar const described[] = {
        {"kvlLibraryVersion",
         {1, 1, 1, 1},
         ValueType::Text,
         [](Facts const&) -> Value { return std::string_view(OAM_VersionString()); },
         about("The version text of the library with which the agent is linked")},
        {"kvlAgentVersion",
         {1, 1, 1, 2},
         ValueType::Text,
         [](Facts const&) -> Value { return std::string_view(KVLOAM_VERSION); },
         about("The version of the agent itself")},
        {"kvlNotificationsDropped",
         {1, 1, 1, 3},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsDropped); },
         about("Notifications that were not sent because the queue was full").in("notifications")},
        {"kvlBoardCount",
         {1, 1, 2, 1},
         ValueType::Gauge,
         [](Facts const& facts) { return sizeOf(facts.snapshot.boards); },
         about("The number of boards present, which is the number of rows of kvlBoardTable")
             .in("boards")},
        {"kvlBoardTableLastChange",
         {1, 1, 2, 2},
         ValueType::TimeStamp,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.lastChange}; },
         about("When a board came, went or changed last")},
        {"kvlBoardStatusChanges",
         {1, 1, 2, 3},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.statusChanges); },
         about("Board status changes since the agent's start").in("changes")},
        {"kvlPlatformServiceStatus",
         {1, 1, 4, 1},
         ValueType::Integer,
         [](Facts const& facts) {
             return number<&PlatformService::status>(facts.snapshot.platformService);
         },
         about("The status of the board platform's own service").as(Kind::State)},
        {"kvlPlatformServiceChangeDate",
         {1, 1, 4, 2},
         ValueType::Date,
         [](Facts const& facts) {
             return textIfKnown<&PlatformService::changeDate>(facts.snapshot.platformService);
         },
         about("When kvlPlatformServiceStatus last changed")},
        {"kvlFaultCount",
         {1, 1, 8, 1},
         ValueType::Gauge,
         [](Facts const& facts) { return sizeOf(facts.snapshot.faults.rows); },
         about("The number of faults that are raised now, which is the number of rows of "
               "kvlFaultTable")
             .in("faults")},
        {"kvlFaultsRaised",
         {1, 1, 8, 2},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.raised}; },
         about("How many times a fault has been raised since the agent's start").in("faults")},
        {"kvlFaultTableLastChange",
         {1, 1, 8, 3},
         ValueType::TimeStamp,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.lastChange}; },
         about("When a row was last added to or removed from kvlFaultTable")},
        {"kvlFaultsUnlisted",
         {1, 1, 8, 4},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.unlisted}; },
         about("How many times a fault was raised that kvlFaultTable does not list because it was "
               "full")
             .in("faults")},
        {"kvlAlarmCount",
         {1, 1, 12, 1},
         ValueType::Gauge,
         [](Facts const& facts) { return sizeOf(facts.snapshot.alarms->alarms); },
         about("The number of active alarms").in("alarms")},
        {"kvlAlarmsRaised",
         {1, 1, 12, 2},
         ValueType::Counter,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.alarms->stats.front().raised};
         },
         about("How many alarms have been raised since the agent's start").in("alarms")},
        {"kvlAlarmsSuppressed",
         {1, 1, 12, 3},
         ValueType::Counter,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.alarms->suppressed};
         },
         about("How many times something was wrong that never became an alarm").in("times")},
        {"kvlEventNumber",
         {1, 1, 12, 5},
         ValueType::Gauge,
         [](Facts const& facts) { return count(facts.counters.events); },
         about("The sequence number of the newest event").as(Kind::Counter)},
        {"kvlAgentUpTime",
         {1, 1, 9, 1},
         ValueType::TimeTicks,
         [](Facts const& facts) -> Value {
             return std::int64_t{timeTicks(Clock::now() - facts.counters.started)};
         },
         about("The time since the agent's start")},
        {"kvlNotificationsSent",
         {1, 1, 9, 2},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsSent); },
         about("The number of notifications sent since the agent's start").in("notifications")},
        {"kvlNotificationsWaiting",
         {1, 1, 9, 3},
         ValueType::Gauge,
         [](Facts const& facts) { return count(facts.counters.notificationsWaiting); },
         about("The number of notifications that wait to be sent").in("notifications")},
        {"kvlRequests",
         {1, 1, 9, 4},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.requests); },
         about("The number of requests for the agent's objects that the agent has answered since "
               "its start")
             .in("requests")},
        {"kvlSnapshots",
         {1, 1, 9, 5},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.number}; },
         about("The number of snapshots of all objects that the agent has taken since its start")
             .in("snapshots")},
        {"kvlSnapshotAge",
         {1, 1, 9, 6},
         ValueType::Gauge,
         [](Facts const& facts) { return milliseconds(Clock::now() - facts.snapshot.begun); },
         about("The time since the agent began to take the snapshot that this response comes from")
             .in("milliseconds")},
        {"kvlRefreshTime",
         {1, 1, 9, 7},
         ValueType::Gauge,
         [](Facts const& facts) { return milliseconds(facts.snapshot.refreshTime); },
         about("How long it took to take the snapshot").in("milliseconds")},
        {"kvlLongestRefreshTime",
         {1, 1, 9, 8},
         ValueType::Gauge,
         [](Facts const& facts) { return milliseconds(facts.snapshot.longestRefreshTime); },
         about("The longest time that a snapshot has taken since the agent's start")
             .in("milliseconds")},
        {"kvlInterfaceCount",
         {1, 1, 9, 9},
         ValueType::Gauge,
         [](Facts const& facts) { return sizeOf(facts.snapshot.interfaces.interfaces); },
         about("The number of interfaces of all boards").in("interfaces")},
        {"kvlLineCount",
         {1, 1, 9, 10},
         ValueType::Gauge,
         [](Facts const& facts) { return sizeOf(facts.snapshot.interfaces.lines); },
         about("The number of DS1 lines of all boards").in("lines")},
        {"kvlAgentFront",
         {1, 1, 9, 11},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             return facts.counters.master == Master::None ? kStandAlone : kSubagent;
         },
         about("Whether the agent serves alone or through a master agent of the host")
             .oneOf(kKvlAgentFront)
             .as(Kind::Information)},
        {"kvlMasterState",
         {1, 1, 9, 12},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             Master const master = facts.counters.master;
             if (master == Master::None) return {};
             return static_cast<std::int64_t>(master);
         },
         about("The state of the connection to the master").oneOf(kKvlMasterState)},
        {"kvlMasterLosses",
         {1, 1, 9, 13},
         ValueType::Counter,
         [](Facts const& facts) {
             return facts.counters.master == Master::None ? Value{}
                                                          : count(facts.counters.masterLosses);
         },
         about("How many times the connection to the master has been lost since the agent's start")
             .in("times")},
        {"kvlInterfaceConflicts",
         {1, 1, 9, 15},
         ValueType::Gauge,
         [](Facts const& facts) -> Value {
             if (facts.counters.master == Master::None) return {};
             return std::int64_t{facts.snapshot.interfaceConflicts};
         },
         about(
             "How many network interfaces of the host have the ifIndex of an interface of a board")
             .in("interfaces")},
        {"kvlHealthNotificationsDropped",
         {1, 1, 9, 16},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsDropped); },
         about("Notifications that were not sent because the queue was full").in("notifications")},
        {"kvlHealthFaultCount",
         {1, 1, 9, 17},
         ValueType::Gauge,
         [](Facts const& facts) { return sizeOf(facts.snapshot.faults.rows); },
         about("The number of faults that are raised now").in("faults")},
        {"kvlHealthFaultsUnlisted",
         {1, 1, 9, 18},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.unlisted}; },
         about("How many times a fault was raised that the full table does not list").in("faults")},
        {"kvlNotificationsUnacknowledged",
         {1, 1, 9, 19},
         ValueType::Counter,
         [](Facts const& facts) { return count(facts.counters.notificationsUnacknowledged); },
         about("Notifications that a receiver of informs did not acknowledge").in("notifications")},
        {"kvlPersistence",
         {1, 1, 9, 14},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             return static_cast<std::int64_t>(facts.snapshot.persistence);
         },
         about("Whether indices and settings will survive a restart of the agent")
             .oneOf(kKvlPersistence)},
    };
    return described;
}

} // namespace kvloamd
