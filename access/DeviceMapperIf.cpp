// SPDX-License-Identifier: BSD-2-Clause
#include "access/DeviceMapperIf.h"

#include "access/DMRequests.h"

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

std::vector<long> DeviceMapperIf::ListBoardsByPlatform(std::string const& platform) {
    std::vector<long> boards;
    // The client only reads the value; the size counts the terminator.
    KVL::append_matches(*m_client, m_root,
                        {"CTPLATFORM", const_cast<char*>(platform.c_str()), 0, 0,
                         static_cast<std::int32_t>(platform.size() + 1)},
                        boards);
    return boards;
}
