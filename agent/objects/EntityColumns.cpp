// SPDX-License-Identifier: BSD-2-Clause
// ENTITY-MIB's tables: the physical entities, which interfaces they are, and what contains what.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

template <auto Rows>
auto const& entityRows(Snapshot const& snapshot) {
    return (*snapshot.entities.physical).*Rows;
}

/// The name that stands for no type of a vendor's.
Value vendorType(PhysicalRow const& /*row*/) {
    static constexpr std::uint32_t kNone[] = {0, 0};
    return NameView{kNone};
}

Value containedIn(PhysicalRow const& row) {
    return std::int64_t{row.containedIn};
}

Value physicalClass(PhysicalRow const& row) {
    return std::int64_t{static_cast<int>(row.physicalClass)};
}

Value position(PhysicalRow const& row) {
    return std::int64_t{row.position};
}

/// What the boards do not tell, and ENTITY-MIB has an empty text for.
Value notKnown(PhysicalRow const& /*row*/) {
    return std::string_view();
}

Value isReplaceable(PhysicalRow const& row) {
    return std::int64_t{row.replaceable ? kTrue : kFalse};
}

/// The eight octets that stand for no date.
Value manufacturingDate(PhysicalRow const& /*row*/) {
    static constexpr char kNoDate[8] = {};
    return std::string_view(kNoDate, sizeof kNoDate);
}

Value interface(AliasRow const& row) {
    return NameView{row.interface};
}

Value child(ContainsRow const& row) {
    return std::int64_t{row.child};
}

using enum ValueType;
using Row = PhysicalRow;

constexpr int kLongestAlias = 32;
/// ENTITY-MIB sets no limit; this one keeps every row well within a message.
constexpr int kLongestUris = 255;
constexpr Writable kAlias{Setting::EntityAlias, 0, kLongestAlias};
constexpr Writable kAssetId{Setting::EntityAssetId, 0, kLongestAlias};
constexpr Writable kUris{Setting::EntityUris, 0, kLongestUris, Characters::Ascii};

constexpr Column<Row> kPhysicalColumns[] = {
    {"entPhysicalDescr", 2, Text, text<&Row::description>},
    {"entPhysicalVendorType", 3, ObjectId, vendorType},
    {"entPhysicalContainedIn", 4, Integer, containedIn},
    {"entPhysicalClass", 5, Integer, physicalClass},
    {"entPhysicalParentRelPos", 6, Integer, position},
    {"entPhysicalName", 7, Text, text<&Row::name>},
    {"entPhysicalHardwareRev", 8, Text, notKnown},
    {"entPhysicalFirmwareRev", 9, Text, text<&Row::firmware>},
    {"entPhysicalSoftwareRev", 10, Text, text<&Row::software>},
    {"entPhysicalSerialNum", 11, Text, text<&Row::serialNumber>},
    {"entPhysicalMfgName", 12, Text, notKnown},
    {"entPhysicalModelName", 13, Text, text<&Row::model>},
    {"entPhysicalAlias", 14, Text, text<&Row::alias>, kAlias},
    {"entPhysicalAssetID", 15, Text, text<&Row::assetId>, kAssetId},
    {"entPhysicalIsFRU", 16, Integer, isReplaceable},
    {"entPhysicalMfgDate", 17, Octets, manufacturingDate},
    {"entPhysicalUris", 18, Octets, text<&Row::uris>, kUris},
    {"entPhysicalUUID", 19, Octets, notKnown},
};

constexpr Column<AliasRow> kAliasColumns[] = {
    {"entAliasMappingIdentifier", 2, ObjectId, interface},
};

constexpr Column<ContainsRow> kContainsColumns[] = {
    {"entPhysicalChildIndex", 1, Integer, child},
};

} // namespace

Table const& entPhysicalTable() {
    static RowTable<Row, entityRows<&PhysicalEntities::entities>> const table(
        "entPhysicalTable", {47, 1, 1, 1, 1}, kPhysicalColumns);
    return table;
}

Table const& entAliasMappingTable() {
    static RowTable<AliasRow, entityRows<&PhysicalEntities::aliases>> const table(
        "entAliasMappingTable", {47, 1, 3, 2, 1}, kAliasColumns);
    return table;
}

Table const& entPhysicalContainsTable() {
    static RowTable<ContainsRow, entityRows<&PhysicalEntities::contains>> const table(
        "entPhysicalContainsTable", {47, 1, 3, 3, 1}, kContainsColumns);
    return table;
}

} // namespace kvloamd
