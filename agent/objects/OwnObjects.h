// SPDX-License-Identifier: BSD-2-Clause
// The managed objects of KVL-OAM-MIB.
#pragma once

#include <span>
#include <vector>

#include "agent/objects/Description.h"

namespace kvloamd {

/// The places of KVL-OAM-MIB's branches, relative.
inline Oid const kObjectsPlace{1, 1};
inline Oid const kNotifyObjectsPlace{1, 1, 3};
inline Oid const kBoardStatusChangePlace{1, 0, 1};
inline Oid const kFaultRaisedPlace{1, 0, 2};
inline Oid const kFaultClearedPlace{1, 0, 3};

std::span<Scalar const> scalars();

Table const& boardTable();
Table const& moduleTable();
Table const& serviceTable();
Table const& deviceTable();
Table const& subDeviceTable();
Table const& processorTable();
Table const& storeTable();
Table const& processTable();
Table const& resourceDeviceTable();
Table const& faultTable();
Table const& interfaceTable();
Table const& alarmTable();
Table const& thresholdTable();

/// Every table.
std::vector<Table const*> tables();

} // namespace kvloamd
