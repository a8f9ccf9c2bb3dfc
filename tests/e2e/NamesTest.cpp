// SPDX-License-Identifier: BSD-2-Clause
// With our MIB modules, tools take and print names of objects, values and notifications.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

constexpr char kModules[] = "KVL-OAM-MIB:SNMPv2-MIB:IF-MIB:DS1-MIB:ENTITY-MIB:ENTITY-STATE-MIB";

class NamesTest : public AgentFixture {
  protected:
    /// Runs one of the SNMP tools with the names of all modules.
    std::string named(std::string const& tool, std::vector<std::string> const& arguments) const {
        std::vector<std::string> command{tool,     "-M", MIB_PATH, "-m", kModules, "-v2c",   "-c",
                                         "public", "-t", "30",     "-r", "2",      address()};
        command.insert(command.end(), arguments.begin(), arguments.end());
        return run(command).output;
    }
};

TEST_F(NamesTest, ValuesAreSetByTheirNames) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    EXPECT_THAT(named("snmpset", {"dsx1LineStatusChangeTrapEnable.1000", "i", "enabled"}),
                HasSubstr("DS1-MIB::dsx1LineStatusChangeTrapEnable.1000 = INTEGER: enabled(1)"));
}

TEST_F(NamesTest, ValuesArePrintedWithTheirNames) {
    startAgent();
    EXPECT_THAT(
        named("snmpget", {"ifType.1000", "dsx1LineType.1000", "entPhysicalClass.1"}),
        ::testing::AllOf(HasSubstr("IF-MIB::ifType.1000 = INTEGER: ds1(18)"),
                         HasSubstr("DS1-MIB::dsx1LineType.1000 = INTEGER: dsx1ESF(2)"),
                         HasSubstr("ENTITY-MIB::entPhysicalClass.1 = INTEGER: chassis(3)")));
}

TEST_F(NamesTest, NotificationsArePrintedWithTheirNames) {
    startTrapReceiver("authCommunity log public\n", {"-M", MIB_PATH, "-m", kModules});
    configureSnmp("rocommunity public 127.0.0.1\ntrap2sink " + trapAddress() + " public\n");
    startAgent();
    sim({"line", "alarm", "101", "los"});
    EXPECT_TRUE(trapReceiver().waitFor("SNMPv2-MIB::snmpTrapOID.0 = OID: IF-MIB::linkDown"));
    EXPECT_TRUE(trapReceiver().waitFor("IF-MIB::ifOperStatus.1000 = INTEGER: down(2)"));
    EXPECT_TRUE(trapReceiver().waitFor(
        "SNMPv2-MIB::snmpTrapOID.0 = OID: ENTITY-STATE-MIB::entStateOperDisabled"));
}

} // namespace
} // namespace kvloamd::e2e
