// SPDX-License-Identifier: BSD-2-Clause
// The Ethernet and IP interfaces of the reference board, real and simulated.
#include <cstdint>
#include <fstream>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "board/EthernetDetails.h"
#include "board/EthernetFeature.h"
#include "board/IPInterface.h"
#include "board/InterfaceFeature.h"
#include "core/ReferenceTable.h"
#include "tests/modules/z7sim/PluggedBoard.h"

namespace {

using KVL::kNotSupported;

constexpr char const* kSimulated = "ETHERNET_ADDRESS: \"02:00:5e:00:00:02\"";

class NetworkFeaturesTest : public PluggedBoard {
  protected:
    ReferenceCounter<KVL::Ethernet> ethernet() {
        return feature<KVL::EthernetFeature>()->GetFirstEthernet();
    }
    ReferenceCounter<KVL::IPInterface> ip() {
        auto const first = feature<KVL::InterfaceFeature>()->GetFirstInterface();
        return {static_cast<KVL::IPInterface*>(first.get())};
    }
    static std::string text(KVL::IPAddress address) {
        std::ostringstream octets;
        octets << address.octet(0) << '.' << address.octet(1) << '.' << address.octet(2) << '.'
               << address.octet(3);
        return octets.str();
    }
    /// "address/mask/broadcast " of every configuration.
    std::string addresses() {
        std::string all;
        auto const interface = ip();
        for (auto config = interface->GetFirstIPAddressConfig(); config.get() != nullptr;
             config = interface->GetNextIPAddressConfig(config))
            all += text(config->GetAddress()) + "/" + text(config->GetMask()) + "/" +
                   text(config->GetBroadcast()) + " ";
        return all;
    }
    static std::uint32_t kernelCounter(char const* file) {
        std::uint64_t value = 0;
        std::ifstream(std::string("/sys/class/net/lo/statistics/") + file) >> value;
        return static_cast<std::uint32_t>(value);
    }
    /// Whether the query answers the kernel's counter, which may go on all the time.
    void expectCounter(char const* file, int (KVL::Ethernet::*query)()) {
        auto const loopback = ethernet();
        std::uint32_t const before = kernelCounter(file);
        auto const answer = static_cast<std::uint32_t>((loopback.get()->*query)());
        EXPECT_LE(answer - before, kernelCounter(file) - before) << file;
    }
};

TEST_F(NetworkFeaturesTest, BoardWithoutInterfacesHasNoFeatures) {
    plugIn("");
    EXPECT_EQ(m_board->GetFeatureListSize(), 0);
}

TEST_F(NetworkFeaturesTest, FeaturesHaveTheirNames) {
    plugIn("ETHERNET_DEVICE: lo");
    EXPECT_STREQ(feature<KVL::EthernetFeature>()->GetFeatureName(), "Ethernet");
    EXPECT_STREQ(feature<KVL::InterfaceFeature>()->GetFeatureName(), "IP");
}

TEST_F(NetworkFeaturesTest, BoardHasOneInterfaceOfEachKind) {
    plugIn("ETHERNET_DEVICE: lo");
    EXPECT_EQ(feature<KVL::EthernetFeature>()->GetNextEthernet(ethernet()).get(), nullptr);
    auto const interfaces = feature<KVL::InterfaceFeature>();
    EXPECT_EQ(interfaces->GetNextInterface(interfaces->GetFirstInterface()).get(), nullptr);
}

TEST_F(NetworkFeaturesTest, LoopbackIsReadFromTheKernel) {
    plugIn("ETHERNET_DEVICE: lo");
    int mtu = 0;
    std::ifstream("/sys/class/net/lo/mtu") >> mtu;
    ASSERT_GT(mtu, 0);
    EXPECT_EQ(ethernet()->GetMTU(), mtu);
    EXPECT_EQ(ethernet()->GetType(), 24);
    EXPECT_EQ(ethernet()->GetAdminStatus(), 1);
    EXPECT_EQ(ethernet()->GetOperStatus(), 1);
    EXPECT_EQ(ethernet()->GetSpeed(), kNotSupported);
    EXPECT_EQ(ethernet()->GetDuplexStatus(), kNotSupported);
    expectCounter("rx_bytes", &KVL::Ethernet::GetInOctets);
    expectCounter("tx_bytes", &KVL::Ethernet::GetOutOctets);
    expectCounter("rx_packets", &KVL::Ethernet::GetInUcastPkts);
    expectCounter("tx_packets", &KVL::Ethernet::GetOutUcastPkts);
    expectCounter("rx_crc_errors", &KVL::Ethernet::GetFCSErrors);
}

TEST_F(NetworkFeaturesTest, LoopbackHasTheHostsAddresses) {
    plugIn("ETHERNET_DEVICE: lo");
    EXPECT_NE(addresses().find("127.0.0.1/255.0.0.0/0.0.0.0 "), std::string::npos) << addresses();
}

TEST_F(NetworkFeaturesTest, DeviceThatIsNotThereSupportsNothingAndHasNoAddresses) {
    plugIn("ETHERNET_DEVICE: nonesuch0");
    EXPECT_EQ(ethernet()->GetMTU(), kNotSupported);
    EXPECT_EQ(ethernet()->GetOperStatus(), kNotSupported);
    EXPECT_EQ(feature<KVL::InterfaceFeature>().get(), nullptr);
}

TEST_F(NetworkFeaturesTest, NameOfNoDeviceIsRefusedWithALine) {
    testing::internal::CaptureStderr();
    plugIn("ETHERNET_DEVICE: ../net/lo");
    EXPECT_EQ(
        testing::internal::GetCapturedStderr(),
        "z7sim: board 5 has the ETHERNET_DEVICE \"../net/lo\"; write a network device of this "
        "host, at most 15 characters without '/'. The board goes without it.\n");
    EXPECT_EQ(m_board->GetFeatureListSize(), 0);
}

TEST_F(NetworkFeaturesTest, SimulatedInterfaceAnswersItsAttributes) {
    plugIn(std::string(kSimulated) + ", ETHERNET_SPEED: 100000000, ETHERNET_MTU: 1500, "
                                     "ETHERNET_IN_OCTETS: 11, ETHERNET_OUT_OCTETS: 12, "
                                     "ETHERNET_FCS_ERRORS: 13");
    std::string description;
    char address[6];
    int length = 0;
    EXPECT_EQ(ethernet()->GetDescription(description), 0);
    EXPECT_EQ(description, "Ethernet interface 02:00:5e:00:00:02");
    EXPECT_EQ(ethernet()->GetPhysAddress(address, length), 0);
    EXPECT_EQ(length, 6);
    EXPECT_EQ(std::string(address, 6), std::string("\x02\x00\x5e\x00\x00\x02", 6));
    EXPECT_EQ(ethernet()->GetType(), 6);
    EXPECT_EQ(ethernet()->GetSpeed(), 100000000);
    EXPECT_EQ(ethernet()->GetMTU(), 1500);
    EXPECT_EQ(ethernet()->GetInOctets(), 11);
    EXPECT_EQ(ethernet()->GetOutOctets(), 12);
    EXPECT_EQ(ethernet()->GetFCSErrors(), 13);
}

TEST_F(NetworkFeaturesTest, SimulatedInterfaceCountsWhatItsAttributesSay) {
    struct {
        char const* attribute;
        int (KVL::Ethernet::*query)();
    } const counters[] = {
        {"ETHERNET_IN_PACKETS", &KVL::Ethernet::GetInUcastPkts},
        {"ETHERNET_IN_DISCARDS", &KVL::Ethernet::GetInDiscards},
        {"ETHERNET_IN_ERRORS", &KVL::Ethernet::GetInErrors},
        {"ETHERNET_IN_UNKNOWN_PROTOCOLS", &KVL::Ethernet::GetInUnknownProtos},
        {"ETHERNET_OUT_PACKETS", &KVL::Ethernet::GetOutUcastPkts},
        {"ETHERNET_OUT_DISCARDS", &KVL::Ethernet::GetOutDiscards},
        {"ETHERNET_OUT_ERRORS", &KVL::Ethernet::GetOutErrors},
        {"ETHERNET_ALIGNMENT_ERRORS", &KVL::Ethernet::GetAlignmentErrors},
        {"ETHERNET_MAC_TRANSMIT_ERRORS", &KVL::Ethernet::GetInternalMacTransmitErrors},
        {"ETHERNET_TOO_LONG_FRAMES", &KVL::Ethernet::GetFrameTooLongs},
        {"ETHERNET_MAC_RECEIVE_ERRORS", &KVL::Ethernet::GetInternalMacReceiveErrors},
        {"ETHERNET_SYMBOL_ERRORS", &KVL::Ethernet::GetSymbolErrors},
        {"ETHERNET_DUPLEX", &KVL::Ethernet::GetDuplexStatus},
        {"ETHERNET_OPER_STATUS", &KVL::Ethernet::GetOperStatus},
    };
    plugIn(kSimulated);
    int number = 100;
    for (auto const& counter : counters) {
        EXPECT_EQ((ethernet().get()->*counter.query)(), KVL::kNotSupported) << counter.attribute;
        sim::set(5, counter.attribute, ++number);
        EXPECT_EQ((ethernet().get()->*counter.query)(), number) << counter.attribute;
    }
}

TEST_F(NetworkFeaturesTest, SimulatedInterfaceKnowsMulticastsAndBroadcasts) {
    plugIn(std::string(kSimulated) + ", ETHERNET_IN_MULTICASTS: 1, ETHERNET_IN_BROADCASTS: 2, "
                                     "ETHERNET_OUT_MULTICASTS: 3, ETHERNET_OUT_BROADCASTS: 4");
    auto const handle = ethernet();
    auto* const details = dynamic_cast<KVL::EthernetDetails*>(handle.get());
    ASSERT_NE(details, nullptr);
    EXPECT_EQ(details->GetInMulticastPkts(), 1);
    EXPECT_EQ(details->GetInBroadcastPkts(), 2);
    EXPECT_EQ(details->GetOutMulticastPkts(), 3);
    EXPECT_EQ(details->GetOutBroadcastPkts(), 4);
    EXPECT_EQ(details->GetPromiscuousMode(), 2);
    EXPECT_EQ(details->GetPauseAdminMode(), KVL::kNotSupported);
}

TEST_F(NetworkFeaturesTest, SimulatedCountersAreLiveAndTheRestIsKept) {
    plugIn(std::string(kSimulated) + ", ETHERNET_MTU: 1500, ETHERNET_IN_OCTETS: 1");
    sim::set(5, "ETHERNET_IN_OCTETS", 2);
    sim::set(5, "ETHERNET_OUT_OCTETS", 3);
    sim::set(5, "ETHERNET_MTU", 9000);
    EXPECT_EQ(ethernet()->GetInOctets(), 2);
    EXPECT_EQ(ethernet()->GetOutOctets(), 3);
    EXPECT_EQ(ethernet()->GetMTU(), 1500);
}

TEST_F(NetworkFeaturesTest, SimulatedInterfaceDoesNotSupportWhatItHasNoAttributeFor) {
    plugIn(kSimulated);
    int value = 0;
    EXPECT_EQ(ethernet()->GetMTU(), kNotSupported);
    EXPECT_EQ(ethernet()->GetSpeed(), kNotSupported);
    EXPECT_EQ(ethernet()->GetAdminStatus(), kNotSupported);
    EXPECT_EQ(ethernet()->SetAdminStatus(1), kNotSupported);
    EXPECT_EQ(ethernet()->GetOperStatus(), kNotSupported);
    EXPECT_EQ(ethernet()->GetLastChange(value, value), kNotSupported);
    for (auto const query : {&KVL::Ethernet::GetInOctets, &KVL::Ethernet::GetInUcastPkts,
                             &KVL::Ethernet::GetInDiscards, &KVL::Ethernet::GetInErrors,
                             &KVL::Ethernet::GetInUnknownProtos, &KVL::Ethernet::GetOutOctets,
                             &KVL::Ethernet::GetOutUcastPkts, &KVL::Ethernet::GetOutDiscards,
                             &KVL::Ethernet::GetOutErrors})
        EXPECT_EQ((ethernet().get()->*query)(), kNotSupported);
    for (auto const query :
         {&KVL::Ethernet::GetAlignmentErrors, &KVL::Ethernet::GetFCSErrors,
          &KVL::Ethernet::GetSingleCollisionFrames, &KVL::Ethernet::GetMultipleCollisionFrames,
          &KVL::Ethernet::GetSQETestErrors, &KVL::Ethernet::GetDeferredTransmissions,
          &KVL::Ethernet::GetLateCollisions, &KVL::Ethernet::GetExcessiveCollisions,
          &KVL::Ethernet::GetInternalMacTransmitErrors, &KVL::Ethernet::GetCarrierSenseErrors,
          &KVL::Ethernet::GetFrameTooLongs, &KVL::Ethernet::GetInternalMacReceiveErrors,
          &KVL::Ethernet::GetSymbolErrors, &KVL::Ethernet::GetDuplexStatus})
        EXPECT_EQ((ethernet().get()->*query)(), kNotSupported);
}

TEST_F(NetworkFeaturesTest, DeviceOfTheHostGoesBeforeTheSimulatedInterface) {
    plugIn(std::string(kSimulated) + ", ETHERNET_DEVICE: lo");
    EXPECT_EQ(ethernet()->GetType(), 24);
}

TEST_F(NetworkFeaturesTest, AddressesAreThoseOfTheBoard) {
    plugIn("ETHERNET_DEVICE: lo, IP_ADDRESS_0: 192.0.2.7, IP_MASK_0: 255.255.255.0, "
           "IP_BROADCAST_0: 192.0.2.255, IP_ADDRESS_1: 198.51.100.1, IP_ADDRESS_3: 203.0.113.9");
    EXPECT_EQ(addresses(), "192.0.2.7/255.255.255.0/192.0.2.255 198.51.100.1/0.0.0.0/0.0.0.0 ");
}

TEST_F(NetworkFeaturesTest, TextsThatAreNoAddressesAreSkipped) {
    plugIn("IP_ADDRESS_0: 192.0.2.256, IP_ADDRESS_1: 192.0.2, IP_ADDRESS_2: {text: nothing}, "
           "IP_ADDRESS_3: 192.0.2.1.1, IP_ADDRESS_4: 192.0.2.4, IP_MASK_4: 255.255, "
           "IP_BROADCAST_4: 192.0.2.-1");
    EXPECT_EQ(addresses(), "192.0.2.4/0.0.0.0/0.0.0.0 ");
}

TEST_F(NetworkFeaturesTest, BoardWhoseAddressesAreAllWrongHasNoIPInterface) {
    plugIn("ETHERNET_DEVICE: lo, IP_ADDRESS_0: here");
    EXPECT_EQ(feature<KVL::InterfaceFeature>().get(), nullptr);
}

TEST_F(NetworkFeaturesTest, AddressObjectsAreTheSameAtEveryCall) {
    plugIn("IP_ADDRESS_0: 192.0.2.7, IP_ADDRESS_1: 192.0.2.8");
    auto const first = ip()->GetFirstIPAddressConfig();
    EXPECT_EQ(ip()->GetFirstIPAddressConfig().get(), first.get());
    EXPECT_EQ(ip()->GetNextIPAddressConfig(first).get(), ip()->GetNextIPAddressConfig(first).get());
    EXPECT_EQ(ip()->GetNextIPAddressConfig(ip()->GetNextIPAddressConfig(first)).get(), nullptr);
}

TEST_F(NetworkFeaturesTest, IPInterfaceAnswersAsTheEthernetInterfaceBelowIt) {
    plugIn(std::string(kSimulated) + ", ETHERNET_SPEED: 100000000, ETHERNET_MTU: 1500, "
                                     "ETHERNET_IN_OCTETS: 11, ETHERNET_OUT_OCTETS: 12, "
                                     "IP_ADDRESS_0: 192.0.2.7");
    std::string description;
    char address[6];
    int length = 0;
    EXPECT_EQ(ip()->GetDescription(description), 0);
    EXPECT_EQ(description, "IP interface over Ethernet interface 02:00:5e:00:00:02");
    EXPECT_EQ(ip()->GetType(), 6);
    EXPECT_EQ(ip()->GetMTU(), 1500);
    EXPECT_EQ(ip()->GetSpeed(), 100000000);
    EXPECT_EQ(ip()->GetPhysAddress(address, length), 0);
    EXPECT_EQ(length, 6);
    EXPECT_EQ(ip()->GetInOctets(), 11);
    EXPECT_EQ(ip()->GetOutOctets(), 12);
    EXPECT_EQ(ip()->GetAdminStatus(), kNotSupported);
}

TEST_F(NetworkFeaturesTest, IPInterfaceOverTheLoopbackIsALoopback) {
    plugIn("ETHERNET_DEVICE: lo");
    EXPECT_EQ(ip()->GetType(), 24);
    EXPECT_EQ(ip()->GetOperStatus(), 1);
}

TEST_F(NetworkFeaturesTest, IPInterfaceWithoutEthernetHasItsAddressesOnly) {
    plugIn("IP_ADDRESS_0: 192.0.2.7");
    std::string description;
    int value = 0;
    char buffer[6];
    EXPECT_EQ(ip()->GetDescription(description), 0);
    EXPECT_EQ(description, "IP interface");
    EXPECT_EQ(addresses(), "192.0.2.7/0.0.0.0/0.0.0.0 ");
    EXPECT_EQ(ip()->GetPhysAddress(buffer, value), kNotSupported);
    EXPECT_EQ(ip()->SetAdminStatus(1), kNotSupported);
    EXPECT_EQ(ip()->GetLastChange(value, value), kNotSupported);
    for (auto const query : {&KVL::IPInterface::GetType, &KVL::IPInterface::GetMTU,
                             &KVL::IPInterface::GetSpeed, &KVL::IPInterface::GetAdminStatus,
                             &KVL::IPInterface::GetOperStatus, &KVL::IPInterface::GetInOctets,
                             &KVL::IPInterface::GetInUcastPkts, &KVL::IPInterface::GetInDiscards,
                             &KVL::IPInterface::GetInErrors, &KVL::IPInterface::GetInUnknownProtos,
                             &KVL::IPInterface::GetOutOctets, &KVL::IPInterface::GetOutUcastPkts,
                             &KVL::IPInterface::GetOutDiscards, &KVL::IPInterface::GetOutErrors})
        EXPECT_EQ((ip().get()->*query)(), kNotSupported);
}

TEST_F(NetworkFeaturesTest, FeaturesAreBackOnceAfterEveryStart) {
    plugIn("ETHERNET_DEVICE: lo");
    for (int round = 1; round <= 3; ++round) {
        stop();
        EXPECT_EQ(m_board->GetFeatureListSize(), 0);
        start();
        EXPECT_EQ(countFeatures<KVL::EthernetFeature>(), 1);
        EXPECT_EQ(countFeatures<KVL::InterfaceFeature>(), 1);
        EXPECT_EQ(m_board->GetFeatureListSize(), 2);
    }
}

} // namespace
