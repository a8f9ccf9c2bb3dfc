// SPDX-License-Identifier: BSD-2-Clause
// The DS1 lines of a Z7 board.
#pragma once

#include <vector>

#include "board/DS1LineFeature.h"
#include "core/ListenerTable.h"

/// Keeps the lines in a vector, which the concrete feature fills before it publishes itself and
/// leaves alone afterwards; any thread may then walk it. Listeners are kept and walked under the
/// feature's own lock.
class KVLOAM_API DS1LineFeatureZ7 : public DS1LineFeature {
  public:
    DS1LineFeatureZ7();
    ~DS1LineFeatureZ7() override;

    /// Returns 0, also for a listener that was added before.
    int AddLineStatusListener(DS1LineStatusListener* listener) override;
    ReferenceCounter<DS1LineDevice> GetFirstDevice() override;
    /// An empty handle too when `previous` is no line of this feature.
    ReferenceCounter<DS1LineDevice>
    GetNextDevice(ReferenceCounter<DS1LineDevice> previous) override;

    /// The first line of that name, or an empty handle. The name is only read.
    virtual ReferenceCounter<DS1LineDevice> Get(char* name);
    /// Deliberate: goes past all lines and answers an empty handle for every index. Lines are found
    /// by name, or walked.
    virtual ReferenceCounter<DS1LineDevice> Get(long index);
    virtual int GetNumberOfLines() = 0;
    /// Deliberate: tells nobody and returns 0. A concrete feature that delivers line statuses
    /// overrides it.
    virtual int NotifyLineStatusListeners(ReferenceCounter<DS1LineDevice> line,
                                          DS1LineStatusEnum status);

  protected:
    std::vector<ReferenceCounter<DS1LineDevice>> m_lines;
    ListenerTable m_listeners;
};
