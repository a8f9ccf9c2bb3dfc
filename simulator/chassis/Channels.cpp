// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a trunk: what a call leaves in its record and in the counters.
#include "simulator/chassis/Channels.h"

namespace kvlsim {

namespace {

/// isdnBearerCallOrigin.
constexpr std::int32_t kOriginate = 2;
constexpr std::int32_t kAnswer = 3;

} // namespace

void Channels::setTerms(std::int32_t channel, CallTerms const& terms) {
    ISDNCallRecord& call = m_calls[static_cast<std::size_t>(channel - 1)];
    call = kNoCall;
    terms.peer.copy(call.peer, sizeof call.peer - 1);
    terms.peerSubAddress.copy(call.peerSubAddress, sizeof call.peerSubAddress - 1);
    call.origin = terms.incoming ? kAnswer : kOriginate;
    call.information = terms.information;
    call.multirate = terms.multirate ? 1 : 0;
}

void Channels::setState(std::int32_t channel, ISDNBearerState state, std::uint32_t now) {
    auto const place = static_cast<std::size_t>(channel - 1);
    m_states[place] = static_cast<char>(state);
    ISDNCallRecord& call = m_calls[place];
    bool const incoming = call.origin == kAnswer;
    if (state == ISDNBearerState::connecting) {
        call.setupTime = now;
        ++(incoming ? m_counters.inCalls : m_counters.outCalls);
    }
    if (state == ISDNBearerState::connected) {
        call.connectTime = now;
        ++(incoming ? m_counters.inConnected : m_counters.outConnected);
    }
}

void Channels::charge(std::int32_t channel, std::uint32_t units) {
    m_calls[static_cast<std::size_t>(channel - 1)].chargedUnits += units;
    m_counters.chargedUnits += units;
}

} // namespace kvlsim
