// SPDX-License-Identifier: BSD-2-Clause
// What the simulator knows of the platform's attributes and object types: the tables.
#include "simulator/AttributeSchema.h"

#include <algorithm>
#include <array>
#include <unordered_map>

namespace kvlsim {

namespace {

constexpr std::array<std::int32_t, 13> kDeviceTypes = {501, 503, 505, 507, 509, 514, 516,
                                                       518, 520, 521, 511, 525, 527};
constexpr std::array<std::int32_t, 11> kSubDeviceTypes = {502, 504, 506, 508, 510, 517,
                                                          519, 522, 512, 526, 528};

std::unordered_map<std::string_view, AttributeKind> const& knownAttributes() {
    using enum AttributeKind;
    static std::unordered_map<std::string_view, AttributeKind> const known = {
        // Boards.
        {"NAME", text},
        {"SERIAL_NUMBER", text},
        {"DESCRIPTION", text},
        {"FAMILY", text},
        {"CTPLATFORM", text},
        {"FIRMWARE_NAME", text},
        {"FIRMWARE_NAME1", text},
        {"FIRMWARE_VERSION", text},
        {"STATE_CHANGE_DATE", text},
        {"BOARD_CONDITION", number},
        {"BOARD_PRESENT", number},
        {"PCI_SLOT_NUMBER", number},
        {"PCI_BUS_NUMBER", number},
        {"SHELF_ID", number},
        {"CHASSIS_SLOT", number},
        {"MEMBASEADDR", number},
        {"IOBASEADDR", number},
        {"IRQ", number},
        {"VORN_DRIVER_BOARD_ID", number},
        {"LOGICAL ID", number},
        {"Board Id (BLT ID)", number},
        // Devices and sub-devices.
        {"ChannelCount", number},
        {"FrontEndType", number},
        {"Out_Variant", byte},
        {"LINEADMINADDR", descriptor},
        {"TSCADDR", descriptor},
        {"CLUSTERADDR", descriptor},
        {"CTBUSADDR", descriptor},
        {"IPVSCADDR", descriptor},
        // Processors.
        {"PROC_NUM", number},
        {"BK_VERSION", text},
        {"BK_FILE", text},
        {"RTK_VERSION", text},
        {"RTK_FILE", text},
    };
    return known;
}

bool isProtocolType(std::string_view attribute) {
    constexpr std::string_view stem = "Protocol_Type_";
    if (!attribute.starts_with(stem) || attribute.size() == stem.size()) return false;
    return std::ranges::all_of(attribute.substr(stem.size()),
                               [](char c) { return c >= '0' && c <= '9'; });
}

} // namespace

AttributeKind kindOf(std::string_view attribute) {
    auto const& known = knownAttributes();
    if (auto const found = known.find(attribute); found != known.end()) return found->second;
    return isProtocolType(attribute) ? AttributeKind::byte : AttributeKind::any;
}

std::span<std::int32_t const> deviceTypes() {
    return kDeviceTypes;
}

std::span<std::int32_t const> subDeviceTypes() {
    return kSubDeviceTypes;
}

} // namespace kvlsim
