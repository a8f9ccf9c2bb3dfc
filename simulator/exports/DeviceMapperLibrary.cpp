// SPDX-License-Identifier: BSD-2-Clause
// The device mapper's accessor over the simulated device mapper.
#include "boardplatform/dm_client.h"
#include "simulator/exports/Start.h"
#include "simulator/mapper/DeviceMapper.h"

DeviceMapperClient* dm_getDeviceMapperClient() {
    // Never destroyed: the process may ask until its very end.
    static auto* const client =
        kvlsim::makeDeviceMapper(kvlsim::startedPlatform().chassis()).release();
    return client;
}
