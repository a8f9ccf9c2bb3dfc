// SPDX-License-Identifier: BSD-2-Clause
// A network device of the host as an Ethernet interface: what its queries make of the kernel's
// files.
#include <climits>
#include <filesystem>
#include <fstream>
#include <string>

#include <gtest/gtest.h>

#include "HostEthernet.h"
#include "HostMulticast.h"
#include "HostPause.h"
#include "core/ReferenceCounter.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

using KVL::kNotSupported;

/// A device "net0" whose files the test writes.
class HostEthernetTest : public testing::Test {
  protected:
    HostEthernetTest() { std::filesystem::create_directories(m_files / "statistics"); }
    void write(char const* file, char const* text) {
        std::ofstream(m_files / file) << text << '\n';
    }

    support::TemporaryDirectory m_directory;
    std::filesystem::path m_files = m_directory.file("net0");
    HostEthernet* m_ethernet = new HostEthernet(HostDevice("net0", m_directory.file(".")));
    ReferenceCounter<KVL::Ethernet> m_handle{m_ethernet};
};

TEST_F(HostEthernetTest, DescriptionNamesTheDevice) {
    std::string description;
    EXPECT_EQ(m_ethernet->GetDescription(description), 0);
    EXPECT_EQ(description, "host interface net0");
}

TEST_F(HostEthernetTest, TypeIsThatOfTheKernel) {
    write("type", "1");
    EXPECT_EQ(m_ethernet->GetType(), 6);
    write("type", "772");
    EXPECT_EQ(m_ethernet->GetType(), 24);
    write("type", "65534");
    EXPECT_EQ(m_ethernet->GetType(), 1);
}

TEST_F(HostEthernetTest, SpeedIsInBitsPerSecond) {
    write("speed", "1000");
    EXPECT_EQ(m_ethernet->GetSpeed(), 1'000'000'000);
    write("speed", "2500");
    EXPECT_EQ(static_cast<unsigned>(m_ethernet->GetSpeed()), 2'500'000'000u);
    write("speed", "10000");
    EXPECT_EQ(static_cast<unsigned>(m_ethernet->GetSpeed()), UINT_MAX);
    write("speed", "-1");
    EXPECT_EQ(m_ethernet->GetSpeed(), kNotSupported);
}

TEST_F(HostEthernetTest, PhysicalAddressHasSixOctets) {
    char buffer[8] = {};
    int length = 0;
    write("address", "02:00:5e:10:00:fe");
    EXPECT_EQ(m_ethernet->GetPhysAddress(buffer, length), 0);
    EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)),
              std::string("\x02\x00\x5e\x10\x00\xfe", 6));
}

TEST_F(HostEthernetTest, AddressOfAnotherFormIsNotSupported) {
    char buffer[8] = {};
    int length = 77;
    for (char const* const text : {"", "02:00:5e:10:00", "02:00:5e:10:00:fe:01",
                                   "02-00-5e-10-00-fe", "02:00:5e:10:00:xx", "02:00:5e:10:00:-1"}) {
        write("address", text);
        EXPECT_EQ(m_ethernet->GetPhysAddress(buffer, length), kNotSupported) << text;
    }
    EXPECT_EQ(length, 77);
}

TEST_F(HostEthernetTest, AdminStatusIsTheKernelsUpFlag) {
    write("flags", "0x1003");
    EXPECT_EQ(m_ethernet->GetAdminStatus(), 1);
    write("flags", "0x1002");
    EXPECT_EQ(m_ethernet->GetAdminStatus(), 2);
}

TEST_F(HostEthernetTest, OperStatusIsTheKernelsState) {
    char const* const states[] = {"up",      "down",       "testing",       "unknown",
                                  "dormant", "notpresent", "lowerlayerdown"};
    int status = 0;
    for (char const* const state : states) {
        write("operstate", state);
        EXPECT_EQ(m_ethernet->GetOperStatus(), ++status) << state;
    }
}

TEST_F(HostEthernetTest, UnknownStateIsUpWithACarrier) {
    write("operstate", "unknown");
    write("flags", "0x9");
    write("carrier", "1");
    EXPECT_EQ(m_ethernet->GetOperStatus(), 1);
    write("carrier", "0");
    EXPECT_EQ(m_ethernet->GetOperStatus(), 4);
    write("carrier", "1");
    write("flags", "0x8");
    EXPECT_EQ(m_ethernet->GetOperStatus(), 4);
}

TEST_F(HostEthernetTest, EveryCounterIsReadFromItsOwnFile) {
    struct {
        char const* file;
        int (KVL::Ethernet::*query)();
    } const counters[] = {
        {"rx_bytes", &KVL::Ethernet::GetInOctets},
        {"rx_packets", &KVL::Ethernet::GetInUcastPkts},
        {"rx_dropped", &KVL::Ethernet::GetInDiscards},
        {"rx_errors", &KVL::Ethernet::GetInErrors},
        {"tx_bytes", &KVL::Ethernet::GetOutOctets},
        {"tx_packets", &KVL::Ethernet::GetOutUcastPkts},
        {"tx_dropped", &KVL::Ethernet::GetOutDiscards},
        {"tx_errors", &KVL::Ethernet::GetOutErrors},
        {"rx_frame_errors", &KVL::Ethernet::GetAlignmentErrors},
        {"rx_crc_errors", &KVL::Ethernet::GetFCSErrors},
        {"tx_heartbeat_errors", &KVL::Ethernet::GetSQETestErrors},
        {"tx_window_errors", &KVL::Ethernet::GetLateCollisions},
        {"tx_aborted_errors", &KVL::Ethernet::GetExcessiveCollisions},
        {"tx_carrier_errors", &KVL::Ethernet::GetCarrierSenseErrors},
        {"rx_length_errors", &KVL::Ethernet::GetFrameTooLongs},
        {"tx_fifo_errors", &KVL::Ethernet::GetInternalMacTransmitErrors},
    };
    int number = 100;
    for (auto const& counter : counters) {
        EXPECT_EQ((m_ethernet->*counter.query)(), kNotSupported) << counter.file;
        std::string const file = std::string("statistics/") + counter.file;
        write(file.c_str(), std::to_string(++number).c_str());
        EXPECT_EQ((m_ethernet->*counter.query)(), number) << counter.file;
    }
}

TEST_F(HostEthernetTest, MulticastPacketsAreNotCountedAsUnicastOnes) {
    write("statistics/rx_packets", "1000");
    EXPECT_EQ(m_ethernet->GetInUcastPkts(), 1000);
    write("statistics/multicast", "3");
    write("statistics/rx_packets", "1010");
    EXPECT_EQ(m_ethernet->GetInMulticastPkts(), 3);
    EXPECT_EQ(m_ethernet->GetInUcastPkts(), 1007);
}

TEST_F(HostEthernetTest, UnicastCounterFallsOnlyWhenTheDeviceHasBegunAgain) {
    write("statistics/rx_packets", "1000");
    EXPECT_EQ(m_ethernet->GetInUcastPkts(), 1000);
    // Counted after the packets were.
    write("statistics/multicast", "5");
    EXPECT_EQ(m_ethernet->GetInUcastPkts(), 1000);
    write("statistics/rx_packets", "10");
    write("statistics/multicast", "1");
    EXPECT_EQ(m_ethernet->GetInUcastPkts(), 9);
}

TEST_F(HostEthernetTest, ReceiveErrorsOfTheMacAreThoseOfItsQueues) {
    EXPECT_EQ(m_ethernet->GetInternalMacReceiveErrors(), kNotSupported);
    write("statistics/rx_fifo_errors", "4");
    EXPECT_EQ(m_ethernet->GetInternalMacReceiveErrors(), 4);
    write("statistics/rx_over_errors", "3");
    EXPECT_EQ(m_ethernet->GetInternalMacReceiveErrors(), 7);
}

TEST_F(HostEthernetTest, SpeedBeyond32BitsIsInMegabits) {
    EXPECT_EQ(m_ethernet->GetHighSpeed(), kNotSupported);
    write("speed", "100000");
    EXPECT_EQ(m_ethernet->GetHighSpeed(), 100000);
    write("speed", "-1");
    EXPECT_EQ(m_ethernet->GetHighSpeed(), kNotSupported);
}

TEST_F(HostEthernetTest, PromiscuousModeIsTheKernelsFlag) {
    EXPECT_EQ(m_ethernet->GetPromiscuousMode(), kNotSupported);
    write("flags", "0x1103");
    EXPECT_EQ(m_ethernet->GetPromiscuousMode(), 1);
    write("flags", "0x1003");
    EXPECT_EQ(m_ethernet->GetPromiscuousMode(), 2);
}

TEST(HostPauseTest, ModeIsTheSumOfBothDirections) {
    EXPECT_EQ(pauseMode({false, false, false}), 1);
    EXPECT_EQ(pauseMode({false, false, true}), 2);
    EXPECT_EQ(pauseMode({false, true, false}), 3);
    EXPECT_EQ(pauseMode({false, true, true}), 4);
}

TEST(HostPauseTest, DeviceThatIsNotThereHasNone) {
    EXPECT_FALSE(readHostPause("no-such-device"));
}

TEST(HostMulticastTest, AddressesOfTheDeviceAreRead) {
    support::TemporaryDirectory const directory;
    std::string const list = directory.file("dev_mcast");
    std::ofstream(list) << "1    lo              1     0     333300000001\n"
                           "2    net0            1     0     01005e000001\n"
                           "2    net0            2     0     3333ff5e0001\n"
                           "2    net0            1     0     nonsense\n"
                           "3    net01           1     0     01005e000002\n";
    std::vector<std::string> addresses;
    EXPECT_TRUE(readHostMulticast("net0", addresses, list));
    EXPECT_EQ(addresses, (std::vector<std::string>{{"\x01\x00\x5e\x00\x00\x01", 6},
                                                   {"\x33\x33\xff\x5e\x00\x01", 6}}));
    EXPECT_FALSE(readHostMulticast("net0", addresses, directory.file("missing")));
}

TEST_F(HostEthernetTest, CountersWrapAt32Bits) {
    write("statistics/rx_bytes", "4294967300");
    EXPECT_EQ(m_ethernet->GetInOctets(), 4);
    write("statistics/rx_bytes", "2147483648");
    EXPECT_EQ(m_ethernet->GetInOctets(), INT_MIN);
}

TEST_F(HostEthernetTest, DuplexStatusIsThatOfTheKernel) {
    write("duplex", "full");
    EXPECT_EQ(m_ethernet->GetDuplexStatus(), 3);
    write("duplex", "half");
    EXPECT_EQ(m_ethernet->GetDuplexStatus(), 2);
    write("duplex", "unknown");
    EXPECT_EQ(m_ethernet->GetDuplexStatus(), 1);
}

TEST_F(HostEthernetTest, WhatTheKernelDoesNotSayIsNotSupported) {
    int value = 77;
    EXPECT_EQ(m_ethernet->GetType(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetMTU(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetSpeed(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetAdminStatus(), kNotSupported);
    EXPECT_EQ(m_ethernet->SetAdminStatus(1), kNotSupported);
    EXPECT_EQ(m_ethernet->GetOperStatus(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetLastChange(value, value), kNotSupported);
    EXPECT_EQ(m_ethernet->GetInUnknownProtos(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetSingleCollisionFrames(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetMultipleCollisionFrames(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetDeferredTransmissions(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetInternalMacTransmitErrors(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetInternalMacReceiveErrors(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetSymbolErrors(), kNotSupported);
    EXPECT_EQ(m_ethernet->GetDuplexStatus(), kNotSupported);
}

TEST_F(HostEthernetTest, FileWithoutANumberIsNotSupported) {
    for (char const* const text : {"", "none", "12 apples", "99999999999999999999"}) {
        write("mtu", text);
        EXPECT_EQ(m_ethernet->GetMTU(), kNotSupported) << text;
    }
}

TEST(HostDeviceTest, NamesThatLeaveTheDirectoryAreRefused) {
    for (char const* const name : {"", ".", "..", "../lo", "a/b", "/", "a123456789012345"})
        EXPECT_FALSE(HostDevice::isName(name)) << name;
    for (char const* const name : {"lo", "eth0.100", "a12345678901234"})
        EXPECT_TRUE(HostDevice::isName(name)) << name;
}

} // namespace
