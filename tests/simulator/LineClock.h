// SPDX-License-Identifier: BSD-2-Clause
// A clock for lines that changes only when the test moves it.
#pragma once

#include <atomic>
#include <chrono>

#include "boardplatform/dm_client.h"
#include "boardplatform/ds1_line.h"
#include "simulator/exports/Control.h"

namespace support {

/// A `LineClock` is the clock of the lines during its lifetime. Only one at a time.
class LineClock {
  public:
    LineClock() {
        s_now = std::chrono::nanoseconds(std::chrono::hours(1)).count();
        kvlsim::setLineClock([] { return std::chrono::nanoseconds(s_now.load()); });
    }
    ~LineClock() { kvlsim::setLineClock(nullptr); }
    LineClock(LineClock const&) = delete;
    LineClock& operator=(LineClock const&) = delete;

    void advance(std::chrono::nanoseconds by) { s_now += by.count(); }

  private:
    static inline std::atomic<std::chrono::nanoseconds::rep> s_now = 0;
};

/// The counters of a line as a client of the platform reads them; all zero when there are none.
inline DS1LineCounters readLine(long handle) {
    DS1LineCounters counters{};
    DMAttribute request{kDS1LineCounters, &counters, 0, 0, sizeof counters};
    dm_getDeviceMapperClient()->GetAttributes(handle, 1, &request);
    return counters;
}

} // namespace support
