// SPDX-License-Identifier: BSD-2-Clause
// A DS1 line: even counting and touched seconds.
#include "simulator/chassis/Line.h"

#include <algorithm>

namespace kvlsim {

namespace {

/// With one of these alarms a line has no frame, and sends RAI to the far end.
constexpr std::uint32_t kFrameLosing =
    kDS1AlarmLossOfSignal | kDS1AlarmLossOfFrame | kDS1AlarmIndication;

} // namespace

std::string_view nameOf(DS1LineType type) {
    auto const* const found = std::ranges::find(kLineTypeNames, type, &LineTypeName::type);
    return found == kLineTypeNames.end() ? std::string_view() : found->name;
}

Line::Count Line::Count::after(std::uint64_t rate, Time time) const {
    if (rate == 0) return *this;
    // Whole seconds and their rest, whole errors and billionths are multiplied separately, so that
    // every product fits.
    auto const nanoseconds = static_cast<std::uint64_t>(std::max(time, Time::zero()).count());
    std::uint64_t const seconds = nanoseconds / kLineRateUnit;
    std::uint64_t const rest = nanoseconds % kLineRateUnit;
    std::uint64_t const errors = rate / kLineRateUnit;
    std::uint64_t const billionths = rate % kLineRateUnit;
    std::uint64_t const parts =
        part + billionths * seconds + errors * rest + billionths * rest / kLineRateUnit;
    // Deliberate: the whole wraps, as the platform's 32-bit counters do.
    return {static_cast<std::uint32_t>(whole + errors * seconds + parts / kLineRateUnit),
            parts % kLineRateUnit};
}

std::uint32_t Line::TouchedSeconds::at(Time age) const {
    if (!m_present) return m_counted;
    // Up to, but not at, this moment: a second is touched by what lies behind its beginning.
    std::int64_t const end = std::chrono::ceil<std::chrono::seconds>(age).count();
    if (end <= m_next) return m_counted;
    return m_counted + static_cast<std::uint32_t>(end - m_next);
}

void Line::TouchedSeconds::set(bool present, Time age) {
    if (present == m_present) return;
    if (present) {
        std::int64_t const second = std::chrono::floor<std::chrono::seconds>(age).count();
        if (second >= m_next) {
            ++m_counted;
            m_next = second + 1;
        }
    } else {
        m_counted = at(age);
        m_next =
            std::max(m_next, std::int64_t(std::chrono::ceil<std::chrono::seconds>(age).count()));
    }
    m_present = present;
}

DS1LineCounters Line::counters(Time age) const {
    std::array<std::uint32_t, kLineErrorNames.size()> counts{};
    for (std::size_t i = 0; i < counts.size(); ++i)
        counts[i] = m_counts[i].after(m_rates[i], age - m_since).whole;
    std::uint32_t const following = (m_raised & kFrameLosing) != 0 ? kDS1AlarmSendingRemote : 0;
    return {wholeSeconds(age),
            counts[0],
            counts[1],
            counts[2],
            counts[3],
            m_lossOfSignal.at(age),
            m_outOfFrame.at(age),
            m_alarmIndication.at(age),
            m_raised | following};
}

bool Line::isSteady() const {
    bool const isWithoutErrors = std::ranges::all_of(m_rates, [](auto rate) { return rate == 0; });
    return isWithoutErrors && (m_raised & kFrameLosing) == 0;
}

void Line::add(LineErrors const& errors) {
    for (std::size_t i = 0; i < errors.size(); ++i)
        m_counts[i].whole += errors[i];
}

void Line::setRates(LineRates const& rates, Time age) {
    for (std::size_t i = 0; i < rates.size(); ++i)
        m_counts[i] = m_counts[i].after(m_rates[i], age - m_since);
    m_since = age;
    m_rates = rates;
}

void Line::setRaised(std::uint32_t alarms, Time age) {
    m_raised = alarms;
    m_lossOfSignal.set((alarms & kDS1AlarmLossOfSignal) != 0, age);
    m_outOfFrame.set((alarms & kFrameLosing) != 0, age);
    m_alarmIndication.set((alarms & kDS1AlarmIndication) != 0, age);
}

} // namespace kvlsim
