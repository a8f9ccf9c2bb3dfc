// SPDX-License-Identifier: BSD-2-Clause
// SNMP implementations other than Net-SNMP see the values that Net-SNMP's tools see.
#include <iostream>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class ClientsTest : public AgentFixture {
  protected:
    ClientsTest() {
        configureSnmp("rocommunity public 127.0.0.1\n"
                      "createUser op SHA authpass1 AES privpass1\n"
                      "rouser op priv\n");
    }
    void serve() {
        startAgent();
        // The past of the lines ends with a whole interval, which the first live second closes.
        ASSERT_TRUE(eventually([this] {
            return std::stoi(get("1.3.6.1.2.1.10.18.6.1.3.1000").substr(sizeof "INTEGER:")) < 600;
        }));
    }
    /// The check prints how many values it compared.
    void expectAgrees(std::vector<std::string> const& command) {
        Result const check = run(command);
        std::cout << check.output;
        EXPECT_EQ(check.status, 0);
    }
};

TEST_F(ClientsTest, PySnmpWalksWithACommunity) {
    serve();
    expectAgrees({SOURCE_DIR "/tests/clients/check-pysnmp", address(), "v2c"});
}

TEST_F(ClientsTest, PySnmpWalksWithAUser) {
    serve();
    expectAgrees({SOURCE_DIR "/tests/clients/check-pysnmp", address(), "v3"});
}

TEST_F(ClientsTest, PrometheusExporterScrapesInterfacesLinesAndBoards) {
    serve();
    expectAgrees({SOURCE_DIR "/tests/clients/check-exporter", SOURCE_DIR, address()});
}

TEST_F(ClientsTest, CheckFindsAValueThatDiffers) {
    serve();
    editWalks(R"(s/^\(\.1\.3\.6\.1\.2\.1\.10\.18\.6\.1\.5\.1000 = INTEGER:\).*/\1 77/)");
    Result const check = run({SOURCE_DIR "/tests/clients/check-exporter", SOURCE_DIR, address()});
    EXPECT_NE(check.status, 0);
    EXPECT_THAT(check.output, HasSubstr("1.3.6.1.2.1.10.18.6.1.5.1000 is "));
    EXPECT_THAT(check.output, HasSubstr("snmpbulkwalk says 77"));
}

} // namespace
} // namespace kvloamd::e2e
