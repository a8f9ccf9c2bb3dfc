// SPDX-License-Identifier: BSD-2-Clause
// The entry point of board modules.
//
// A board module is a shared library `<name>kvl.so` with one C function. The agent calls it once
// with the version that the agent was built with, and attaches the factory to its board manager.
#pragma once

#include "board/BoardFactory.h"

/// The version of everything that a module derives from or calls. Every incompatible change raises
/// it.
inline constexpr int KVL_BOARD_MODULE_ABI_VERSION = 1;

/// The entry point's name, for dlsym().
inline constexpr char const* KVL_BOARD_MODULE_ENTRY_POINT = "kvl_create_board_factory";

using KVLCreateBoardFactory = BoardFactory*(int abi_version);

/// Returns a new factory, which the caller must put at once into a
/// `ReferenceCounter<BoardFactory>`; null if the module does not support `abi_version`.
extern "C" KVLOAM_API BoardFactory* kvl_create_board_factory(int abi_version);
