// SPDX-License-Identifier: BSD-2-Clause
// The objects of KVL-OAM-MIB that have one instance.
#include "agent/Objects.h"
#include "agent/RowValues.h"
#include "services/oam.h"

namespace kvloamd {

namespace {

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
         [](Facts const& facts) -> Value {
             return static_cast<std::int64_t>(facts.snapshot.boards.size());
         }},
        {"kvlBoardTableLastChange",
         {1, 1, 2, 2},
         ValueType::TimeTicks,
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
         [](Facts const& facts) -> Value {
             return static_cast<std::int64_t>(facts.snapshot.faults.rows.size());
         }},
        {"kvlFaultsRaised",
         {1, 1, 8, 2},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.raised}; }},
        {"kvlFaultTableLastChange",
         {1, 1, 8, 3},
         ValueType::TimeTicks,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.faults.lastChange};
         }},
        {"kvlFaultsUnlisted",
         {1, 1, 8, 4},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.faults.unlisted}; }},
    };
    return described;
}

std::vector<Table const*> tables() {
    return {&boardTable(),          &moduleTable(),    &serviceTable(), &deviceTable(),
            &subDeviceTable(),      &processorTable(), &storeTable(),   &processTable(),
            &resourceDeviceTable(), &faultTable()};
}

} // namespace kvloamd
