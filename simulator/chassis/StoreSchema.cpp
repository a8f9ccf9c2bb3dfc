// SPDX-License-Identifier: BSD-2-Clause
// The attribute store's record types and the fields of a board's record: the tables.
#include "simulator/chassis/StoreSchema.h"

#include <algorithm>
#include <array>
#include <cstring>

namespace kvlsim {

namespace {

constexpr std::array<RecordType, 3> kRecordTypes = {kRootRecord, kFamilyRecord, kBoardRecord};

constexpr std::array<std::string_view, 5> kFamilies = {"NX5", "QUILLON", "VORN", "Z7", "VELQUOR"};

constexpr int kText = 80;
constexpr int kNumber = 4;

constexpr std::array<RecordField, 13> kBoardFields = {
    {{"Version", 0, kText, FieldKind::text, ""},
     {"Model", 80, kText, FieldKind::text, "NAME"},
     {"Type", 160, kNumber, FieldKind::number, "TYPE"},
     {"FunctionalDescription", 164, kText, FieldKind::text, "DESCRIPTION"},
     {"FirmwareName", 244, kText, FieldKind::text, "FIRMWARE_NAME"},
     {"FirmwareVersion", 324, kText, FieldKind::text, "FIRMWARE_VERSION"},
     {"SerialNumber", 404, kText, FieldKind::text, "SERIAL_NUMBER"},
     {"SharedMemoryBaseAddress", 484, kNumber, FieldKind::number, "MEMBASEADDR"},
     {"IOBaseAddress", 488, kNumber, FieldKind::number, "IOBASEADDR"},
     {"IRQ", 492, kNumber, FieldKind::number, "IRQ"},
     {"BoardID", 496, kNumber, FieldKind::number, "Board Id (BLT ID)"},
     {"PCISlotNumber", 500, kNumber, FieldKind::number, "PCI_SLOT_NUMBER"},
     {"DeviceChangeDate", 508, kText, FieldKind::text, "STATE_CHANGE_DATE"}}};

std::string upToNul(std::string_view text) {
    return std::string(text.substr(0, text.find('\0')));
}

} // namespace

RecordType const* recordTypeNamed(std::string_view name) {
    auto const* const found = std::ranges::find(kRecordTypes, name, &RecordType::name);
    return found == kRecordTypes.end() ? nullptr : found;
}

std::span<std::string_view const> knownFamilies() {
    return kFamilies;
}

std::span<RecordField const> boardFields() {
    return kBoardFields;
}

RecordField const* boardFieldNamed(std::string_view name) {
    auto const* const found = std::ranges::find(kBoardFields, name, &RecordField::name);
    return found == kBoardFields.end() ? nullptr : found;
}

void BoardRecord::set(RecordField const& field, FieldValue const& value) {
    char* const at = m_bytes.data() + field.offset;
    auto const length = static_cast<std::size_t>(field.length);
    std::memset(at, 0, length);
    if (auto const* number = std::get_if<std::int32_t>(&value))
        std::memcpy(at, number, sizeof *number);
    else
        std::get<std::string>(value).copy(at, length - 1);
}

FieldValue BoardRecord::get(RecordField const& field) const {
    if (field.kind == FieldKind::text)
        return upToNul(std::string_view(m_bytes).substr(static_cast<std::size_t>(field.offset),
                                                        static_cast<std::size_t>(field.length)));
    std::int32_t number = 0;
    std::memcpy(&number, m_bytes.data() + field.offset, sizeof number);
    return number;
}

std::string BoardRecord::serialNumber() const {
    return std::get<std::string>(get(*boardFieldNamed("SerialNumber")));
}

bool fitsAsFamily(std::string_view name) {
    return !name.empty() && name.size() < static_cast<std::size_t>(kFamilyRecord.size);
}

std::string familyRecord(std::string_view name) {
    std::string record(name);
    record.resize(static_cast<std::size_t>(kFamilyRecord.size), '\0');
    return record;
}

std::string familyName(std::string_view record) {
    return upToNul(record);
}

} // namespace kvlsim
