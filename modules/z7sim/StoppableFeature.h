// SPDX-License-Identifier: BSD-2-Clause
// A feature that follows the platform while its board is started.
#pragma once

/// Implemented by a feature beside `Feature`. The board calls `stop` once, when it has taken the
/// feature away; whoever holds a handle may go on asking the feature, which stays as it was.
class StoppableFeature {
  public:
    /// Nothing that the platform announces from now on reaches the feature. What was on its way on
    /// another thread may still arrive. Waits for no callback.
    virtual void stop() = 0;

  protected:
    ~StoppableFeature() = default;
};
