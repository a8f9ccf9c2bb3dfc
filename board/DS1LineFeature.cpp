// SPDX-License-Identifier: BSD-2-Clause
#include "board/DS1LineFeature.h"

#include <utility>

#include "core/HandleWalk.h"

DS1LineStatusEvent::DS1LineStatusEvent(DS1LineStatusEnum status,
                                       ReferenceCounter<DS1LineDevice> line)
    : m_status(status), m_line(std::move(line)) {}

DS1LineStatusEvent::~DS1LineStatusEvent() = default;

DS1LineStatusEnum DS1LineStatusEvent::GetLineStatus() {
    return m_status;
}

ReferenceCounter<DS1LineDevice> DS1LineStatusEvent::GetLine() {
    return m_line;
}

DS1LineFeature::DS1LineFeature() {
    answer_to(iid());
}

DS1LineFeature::~DS1LineFeature() = default;

ReferenceCounter<KVL::Interface> DS1LineFeature::GetFirstInterface() {
    ReferenceCounter<DS1LineDevice> const line = GetFirstDevice();
    return {line.get()};
}

ReferenceCounter<KVL::Interface>
DS1LineFeature::GetNextInterface(ReferenceCounter<KVL::Interface> previous) {
    ReferenceCounter<DS1LineDevice> const line = GetNextDevice(
        ReferenceCounter<DS1LineDevice>(dynamic_cast<DS1LineDevice*>(previous.get())));
    return {line.get()};
}

ReferenceCounter<DS1LineDevice> DS1LineFeature::Find(char const* name) {
    return KVL::find_named(
        GetFirstDevice(), [this](auto const& line) { return GetNextDevice(line); }, name);
}
