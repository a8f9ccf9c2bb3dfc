// SPDX-License-Identifier: BSD-2-Clause
// Makes up boards and whole chassis.
#include "simulator/description/Generator.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace kvlsim {

namespace {

using Json = nlohmann::ordered_json;

struct Family {
    std::string_view name;
    std::string_view platform;
    std::array<std::string_view, 2> models;
};

constexpr std::array<Family, 5> kFamilies = {{{"NX5", "NX5", {"NX5-T1", "NX5-E1"}},
                                              {"QUILLON", "QUILLON", {"QUILLON-T1", "QUILLON-E1"}},
                                              {"VORN", "VORN", {"VORN-T1", "VORN-E1"}},
                                              {"Z7", "NX5", {"Z7-T1", "Z7-E1"}},
                                              {"VELQUOR", "QUILLON", {"VELQUOR", "VELQUOR"}}}};

struct DeviceKind {
    std::int32_t type;
    std::int32_t subDeviceType; ///< 0: none
    std::string_view word;
    std::int32_t channels; ///< 0: as the board's span has
};

constexpr std::array<DeviceKind, 6> kDeviceKinds = {{{501, 502, "trunk", 0},
                                                     {503, 504, "voice", 48},
                                                     {505, 506, "span", 0},
                                                     {507, 508, "conference", 60},
                                                     {520, 0, "ip", 120},
                                                     {525, 526, "station", 16}}};

Json descriptor(std::int32_t board, std::int32_t kind, std::int32_t index) {
    auto const word = [](std::int32_t value) { return value & 0xFFFF; };
    return {{"descriptor", {word(board), 1, kind, word(index)}}};
}

std::string padded(std::int32_t number, std::size_t width) {
    std::string const digits = std::to_string(number);
    return std::string(width - std::min(width, digits.size()), '0') + digits;
}

std::string lowerCase(std::string_view text) {
    std::string result(text);
    std::ranges::transform(result, result.begin(), [](char c) {
        return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    });
    return result;
}

void writeYaml(Json const& node, std::size_t indent, std::string& out);

void writeEntries(Json const& map, std::size_t indent, bool indentFirst, std::string& out) {
    for (auto const& [key, value] : map.items()) {
        if (indentFirst) out.append(indent, ' ');
        indentFirst = true;
        out += key + ":";
        writeYaml(value, indent + 2, out);
    }
}

/// What stands behind a key's colon, line end included.
void writeYaml(Json const& node, std::size_t indent, std::string& out) {
    if (node.is_array()) {
        out += '\n';
        for (auto const& item : node) {
            out.append(indent, ' ');
            out += "- ";
            writeEntries(item, indent + 2, false, out);
        }
    } else if (node.is_object() && !node.contains("descriptor")) {
        out += '\n';
        writeEntries(node, indent, true, out);
    } else if (node.is_object()) {
        out += " {descriptor: " + node["descriptor"].dump() + "}\n";
    } else {
        out += ' ' + node.dump() + '\n';
    }
}

} // namespace

std::int32_t Generator::pick(std::int32_t least, std::int32_t most) {
    // Not std::uniform_int_distribution: its numbers differ between standard libraries.
    auto const range = static_cast<std::uint32_t>(most - least + 1);
    return least + static_cast<std::int32_t>(m_random() % range);
}

Json Generator::line(std::int32_t board, std::int32_t handle, std::int32_t index, bool isE1) {
    Json device;
    device["handle"] = handle;
    device["type"] = 501;
    Json& of = device["attributes"];
    of["NAME"] = std::string("b").append(std::to_string(board)) + "-line-" + std::to_string(index);
    of["ChannelCount"] = isE1 ? 30 : 24;
    of["LINEADMINADDR"] = descriptor(board, 2, index);
    of["LINE_NUMBER"] = index;
    of["CIRCUIT"] = (isE1 ? "E1-" : "T1-") + padded(handle, 8);
    Json& line = device["line"];
    line["type"] = isE1 ? "e1-crc" : "esf";
    line["errors"]["code-violations"] = pick(0, 20) / 10.0;
    line["errors"]["path-violations"] = pick(0, 10) / 100.0;
    return device;
}

Json Generator::board(std::int32_t handle, std::int32_t& nextHandle) {
    auto const* const wanted = std::ranges::find(kFamilies, m_options.family, &Family::name);
    Family const& family =
        wanted != kFamilies.end()
            ? *wanted
            : kFamilies[static_cast<std::size_t>(pick(0, std::int32_t(kFamilies.size()) - 1))];
    std::int32_t const model = pick(0, 1);
    std::int32_t const slot = (handle - 1) % 16 + 1;
    std::int32_t const shelf = (handle - 1) / 16 + 1;
    Json board;
    board["handle"] = handle;
    Json& attributes = board["attributes"];
    std::string const lower = lowerCase(family.name);
    attributes["NAME"] = family.models[static_cast<std::size_t>(model)];
    attributes["SERIAL_NUMBER"] = std::string(family.name.substr(0, 2)) + padded(handle, 7);
    attributes["DESCRIPTION"] = std::string(family.name) + " board of the simulated chassis";
    attributes["FAMILY"] = family.name;
    attributes["CTPLATFORM"] = family.platform;
    attributes["LOGICAL ID"] = handle - 1;
    attributes["Board Id (BLT ID)"] = pick(16, 255);
    attributes["VORN_DRIVER_BOARD_ID"] = handle + 99;
    attributes["PCI_BUS_NUMBER"] = shelf % 256;
    attributes["PCI_SLOT_NUMBER"] = slot;
    attributes["SHELF_ID"] = shelf;
    attributes["CHASSIS_SLOT"] = slot;
    attributes["MEMBASEADDR"] = 0x40000000 + (handle % 1024) * 0x100000;
    attributes["IOBASEADDR"] = 0xC000 + slot * 0x100;
    attributes["IRQ"] = pick(3, 15);
    attributes["FIRMWARE_NAME"] = lower + ".fw";
    attributes["FIRMWARE_NAME1"] = lower + "_dsp.fw";
    attributes["FIRMWARE_VERSION"] = std::to_string(pick(1, 9)) + "." + std::to_string(pick(0, 99));
    std::string const stem = std::string("b").append(std::to_string(handle));
    for (std::int32_t i = 1; i <= m_options.devices; ++i) {
        DeviceKind const& kind =
            kDeviceKinds[static_cast<std::size_t>(pick(0, std::int32_t(kDeviceKinds.size()) - 1))];
        std::string const name = stem + "-" + std::string(kind.word) + "-" + std::to_string(i);
        Json device;
        device["handle"] = nextHandle++;
        device["type"] = kind.type;
        std::int32_t const spanChannels = model == 0 ? 24 : 30;
        Json& of = device["attributes"];
        of["NAME"] = name;
        of["ChannelCount"] = kind.channels == 0 ? spanChannels : kind.channels;
        if (kind.channels == 0) {
            of["LINEADMINADDR"] = descriptor(handle, 1, i);
            of["Protocol_Type_0"] = pick(1, 4);
        }
        for (std::int32_t k = 1; kind.subDeviceType != 0 && k <= m_options.subDevices; ++k) {
            Json sub;
            sub["handle"] = nextHandle++;
            sub["type"] = kind.subDeviceType;
            Json& subOf = sub["attributes"];
            subOf["NAME"] = name + "-" + std::to_string(k);
            subOf["TSCADDR"] = descriptor(handle, 16, k);
            subOf["CLUSTERADDR"] = descriptor(handle, 48, k);
            subOf["Out_Variant"] = pick(0, 3);
            subOf["FrontEndType"] = model + 1;
            device["subdevices"].push_back(std::move(sub));
        }
        board["devices"].push_back(std::move(device));
    }
    bool const isE1 =
        std::string_view(family.models[static_cast<std::size_t>(model)]).ends_with("-E1");
    for (std::int32_t i = 1; i <= m_options.lines; ++i)
        board["devices"].push_back(line(handle, nextHandle++, i, isE1));
    for (std::int32_t i = 0; i < m_options.processors; ++i) {
        Json processor;
        processor["handle"] = nextHandle++;
        Json& of = processor["attributes"];
        of["NAME"] = stem + "-processor-" + std::to_string(i);
        of["PROC_NUM"] = i;
        of["BK_VERSION"] = "1." + std::to_string(pick(0, 9));
        of["BK_FILE"] = lower + "_boot.bin";
        of["RTK_VERSION"] = "3." + std::to_string(pick(0, 99));
        of["RTK_FILE"] = lower + "_kernel.bin";
        board["processors"].push_back(std::move(processor));
    }
    return board;
}

std::string Generator::chassis() {
    std::string out = "# Made by: kvlsim generate --boards " + std::to_string(m_options.boards) +
                      " --devices " + std::to_string(m_options.devices) + " --subdevices " +
                      std::to_string(m_options.subDevices) + " --processors " +
                      std::to_string(m_options.processors) + " --seed " +
                      std::to_string(m_options.seed);
    if (m_options.lines > 0) out += " --lines " + std::to_string(m_options.lines);
    out += "\nboards:\n";
    std::int32_t nextHandle = m_options.boards + 1;
    for (std::int32_t handle = 1; handle <= m_options.boards; ++handle) {
        out += "  - ";
        writeEntries(board(handle, nextHandle), 4, false, out);
    }
    return out;
}

std::int64_t Generator::objects(GeneratorOptions const& options) {
    std::int64_t const perBoard = 1 + std::int64_t(options.devices) * (1 + options.subDevices) +
                                  options.lines + options.processors;
    return options.boards * perBoard;
}

} // namespace kvlsim
