// SPDX-License-Identifier: BSD-2-Clause
// The numbers that the standard MIB modules give to yes and no.
#pragma once

namespace kvloamd {

// TruthValue.
inline constexpr int kTrue = 1;
inline constexpr int kFalse = 2;

// The values of objects such as ifLinkUpDownTrapEnable and dsx1LineStatusChangeTrapEnable.
inline constexpr int kEnabled = 1;
inline constexpr int kDisabled = 2;

} // namespace kvloamd
