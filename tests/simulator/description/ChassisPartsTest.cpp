// SPDX-License-Identifier: BSD-2-Clause
// The parts "store" and "processes" of chassis files, and the example chassis.
#include <set>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/chassis/AttributeSchema.h"
#include "simulator/description/ChassisReader.h"
#include "tests/simulator/description/BadFixture.h"

namespace {

using namespace kvlsim;
using testing::SizeIs;

class BadChassisPartTest : public testing::TestWithParam<BadFixture> {};

TEST_P(BadChassisPartTest, IsRefusedWithPlaceAndRemedy) {
    EXPECT_EQ(refusalOf(GetParam()), std::string(GetParam().file) + GetParam().refusal);
}

INSTANTIATE_TEST_SUITE_P(
    Fixtures, BadChassisPartTest,
    testing::Values(
        BadFixture{"process-command-twice.yaml",
                   ":4: command \"snmpd\" is written twice; keep one of them"},
        BadFixture{"process-negative-counter.yaml",
                   ":5: NumberOfOpens cannot be -3; write a number from 0 to 2147483647"},
        BadFixture{"process-no-kind.yaml",
                   ":3: process without kind; give it \"kind:\" self, child or command"},
        BadFixture{"process-no-name.yaml", ":3: process without name; give it \"name:\""},
        BadFixture{"process-rate-text.yaml", ":5: the rate of NumberOfOpens cannot be the text "
                                             "\"often\"; write a number per second, such as 0.5"},
        BadFixture{"process-self-named.yaml",
                   ":4: the process itself has a name already; remove \"name:\""},
        BadFixture{"process-self-twice.yaml", ":4: the process itself is written twice; keep one"},
        BadFixture{"process-unknown-counter.yaml",
                   ":5: no counter is called \"Opens\"; there are NumberOfOpens, NumberOfCloses, "
                   "EventQueueSize, CurrentEventsOnQueue, MaxEventsOnQueue, TotalQueuedEvents, "
                   "NumberOfHandlers"},
        BadFixture{"process-unknown-kind.yaml", ":3: the kind of a process cannot be the text "
                                                "\"parent\"; choose self, child or command"},
        BadFixture{
            "processes-is-a-map.yaml",
            ":3: processes cannot be a map; write a list, each process beginning with \"- kind:\""},
        BadFixture{
            "store-families-is-a-text.yaml",
            ":3: families cannot be the text \"NX5\"; write a list of names, such as [NX5, VORN]"},
        BadFixture{"store-family-not-there.yaml",
                   ":5: record \"A1\" is of family \"VORN\", which is "
                   "not among the store's families; add it there"},
        BadFixture{"store-family-too-long.yaml",
                   ":4: a family's name has 30 bytes; 29 is the most"},
        BadFixture{"store-family-twice.yaml",
                   ":6: family \"NX5\" is written twice; keep one of them"},
        BadFixture{"store-is-a-list.yaml",
                   ":2: the store cannot be a list; begin it with \"families:\""},
        BadFixture{"store-no-family.yaml", ":5: record \"A1\" has no family; give it \"family:\""},
        BadFixture{"store-no-serial.yaml",
                   ":4: a board of the store has no serial number; give it \"serial:\""},
        BadFixture{"store-number-out-of-range.yaml",
                   ":7: IRQ cannot be 0x100000000; it is a number "
                   "of 4 bytes, write a decimal or 0x number"},
        BadFixture{"store-serial-number.yaml",
                   ":4: a serial number cannot be 12345; it is a text, write it in quotes"},
        BadFixture{"store-serial-twice.yaml",
                   ":5: serial number \"A1\" is already that of the record "
                   "of line 4 of the file; serial numbers must differ"},
        BadFixture{"store-text-too-long.yaml",
                   ":7: Model: a text of 80 bytes is too long; 79 is the most"},
        BadFixture{"store-unknown-field.yaml",
                   ":7: a board's record has no field \"Irq\"; there are Version, Model, Type, "
                   "FunctionalDescription, FirmwareName, FirmwareVersion, SharedMemoryBaseAddress, "
                   "IOBaseAddress, IRQ, BoardID, PCISlotNumber, DeviceChangeDate"},
        BadFixture{"store-unknown-key.yaml",
                   ":3: unknown key \"family\" in the store; known: families, boards"}),
    [](auto const& each) {
        std::string name = each.param.file;
        name.erase(name.find('.'));
        std::erase(name, '-');
        return name;
    });

void collectTypes(Chassis const& chassis, ChassisObject const& object, ObjectKind kind,
                  std::set<std::int32_t>& types) {
    if (object.kind == kind) types.insert(object.attribute("TYPE")->asNumber());
    for (std::int32_t const child : object.children)
        collectTypes(chassis, *chassis.find(child), kind, types);
}

std::set<std::string> collectNames(Chassis const& chassis, ChassisObject const& object) {
    std::set<std::string> names;
    object.attributes.forEach(
        [&](std::string_view name, AttributeValue const&) { names.emplace(name); });
    for (std::int32_t const child : object.children)
        names.merge(collectNames(chassis, *chassis.find(child)));
    return names;
}

class ExampleChassisTest : public testing::Test {
  protected:
    std::set<std::int32_t> types(ObjectKind kind) const {
        std::set<std::int32_t> found;
        collectTypes(chassis, chassis.root(), kind, found);
        return found;
    }
    Chassis chassis = readChassis(readChassisFile(KVLSIM_SMALL_CHASSIS));
};

TEST_F(ExampleChassisTest, HasEveryTypeOfDevice) {
    std::set<std::int32_t> const all(deviceTypes().begin(), deviceTypes().end());
    EXPECT_EQ(types(ObjectKind::device), all);
}

TEST_F(ExampleChassisTest, HasEveryTypeOfSubDevice) {
    std::set<std::int32_t> const all(subDeviceTypes().begin(), subDeviceTypes().end());
    EXPECT_EQ(types(ObjectKind::subDevice), all);
}

TEST_F(ExampleChassisTest, HasEveryAddressAndProcessors) {
    auto const names = collectNames(chassis, chassis.root());
    for (char const* name :
         {"LINEADMINADDR", "TSCADDR", "CLUSTERADDR", "CTBUSADDR", "IPVSCADDR", "Protocol_Type_0",
          "Protocol_Type_1", "Protocol_Type_2", "Out_Variant", "FrontEndType", "RTK_VERSION"})
        EXPECT_TRUE(names.contains(name)) << name;
}

TEST_F(ExampleChassisTest, HasProcesses) {
    ASSERT_TRUE(chassis.processes());
    EXPECT_THAT(*chassis.processes(), SizeIs(3));
}

} // namespace
