// SPDX-License-Identifier: BSD-2-Clause
// The DS1 lines of a Z7 board.
#pragma once

#include <vector>

#include "board/DS1LineFeature.h"
#include "core/ListenerTable.h"

/// A `DS1LineFeatureZ7` holds the DS1 lines of a Z7 board. The concrete feature fills the vector of
/// lines before other threads see the feature and does not change it afterwards. Thread-safe from
/// then on; the feature's own lock guards the listeners.
class KVLOAM_API DS1LineFeatureZ7 : public DS1LineFeature {
  public:
    DS1LineFeatureZ7();
    ~DS1LineFeatureZ7() override;

    /// Returns 0, also if the listener was added before.
    int AddLineStatusListener(DS1LineStatusListener* listener) override;
    ReferenceCounter<DS1LineDevice> GetFirstDevice() override;
    /// The line after `previous`; an empty handle if there is none or `previous` is not a line of
    /// this feature.
    ReferenceCounter<DS1LineDevice>
    GetNextDevice(ReferenceCounter<DS1LineDevice> previous) override;

    /// The first line with this name, or an empty handle. The name is only read.
    virtual ReferenceCounter<DS1LineDevice> Get(char* name);
    /// Deliberate: returns an empty handle for every index. Lines are found by name or by a walk.
    virtual ReferenceCounter<DS1LineDevice> Get(long index);
    virtual int GetNumberOfLines() = 0;
    /// Deliberate: notifies no listener and returns 0. A concrete feature that delivers line status
    /// changes overrides it.
    virtual int NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> line,
                                          DS1LineStatusEnum status);

  protected:
    std::vector<ReferenceCounter<DS1LineDevice>> m_lines;
    ListenerTable m_listeners;
};
