// SPDX-License-Identifier: BSD-2-Clause
// The system group, as the agent serves it alone.
#include <sys/utsname.h>

#include <algorithm>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

constexpr char kSystem[] = "1.3.6.1.2.1.1.";

class SystemTest : public AgentFixture {
  protected:
    std::string system(int number) const { return get(kSystem + std::to_string(number) + ".0"); }
    std::vector<std::string> column(std::string const& name) const {
        std::vector<std::string> values;
        for (Answer const& answer : walk(name))
            values.push_back(answer.value);
        return values;
    }
};

TEST_F(SystemTest, DescriptionNamesTheProductItsVersionAndTheHost) {
    startAgent();
    utsname host{};
    ASSERT_EQ(uname(&host), 0);
    EXPECT_THAT(system(1), StartsWith("STRING: \"KVL OAM agent kvloamd "));
    std::string const version = get("kvlAgentVersion.0");
    EXPECT_THAT(system(1), HasSubstr(version.substr(version.find(' ') + 1)));
    EXPECT_THAT(system(1), HasSubstr(host.nodename));
}

TEST_F(SystemTest, ObjectIdIsOursBelowTheEnterpriseArc) {
    startAgent();
    EXPECT_EQ(system(2), "OID: .1.3.6.1.4.1.32473.1.4.1");
    EXPECT_EQ(stopAgent(), 0);
    startAgent({"--enterprise-oid", "1.3.6.1.4.1.99999"});
    EXPECT_EQ(system(2), "OID: .1.3.6.1.4.1.99999.1.4.1");
}

TEST_F(SystemTest, ConfigurationDescribesTheSystemOtherwise) {
    configureSnmp("rocommunity public 127.0.0.1\n"
                  "sysobjectid .1.3.6.1.4.1.99999.7\n"
                  "sysdescr Exchange 4\n"
                  "sysservices 76\n");
    startAgent();
    EXPECT_EQ(system(1), "STRING: \"Exchange 4\"");
    EXPECT_EQ(system(2), "OID: .1.3.6.1.4.1.99999.7");
    EXPECT_EQ(system(7), "INTEGER: 76");
}

TEST_F(SystemTest, EveryObjectOfTheMandatoryGroupsIsServed) {
    startAgent();
    for (int const number : {1, 2, 3, 4, 5, 6, 7, 8})
        EXPECT_THAT(system(number), Not(HasSubstr("No Such"))) << number;
    EXPECT_EQ(system(7), "INTEGER: 72");
    for (char const* const name :
         {"1.3.6.1.2.1.11.1.0", "1.3.6.1.2.1.11.3.0", "1.3.6.1.2.1.11.4.0", "1.3.6.1.2.1.11.5.0",
          "1.3.6.1.2.1.11.6.0", "1.3.6.1.2.1.11.30.0", "1.3.6.1.2.1.11.31.0", "1.3.6.1.2.1.11.32.0",
          "1.3.6.1.6.3.1.1.6.1.0"})
        EXPECT_THAT(get(name), Not(HasSubstr("No Such"))) << name;
}

TEST_F(SystemTest, OurModulesAreListed) {
    startAgent();
    auto const ids = column("1.3.6.1.2.1.1.9.1.2");
    for (char const* const id :
         {"OID: .1.3.6.1.4.1.32473.1.3.1", "OID: .1.3.6.1.4.1.32473.1", "OID: .1.3.6.1.2.1.31",
          "OID: .1.3.6.1.2.1.10.18", "OID: .1.3.6.1.2.1.10.20", "OID: .1.3.6.1.2.1.35",
          "OID: .1.3.6.1.2.1.47", "OID: .1.3.6.1.2.1.131"})
        EXPECT_THAT(ids, Contains(id));
    EXPECT_THAT(column("1.3.6.1.2.1.1.9.1.3"), Contains("STRING: \"The MIB module IF-MIB\""));
    EXPECT_EQ(column("1.3.6.1.2.1.1.9.1.4").size(), ids.size());
}

} // namespace
} // namespace kvloamd::e2e
