// SPDX-License-Identifier: BSD-2-Clause
// The reference factory: which boards there are, and how one is made.
#pragma once

#include <mutex>
#include <vector>

#include "LineFailures.h"
#include "z7/Z7BoardFactory.h"

/// Makes a `Z7SimBoard` of every board that the device mapper knows.
class Z7SimBoardFactory : public Z7BoardFactory {
  public:
    Z7SimBoardFactory();
    ~Z7SimBoardFactory() override;

    /// For the lines of boards that are made from now on. Not while the factory makes some.
    void SetFailureTimes(FailureTimes const& times) { m_failureTimes = times; }

    /// Also retires a board that is announced as gone.
    int NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum status) override;

  protected:
    /// All boards, however many. When the device mapper does not answer: those it answered last,
    /// for a search that fails does not mean that every board has gone.
    std::vector<long> GetBoardIdentifiers() override;
    /// Nothing: every board reads the device mapper for itself.
    int RefreshBoardData() override;
    Z7Board* MakeBoard(long id) override;

  private:
    FailureTimes m_failureTimes;
    std::mutex m_mutex; ///< guards the identifiers; never held during a search
    std::vector<long> m_identifiers;
};
