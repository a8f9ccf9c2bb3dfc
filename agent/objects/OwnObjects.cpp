// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/OwnObjects.h"

namespace kvloamd {

std::vector<Table const*> tables() {
    return {&boardTable(),          &moduleTable(),    &serviceTable(),   &deviceTable(),
            &subDeviceTable(),      &processorTable(), &storeTable(),     &processTable(),
            &resourceDeviceTable(), &faultTable(),     &interfaceTable(), &alarmTable(),
            &thresholdTable()};
}

} // namespace kvloamd
