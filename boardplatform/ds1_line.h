// SPDX-License-Identifier: BSD-2-Clause
// The board platform's DS1 lines: what a line's attributes answer.
#pragma once

#include <cstddef>
#include <cstdint>

/// Attributes of a device that is a line.
/// One DS1LineCounters: the line now, all fields at one and the same moment.
inline constexpr char const* kDS1LineCounters = "LINE_COUNTERS";
/// N, in 4 bytes: the seconds of the line's past. Absent when the line has none.
inline constexpr char const* kDS1LinePastSeconds = "LINE_PAST_SECONDS";
/// N + 1 DS1LineCounters, oldest first: at every second from N seconds before the line was loaded
/// up to its loading. What happens at the very moment of a record shows in the next one. Not read
/// when the buffer is too small for all of them.
inline constexpr char const* kDS1LinePast = "LINE_PAST";
/// A `DS1LineType`, in 4 bytes.
inline constexpr char const* kDS1LineType = "LINE_TYPE";

/// Attribute of a board: a `DS1BoardLine` for each of its devices that is a line, in the order of
/// the board's devices, all at one and the same moment; as many as the buffer holds. Absent when
/// the board has no lines.
inline constexpr char const* kDS1BoardCounters = "BOARD_LINE_COUNTERS";

/// What LINE_TYPE answers; the numbers are those of dsx1LineType.
enum class DS1LineType : std::int32_t {
    esf = 2,
    d4 = 3,
    e1 = 4,
    e1Crc = 5,
    e1Mf = 6,    ///< with signalling multiframe in time slot 16
    e1CrcMf = 7, ///< both
};

/// The state of a line at one moment; words are in host byte order. All fields but the last only
/// ever grow, modulo 2^32.
///
/// The three ...Seconds count the whole seconds of the line's clock in which the defect was there
/// at any time: a touch counts at once, and no second counts twice. A line without signal or frame,
/// and one that receives AIS, has no frame: outOfFrameSeconds grows in all three cases.
struct DS1LineCounters {
    std::uint32_t seconds;                ///< the line's age in whole seconds
    std::uint32_t lineCodeViolations;     ///< on the wire
    std::uint32_t pathCodeViolations;     ///< CRC errors
    std::uint32_t framingErrors;          ///< errored framing or alignment bits
    std::uint32_t controlledSlips;        ///< frames repeated or left out
    std::uint32_t lossOfSignalSeconds;    ///< no signal
    std::uint32_t outOfFrameSeconds;      ///< no frame, for whatever reason
    std::uint32_t alarmIndicationSeconds; ///< AIS received
    std::uint32_t alarms;                 ///< the kDS1Alarm... that are present now
};

static_assert(sizeof(DS1LineCounters) == 36 && alignof(DS1LineCounters) == 4);
static_assert(offsetof(DS1LineCounters, lineCodeViolations) == 4);
static_assert(offsetof(DS1LineCounters, pathCodeViolations) == 8);
static_assert(offsetof(DS1LineCounters, framingErrors) == 12);
static_assert(offsetof(DS1LineCounters, controlledSlips) == 16);
static_assert(offsetof(DS1LineCounters, lossOfSignalSeconds) == 20);
static_assert(offsetof(DS1LineCounters, outOfFrameSeconds) == 24);
static_assert(offsetof(DS1LineCounters, alarmIndicationSeconds) == 28);
static_assert(offsetof(DS1LineCounters, alarms) == 32);

/// One line of a board: the handle of its device, and what that answers to LINE_COUNTERS.
struct DS1BoardLine {
    std::int32_t device;
    DS1LineCounters counters;
};

static_assert(sizeof(DS1BoardLine) == 40 && offsetof(DS1BoardLine, counters) == 4);

/// Attribute of the root object: a `DS1BoardGeneration` for each board that has lines, in ascending
/// order of the boards' handles, all at one and the same moment; as many as the buffer holds.
inline constexpr char const* kDS1LineGenerations = "LINE_GENERATIONS";

/// Whether the lines of a board have changed. As long as the generation is the same, and is not 0,
/// the board has the same lines, each counter but `seconds` stays as it is, and so do the alarms.
/// Generations are unique: no board has one that another board, or this one, had before.
struct DS1BoardGeneration {
    std::int32_t board;       ///< its handle
    std::uint32_t seconds;    ///< of its first line; the others' grow at the same moments
    std::uint64_t generation; ///< 0: a line is counting, so that each moment may differ
};

static_assert(sizeof(DS1BoardGeneration) == 16 && offsetof(DS1BoardGeneration, generation) == 8);

// A line that has lost its signal, or receives AIS, does not by that report the loss of frame: only
// the root is named. With any of the three the platform sends RAI to the far end.
inline constexpr std::uint32_t kDS1AlarmLossOfSignal = 1;
inline constexpr std::uint32_t kDS1AlarmLossOfFrame = 2;
inline constexpr std::uint32_t kDS1AlarmIndication = 4;         ///< AIS received
inline constexpr std::uint32_t kDS1AlarmRemote = 8;             ///< RAI: the far end has no frame
inline constexpr std::uint32_t kDS1AlarmSendingRemote = 16;     ///< sending RAI
inline constexpr std::uint32_t kDS1AlarmSendingIndication = 32; ///< sending AIS
inline constexpr std::uint32_t kDS1AlarmLoopback = 64;          ///< looped back
inline constexpr std::uint32_t kDS1AlarmTimeSlot16 = 128;       ///< AIS in time slot 16
inline constexpr std::uint32_t kDS1AlarmRemoteMultiframe = 256; ///< the far end: no multiframe
inline constexpr std::uint32_t kDS1AlarmSendingRemoteMultiframe = 512;
inline constexpr std::uint32_t kDS1AlarmTestCode = 1024; ///< a test code is received
