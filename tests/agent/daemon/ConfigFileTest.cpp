// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/ConfigFile.h"

#include <sstream>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Pair;

class ConfigFileTest : public ::testing::Test {
  protected:
    std::map<std::string, int> check(std::string const& text) {
        std::istringstream file(text);
        return checkConfigFile(file, {"port", "module"});
    }
    /// The fault of a file: "2: what it is".
    std::string fault(std::string const& text) {
        try {
            check(text);
        } catch (ConfigFault const& found) {
            return std::to_string(found.line()) + ": " + found.what();
        }
        return "none";
    }
};

TEST_F(ConfigFileTest, LineOfEachKeyIsReturned) {
    EXPECT_THAT(check("# modules\n\nmodule = [\"a\", 'b', c] # three\r\nport=1161\n"),
                ElementsAre(Pair("module", 3), Pair("port", 4)));
}

TEST_F(ConfigFileTest, MarksInQuotesAreText) {
    EXPECT_EQ(fault("module = \"a # ] = b\"\n"), "none");
}

TEST_F(ConfigFileTest, EmptyListIsAccepted) {
    EXPECT_EQ(fault("module = []\n"), "none");
}

TEST_F(ConfigFileTest, LastLineNeedsNoEnd) {
    EXPECT_EQ(fault("port = 1161"), "none");
}

TEST_F(ConfigFileTest, UnclosedListIsRefused) {
    for (char const* const text : {"[", "[\"a\"", "[\"a\",", "[a, # b]"})
        EXPECT_THAT(fault("\nmodule = " + std::string(text) + "\nport = 1\n"),
                    HasSubstr("2: the list is not closed"))
            << text;
}

TEST_F(ConfigFileTest, UnclosedTextIsRefused) {
    EXPECT_THAT(fault("module = \"a\n"), HasSubstr("1: the text is not closed"));
}

TEST_F(ConfigFileTest, LineThatIsNoAssignmentIsRefused) {
    for (char const* const text : {"port : 1161", "port", "[default]", "= 1161"})
        EXPECT_THAT(fault(text), HasSubstr("1: this is not of the form key = value")) << text;
}

TEST_F(ConfigFileTest, MissingValueIsRefused) {
    for (char const* const text : {"port =", "port = # 1161", "module = [a,,b]"})
        EXPECT_THAT(fault(text), HasSubstr("1: there is no value")) << text;
}

TEST_F(ConfigFileTest, UnknownKeyIsRefused) {
    EXPECT_THAT(fault("prot = 1161"), HasSubstr("1: unknown key 'prot'"));
}

TEST_F(ConfigFileTest, KeyThatIsSetTwiceIsRefused) {
    EXPECT_THAT(fault("port = 1\nport = 2\n"), HasSubstr("2: 'port' is set in line 1 already"));
}

TEST_F(ConfigFileTest, TextAfterTheValueIsRefused) {
    for (char const* const text : {"port = 1161 1162", "module = [a] b", "port = \"1\"2"})
        EXPECT_THAT(fault(text), HasSubstr("1: something follows the value")) << text;
}

} // namespace
} // namespace kvloamd
