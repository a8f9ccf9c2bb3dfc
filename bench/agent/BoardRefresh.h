// SPDX-License-Identifier: BSD-2-Clause
// What a refresh of the agent's snapshot reads of boards, and makes of them.
#pragma once

#include "agent/readers/BoardSource.h"
#include "agent/readers/BoardTurns.h"
#include "agent/readers/EntityReader.h"
#include "agent/readers/InterfaceReader.h"
#include "agent/readers/PlatformReader.h"
#include "agent/readers/ResourceReader.h"
#include "agent/readers/StableIndices.h"
#include "agent/rows/Snapshot.h"
#include "board/BoardManager.h"

/// What has happened since the refresh before.
enum class Happened : char {
    Nothing,
    Counting,   ///< every line has counted a second
    StatusOf1,  ///< a board has stopped or started, with its lines
    Everything, ///< every board has announced something, so that all are read in full
};

/// Boards of the reference module on the simulated platform, each with four lines that have a full
/// day behind them. The lines count seconds only when they are told to. One for a process.
class BoardRefresh final : private BoardStatusListener {
  public:
    explicit BoardRefresh(int boards);

    /// Makes something happen. Not part of a refresh.
    void let(Happened happened);

    void read(kvloamd::Snapshot& snapshot);

  private:
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;

    int m_boards;
    int m_changes = 0;
    ReferenceCounter<BoardManager> m_manager;
    kvloamd::BoardTurns m_turns;
    kvloamd::BoardSource m_source;
    kvloamd::StableIndices m_indices;
    kvloamd::InterfaceReader m_interfaces;
    kvloamd::ResourceReader m_resources;
    kvloamd::PlatformReader m_platform;
    kvloamd::StableIndices m_entityIndices;
    kvloamd::Settings m_settings;
    kvloamd::EntityReader m_entities;
};
