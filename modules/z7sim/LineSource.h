// SPDX-License-Identifier: BSD-2-Clause
// Where a line's counters come from.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "LinePerformance.h"
#include "boardplatform/ds1_line.h"

class LineGenerations;

/// A `LineSource` answers a line's counters.
class LineSource {
  public:
    virtual ~LineSource() = default;
    /// The counters as they are now. False, leaving `counters` alone, when there is no answer.
    virtual bool read(DS1LineCounters& counters) = 0;
};

/// The line of a device of the device mapper. Thread-safe.
class PlatformLine final : public LineSource {
  public:
    /// `device`: the device's handle.
    explicit PlatformLine(long device) : m_device(device) {}

    bool read(DS1LineCounters& counters) override;
    /// While it is silent, `read` does not ask the platform and has no answer.
    void setSilent(bool silent) { m_silent = silent; }
    /// What the line counted before its platform started, a record a second, oldest first; empty
    /// when it has no past, or when that ended so long ago that the time since would be missing.
    std::vector<DS1LineCounters> past();

  private:
    long m_device;
    std::atomic<bool> m_silent{false};
};

/// A `LineBatch` answers the counters of several lines of one board in one request.
class LineBatch {
  public:
    virtual ~LineBatch() = default;
    /// The generation of the lines when the pass under way began; 0 when it is not known.
    /// Thread-bound: the thread of the `LineScheduler`.
    virtual DS1BoardGeneration generation() { return {}; }
    /// Fills the beginning of `lines` with the lines that answer, in any order. Returns how many
    /// there are.
    virtual std::size_t read(std::span<DS1BoardLine> lines) = 0;
};

/// The lines of a board of the device mapper. Thread-safe, apart from `generation`.
class PlatformBoard final : public LineBatch {
  public:
    /// `board`: the board's handle.
    explicit PlatformBoard(long board);

    DS1BoardGeneration generation() override;
    std::size_t read(std::span<DS1BoardLine> lines) override;

  private:
    long m_board;
    LineGenerations& m_generations;
    std::size_t m_place = 0; ///< among the generations
};

/// The defects that are there at the moment of a reading.
LineDefects defectsOf(DS1LineCounters const& now);

/// The alarms of a line that has no frame.
inline constexpr std::uint32_t kFrameLosingAlarms =
    kDS1AlarmLossOfSignal | kDS1AlarmLossOfFrame | kDS1AlarmIndication;

/// Whether nothing was counted between two readings, at whose end there is no defect: then
/// `secondBetween` is all zero, and the alarms are the same.
inline bool isCleanBetween(DS1LineCounters const& before, DS1LineCounters const& now) {
    // Without a branch for each.
    std::uint32_t const different = (before.lineCodeViolations ^ now.lineCodeViolations) |
                                    (before.pathCodeViolations ^ now.pathCodeViolations) |
                                    (before.framingErrors ^ now.framingErrors) |
                                    (before.controlledSlips ^ now.controlledSlips) |
                                    (before.lossOfSignalSeconds ^ now.lossOfSignalSeconds) |
                                    (before.outOfFrameSeconds ^ now.outOfFrameSeconds) |
                                    (before.alarmIndicationSeconds ^ now.alarmIndicationSeconds) |
                                    (before.alarms ^ now.alarms);
    return different == 0 && (now.alarms & kFrameLosingAlarms) == 0;
}

/// What a line counted between two readings. Requires that it has not begun anew in between.
LineSecond secondBetween(DS1LineCounters const& before, DS1LineCounters const& now);
