// SPDX-License-Identifier: BSD-2-Clause
// What all commands work with.
#pragma once

#include <functional>
#include <ostream>

#include "cli/Client.h"
#include "cli/Screen.h"

namespace kvloam {

/// A `Session` is one run of a command: the agent that it asks, and where it writes.
/// Unsynchronised.
struct Session {
    Client& client;
    std::function<Screen()> const& measure; ///< asks for the screen again: its user may resize it
    Screen screen;
    std::ostream& out;
    std::ostream& errors;
    bool asJson = false;
    bool isWatched = false; ///< each output is one line if it is JSON
};

/// What a command does. It returns the exit status. Throws CliError.
using Action = std::function<int(Session&)>;

/// Does `action` again and again, with a pause of `interval` seconds, until the program is ended.
/// On a terminal each output takes the place of the one before. While no agent answers, it says so.
int watch(Session& session, Action const& action, double interval);

/// What `watch` writes to a terminal to replace the last output by `text`: at most as many lines as
/// the screen has.
std::string redrawn(Screen const& screen, std::string const& text);

} // namespace kvloam
