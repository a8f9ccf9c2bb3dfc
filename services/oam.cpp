// SPDX-License-Identifier: BSD-2-Clause
#include "services/oam.h"

namespace {

constexpr char kNotice[252] =
    "Copyright (c) 2026, the KVL OAM authors. Distributed under the terms "
    "of the BSD 2-Clause License.";

} // namespace

char const* OAM_VersionString() {
    return OAM_VERSION_STRING;
}

char const* OAM_GetCopyRight() {
    return kNotice;
}
