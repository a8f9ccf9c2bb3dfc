// SPDX-License-Identifier: BSD-2-Clause
// Tells line status changes on a thread of its own.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>

#include "board/DS1LineFeature.h"
#include "core/ReferenceCounter.h"
#include "platform/KVLThread_pthread.h"

class Z7SimLineFeature;

/// Changes are noticed in the scheduler's ticks, under the scheduler's lock, where nobody may be
/// called back: a listener that dropped the last handle of a board would wait for ever. So the tick
/// leaves a note, and this thread makes the event.
///
/// One per process, never destroyed. Any thread may call; no lock is held while listeners are told.
class LineStatusDelivery final : public Runnable {
  public:
    /// The first call starts the thread.
    static LineStatusDelivery& instance();

    /// A number under which changes can be posted.
    std::uint64_t reserve();
    /// What is posted under `number` goes to the listeners of `feature`, which is kept meanwhile.
    void open(std::uint64_t number, ReferenceCounter<Z7SimLineFeature> feature);
    /// Forgets the feature and what is posted under its number. A delivery under way goes on.
    void close(std::uint64_t number);

    /// Leaves the note that line `line` (counted from 0) of a feature has `status` now. When
    /// thousands of notes wait for a listener that does not return, new ones are dropped: the line
    /// itself can still be asked.
    void post(std::uint64_t number, int line, DS1LineStatusEnum status);
    /// Waits until what has been posted so far is delivered. Not from a listener.
    void drain();

    void Run() override;

  private:
    struct Note {
        std::uint64_t number;
        int line;
        DS1LineStatusEnum status;
    };

    LineStatusDelivery() = default;
    ~LineStatusDelivery() = default;
    void deliver(Note const& note);

    std::mutex m_mutex; ///< guards all below; comes after the scheduler's lock
    std::condition_variable m_changed;
    std::deque<Note> m_notes;
    std::map<std::uint64_t, ReferenceCounter<Z7SimLineFeature>> m_features;
    std::uint64_t m_lastNumber = 0;
    std::uint64_t m_posted = 0;
    std::uint64_t m_delivered = 0;
    KVLThread_pthread m_thread{this};
};
