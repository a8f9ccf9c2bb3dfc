// SPDX-License-Identifier: BSD-2-Clause
#include "LineTicks.h"

#include <algorithm>
#include <cstddef>
#include <span>
#include <utility>

#include "LineScheduler.h"
#include "Z7SimIntervalTable.h"

namespace {

/// The buffer for the answers to a request, with room for the lines of any board. Boards tick one
/// after the other; what they share stays in the processor's cache. Changed between passes only,
/// and never destroyed, because the scheduler never ends.
std::vector<DS1BoardLine>& sharedAnswers() {
    static auto* const answers = new std::vector<DS1BoardLine>;
    return *answers;
}

/// The answer of `device`. Answers usually stand in the order in which they are looked for: `next`
/// is where to look first, and where to go on. Null if there is none.
DS1BoardLine const* find(std::span<DS1BoardLine const> answers, long device, std::size_t& next) {
    if (next >= answers.size() || answers[next].device != device) {
        auto const found = std::ranges::find(answers, device, &DS1BoardLine::device);
        if (found == answers.end()) return nullptr;
        next = static_cast<std::size_t>(found - answers.begin());
    }
    return &answers[next++];
}

} // namespace

LineTicks::LineTicks(std::unique_ptr<LineBatch> batch) : m_batch(std::move(batch)) {
    LineScheduler::instance().AddPeriodic(this, 1);
}

LineTicks::~LineTicks() {
    LineScheduler::instance().Remove(this);
}

void LineTicks::add(long device, Z7SimIntervalTable& table) {
    LineScheduler::instance().betweenPasses([&] {
        auto& answers = sharedAnswers();
        answers.resize(std::max(answers.size(), m_lines.size() + 1));
        m_lines.push_back({device, &table});
        m_generation = 0;
    });
}

void LineTicks::remove(Z7SimIntervalTable const& table) {
    LineScheduler::instance().betweenPasses(
        [&] { std::erase_if(m_lines, [&](Line const& line) { return line.table == &table; }); });
}

int LineTicks::ScheduledAction() {
    if (m_lines.empty()) return 0;
    // The tables lie all over memory; they are fetched while the platform answers.
    for (Line const& line : m_lines)
        line.table->fetch();
    bool const together = m_isTogether;
    auto const now = together ? m_batch->generation() : DS1BoardGeneration();
    if (isNextSecondOf(now)) {
        m_seconds = now.seconds;
        for (Line const& line : m_lines)
            line.table->tickUnchanged();
    } else {
        ask(together, now.generation);
    }
    return 0;
}

/// Whether a second has passed and the counters have not changed since the tables read them.
bool LineTicks::isNextSecondOf(DS1BoardGeneration const& now) const {
    return m_generation != 0 && now.generation == m_generation && now.seconds == m_seconds + 1;
}

/// `generation`: of the counters, known before they are read.
void LineTicks::ask(bool together, std::uint64_t generation) {
    auto const room = std::span(sharedAnswers()).first(m_lines.size());
    std::size_t const count = together ? m_batch->read(room) : 0;
    auto const answers = room.first(std::min(count, room.size()));
    std::size_t next = 0;
    bool haveAll = true;
    for (Line const& line : m_lines) {
        if (auto const* const answer = find(answers, line.device, next)) {
            line.table->tick(answer->counters);
        } else {
            line.table->ScheduledAction();
            haveAll = false;
        }
    }
    // Counters that have changed since have another generation at the next tick.
    m_generation = haveAll ? generation : 0;
    if (haveAll) m_seconds = answers.front().counters.seconds;
}
