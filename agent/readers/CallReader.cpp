// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/CallReader.h"

#include <cstring>
#include <string>

#include "agent/readers/Answers.h"
#include "agent/readers/LegalValues.h"
#include "board/ISDNCall.h"

namespace kvloamd {

namespace {

template <std::size_t Size>
std::string bounded(char const (&text)[Size]) {
    return printable({text, strnlen(text, Size)});
}

std::optional<ISDNSignallingCounts> countsOf(ISDNDChannel& channel) {
    auto* const counting = dynamic_cast<ISDNCountingChannel*>(&channel);
    ISDNSignallingCounts counts;
    if (counting == nullptr || counting->GetCounts(counts) != 0) return std::nullopt;
    return counts;
}

} // namespace

void readCall(ISDNBChannel& channel, std::function<std::uint32_t(long)> const& toTicks,
              BearerRow& row) {
    auto* const calling = dynamic_cast<ISDNCallChannel*>(&channel);
    if (calling == nullptr) return;
    ISDNCallDetails const call = calling->GetCall();
    CallRow& read = row.call;
    read.peerAddress = bounded(call.peerAddress);
    read.peerSubAddress = bounded(call.peerSubAddress);
    // What ISDN-MIB has no number for is unknown to it.
    read.origin = legal(kCallOrigins, call.origin).value_or(read.origin);
    read.informationType =
        legal(kInformationTypes, call.informationType).value_or(read.informationType);
    read.multirate = legal(kTruthValues, call.multirate).value_or(read.multirate);
    read.chargedUnits = call.chargedUnits;
    if (call.setupTime > 0) read.setupTime = toTicks(call.setupTime);
    read.connected = call.connectTime > 0;
    if (read.connected) read.connectTime = toTicks(call.connectTime);
}

void readCounts(ISDNDChannel& channel, SignallingRow& row) {
    if (auto* const counting = dynamic_cast<ISDNCountingChannel*>(&channel)) {
        char address[kTextCapacity] = "";
        if (counting->GetCallingSubAddress(address) == 0) row.callingSubAddress = bounded(address);
    }
    auto const counts = countsOf(channel);
    if (!counts) return;
    row.inCalls = counts->inCalls;
    row.inConnected = counts->inConnected;
    row.outCalls = counts->outCalls;
    row.outConnected = counts->outConnected;
    row.chargedUnits = counts->chargedUnits;
}

void readCounts(ISDNDChannel& channel, LapdRow& row) {
    auto const counts = countsOf(channel);
    if (!counts) return;
    row.peerSabme = counts->peerSabme;
    row.recvdFrmr = counts->recvdFrmr;
}

} // namespace kvloamd
