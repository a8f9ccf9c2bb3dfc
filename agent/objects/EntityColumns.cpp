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

constexpr NamedNumber kEntPhysicalClass[] = {
    {1, "other"},       {2, "unknown"}, {3, "chassis"},       {4, "backplane"}, {5, "container"},
    {6, "powerSupply"}, {7, "fan"},     {8, "sensor"},        {9, "module"},    {10, "port"},
    {11, "stack"},      {12, "cpu"},    {13, "energyObject"}, {14, "battery"}};

constexpr NamedNumber kTruthValues[] = {{1, "true"}, {2, "false"}};

constexpr Column<Row> kPhysicalColumns[] = {
    {"entPhysicalDescr", 2, Text, text<&Row::description>, about("What the entity is, in words")},
    {"entPhysicalVendorType", 3, ObjectId, vendorType,
     about("The maker's identity for this kind of entity")},
    {"entPhysicalContainedIn", 4, Integer, containedIn, about("The entity that contains this one")},
    {"entPhysicalClass", 5, Integer, physicalClass,
     about("The kind of the entity").oneOf(kEntPhysicalClass).as(Kind::Information)},
    {"entPhysicalParentRelPos", 6, Integer, position,
     about("The position among the entities of the same container")},
    {"entPhysicalName", 7, Text, text<&Row::name>,
     about("The name of the entity on the system's own console").identifies()},
    {"entPhysicalHardwareRev", 8, Text, notKnown, about("The revision of the hardware")},
    {"entPhysicalFirmwareRev", 9, Text, text<&Row::firmware>,
     about("The revision of the firmware")},
    {"entPhysicalSoftwareRev", 10, Text, text<&Row::software>,
     about("The revision of the software")},
    {"entPhysicalSerialNum", 11, Text, text<&Row::serialNumber>,
     about("The serial number").identifies()},
    {"entPhysicalMfgName", 12, Text, notKnown, about("The maker")},
    {"entPhysicalModelName", 13, Text, text<&Row::model>, about("The maker's name of the model")},
    {"entPhysicalAlias", 14, Text, text<&Row::alias>,
     about("The name that the operator has given to the entity").settable(kAlias)},
    {"entPhysicalAssetID", 15, Text, text<&Row::assetId>,
     about("The operator's inventory number").settable(kAssetId)},
    {"entPhysicalIsFRU", 16, Integer, isReplaceable,
     about("Whether the entity can be replaced in the field")
         .oneOf(kTruthValues)
         .as(Kind::Information)},
    {"entPhysicalMfgDate", 17, Date, manufacturingDate, about("When the entity was made")},
    {"entPhysicalUris", 18, Octets, text<&Row::uris>,
     about("Identifiers of the entity as URIs, separated by white space").settable(kUris)},
    {"entPhysicalUUID", 19, Octets, notKnown,
     about("The universally unique identifier of the entity")},
};

constexpr Column<AliasRow> kAliasColumns[] = {
    {"entAliasMappingIdentifier", 2, ObjectId, interface, about("The instance in the other table")},
};

constexpr Column<ContainsRow> kContainsColumns[] = {
    {"entPhysicalChildIndex", 1, Integer, child, about("The entity that is contained")},
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
