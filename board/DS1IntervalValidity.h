// SPDX-License-Identifier: BSD-2-Clause
// Which intervals of a DS1 line's history have all of their data.
#pragma once

#include "platform/Export.h"

/// A `DS1IntervalValidity` answers which intervals of a line's history missed data. An interval
/// table that can miss data derives from this class beside `DS1IntervalTable`; its users find it
/// with `dynamic_cast`. Every interval of a table without it is valid.
///
/// Thread-safe, as the readers of `DS1IntervalTable` are.
class KVLOAM_API DS1IntervalValidity {
  public:
    /// Whether interval `n`, numbered as in `DS1IntervalTable`, has the data of every second that
    /// it counts. False for an interval that was never closed.
    virtual bool IsIntervalValid(int n) = 0;
    /// How many intervals were ever closed, those included that the history has forgotten. Tells
    /// two readings of the history whether an interval was closed in between.
    virtual int GetIntervalsClosed() = 0;

  protected:
    DS1IntervalValidity();
    ~DS1IntervalValidity();
};
