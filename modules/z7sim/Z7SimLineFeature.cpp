// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimLineFeature.h"

#include <algorithm>
#include <array>
#include <memory>
#include <utility>

#include "LineSource.h"
#include "LineStatusDelivery.h"
#include "ObjectAttributes.h"
#include "Z7SimLine.h"
#include "access/DevMapBoardIf.h"
#include "boardplatform/isdn_channels.h"

namespace {

constexpr std::size_t kMaxNameLength = 63;
/// Of an E1 line, one per time slot.
constexpr std::size_t kMostChannels = 32;

/// dsx1LineType of a line whose type the platform does not know.
constexpr int kOtherType = 1;

/// dsx1LineCoding.
int usualCoding(LineCarrier carrier) {
    switch (carrier) {
    case LineCarrier::t1:
        return 2; // B8ZS
    case LineCarrier::e1:
        return 3; // HDB3
    case LineCarrier::unknown:
        break;
    }
    return 6; // other
}

/// The configuration of a line in DS1-MIB's values. What the platform does not know has the usual
/// value of the line type.
LineSetup readSetup(long device, int number) {
    LineSetup setup;
    setup.name = textAttribute(device, "NAME").substr(0, kMaxNameLength);
    setup.circuit = textAttribute(device, "CIRCUIT");
    setup.type = numberAttributeOr(device, kDS1LineType, kOtherType);
    bool const esf = setup.format() == LineFormat::esf;
    setup.number = numberAttributeOr(device, "LINE_NUMBER", number);
    setup.coding = numberAttributeOr(device, "LINE_CODING", usualCoding(setup.carrier()));
    setup.length = numberAttributeOr(device, "LINE_LENGTH", 0);
    setup.buildOut = numberAttributeOr(device, "LINE_BUILD_OUT", 1);  // not applicable
    setup.impedance = numberAttributeOr(device, "LINE_IMPEDANCE", 1); // not applicable
    setup.clockSource = numberAttributeOr(device, "CLOCK_SOURCE", 1); // loop timing
    setup.fdl = numberAttributeOr(device, "FDL", esf ? 2 : 8);        // ANSI T1.403, none
    std::array<char, kMostChannels> states{};
    setup.channelized =
        bytesAttribute(device, kISDNChannelStates, states.data(), states.size()) > 0;
    // Message oriented where a channel signals for the others, else none.
    setup.signalMode = numberAttributeOr(device, "SIGNAL_MODE", setup.channelized ? 4 : 1);
    return setup;
}

} // namespace

Z7SimLineFeature::Z7SimLineFeature() {
    SetFeatureName("DS1");
}

Z7SimLineFeature::~Z7SimLineFeature() = default;

ReferenceCounter<Z7SimLineFeature> Z7SimLineFeature::make(long board, LineRecords& records) {
    ReferenceCounter<Z7SimLineFeature> feature(new Z7SimLineFeature);
    std::vector<long> const devices = DevMapBoardIf(board).ListAllDevices();
    for (long const device : devices)
        feature->add(device, records);
    records.keepOnly(devices);
    auto const& lines = feature->m_lines;
    if (lines.empty()) return {};
    for (std::size_t i = 0; i < lines.size(); ++i)
        LineStatusDelivery::instance().open(feature->m_numbers[i], {feature.get()}, lines[i]);
    return feature;
}

void Z7SimLineFeature::add(long device, LineRecords& records) {
    DS1LineCounters counters{};
    if (!PlatformLine(device).read(counters)) return;
    LineSetup setup = readSetup(device, static_cast<int>(m_lines.size()) + 1);
    LineRecord const& record = records.of(device, setup.format());
    m_lines.emplace_back(new Z7SimLine(std::move(setup), record.state, {record.intervals.get()}));
    m_devices.push_back(device);
    m_numbers.push_back(record.state->number());
}

int Z7SimLineFeature::GetNumberOfLines() {
    return static_cast<int>(m_lines.size());
}

int Z7SimLineFeature::NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> line,
                                                DS1LineStatusEnum status) {
    ReferenceCounter<DS1LineStatusEvent> const event(
        new DS1LineStatusEvent(status, std::move(line)));
    for_each_listener<DS1LineStatusListener>(
        m_listeners, this, [&](auto* listener) { listener->ProcessLineStatusEvent(event); });
    return 0;
}

void Z7SimLineFeature::Withdraw() {
    for (std::uint64_t const number : m_numbers)
        LineStatusDelivery::instance().close(number);
}

ReferenceCounter<DS1LineDevice> Z7SimLineFeature::lineOfDevice(long device) {
    auto const found = std::find(m_devices.begin(), m_devices.end(), device);
    if (found == m_devices.end()) return {};
    return m_lines[static_cast<std::size_t>(found - m_devices.begin())];
}
