// SPDX-License-Identifier: BSD-2-Clause
#include "Rack.h"

#include <cstdlib>
#include <fstream>
#include <sstream>

std::optional<std::map<std::string, CardReading>> readRack() {
    char const* const path = std::getenv("RACK_FILE");
    std::ifstream file(path != nullptr ? path : "/run/rack/cards");
    if (!file) return std::nullopt;
    std::map<std::string, CardReading> cards;
    for (std::string line; std::getline(file, line);) {
        std::istringstream fields(line);
        std::string serialNumber;
        std::string state;
        CardReading card{};
        if (!(fields >> serialNumber >> state >> card.violations >> card.calls))
            return std::nullopt;
        card.running = state == "up";
        cards[serialNumber] = card;
    }
    return cards;
}
