// SPDX-License-Identifier: BSD-2-Clause
// How long requests take while boards are read anew, and while they are not.
#pragma once

/// Prints the distributions for a chassis of `boards` boards. Returns whether reading anew delays
/// requests by less than a request's own time.
bool reportDelays(int boards);
