// SPDX-License-Identifier: BSD-2-Clause
// Alarms as the agent serves them.
#pragma once

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

#include "agent/rows/Clock.h"
#include "agent/rows/Oid.h"
#include "agent/rows/VariableType.h"

namespace kvloamd {

/// The numbers are kvlAlarmState's.
enum class AlarmState : int {
    Active = 1, ///< the condition is present
    Ending = 2  ///< the condition has ended, and the alarm is held
};

/// An active alarm.
struct AlarmRow {
    std::uint32_t number = 0; ///< never given twice
    std::string kind;
    int severity = 0; ///< AlarmSeverity
    std::string resource;
    std::uint32_t boardIndex = 0; ///< 0: none
    std::uint32_t ifIndex = 0;    ///< 0: none
    std::string raised;           ///< when, as `dateOctets`
    std::string began;            ///< the condition, as `dateOctets`
    std::uint32_t times = 0;      ///< how often the condition has begun
    std::string text;
    AlarmState state = AlarmState::Active;

    std::array<std::uint32_t, 1> index() const { return {number}; }
};

/// The index of a row that ALARM-MIB orders by date: the name of the list, which is empty; the
/// date; a number. Texts are preceded by their lengths.
using DatedIndex = std::array<std::uint32_t, 14>;

/// `date`: as `dateOctets`; a date that is not known is all zeroes.
inline DatedIndex datedIndex(std::string const& date, std::uint32_t number) {
    constexpr std::size_t kDate = 11;
    DatedIndex index{0, kDate};
    for (std::size_t i = 0; i < std::min(date.size(), kDate); ++i)
        index[2 + i] = static_cast<unsigned char>(date[i]);
    index.back() = number;
    return index;
}

/// An alarm of ALARM-MIB, active or cleared.
struct DatedAlarmRow {
    DatedIndex place{};
    Oid notification; ///< absolute
    Oid resource;     ///< absolute
    Oid model;        ///< absolute: a row of alarmModelTable
    Oid specific;     ///< absolute: a row of kvlAlarmTable
    std::string description;

    DatedIndex const& index() const { return place; }
};

/// One variable of an active alarm of ALARM-MIB.
struct AlarmVariableRow {
    std::uint32_t alarm = 0;
    std::uint32_t variable = 0; ///< from 1
    Oid name;                   ///< absolute
    VariableType type = VariableType::Integer32;
    std::int64_t integer = 0; ///< good for Integer32
    std::string octets;       ///< good for OctetString

    std::array<std::uint32_t, 3> index() const { return {0, alarm, variable}; }
};

/// One state of a kind of alarm, in ALARM-MIB.
struct AlarmModelRow {
    std::uint32_t model = 0;
    std::uint32_t state = 0; ///< 1: clear, higher: more severe
    Oid notification;        ///< absolute
    std::string description;

    std::array<std::uint32_t, 3> index() const { return {0, model, state}; }
};

/// The counts of the one list of alarms.
struct AlarmStatsRow {
    std::uint32_t current = 0;
    std::uint32_t raised = 0;
    std::uint32_t lastRaise = 0; ///< hundredths of a second since the agent's start; 0: none
    std::uint32_t lastClear = 0;

    std::array<std::uint32_t, 1> index() const { return {0}; }
};

/// What has been counted of the alarms of one kind since the agent's start.
struct AlarmTotalRow {
    std::string kind;
    std::uint64_t raised = 0;
    std::uint64_t cleared = 0;
    std::uint32_t active = 0;            ///< now
    std::chrono::milliseconds lasted{0}; ///< how long its alarms were active, added up
    Clock::time_point counted;           ///< the time until which `lasted` counts

    /// `lasted` at a later time: it grows while alarms are active, without another snapshot.
    std::chrono::milliseconds lastedAt(Clock::time_point now) const {
        if (active == 0 || now <= counted) return lasted;
        return lasted +
               active * std::chrono::duration_cast<std::chrono::milliseconds>(now - counted);
    }
};

/// All ascending by index.
struct AlarmRows {
    std::vector<AlarmRow> alarms;
    std::vector<DatedAlarmRow> active;
    std::vector<AlarmVariableRow> variables;
    std::vector<DatedAlarmRow> cleared;
    std::vector<AlarmModelRow> models;
    std::vector<AlarmStatsRow> stats{1};
    std::vector<AlarmTotalRow> totals; ///< one for every kind, in the order of their numbers
    std::uint32_t suppressed = 0;      ///< beginnings of conditions that never became an alarm
    std::uint32_t unlisted = 0;        ///< beginnings of conditions that found the list full
    std::uint32_t lastChange = 0;      ///< of the active alarms, as `AlarmStatsRow::lastRaise`
    std::uint32_t modelChange = 0;
    std::uint32_t clearedMaximum = 0; ///< how many cleared alarms are remembered
};

} // namespace kvloamd
