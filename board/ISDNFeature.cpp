// SPDX-License-Identifier: BSD-2-Clause
#include "board/ISDNFeature.h"

#include <utility>

#include "core/HandleWalk.h"

ISDNFeature::ISDNFeature() {
    answer_to(iid());
}

ISDNFeature::~ISDNFeature() = default;

ReferenceCounter<ISDNBChannel> ISDNFeature::GetFirstBChannel() {
    return GetFirstChannel(ReferenceCounter<ISDNBChannel>());
}

ReferenceCounter<ISDNBChannel>
ISDNFeature::GetNextBChannel(ReferenceCounter<ISDNBChannel> previous) {
    return GetNextChannel(std::move(previous));
}

ReferenceCounter<ISDNDChannel> ISDNFeature::GetFirstDChannel() {
    return GetFirstChannel(ReferenceCounter<ISDNDChannel>());
}

ReferenceCounter<ISDNDChannel>
ISDNFeature::GetNextDChannel(ReferenceCounter<ISDNDChannel> previous) {
    return GetNextChannel(std::move(previous));
}

ReferenceCounter<ISDNBChannel> ISDNFeature::FindBChannel(char const* name) {
    return KVL::find_named(
        GetFirstBChannel(), [this](auto const& channel) { return GetNextBChannel(channel); }, name);
}
