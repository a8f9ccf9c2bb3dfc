// SPDX-License-Identifier: BSD-2-Clause
#include "Judgement.h"

#include <algorithm>
#include <array>
#include <cstdio>

namespace {

/// snprintf() into a string, for lines of tables.
template <class... Arguments>
std::string formatted(char const* format, Arguments... arguments) {
    std::array<char, 256> text{};
    std::snprintf(text.data(), text.size(), format, arguments...);
    return text.data();
}

std::string timeText(Spread const& nanoseconds) {
    double divisor = 1;
    char const* unit = "ns";
    if (nanoseconds.median >= 1e6) {
        divisor = 1e6;
        unit = "ms";
    } else if (nanoseconds.median >= 1e3) {
        divisor = 1e3;
        unit = "us";
    }
    return formatted("%9.2f %s %9.2f to %-9.2f", nanoseconds.median / divisor, unit,
                     nanoseconds.low / divisor, nanoseconds.high / divisor);
}

std::string ratioText(Spread const& ratio) {
    return formatted("%8.3f %8.3f to %-8.3f", ratio.median, ratio.low, ratio.high);
}

char const* limitText(Verdict verdict) {
    switch (verdict) {
    case Verdict::Within:
        return "within";
    case Verdict::Over:
        return "OVER THE LIMIT";
    default:
        return "undecided";
    }
}

char const* changeText(Verdict verdict) {
    switch (verdict) {
    case Verdict::Within:
        return "not slower";
    case Verdict::Over:
        return "SLOWER";
    default:
        return "undecided";
    }
}

} // namespace

void Judgement::addTime(std::string const& benchmark, Spread const& nanoseconds) {
    m_times.insert_or_assign(benchmark, nanoseconds);
}

void Judgement::addRatio(std::string const& what, std::string const& unit, Spread const& ratio,
                         std::optional<double> limit) {
    m_ratios.push_back({what, unit, ratio, limit});
}

void Judgement::addFailure(std::string const& benchmark, std::string const& why) {
    m_failures.insert_or_assign(benchmark, why);
}

Judgement::Changes Judgement::changes() const {
    Changes changes;
    if (!m_before) return changes;
    for (auto const& [benchmark, time] : m_times) {
        auto const before = m_before->times.find(benchmark);
        if (before == m_before->times.end()) continue;
        Spread const ratio = ratioOf(time, before->second);
        Verdict const verdict = decide(ratio, kTolerance);
        changes.all.push_back({benchmark, ratio, verdict});
        if (benchmark.starts_with(kFloorPrefix) && verdict == Verdict::Over)
            changes.machineIsSlower = true;
    }
    if (changes.machineIsSlower)
        for (Change& change : changes.all)
            if (change.verdict == Verdict::Over) change.verdict = Verdict::Undecided;
    return changes;
}

int Judgement::count(Verdict verdict) const {
    return static_cast<int>(std::ranges::count_if(m_ratios, [&](Ratio const& each) {
        return each.limit && decide(each.ratio, *each.limit) == verdict;
    }));
}

std::string Judgement::timesText() const {
    std::string text = formatted("%-68s %12s %s\n", "one run", "median", "   range of the median");
    for (auto const& [benchmark, time] : m_times)
        text += formatted("%-68s ", benchmark.c_str()) + timeText(time) + "\n";
    return text;
}

std::string Judgement::ratiosText() const {
    std::string text = formatted("\n%-54s %-34s %8s %20s %9s\n", "cost of", "in units of", "median",
                                 "range of the median", "limit");
    for (Ratio const& each : m_ratios) {
        text +=
            formatted("%-54s %-34s ", each.what.c_str(), each.unit.c_str()) + ratioText(each.ratio);
        if (each.limit)
            text +=
                formatted(" %9.3f  %s", *each.limit, limitText(decide(each.ratio, *each.limit)));
        text += "\n";
    }
    return text;
}

std::string Judgement::changesText() const {
    std::string text = "\nchanges since the baseline of " + m_before->date + ", slower above " +
                       formatted("%.2f", kTolerance) + "\n";
    Changes const changes = this->changes();
    for (Change const& change : changes.all)
        text += formatted("%-68s ", change.benchmark.c_str()) + ratioText(change.ratio) + "  " +
                changeText(change.verdict) + "\n";
    if (changes.machineIsSlower)
        text += "the machine itself is slower than then, so that nothing else can be decided\n";
    return text;
}

std::string Judgement::text() const {
    std::string text = timesText() + ratiosText();
    if (m_before) text += changesText();
    text += "\n";
    for (auto const& [benchmark, why] : m_failures)
        text += benchmark + ": NOT MEASURED: " + why + "\n";
    text += formatted("limits: %d kept, %d exceeded, %d undecided", count(Verdict::Within),
                      count(Verdict::Over), count(Verdict::Undecided));
    if (m_before) {
        auto const all = changes().all;
        auto const having = [&](Verdict verdict) {
            return static_cast<int>(std::ranges::count(all, verdict, &Change::verdict));
        };
        text += formatted("; since the baseline: %d slower, %d undecided", having(Verdict::Over),
                          having(Verdict::Undecided));
    }
    return text + "\n";
}

BenchStatus Judgement::exitStatus() const {
    if (hasFailures() || count(Verdict::Over) > 0) return kOver;
    auto const all = changes().all;
    auto const changed = [&](Verdict verdict) {
        return std::ranges::find(all, verdict, &Change::verdict) != all.end();
    };
    if (changed(Verdict::Over)) return kSlower;
    if (count(Verdict::Undecided) > 0 || changed(Verdict::Undecided)) return kUndecided;
    return kAllWithin;
}
