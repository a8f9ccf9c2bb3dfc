// SPDX-License-Identifier: BSD-2-Clause
// The hardware: a rack of cards, each with one T1 trunk.
#pragma once

#include <atomic>
#include <map>
#include <optional>
#include <string>

/// What the rack says about one card.
struct CardReading {
    bool running;
    long violations; ///< path coding violations of the trunk since the card was plugged in
    int calls;       ///< bearer channels in use, from the first on
};

/// Reads the rack's cards by serial number. They stand in the text file that the environment
/// variable `RACK_FILE` names, one line for each card: "<serial number> up|down <violations>
/// <calls>". Returns nothing if the file cannot be read or has a bad line. The file must be
/// replaced as a whole: a file that is half written has fewer cards.
std::optional<std::map<std::string, CardReading>> readRack();

/// The last reading of a card. Thread-safe: the factory's thread writes, queries read.
struct Card {
    std::string const serialNumber;
    std::atomic<long> violations{0};
    std::atomic<int> calls{0};
};
