// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimResourceFeature.h"

#include <utility>

#include "Z7SimDevices.h"

namespace {

/// Makes the devices of one board, and numbers them.
class DeviceMaker {
  public:
    DeviceMaker(long board, ReferenceCounter<Z7SimLineFeature> const& lines,
                ReferenceCounter<Z7SimISDNFeature> const& isdn)
        : m_board(static_cast<int>(board)), m_lines(lines), m_isdn(isdn) {}

    /// Null for a device of unknown kind.
    Z7Device* make(long device) {
        DevMapDeviceIf const record(device);
        switch (record.DeviceType()) {
        case 503: // voice
        case 507: // conference
        case 509: // tones
        case 511: // fax
            return new Z7SimVoiceDevice(record, next(m_voice));
        case 501:
        case 505:
            return new Z7SimTrunk<Z7TRKDevice>(record, next(m_trunks), facts(device));
        case 514:
        case 516:
            return new Z7SimISDNDevice(record, next(m_isdnTrunks), facts(device),
                                       signalling(device));
        case 521: // switching
        case 525:
        case 527:
            return new Z7SimSTNDevice(record, next(m_stations));
        default:
            return nullptr;
        }
    }

  private:
    DevicePlace next(int& number) const { return {m_board, ++number}; }
    TrunkFacts facts(long device) {
        ReferenceCounter<DS1LineDevice> line;
        if (m_lines.get() != nullptr) line = m_lines->lineOfDevice(device);
        return {device, std::move(line)};
    }
    ReferenceCounter<ISDNDChannel> signalling(long device) const {
        if (m_isdn.get() == nullptr) return {};
        return m_isdn->signallingChannel(device);
    }

    int const m_board;
    ReferenceCounter<Z7SimLineFeature> const& m_lines;
    ReferenceCounter<Z7SimISDNFeature> const& m_isdn;
    int m_voice = 0;
    int m_trunks = 0;
    int m_isdnTrunks = 0;
    int m_stations = 0;
};

} // namespace

Z7SimResourceFeature::Z7SimResourceFeature(long board, std::vector<long> const& devices,
                                           ReferenceCounter<Z7SimLineFeature> const& lines,
                                           ReferenceCounter<Z7SimISDNFeature> const& isdn) {
    SetFeatureName("Resources");
    DeviceMaker maker(board, lines, isdn);
    for (long const device : devices)
        if (Z7Device* const made = maker.make(device)) m_devices.emplace_back(made);
}

Z7SimResourceFeature::~Z7SimResourceFeature() = default;

int Z7SimResourceFeature::GetNumberOfDevices() {
    return static_cast<int>(m_devices.size());
}

ReferenceCounter<Z7SimResourceFeature>
makeResourceFeature(long board, std::vector<long> const& devices,
                    ReferenceCounter<Z7SimLineFeature> const& lines,
                    ReferenceCounter<Z7SimISDNFeature> const& isdn) {
    ReferenceCounter<Z7SimResourceFeature> feature(
        new Z7SimResourceFeature(board, devices, lines, isdn));
    if (feature->GetNumberOfDevices() == 0) return {};
    return feature;
}
