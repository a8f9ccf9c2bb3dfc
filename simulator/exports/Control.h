// SPDX-License-Identifier: BSD-2-Clause
// Control of the simulated platform from within its own process, for tests and benchmarks.
#pragma once

#include <chrono>
#include <string>

#include <nlohmann/json.hpp>

#pragma GCC visibility push(default)

namespace kvlsim {

/// Executes one control command, exactly as a line on the control socket is. Never throws: the
/// reply is {"ok": true, ...} or {"ok": false, "error": "..."}. Any thread; "drain" waits until all
/// events announced so far are delivered, and is refused on the delivery thread.
nlohmann::json execute(nlohmann::json const& command);

/// Replaces the chassis, announcing nothing. May come before the first platform call, which then
/// loads no other. Throws std::runtime_error with one line, "chassis:12: ...", when the text is
/// bad; the chassis is then unchanged.
void loadChassis(std::string const& yamlText);

/// Sets the clock of the counters of the runtime library's processes, which start again; null: the
/// steady clock. The clock is called on any thread that reads counters.
void setCounterClock(std::chrono::nanoseconds (*clock)());

/// Sets the clock of the lines, of this chassis and of later ones; null: the steady clock. The
/// lines start again, as at loading. The clock is called on any thread that reads a line.
void setLineClock(std::chrono::nanoseconds (*clock)());

} // namespace kvlsim

#pragma GCC visibility pop
