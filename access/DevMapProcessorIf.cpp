// SPDX-License-Identifier: BSD-2-Clause
#include "access/DevMapProcessorIf.h"

#include <cstdint>

#include "access/DMRequests.h"

using KVL::DMNumber;
using KVL::DMText;
using KVL::kDMUnknown;

DevMapProcessorIf::DevMapProcessorIf(long auid)
    : m_auid(auid), m_dmIf(DeviceMapperIf::get_interface()) {
    PopulateAttributes();
}

void DevMapProcessorIf::PopulateAttributes() {
    DMText name, bootVersion, bootFile, kernelVersion, kernelFile;
    DMNumber number(static_cast<std::int32_t>(m_processorNumber));
    DMAttribute requests[] = {
        name.request("NAME"),
        number.request("PROC_NUM"),
        bootVersion.request("BK_VERSION"),
        bootFile.request("BK_FILE"),
        kernelVersion.request("RTK_VERSION"),
        kernelFile.request("RTK_FILE"),
    };
    int const result = m_dmIf->GetDMClient()->GetAttributes(m_auid, 6, requests);
    if (requests[0].status == 0) m_name = name.text();
    m_processorNumber = number.inPlace(requests[1], result);
    m_bootKernelVersion = bootVersion.answer(requests[2], kDMUnknown);
    m_bootKernelFilename = bootFile.answer(requests[3], kDMUnknown);
    m_realTimeKernelVersion = kernelVersion.answer(requests[4], kDMUnknown);
    m_realTimeKernelFilename = kernelFile.answer(requests[5], kDMUnknown);
}
