// SPDX-License-Identifier: BSD-2-Clause
// The device mapper: which boards there are.
#pragma once

#include <string>
#include <vector>

#include "boardplatform/dm_client.h"
#include "platform/Export.h"

/// The most objects that one search of the lists below answers.
inline constexpr int kDMSearchCapacity = 100;

/// The values of the attribute "TYPE".
enum DMObjectType : int { DMObjectTypeBoard = 200, DMObjectTypeProcessor = 800 };

/// The process's way to the board platform's device mapper. The first `get_interface()` must return
/// before several threads use it; then all operations may be called from any thread.
class KVLOAM_API DeviceMapperIf {
  public:
    static std::string const NX5BoardPlatform;
    static std::string const QuillonBoardPlatform;
    static std::string const VORNBoardPlatform;

    /// The single instance, made by the first call and never destroyed.
    static DeviceMapperIf* get_interface();

    DeviceMapperIf();
    ~DeviceMapperIf() = default;

    /// The handles (AUIDs) of the boards, at most `kDMSearchCapacity`; empty when the search fails.
    std::vector<long> ListAllBoards();
    /// The same of the boards whose "CTPLATFORM" is `platform`.
    std::vector<long> ListBoardsByPlatform(std::string const& platform);
    /// The platform's client; owned by the platform.
    DeviceMapperClient* GetDMClient() { return m_client; }

  private:
    DeviceMapperClient* m_client;
    long m_root = -1;

    static DeviceMapperIf* m_deviceMapperIf;
};
