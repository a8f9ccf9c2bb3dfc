// SPDX-License-Identifier: BSD-2-Clause
// The DS1 lines of a reference board.
#pragma once

#include <cstdint>

#include "Withdrawable.h"
#include "z7/DS1LineFeatureZ7.h"

/// All lines of a board, and the delivery of their status changes to its listeners.
class Z7SimLineFeature final : public DS1LineFeatureZ7, public Withdrawable {
  public:
    /// The lines of the board with this handle in the device mapper: every device that has line
    /// counters. An empty handle when it has none. Changes are delivered until it is withdrawn.
    static ReferenceCounter<Z7SimLineFeature> make(long board);
    ~Z7SimLineFeature() override;

    int GetNumberOfLines() override;
    /// Hands one event to every listener, on the caller's thread: `LineStatusDelivery`'s. Returns
    /// 0.
    int NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> line,
                                  DS1LineStatusEnum status) override;
    void Withdraw() override;

    /// `i` from 0; an empty handle when there is no such line.
    ReferenceCounter<DS1LineDevice> lineAt(int i);
    /// The line of a device, by its handle in the device mapper; an empty handle when it is none.
    ReferenceCounter<DS1LineDevice> lineOfDevice(long device);

  private:
    explicit Z7SimLineFeature(std::uint64_t number);
    void add(long device);

    std::uint64_t m_number; ///< with the `LineStatusDelivery`
    std::vector<long> m_devices;
};
