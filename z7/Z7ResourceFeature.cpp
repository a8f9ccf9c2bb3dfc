// SPDX-License-Identifier: BSD-2-Clause
#include "z7/Z7ResourceFeature.h"

#include "core/HandleWalk.h"

Z7ResourceFeature::Z7ResourceFeature() {
    answer_to(iid());
}

Z7ResourceFeature::~Z7ResourceFeature() = default;

ReferenceCounter<Z7Device> Z7ResourceFeature::GetFirstDevice() {
    return KVL::first_in(m_devices);
}

ReferenceCounter<Z7Device> Z7ResourceFeature::GetNextDevice(ReferenceCounter<Z7Device> current) {
    return KVL::next_in(m_devices, current);
}

ReferenceCounter<Z7Device> Z7ResourceFeature::GetDevice(char* /*name*/) {
    return {};
}
