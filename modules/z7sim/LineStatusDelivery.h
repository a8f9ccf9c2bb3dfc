// SPDX-License-Identifier: BSD-2-Clause
// The thread that announces status changes of lines.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>

#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"
#include "platform/KVLThread_pthread.h"
#include "z7/DS1LineFeatureZ7.h"

/// The `LineStatusDelivery` calls the listeners of lines whose status has changed. Changes are
/// noticed in the scheduler's ticks, under the scheduler's lock, where no listener may be called:
/// one that dropped the last handle of a board would wait for ever. So the tick posts the change,
/// and this thread announces it.
///
/// One per process, never destroyed. Thread-safe; no lock is held while listeners are called.
class LineStatusDelivery final : public Runnable {
  public:
    /// The first call starts the thread.
    static LineStatusDelivery& instance();

    /// A number for one line, under which its changes are posted.
    std::uint64_t reserve();
    /// Announces what is posted under `number` to the listeners of `feature`, as changes of `line`.
    /// Keeps both until the number is closed. A number that is open already is opened anew.
    void open(std::uint64_t number, ReferenceCounter<DS1LineFeatureZ7> feature,
              ReferenceCounter<DS1LineDevice> line);
    /// Forgets the feature and the line, and what is posted under their number. A delivery under
    /// way goes on.
    void close(std::uint64_t number);

    /// Posts the status that the line of `number` has now. When thousands of changes wait for a
    /// listener that does not return, new ones are dropped; the line itself can still be asked.
    void post(std::uint64_t number, DS1LineStatusEnum status);
    /// Waits until everything posted so far has been delivered. Not for a listener to call.
    void drain();

    void Run() override;

  private:
    struct Line {
        ReferenceCounter<DS1LineFeatureZ7> feature;
        ReferenceCounter<DS1LineDevice> line;
    };
    struct Change {
        std::uint64_t number;
        DS1LineStatusEnum status;
    };

    LineStatusDelivery() = default;
    ~LineStatusDelivery() = default;
    void deliver(Change const& change);

    std::mutex m_mutex; ///< guards everything below; comes after the scheduler's lock
    std::condition_variable m_changed;
    std::deque<Change> m_changes;
    std::map<std::uint64_t, Line> m_lines;
    std::uint64_t m_lastNumber = 0;
    std::uint64_t m_posted = 0;
    std::uint64_t m_delivered = 0;
    KVLThread_pthread m_thread{this};
};
