// SPDX-License-Identifier: BSD-2-Clause
// Everything that the public headers declare, compiled for its debug information.
#include "boardplatform/dm_client.h"
#include "boardplatform/ds1_line.h"
#include "boardplatform/isdn_channels.h"
#include "boardplatform/kpx.h"
#include "boardplatform/qsb.h"
#include "boardplatform/vqx_event_service.h"
#include "kvloam.h"

namespace contract {

/// One instance of each class template that has virtual operations.
struct Instances {
    IndexedTable<int, ReferenceCounter<Board>> table;
    ReferenceCounter<Board> handle;
    kvlvector<ReferenceCounter<BoardFactory>> vector;
};

static_assert(sizeof(Instances) > 0);

} // namespace contract
