// SPDX-License-Identifier: BSD-2-Clause
// The board platform's device mapper client: objects with handles (AUIDs) and named attributes.
#pragma once

#include <cstddef>
#include <cstdint>

#pragma GCC visibility push(default)

/// A `DMAttribute` is one attribute request or search criterion. The layout is the platform's.
struct DMAttribute {
    char const* name;      ///< attribute key, such as "SERIAL_NUMBER"
    void* value;           ///< caller's buffer; in a search, the value to match
    std::int32_t status;   ///< cleared by the caller; 0 after the call if found and copied
    std::int32_t reserved; ///< cleared by the caller
    std::int32_t size;     ///< in: buffer size in bytes; out: bytes stored
};

static_assert(offsetof(DMAttribute, value) == sizeof(void*));
static_assert(offsetof(DMAttribute, status) == 2 * sizeof(void*));
static_assert(offsetof(DMAttribute, reserved) == 2 * sizeof(void*) + 4);
static_assert(offsetof(DMAttribute, size) == 2 * sizeof(void*) + 8);
static_assert(sizeof(DMAttribute) == (sizeof(void*) == 4 ? 20 : 32));

/// The platform's eight-byte address descriptor; only ever copied whole.
struct QCompDesc {
    std::uint16_t word[4];
};

static_assert(sizeof(QCompDesc) == 8 && alignof(QCompDesc) == 2);

/// The result of `GetAttributes` if some attributes could not be read; their status shows which.
inline constexpr int kDMSomeAttributesFailed = 202;

/// The `DeviceMapperClient` is the process's client of the device mapper, owned by the platform.
/// Thread-safe.
class DeviceMapperClient {
  public:
    virtual ~DeviceMapperClient() = default;

    /// Finds the objects under `parent` whose attributes equal all `criteria`.
    /// `found`: in, the capacity of `auids`; out, the number stored. Returns 0 on success.
    virtual int FindObjects(long parent, int count, DMAttribute* criteria, int* found,
                            long* auids) = 0;
    /// Reserved by the platform; not called.
    virtual int Reserved3() = 0;
    virtual int GetRootObject(long* auid) = 0;
    virtual int FindObjectByName(char* name, long* auid) = 0;
    /// Reads `count` attributes of one object. Returns 0 if all were read,
    /// `kDMSomeAttributesFailed` if some were not, and another value if the whole request failed.
    virtual int GetAttributes(long auid, int count, DMAttribute* requests) = 0;
};

extern "C" DeviceMapperClient* dm_getDeviceMapperClient();

#pragma GCC visibility pop
