// SPDX-License-Identifier: BSD-2-Clause
// A snapshot with rows in every large table, and the trees that serve it, for fuzz targets.
#pragma once

#include <memory>
#include <vector>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

/// Three boards, four interfaces, two lines with an interval, faults, devices and entities.
std::shared_ptr<Snapshot const> sampleSnapshot();

inline Oid const kSampleEnterprise{1, 3, 6, 1, 4, 1, 32473};

/// `SampleTrees` are all objects of the agent, as the daemon serves them.
class SampleTrees {
  public:
    std::vector<ServedTree> served() const {
        return {{m_own, kSampleEnterprise, {{kObjectsPlace, "KVL-OAM-MIB"}}},
                {m_standard, kStandardArc, {kStandardPlaces.begin(), kStandardPlaces.end()}}};
    }

  private:
    std::vector<Table const*> m_ownTables = tables();
    std::vector<Table const*> m_standardTables = standardTables();
    ObjectTree m_own{scalars(), m_ownTables};
    ObjectTree m_standard{standardScalars(), m_standardTables};
};

} // namespace kvloamd
