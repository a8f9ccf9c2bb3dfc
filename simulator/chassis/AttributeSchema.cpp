// SPDX-License-Identifier: BSD-2-Clause
// What the simulator knows of the platform's attributes and object types: the tables.
#include "simulator/chassis/AttributeSchema.h"

#include <algorithm>
#include <array>
#include <unordered_map>
#include <utility>
#include <vector>

#include "boardplatform/ds1_line.h"
#include "boardplatform/isdn_channels.h"
#include "simulator/base/Text.h"

namespace kvlsim {

namespace {

constexpr std::array<std::int32_t, 13> kDeviceTypes = {501, 503, 505, 507, 509, 514, 516,
                                                       518, 520, 521, 511, 525, 527};
constexpr std::array<std::int32_t, 11> kSubDeviceTypes = {502, 504, 506, 508, 510, 517,
                                                          519, 522, 512, 526, 528};

constexpr std::array<std::string_view, 7> kLiveAttributes = {
    kDS1LineCounters,     kDS1LinePastSeconds, kDS1LinePast,           kISDNChannelStates,
    kISDNSignallingState, kISDNCallRecords,    kISDNSignallingCounters};

/// They have a number behind this stem.
constexpr std::array<std::pair<std::string_view, AttributeKind>, 4> kNumberedAttributes = {
    {{"Protocol_Type_", AttributeKind::byte},
     {"IP_ADDRESS_", AttributeKind::text},
     {"IP_MASK_", AttributeKind::text},
     {"IP_BROADCAST_", AttributeKind::text}}};

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
        {"ETHERNET_DEVICE", text},
        {"ETHERNET_ADDRESS", text},
        {"ETHERNET_SPEED", number},
        {"ETHERNET_MTU", number},
        {"ETHERNET_IN_OCTETS", number},
        {"ETHERNET_OUT_OCTETS", number},
        {"ETHERNET_FCS_ERRORS", number},
        {"ETHERNET_IN_PACKETS", number},
        {"ETHERNET_OUT_PACKETS", number},
        {"ETHERNET_IN_MULTICASTS", number},
        {"ETHERNET_OUT_MULTICASTS", number},
        {"ETHERNET_IN_BROADCASTS", number},
        {"ETHERNET_OUT_BROADCASTS", number},
        {"ETHERNET_IN_DISCARDS", number},
        {"ETHERNET_OUT_DISCARDS", number},
        {"ETHERNET_IN_ERRORS", number},
        {"ETHERNET_OUT_ERRORS", number},
        {"ETHERNET_IN_UNKNOWN_PROTOCOLS", number},
        {"ETHERNET_ALIGNMENT_ERRORS", number},
        {"ETHERNET_TOO_LONG_FRAMES", number},
        {"ETHERNET_MAC_RECEIVE_ERRORS", number},
        {"ETHERNET_MAC_TRANSMIT_ERRORS", number},
        {"ETHERNET_SYMBOL_ERRORS", number},
        {"ETHERNET_DUPLEX", number},
        {"ETHERNET_OPER_STATUS", number},
        // Devices and sub-devices.
        {"ChannelCount", number},
        {"FrontEndType", number},
        {"Out_Variant", byte},
        {"LINEADMINADDR", descriptor},
        {"TSCADDR", descriptor},
        {"CLUSTERADDR", descriptor},
        {"CTBUSADDR", descriptor},
        {"IPVSCADDR", descriptor},
        // Lines.
        {kDS1LineType, number},
        {"LINE_CODING", number},
        {"LINE_LENGTH", number},
        {"LINE_BUILD_OUT", number},
        {"LINE_IMPEDANCE", number},
        {"LINE_NUMBER", number},
        {"SIGNAL_MODE", number},
        {"CLOCK_SOURCE", number},
        {"FDL", number},
        {"CIRCUIT", text},
        // Trunks.
        {kISDNCallingAddress, text},
        {kISDNCallingSubAddress, text},
        // Processors.
        {"PROC_NUM", number},
        {"BK_VERSION", text},
        {"BK_FILE", text},
        {"RTK_VERSION", text},
        {"RTK_FILE", text},
    };
    return known;
}

/// What DS1-MIB allows for the attributes of lines that have its numbers.
constexpr std::array<std::pair<std::string_view, LegalNumbers>, 7> kLegalNumbers = {
    {{"LINE_CODING", {1, 7}},
     {"LINE_LENGTH", {0, 64000}},
     {"LINE_BUILD_OUT", {1, 5}},
     {"LINE_IMPEDANCE", {1, 4}},
     {"SIGNAL_MODE", {1, 5}},
     {"CLOCK_SOURCE", {1, 4}},
     {"FDL", {1, 15}}}};

/// Whether `attribute` is this stem followed by a number.
bool isNumbered(std::string_view attribute, std::string_view stem) {
    if (!attribute.starts_with(stem) || attribute.size() == stem.size()) return false;
    return std::ranges::all_of(attribute.substr(stem.size()),
                               [](char c) { return c >= '0' && c <= '9'; });
}

std::string_view withoutNumber(std::string_view attribute) {
    while (!attribute.empty() && attribute.back() >= '0' && attribute.back() <= '9')
        attribute.remove_suffix(1);
    return attribute;
}

std::vector<std::string> sortedNames() {
    std::vector<std::string> names;
    for (auto const& [name, kind] : knownAttributes())
        names.emplace_back(name);
    std::ranges::sort(names);
    return names;
}

} // namespace

AttributeKind kindOf(std::string_view attribute) {
    auto const& known = knownAttributes();
    if (auto const found = known.find(attribute); found != known.end()) return found->second;
    for (auto const& [stem, kind] : kNumberedAttributes)
        if (isNumbered(attribute, stem)) return kind;
    return AttributeKind::any;
}

std::string knownNameLike(std::string_view attribute) {
    if (kindOf(attribute) != AttributeKind::any) return {};
    std::string_view const stem = withoutNumber(attribute);
    std::string const number(attribute.substr(stem.size()));
    static std::vector<std::string> const names = sortedNames();
    std::vector<std::string> stems;
    for (auto const& [name, kind] : kNumberedAttributes)
        if (!number.empty()) stems.push_back(std::string(name) + number);
    std::string numbered = nearestWord(attribute, stems);
    if (!numbered.empty()) return numbered;
    std::string nearest = nearestWord(attribute, names);
    // NAME2 is another attribute than NAME, not a misspelt one.
    return withoutNumber(nearest) == stem ? std::string() : nearest;
}

std::optional<LegalNumbers> legalNumbersOf(std::string_view attribute) {
    for (auto const& [name, numbers] : kLegalNumbers)
        if (name == attribute) return numbers;
    return std::nullopt;
}

bool isLiveAttribute(std::string_view attribute) {
    return std::ranges::find(kLiveAttributes, attribute) != kLiveAttributes.end();
}

std::span<std::int32_t const> deviceTypes() {
    return kDeviceTypes;
}

std::span<std::int32_t const> subDeviceTypes() {
    return kSubDeviceTypes;
}

} // namespace kvlsim
