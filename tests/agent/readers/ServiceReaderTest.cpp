// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/ServiceRows.h"

#include <gtest/gtest.h>

#include "agent/readers/Answers.h"
#include "agent/readers/ServiceReader.h"
#include "agent/rows/BoardRow.h"

namespace kvloamd {
namespace {

/// A manager with a service, as a variant for another platform would enter it.
class ServicedManager final : public ServiceManager {
  public:
    ReferenceCounter<Service> enter(std::string const& name) {
        ReferenceCounter<Service> service(new Service(name));
        enter_at_next_index(*services().get(), service);
        return service;
    }
};

class ServiceRowsTest : public ::testing::Test {
  protected:
    ServicedManager& m_manager = *new ServicedManager;
    ReferenceCounter<ServiceManager> m_handle{&m_manager};
};

TEST_F(ServiceRowsTest, ThereIsNoModuleAtFirst) {
    EXPECT_TRUE(readModules(m_manager).empty());
}

TEST_F(ServiceRowsTest, AddedModulesAreRowsInTheirOrder) {
    m_manager.AddModule("z7sim");
    m_manager.AddModule("other");
    auto const rows = readModules(m_manager);
    ASSERT_EQ(rows.size(), 2U);
    EXPECT_EQ(rows[0].moduleIndex, 1U);
    EXPECT_EQ(rows[0].name, "z7simkvl");
    EXPECT_EQ(rows[0].purpose, "KVL Extension Module for z7sim");
    EXPECT_EQ(rows[0].version, "5.2");
    EXPECT_EQ(rows[1].moduleIndex, 2U);
    EXPECT_EQ(rows[1].name, "otherkvl");
}

TEST_F(ServiceRowsTest, ModuleIsDated) {
    m_manager.AddModule("z7sim");
    m_manager.GetFirstModule()->SetModuleDate(1'000'000'000);
    EXPECT_EQ(readModules(m_manager).at(0).date, dateOctets(1'000'000'000));
}

TEST_F(ServiceRowsTest, LongestModuleNameIsServedWhole) {
    std::string const longest(ServiceManager::kMaxModuleNameLength, 'm');
    m_manager.AddModule(longest.c_str());
    auto const rows = readModules(m_manager);
    EXPECT_EQ(rows.at(0).name, longest + "kvl");
    EXPECT_EQ(rows.at(0).purpose, "KVL Extension Module for " + longest);
}

TEST_F(ServiceRowsTest, ServiceHasNeitherStatusNorDateUntilTheyAreSet) {
    m_manager.enter("telephony");
    auto const rows = readServices(m_manager);
    ASSERT_EQ(rows.size(), 1U);
    EXPECT_EQ(rows[0].serviceIndex, 1U);
    EXPECT_EQ(rows[0].name, "telephony");
    EXPECT_EQ(rows[0].scmName, "telephony");
    EXPECT_EQ(rows[0].status, std::nullopt);
    EXPECT_EQ(rows[0].changeDate, "");
}

TEST_F(ServiceRowsTest, ServiceHasItsStatusAndDateWhenTheyAreSet) {
    ReferenceCounter<Service> const service = m_manager.enter("telephony");
    service->SetServiceStatus(4);
    service->SetServiceChangeDate();
    auto const rows = readServices(m_manager);
    EXPECT_EQ(rows.at(0).status, 4);
    EXPECT_EQ(rows.at(0).changeDate.size(), 11U);
}

TEST_F(ServiceRowsTest, PlatformServiceIsUnknownUntilItIsSet) {
    PlatformService const service = readPlatformService(m_manager);
    EXPECT_EQ(service.status, std::nullopt);
    EXPECT_EQ(service.changeDate, "");
}

TEST_F(ServiceRowsTest, PlatformServiceIsWhatWasSetLast) {
    m_manager.SetVelquorServiceStatus(3);
    m_manager.SetVelquorServiceChangeDate(1'000'000'000);
    PlatformService const service = readPlatformService(m_manager);
    EXPECT_EQ(service.status, 3);
    EXPECT_EQ(service.changeDate, dateOctets(1'000'000'000));
}

} // namespace
} // namespace kvloamd
