// SPDX-License-Identifier: BSD-2-Clause
#include "access/DeviceMapperIf.h"

#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <utility>

#include "access/DMRequests.h"

namespace {

constexpr int kFirstCapacity = 256;
constexpr int kLargestCapacity = 1 << 20;

} // namespace

std::string const DeviceMapperIf::NX5BoardPlatform = "NX5";
std::string const DeviceMapperIf::QuillonBoardPlatform = "QUILLON";
std::string const DeviceMapperIf::VORNBoardPlatform = "VORN";

DeviceMapperIf* DeviceMapperIf::m_deviceMapperIf = nullptr;

DeviceMapperIf* DeviceMapperIf::get_interface() {
    if (m_deviceMapperIf == nullptr) m_deviceMapperIf = new DeviceMapperIf;
    return m_deviceMapperIf;
}

DeviceMapperIf::DeviceMapperIf() : m_client(dm_getDeviceMapperClient()) {
    m_client->GetRootObject(&m_root);
}

std::vector<long> DeviceMapperIf::ListAllBoards() {
    std::vector<long> boards;
    KVL::append_objects_of_type(*m_client, m_root, DMObjectTypeBoard, boards);
    return boards;
}

bool DeviceMapperIf::FindAllBoards(std::vector<long>& boards) {
    // Asked anew: the platform may not have answered when this object was made.
    long root = -1;
    if (m_client->GetRootObject(&root) != 0) return false;
    for (int capacity = kFirstCapacity;; capacity *= 2) {
        std::int32_t type = DMObjectTypeBoard;
        DMAttribute criterion{"TYPE", &type, 0, 0, sizeof type};
        int count = capacity;
        std::vector<long> found(static_cast<std::size_t>(capacity));
        if (m_client->FindObjects(root, 1, &criterion, &count, found.data()) != 0) return false;
        // A full array may be only a part of the answer.
        if (count >= capacity && capacity < kLargestCapacity) continue;
        found.resize(static_cast<std::size_t>(std::clamp(count, 0, capacity)));
        boards = std::move(found);
        return true;
    }
}

std::vector<long> DeviceMapperIf::ListBoardsByPlatform(std::string const& platform) {
    std::vector<long> boards;
    // The client only reads the value; the size counts the terminator.
    KVL::append_matches(*m_client, m_root,
                        {"CTPLATFORM", const_cast<char*>(platform.c_str()), 0, 0,
                         static_cast<std::int32_t>(platform.size() + 1)},
                        boards);
    return boards;
}
