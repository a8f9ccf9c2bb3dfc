// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ResourceReader.h"

#include <cstring>
#include <string_view>
#include <utility>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardFaults.h"
#include "agent/readers/Courtesy.h"
#include "board/ISDNChannel.h"
#include "z7/Z7ResourceFeature.h"

namespace kvloamd {

namespace {

/// A name as long as its room has no end of its own.
std::string nameOf(Z7Device& device) {
    char const* const name = device.GetName();
    return printable(std::string_view(name, strnlen(name, Z7Device::kNameSize)));
}

/// A state that the MIB module has a name for, of 1 to `last`.
std::optional<int> named(int state, int last) {
    return state >= 1 && state <= last ? std::optional(state) : std::nullopt;
}

void readVoice(Z7VoiceDevice& device, ResourceRow& row) {
    row.kind = ResourceKind::Voice;
    row.coderType = unlessNegative(device.GetCoderType());
    row.channelState = unlessNegative(device.GetChannelState());
    if (int const gain = device.GetGain(); gain != -1) row.gain = gain;
    row.echoCancellation = named(device.GetEchoCancellation(), 2);
}

void readTrunk(Z7TRKDevice& device, ResourceRow& row) {
    row.kind = ResourceKind::Trunk;
    row.lineNumber = unlessNegative(device.GetLineNumber());
    row.lineType = unlessNegative(device.GetLineType());
    row.lineStatus = unlessNegative(device.GetLineStatus());
    row.protocolType = unlessNegative(device.GetProtocolType());
}

ResourceRow readResource(Z7Device& device) {
    ResourceRow row;
    row.name = nameOf(device);
    row.type = unlessNegative(device.GetType());
    row.status = unlessNegative(device.GetStatus());
    row.moduleBoard = unlessNegative(device.GetBoardIndex());
    row.number = unlessNegative(device.GetDeviceNumber());
    if (auto* const voice = dynamic_cast<Z7VoiceDevice*>(&device)) readVoice(*voice, row);
    if (auto* const trunk = dynamic_cast<Z7TRKDevice*>(&device)) readTrunk(*trunk, row);
    if (auto* const isdn = dynamic_cast<Z7ISDNDevice*>(&device)) {
        row.kind = ResourceKind::IsdnTrunk;
        row.bearerCount = unlessNegative(isdn->GetBChannelCount());
        row.signallingStatus = named(isdn->GetDChannelStatus(), ISDNDChannelStatusL2Active);
    }
    if (auto* const station = dynamic_cast<Z7STNDevice*>(&device)) {
        row.kind = ResourceKind::Station;
        row.timeSlotCount = unlessNegative(station->GetTimeSlotCount());
    }
    return row;
}

void readBoardResources(Board& board, std::uint32_t boardIndex, std::vector<ResourceRow>& rows) {
    std::uint32_t place = 0;
    for (auto feature = board.GetFirstFeature(Z7ResourceFeature::iid()); feature.get() != nullptr;
         feature = board.GetNextFeature(feature, Z7ResourceFeature::iid())) {
        auto* const resources = dynamic_cast<Z7ResourceFeature*>(feature.get());
        if (resources == nullptr) continue;
        for (auto device = resources->GetFirstDevice(); device.get() != nullptr;
             device = resources->GetNextDevice(device)) {
            ResourceRow row = readResource(*device.get());
            row.boardIndex = boardIndex;
            row.place = ++place;
            rows.push_back(std::move(row));
        }
    }
}

} // namespace

Rows<ResourceRow> ResourceReader::read(Rows<BoardRow> const& boards) {
    bool changed = false;
    auto const drop = [&](Part const& part) { changed = changed || part != nullptr; };
    m_parts.begin();
    for (BoardRow const& row : boards) {
        Part& part = m_parts.at(row.boardIndex, drop);
        if (part != nullptr && !isDue(m_turns, row.boardIndex)) continue;
        Part read = readPart(row.boardIndex, part);
        changed = changed || read != part;
        part = std::move(read);
        yieldBetweenBoards();
    }
    m_parts.end(drop);
    if (!changed) return m_rows;
    m_rows.clear();
    for (auto const& [boardIndex, part] : m_parts.all())
        if (part != nullptr && !part->empty()) m_rows.append(*part, part);
    return m_rows;
}

ResourceReader::Part ResourceReader::readPart(std::uint32_t boardIndex, Part const& former) {
    auto const board = m_manager.GetBoardByIndex(static_cast<int>(boardIndex));
    Board* const asked = board.get();
    if (asked == nullptr) return nullptr;
    std::vector<ResourceRow> rows;
    if (!readGuarded(boardIndex, "resources",
                     [&] { readBoardResources(*asked, boardIndex, rows); }))
        return nullptr;
    if (former != nullptr && *former == rows) return former;
    return std::make_shared<std::vector<ResourceRow> const>(std::move(rows));
}

} // namespace kvloamd
