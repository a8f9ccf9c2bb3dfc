// SPDX-License-Identifier: BSD-2-Clause
#include "access/DevMapSubDeviceIf.h"

#include <cstdint>

#include "access/DMRequests.h"

using KVL::DMNumber;
using KVL::DMText;

namespace {

bool copyIf(bool present, QCompDesc const& from, QCompDesc& to) {
    if (present) to = from;
    return present;
}

} // namespace

DevMapSubDeviceIf::DevMapSubDeviceIf(char* name) : m_dmIf(DeviceMapperIf::get_interface()) {
    m_dmIf->GetDMClient()->FindObjectByName(name, &m_auid);
    PopulateAttributes();
}

DevMapSubDeviceIf::DevMapSubDeviceIf(long auid)
    : m_auid(auid), m_dmIf(DeviceMapperIf::get_interface()) {
    PopulateAttributes();
}

void DevMapSubDeviceIf::PopulateAttributes() {
    DMText name;
    DMNumber type(static_cast<std::int32_t>(m_deviceType));
    DMNumber frontEnd(static_cast<std::int32_t>(m_frontEndType));
    std::int8_t outVariant = 0;
    DMAttribute requests[] = {
        name.request("NAME"),
        type.request("TYPE"),
        KVL::descriptor_request("TSCADDR", m_tscAddress),
        {"Out_Variant", &outVariant, 0, 0, sizeof outVariant},
        KVL::descriptor_request("CLUSTERADDR", m_clusterAddress),
        KVL::descriptor_request("CTBUSADDR", m_ctBusAddress),
        KVL::descriptor_request("IPVSCADDR", m_ipvscAddress),
        frontEnd.request("FrontEndType"),
    };
    int const result = m_dmIf->GetDMClient()->GetAttributes(m_auid, 8, requests);
    if (requests[0].status == 0) m_name = name.text();
    m_deviceType = type.inPlace(requests[1], result);
    m_hasTSCAddress = requests[2].status == 0;
    m_outVariant = outVariant; // NOLINT(bugprone-signed-char-misuse): it has a sign
    if (result == kDMSomeAttributesFailed && requests[3].status != 0) m_outVariant = 0;
    m_hasClusterAddress = requests[4].status == 0;
    m_hasCTBusAddress = requests[5].status == 0;
    m_hasIPVSCAddress = requests[6].status == 0;
    m_frontEndType = frontEnd.inPlace(requests[7], result);
}

bool DevMapSubDeviceIf::TSCAddress(QCompDesc& address) const {
    return copyIf(m_hasTSCAddress, m_tscAddress, address);
}

bool DevMapSubDeviceIf::ClusterAddress(QCompDesc& address) const {
    return copyIf(m_hasClusterAddress, m_clusterAddress, address);
}

bool DevMapSubDeviceIf::CTBusAddress(QCompDesc& address) const {
    return copyIf(m_hasCTBusAddress, m_ctBusAddress, address);
}

bool DevMapSubDeviceIf::IPVSCAddress(QCompDesc& address) const {
    return copyIf(m_hasIPVSCAddress, m_ipvscAddress, address);
}
