// SPDX-License-Identifier: BSD-2-Clause
// The board platform's device mapper, and which boards it knows.
#pragma once

#include <string>
#include <vector>

#include "boardplatform/dm_client.h"
#include "platform/Export.h"

/// The most objects that one search of the lists below answers.
inline constexpr int kDMSearchCapacity = 100;

/// The values of the attribute "TYPE".
enum DMObjectType : int { DMObjectTypeBoard = 200, DMObjectTypeProcessor = 800 };

/// `DeviceMapperIf` is the process's access to the board platform's device mapper. Thread-safe once
/// the first `get_interface()` has returned.
class KVLOAM_API DeviceMapperIf {
  public:
    static std::string const NX5BoardPlatform;
    static std::string const QuillonBoardPlatform;
    static std::string const VORNBoardPlatform;

    /// The single instance, created by the first call and never destroyed.
    static DeviceMapperIf* get_interface();

    DeviceMapperIf();
    ~DeviceMapperIf() = default;

    /// The handles (AUIDs) of the boards, at most `kDMSearchCapacity`; empty if the search fails.
    std::vector<long> ListAllBoards();
    /// The same for the boards whose "CTPLATFORM" is `platform`.
    std::vector<long> ListBoardsByPlatform(std::string const& platform);
    /// Finds all boards, however many there are, and puts their handles into `boards`. Returns
    /// whether the device mapper answered; if it did not, `boards` stays as it was, so that a
    /// platform that is silent for a while is not taken for one without boards.
    bool FindAllBoards(std::vector<long>& boards);
    /// The platform's client; owned by the platform.
    DeviceMapperClient* GetDMClient() { return m_client; }

  private:
    DeviceMapperClient* m_client;
    long m_root = -1;

    static DeviceMapperIf* m_deviceMapperIf;
};
