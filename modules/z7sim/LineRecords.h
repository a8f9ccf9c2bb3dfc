// SPDX-License-Identifier: BSD-2-Clause
// What is kept of a board's lines while the board is there.
#pragma once

#include <map>
#include <memory>
#include <vector>

#include "LineFailures.h"
#include "LinePerformance.h"
#include "LineSource.h"
#include "LineState.h"
#include "LineTicks.h"
#include "Z7SimIntervalTable.h"
#include "core/ReferenceCounter.h"

/// The status and the history of one line.
struct LineRecord {
    LineFormat format = LineFormat::esf;
    std::shared_ptr<PlatformLine> source;
    std::shared_ptr<LineState> state;
    ReferenceCounter<Z7SimIntervalTable> intervals;
};

/// The `LineRecords` of a board keep the status and the history of each of its lines. A line
/// belongs to its board for as long as that has the same place and serial number, so the history
/// goes on while the board is stopped or has failed, as far as the platform still answers for the
/// line. The line features that the board offers while it runs share these records.
///
/// Unsynchronised. The records must not be dropped in a scheduled action.
class LineRecords {
  public:
    /// `board`: its handle in the device mapper.
    LineRecords(long board, FailureTimes const& times) : m_board(board), m_times(times) {}
    ~LineRecords();
    LineRecords(LineRecords const&) = delete;
    LineRecords& operator=(LineRecords const&) = delete;

    /// The record of the line of a device, by its handle in the device mapper. It is made when
    /// there is none, or when the line has another format than it had.
    LineRecord const& of(long device, LineFormat format);
    /// Drops the records of devices that are not among these. A board that lists no devices at all
    /// has not answered; its records stay.
    void keepOnly(std::vector<long> const& devices);
    /// From now on nothing is read of the lines, and their seconds are missed: another board has
    /// taken the place of theirs.
    void suspend();
    void resume();
    void clear();

  private:
    void setSilent(bool silent);
    void release(LineRecord const& record);

    long const m_board;
    FailureTimes const m_times;
    std::unique_ptr<LineTicks> m_ticks;   ///< null while there was no line
    std::map<long, LineRecord> m_records; ///< by device
};
