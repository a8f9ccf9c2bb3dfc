// SPDX-License-Identifier: BSD-2-Clause
// A line's past: the same model, driven through the changes that are described.
#include <algorithm>
#include <array>
#include <utility>

#include "simulator/chassis/LineDraft.h"
#include "simulator/chassis/LinePast.h"

namespace kvlsim {

namespace {

/// A `Change` is the start or the end of a spell.
struct Change {
    std::int64_t second = 0;
    LineSpell const* spell = nullptr;
    bool begins = false;
};

std::vector<Change> changesOf(LinePast const& past) {
    std::vector<Change> changes;
    changes.reserve(2 * past.spells.size());
    for (auto const& spell : past.spells) {
        std::int64_t const begin = past.seconds - spell.ago;
        changes.push_back({begin, &spell, true});
        changes.push_back({begin + spell.seconds, &spell, false});
    }
    // Spells that begin come before those that end, so that an alarm of both is not interrupted.
    std::ranges::sort(
        changes, {}, [](Change const& change) { return std::pair(change.second, !change.begins); });
    return changes;
}

/// A `PastLine` is a line in its past, with the sum of all spells that are under way.
class PastLine {
  public:
    explicit PastLine(LinePast const& past) : m_rates(past.rates) { m_line.setRates(m_rates, {}); }

    void apply(Change const& change) {
        Line::Time const age = std::chrono::seconds(change.second);
        for (std::size_t i = 0; i < m_rates.size(); ++i)
            m_rates[i] = change.begins ? m_rates[i] + change.spell->rates[i]
                                       : m_rates[i] - change.spell->rates[i];
        std::uint32_t alarms = 0;
        for (std::size_t bit = 0; bit < m_holders.size(); ++bit) {
            if ((change.spell->alarms >> bit & 1U) != 0) m_holders[bit] += change.begins ? 1 : -1;
            if (m_holders[bit] > 0) alarms |= 1U << bit;
        }
        m_line.setRates(m_rates, age);
        m_line.setRaised(alarms, age);
    }

    Line const& line() const { return m_line; }

  private:
    Line m_line;
    LineRates m_rates;
    std::array<int, kLineAlarmNames.size()> m_holders{}; ///< spells under way, for each alarm
};

} // namespace

Line lineAtLoading(LineDraft const& draft) {
    PastLine past(draft.past);
    for (auto const& change : changesOf(draft.past))
        past.apply(change);
    Line line = past.line();
    Line::Time const age = std::chrono::seconds(draft.past.seconds);
    line.setRates(draft.rates, age);
    line.setRaised(draft.alarms, age);
    return line;
}

void replayPast(LinePast const& past, std::function<void(DS1LineCounters const&)> const& record) {
    PastLine replayed(past);
    auto const changes = changesOf(past);
    auto next = changes.begin();
    for (std::int64_t second = 0; second <= past.seconds; ++second) {
        record(replayed.line().counters(std::chrono::seconds(second)));
        for (; next != changes.end() && next->second == second; ++next)
            replayed.apply(*next);
    }
}

} // namespace kvlsim
