// SPDX-License-Identifier: BSD-2-Clause
// What a refresh of the agent's snapshot reads of boards, and makes of them.
#pragma once

#include "agent/readers/BoardSource.h"
#include "agent/readers/EntityReader.h"
#include "agent/readers/InterfaceReader.h"
#include "agent/readers/PlatformReader.h"
#include "agent/readers/StableIndices.h"
#include "agent/rows/Snapshot.h"
#include "board/BoardManager.h"

/// Boards of the reference module on the simulated platform, each with four lines that have a full
/// day behind them. One for a process.
class BoardRefresh {
  public:
    explicit BoardRefresh(int boards);

    /// Has the lines count no more seconds.
    void stopLines();

    void read(kvloamd::Snapshot& snapshot);

  private:
    ReferenceCounter<BoardManager> m_manager;
    kvloamd::BoardSource m_source;
    kvloamd::StableIndices m_indices;
    kvloamd::InterfaceReader m_interfaces;
    kvloamd::PlatformReader m_platform;
    kvloamd::StableIndices m_entityIndices;
    kvloamd::Settings m_settings;
    kvloamd::EntityReader m_entities;
};
