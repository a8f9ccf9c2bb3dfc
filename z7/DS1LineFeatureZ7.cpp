// SPDX-License-Identifier: BSD-2-Clause
#include "z7/DS1LineFeatureZ7.h"

#include "core/HandleWalk.h"

DS1LineFeatureZ7::DS1LineFeatureZ7() = default;

DS1LineFeatureZ7::~DS1LineFeatureZ7() = default;

int DS1LineFeatureZ7::AddLineStatusListener(DS1LineStatusListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

ReferenceCounter<DS1LineDevice> DS1LineFeatureZ7::GetFirstDevice() {
    return KVL::first_in(m_lines);
}

ReferenceCounter<DS1LineDevice>
DS1LineFeatureZ7::GetNextDevice(ReferenceCounter<DS1LineDevice> previous) {
    return KVL::next_in(m_lines, previous);
}

ReferenceCounter<DS1LineDevice> DS1LineFeatureZ7::Get(char* name) {
    return KVL::find_named(
        GetFirstDevice(), [this](auto const& line) { return GetNextDevice(line); }, name);
}

ReferenceCounter<DS1LineDevice> DS1LineFeatureZ7::Get(long /*index*/) {
    return KVL::past_all(GetFirstDevice(),
                         [this](auto const& line) { return GetNextDevice(line); });
}

int DS1LineFeatureZ7::NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> /*line*/,
                                                DS1LineStatusEnum /*status*/) {
    return 0;
}
