// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Platform.h"

#include <string>

#include "access/DeviceMapperIf.h"
#include "access/ExternalEventAdaptor.h"
#include "access/ExternalFaultEventAdaptor.h"
#include "agent/log/Log.h"

namespace kvloamd {

bool rootObjectAnswers() {
    DeviceMapperClient* const client = DeviceMapperIf::get_interface()->GetDMClient();
    long root = -1;
    int const result = client == nullptr ? -1 : client->GetRootObject(&root);
    if (result == 0) return true;
    log(LogLevel::Error, "the board platform does not answer: its device mapper gives no root "
                         "object (result " +
                             std::to_string(result) + "); check that the platform runs");
    return false;
}

bool platformAnswers() {
    ReferenceTable::get_instance();
    if (!rootObjectAnswers()) return false;
    ExternalEventAdaptor::get_instance();
    ExternalFaultEventAdaptor::get_instance();
    return true;
}

} // namespace kvloamd
