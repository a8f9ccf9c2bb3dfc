// SPDX-License-Identifier: BSD-2-Clause
// When the defects of a DS1 line become failures, and when the failures end.
#pragma once

/// How long a defect lasts until it is a failure, and how long it is away until the failure ends:
/// whole seconds, from which a second's resolution makes up to one more.
struct FailureTimes {
    static constexpr int kShortestDeclaration = 2;
    static constexpr int kLongestDeclaration = 9;
    static constexpr int kLongestClearing = 19;

    int declaration = kShortestDeclaration; ///< 2: declared 2 to 3 seconds after the onset
    int clearing = 10;                      ///< 10: cleared 10 to 11 seconds after the end
};

/// A `LineFailure` is one kind of failure of a line, derived from the seconds in which its defect
/// was seen. Unsynchronised.
class LineFailure {
  public:
    /// Counts one second. `present`: the defect was there at some time of it. `atEnd`: it was there
    /// when the second ended.
    void count(bool present, bool atEnd, FailureTimes const& times);
    /// Takes a line as it is found: a defect that is there has been there for an unknown time, and
    /// counts as a failure.
    void begin(bool present);
    /// Forgets how long the defect has been there, or away: the next second does not follow the
    /// last one. A failure that was declared stays.
    void interrupt();

    bool isDeclared() const { return m_declared; }
    /// Seconds in a row, up to the last one, since the defect's onset; 0 when it is not there.
    int sinceOnset() const { return m_sinceOnset; }
    /// Neither is the failure declared nor does its defect last.
    bool isIdle() const { return !m_declared && m_sinceOnset == 0; }

  private:
    bool m_declared = false;
    int m_sinceOnset = 0;
    int m_without = 0; ///< seconds in a row without the defect
};
