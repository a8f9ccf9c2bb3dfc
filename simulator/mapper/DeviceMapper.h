// SPDX-License-Identifier: BSD-2-Clause
// The simulated device mapper client, and its result and status codes.
#pragma once

#include <memory>

#include "boardplatform/dm_client.h"
#include "simulator/chassis/GuardedChassis.h"

namespace kvlsim {

/// The object is not in the chassis.
inline constexpr int kUnknownObject = 201;
/// The request itself makes no sense (a null pointer, a negative count).
inline constexpr int kInvalidRequest = 203;
/// There is no chassis: the configured one was refused.
inline constexpr int kNoChassis = 204;

/// Status of one attribute: the object has no such attribute.
inline constexpr int kNoAttribute = 1;
/// Status of one attribute: the buffer does not hold the number, descriptor or record.
inline constexpr int kBufferTooSmall = 2;
/// Status of one attribute: name or buffer are missing.
inline constexpr int kInvalidAttribute = 3;

/// A client that searches and reads this chassis; thread-safe. Requires: the chassis outlives it.
std::unique_ptr<DeviceMapperClient> makeDeviceMapper(GuardedChassis& chassis);

} // namespace kvlsim
