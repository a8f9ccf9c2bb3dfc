// SPDX-License-Identifier: BSD-2-Clause
// The DS1 lines of a reference board.
#pragma once

#include <cstdint>

#include <vector>

#include "LineRecords.h"
#include "Withdrawable.h"
#include "z7/DS1LineFeatureZ7.h"

/// A `Z7SimLineFeature` holds all lines of a board while it runs, and delivers their status changes
/// to its listeners. The lines' status and history stay with the board.
class Z7SimLineFeature final : public DS1LineFeatureZ7, public Withdrawable {
  public:
    /// The lines of the board with this handle in the device mapper: every device that has line
    /// counters. An empty handle when it has none. Changes are delivered until it is withdrawn.
    /// `records`: of the board's lines; those of lines that it no longer has are dropped.
    static ReferenceCounter<Z7SimLineFeature> make(long board, LineRecords& records);
    ~Z7SimLineFeature() override;

    int GetNumberOfLines() override;
    /// Hands one event to every listener, on the calling thread, which is that of the
    /// `LineStatusDelivery`. Returns 0.
    int NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> line,
                                  DS1LineStatusEnum status) override;
    void Withdraw() override;

    /// The line of a device, by its handle in the device mapper; an empty handle when it is none.
    ReferenceCounter<DS1LineDevice> lineOfDevice(long device);

  private:
    Z7SimLineFeature();
    void add(long device, LineRecords& records);

    std::vector<long> m_devices;          ///< of each line
    std::vector<std::uint64_t> m_numbers; ///< of each line, with the `LineStatusDelivery`
};
