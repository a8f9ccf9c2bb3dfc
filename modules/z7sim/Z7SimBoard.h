// SPDX-License-Identifier: BSD-2-Clause
// The reference board: a Z7 board with everything that the base leaves open.
#pragma once

#include <atomic>
#include <mutex>

#include "BoardFeatures.h"
#include "LineRecords.h"
#include "z7/Z7Board.h"

/// A board of the chassis. Most answers come from its device mapper record, which the base keeps;
/// its status and its logical identifier are its own.
///
/// Threads: any thread may ask. What changes the board's state, the events on the platform's
/// delivery thread and the pings on the factory's ping thread, takes turns under a mutex of its
/// own, which queries never take. It is held while listeners are called, so a listener must not
/// wait for another status change.
class Z7SimBoard final : public Z7Board {
  public:
    /// `id`: the board's handle in the device mapper. The new board is stopped.
    explicit Z7SimBoard(long id, FailureTimes const& times = {});
    ~Z7SimBoard() override;

    /// Brings a new board, which has no listeners yet, into the condition that the platform
    /// reports. Not part of the constructor, because the stages are virtual.
    void AdoptCondition();
    /// Takes the board out for good: it announces nothing more.
    void Retire();

    BoardStatusEnum GetStatus() override;
    BoardStatusEnum GetSecondaryStatus() override;
    int GetName(char* name) override;
    int GetModel(char* model) override;
    int GetFamily(char* family) override;
    int GetFirmwareName(char* name) override;
    int GetFirmwareVersion(char* version) override;
    int GetLogicalID() override;
    int GetBoardID() override;
    int GetShelfID() override;

    int ProcessExternalEvent(BoardStatusEnum status) override;
    /// Fails a running board that does not answer, and starts it again when it answers again.
    /// Returns 0 when the board answers or needs not, else -1.
    int PingBoard() override;
    int SetStatus(BoardStatusEnum status) override;
    int SetSecondaryStatus(BoardStatusEnum status) override;
    /// Each stage returns 0, or -1 when the board cannot come up.
    int StartStage1() override;
    int StartStage2() override;
    int StartStage3() override;
    int StopBoard() override;
    int create_ipethernet_feature() override;
    int create_extended_features() override;
    /// Takes all features away, the network's too, and stops those that follow the platform.
    int destroy_extended_features() override;

  private:
    void offer(FeatureList features);
    void withdrawFeatures();
    bool answers();
    void readLogicalID();
    int giveUp(char const* reason);
    void fail(char const* reason);

    std::atomic<BoardStatusEnum> m_status{BoardStatusStopped};
    std::atomic<BoardStatusEnum> m_secondaryStatus{BoardStatusNone};
    /// The platform is not asked by a query, which must never wait for it.
    std::atomic<int> m_logicalID{-1};

    /// Serialises what changes the board's state, and guards the fields below. Recursive: a ping
    /// that finds the board silent goes through `ProcessExternalEvent`.
    std::recursive_mutex m_transition;
    char const* m_startFailure = nullptr; ///< why the last start came to nothing
    bool m_inService = false;             ///< pings watch over it
    bool m_silent = false;                ///< failed because it did not answer
    bool m_retired = false;
    FeatureList m_offered; ///< what a stop takes away again
    LineRecords m_lines;   ///< stay with the board, whether it runs or not
};
