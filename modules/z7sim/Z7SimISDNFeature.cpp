// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimISDNFeature.h"

#include <algorithm>
#include <array>
#include <string>

#include "ObjectAttributes.h"

namespace {

constexpr std::size_t kMostBearers = 31;
constexpr int kBearersOfT1 = 24;
constexpr int kSignallingSlotOfE1 = 16;

std::string readBearerStates(long device) {
    std::string states(kMostBearers, '\0');
    states.resize(bytesAttribute(device, kISDNChannelStates, states.data(), states.size()));
    return states;
}

/// The time slot of bearer channel `channel` of so many, both from 1. An E1 keeps one slot in its
/// middle for signalling, unless all are bearers and the signalling goes elsewhere.
int timeSlot(int channel, int bearers) {
    bool const skips = bearers > kBearersOfT1 && bearers < static_cast<int>(kMostBearers);
    return skips && channel >= kSignallingSlotOfE1 ? channel + 1 : channel;
}

ReferenceCounter<DS1LineDevice> lineOf(long device,
                                       ReferenceCounter<Z7SimLineFeature> const& lines) {
    if (lines.get() == nullptr) return {};
    return lines->lineOfDevice(device);
}

bool isBearerState(int state) {
    return state >= ISDNBChannelStatusIdle && state <= ISDNBChannelStatusActive;
}

bool isSignallingState(int state) {
    return state >= ISDNDChannelStatusInactive && state <= ISDNDChannelStatusL2Active;
}

} // namespace

Z7SimISDNFeature::Z7SimISDNFeature(long board, std::vector<long> const& devices,
                                   ReferenceCounter<Z7SimLineFeature> const& lines) {
    SetFeatureName("ISDN");
    for (long const device : devices) {
        auto const bearers = static_cast<int>(readBearerStates(device).size());
        if (bearers == 0 || !numberAttribute(device, kISDNSignallingState)) continue;
        addTrunk(board, device, bearers, lineOf(device, lines));
    }
}

Z7SimISDNFeature::~Z7SimISDNFeature() = default;

void Z7SimISDNFeature::addTrunk(long board, long device, int bearers,
                                ReferenceCounter<DS1LineDevice> const& line) {
    std::string const number = std::to_string(m_trunks.size() + 1);
    int const index = static_cast<int>(board);
    Trunk trunk{device, {}, new Z7SimDChannel("D" + number, device, bearers, index, line)};
    m_signallingChannels.emplace_back(trunk.signalling.get());
    for (int channel = 1; channel <= bearers; ++channel) {
        int const slot = timeSlot(channel, bearers);
        std::string const name = "B" + number + "." + std::to_string(slot);
        trunk.bearers.emplace_back(new Z7SimBChannel(name, slot, index, line));
        m_bearerChannels.emplace_back(trunk.bearers.back().get());
    }
    m_trunks.push_back(std::move(trunk));
}

void Z7SimISDNFeature::readStates() {
    for (auto const& trunk : m_trunks) {
        readCalls(trunk);
        std::string const states = readBearerStates(trunk.device);
        for (std::size_t i = 0; i < trunk.bearers.size(); ++i) {
            int const state = i < states.size() ? states[i] : 0;
            trunk.bearers[i]->state().adopt(isBearerState(state)
                                                ? static_cast<ISDNBChannelStatusEnum>(state)
                                                : ISDNBChannelStatusIdle);
        }
        int const state = numberAttributeOr(trunk.device, kISDNSignallingState, 0);
        trunk.signalling->state().adopt(isSignallingState(state)
                                            ? static_cast<ISDNDChannelStatusEnum>(state)
                                            : ISDNDChannelStatusInactive);
    }
}

void Z7SimISDNFeature::readCalls(Trunk const& trunk) {
    std::array<ISDNCallRecord, kMostBearers> records{};
    std::size_t const size =
        bytesAttribute(trunk.device, kISDNCallRecords, records.data(), sizeof records);
    std::size_t const count = std::min(size / sizeof(ISDNCallRecord), trunk.bearers.size());
    for (std::size_t i = 0; i < count; ++i)
        trunk.bearers[i]->setCall(records[i]);
}

void Z7SimISDNFeature::apply(std::uint32_t id, ISDNChannelMsg const& message) {
    Trunk const* const trunk = find(message.device);
    if (trunk == nullptr) return;
    if (id == kISDNBearerChanged) applyToBearer(*trunk, message);
    if (id == kISDNSignallingChanged) applyToSignalling(*trunk, message);
}

void Z7SimISDNFeature::applyToBearer(Trunk const& trunk, ISDNChannelMsg const& message) {
    auto const number = static_cast<std::size_t>(message.channel);
    if (message.channel < 1 || number > trunk.bearers.size() || !isBearerState(message.state))
        return;
    // A listener of the change then finds the call that it belongs to.
    readCalls(trunk);
    auto const& channel = trunk.bearers[number - 1];
    auto const status = static_cast<ISDNBChannelStatusEnum>(message.state);
    if (!channel->state().change(status)) return;
    NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel>(channel.get()), status);
    channel->NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel>(channel.get()), status);
}

void Z7SimISDNFeature::applyToSignalling(Trunk const& trunk, ISDNChannelMsg const& message) {
    if (message.channel != 0 || !isSignallingState(message.state)) return;
    auto const& channel = trunk.signalling;
    auto const status = static_cast<ISDNDChannelStatusEnum>(message.state);
    if (!channel->state().change(status)) return;
    NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel>(channel.get()), status);
    channel->NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel>(channel.get()), status);
}

void Z7SimISDNFeature::Withdraw() {
    ISDNMonitor::instance().remove(*this);
}

std::vector<long> Z7SimISDNFeature::trunks() const {
    std::vector<long> devices;
    for (auto const& trunk : m_trunks)
        devices.push_back(trunk.device);
    return devices;
}

ReferenceCounter<ISDNDChannel> Z7SimISDNFeature::signallingChannel(long device) const {
    Trunk const* const trunk = find(device);
    if (trunk == nullptr) return {};
    return {trunk->signalling.get()};
}

Z7SimISDNFeature::Trunk const* Z7SimISDNFeature::find(long device) const {
    auto const found = std::ranges::find(m_trunks, device, &Trunk::device);
    return found == m_trunks.end() ? nullptr : &*found;
}

ReferenceCounter<Z7SimISDNFeature>
makeISDNFeature(long board, std::vector<long> const& devices,
                ReferenceCounter<Z7SimLineFeature> const& lines) {
    ReferenceCounter<Z7SimISDNFeature> feature(new Z7SimISDNFeature(board, devices, lines));
    if (feature->trunks().empty()) return {};
    ISDNMonitor::instance().add(feature->trunks(), {feature.get()}, *feature.get());
    feature->readStates();
    return feature;
}
