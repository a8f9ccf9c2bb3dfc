// SPDX-License-Identifier: BSD-2-Clause
#include "Baseline.h"

#include <cmath>
#include <cstdio>
#include <fstream>
#include <stdexcept>

#include <nlohmann/json.hpp>

using nlohmann::json;

namespace {

Spread readSpread(json const& time) {
    Spread const spread{time.at("median"), time.at("low"), time.at("high")};
    if (!(spread.low > 0 && spread.low <= spread.median && spread.median <= spread.high))
        throw std::runtime_error("a time is not one");
    return spread;
}

Baseline readBaseline(std::istream& text) {
    json const content = json::parse(text);
    Baseline baseline{content.at("program"), content.at("machine"), content.at("date"), {}};
    for (auto const& [name, time] : content.at("nanoseconds").items())
        baseline.times.emplace(name, readSpread(time));
    return baseline;
}

} // namespace

std::string machineName(std::istream& cpuinfo) {
    std::string processor = "unnamed processor";
    int count = 0;
    for (std::string line; std::getline(cpuinfo, line);) {
        if (line.starts_with("processor")) ++count;
        auto const colon = line.find(": ");
        if (line.starts_with("model name") && colon != std::string::npos)
            processor = line.substr(colon + 2);
    }
    return processor + ", " + std::to_string(count) + (count == 1 ? " processor" : " processors");
}

std::string machineName() {
    std::ifstream cpuinfo("/proc/cpuinfo");
    return machineName(cpuinfo);
}

void saveBaseline(Baseline const& baseline, std::string const& file) {
    json times = json::object();
    for (auto const& [name, time] : baseline.times) {
        if (!std::isfinite(time.high))
            throw std::runtime_error(file + ": not written; measure two rounds at least");
        times[name] = {{"median", time.median}, {"low", time.low}, {"high", time.high}};
    }
    json const content{{"program", baseline.program},
                       {"machine", baseline.machine},
                       {"date", baseline.date},
                       {"nanoseconds", times}};
    std::string const aside = file + ".new";
    std::ofstream written(aside);
    written << content.dump(1) << "\n";
    written.close();
    if (!written || std::rename(aside.c_str(), file.c_str()) != 0)
        throw std::runtime_error(file + ": cannot be written");
}

Baseline loadBaseline(std::string const& file, std::string const& program,
                      std::string const& machine) {
    std::ifstream text(file);
    if (!text) throw std::runtime_error(file + ": cannot be read");
    Baseline baseline;
    try {
        baseline = readBaseline(text);
    } catch (std::exception const&) {
        throw std::runtime_error(file + ": is no baseline, or is damaged; write a new one with "
                                        "--save-baseline");
    }
    if (baseline.program != program)
        throw std::runtime_error(file + ": is a baseline of " + baseline.program + ", not of " +
                                 program);
    if (baseline.machine != machine)
        throw std::runtime_error(file + ": is from another machine (" + baseline.machine +
                                 "; this is " + machine +
                                 "); write one of this machine with "
                                 "--save-baseline");
    return baseline;
}
