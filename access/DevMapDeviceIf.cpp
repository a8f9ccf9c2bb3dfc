// SPDX-License-Identifier: BSD-2-Clause
#include "access/DevMapDeviceIf.h"

#include <cstdint>

#include "access/DMRequests.h"

using KVL::DMNumber;
using KVL::DMText;

namespace {

/// The types of sub-devices of a device, in the order in which they are listed.
constexpr int kSubDeviceTypes[] = {502, 504, 506, 508, 510, 517, 519, 522, 512, 526, 528};

} // namespace

DevMapDeviceIf::DevMapDeviceIf(char* name) : m_dmIf(DeviceMapperIf::get_interface()) {
    m_dmIf->GetDMClient()->FindObjectByName(name, &m_auid);
    PopulateAttributes();
}

DevMapDeviceIf::DevMapDeviceIf(long auid) : m_auid(auid), m_dmIf(DeviceMapperIf::get_interface()) {
    PopulateAttributes();
}

void DevMapDeviceIf::PopulateAttributes() {
    DMText name;
    DMNumber type(static_cast<std::int32_t>(m_deviceType));
    DMNumber channels(static_cast<std::int32_t>(m_channelCount));
    DMAttribute requests[] = {
        name.request("NAME"),
        type.request("TYPE"),
        channels.request("ChannelCount"),
        KVL::descriptor_request("LINEADMINADDR", m_lineAdminAddress),
    };
    int const result = m_dmIf->GetDMClient()->GetAttributes(m_auid, 4, requests);
    if (requests[0].status == 0) m_name = name.text();
    m_deviceType = type.inPlace(requests[1], result);
    m_channelCount = channels.inPlace(requests[2], result);
    m_hasLineAdminAddress = requests[3].status == 0;
}

bool DevMapDeviceIf::LineAdminAddress(QCompDesc& address) const {
    if (m_hasLineAdminAddress) address = m_lineAdminAddress;
    return m_hasLineAdminAddress;
}

int DevMapDeviceIf::ProtocolType(int index) {
    std::string const name = "Protocol_Type_" + std::to_string(index);
    std::int8_t type = 0;
    DMAttribute request{name.c_str(), &type, 0, 0, sizeof type};
    DeviceMapperIf::get_interface()->GetDMClient()->GetAttributes(m_auid, 1, &request);
    return request.status == 0 ? type : 0;
}

std::vector<long> DevMapDeviceIf::ListSubDevicesByType(int type) {
    std::vector<long> found;
    KVL::append_objects_of_type(*m_dmIf->GetDMClient(), m_auid, type, found);
    return found;
}

std::vector<long> DevMapDeviceIf::ListAllSubDevices() {
    std::vector<long> found;
    for (int const type : kSubDeviceTypes)
        KVL::append_objects_of_type(*m_dmIf->GetDMClient(), m_auid, type, found);
    return found;
}

std::vector<std::string> DevMapDeviceIf::ListAllSubDeviceNames() {
    return namesOf(ListAllSubDevices());
}

std::vector<std::string> DevMapDeviceIf::ListSubDeviceNamesByType(int type) {
    return namesOf(ListSubDevicesByType(type));
}

std::vector<std::string> DevMapDeviceIf::namesOf(std::vector<long> const& auids) {
    std::vector<std::string> names;
    for (long const auid : auids) {
        DMText name;
        DMAttribute request = name.request("NAME");
        m_dmIf->GetDMClient()->GetAttributes(auid, 1, &request);
        if (request.status == 0) names.push_back(name.text());
    }
    return names;
}
