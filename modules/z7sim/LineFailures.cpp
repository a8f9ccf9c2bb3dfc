// SPDX-License-Identifier: BSD-2-Clause
#include "LineFailures.h"

void LineFailure::count(bool present, bool atEnd, FailureTimes const& times) {
    m_sinceOnset = atEnd ? m_sinceOnset + 1 : 0;
    m_without = present ? 0 : m_without + 1;
    // The second of the onset is there in part: only those that follow it are whole ones.
    if (!m_declared)
        m_declared = m_sinceOnset > times.declaration;
    else if (!atEnd && m_without >= times.clearing)
        m_declared = false;
}

void LineFailure::begin(bool present) {
    m_declared = present;
    m_sinceOnset = 0;
    m_without = 0;
}

void LineFailure::interrupt() {
    m_sinceOnset = 0;
    m_without = 0;
}
