// SPDX-License-Identifier: BSD-2-Clause
// The capability statement is valid and agrees with what the agent serves.
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>

#include <gmock/gmock.h>

#include "agent/objects/StandardObjects.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::ContainsRegex;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

constexpr char kFolder[] = MIB_DIR "/capabilities";
constexpr char kStatement[] = MIB_DIR "/capabilities/KVL-OAM-CAPABILITIES-MIB.txt";

std::string contentOf(std::string const& file) {
    std::ifstream stream(file);
    return {std::istreambuf_iterator<char>(stream), {}};
}

/// The first group of every match of `pattern`.
std::vector<std::string> found(std::string const& text, std::string const& pattern) {
    std::regex const expression(pattern);
    std::vector<std::string> all;
    for (std::sregex_iterator match(text.begin(), text.end(), expression), end; match != end;
         ++match)
        all.push_back((*match)[1]);
    return all;
}

class CapabilitiesTest : public AgentFixture {
  protected:
    CapabilitiesTest() {
        for (auto const& file : std::filesystem::directory_iterator(kFolder))
            if (file.path() != kStatement) readStandIn(contentOf(file.path()));
    }

    /// The output of smilint for `file`, without the host's configuration.
    Result lint(std::string const& file) {
        write(path("smi.conf"), std::string("path ") + MIB_PATH + ":" + kFolder + "\n");
        return run({"smilint", "-c", path("smi.conf"), "-l", "4", file});
    }
    /// The object identifiers, below mib-2, that the agent serves from standard modules.
    static std::map<std::string, Oid> served() {
        std::map<std::string, Oid> places;
        for (Scalar const& scalar : standardScalars())
            places[scalar.name] = scalar.place;
        for (Table const* const table : standardTables())
            for (std::size_t column = 0; column < table->columnCount(); ++column) {
                ColumnHead const head = table->column(column);
                places[head.name] = joined(table->entry(), Oid{head.number});
            }
        return places;
    }
    /// The leaf objects of the stand-in modules.
    std::set<std::string> objects() const {
        std::set<std::string> names;
        for (auto const& [name, place] : m_places)
            if (!m_parents.contains(name) && !std::regex_search(name, std::regex("Group2?$")))
                names.insert(name);
        return names;
    }
    /// The objects whose VARIATION states this access.
    static std::set<std::string> stated(std::string const& access) {
        auto const names =
            found(contentOf(kStatement), "VARIATION (\\w+)\\s+ACCESS " + access + "\\s");
        return {names.begin(), names.end()};
    }

    std::map<std::string, Oid> m_places; ///< below mib-2
    std::set<std::string> m_parents;

  private:
    void readStandIn(std::string const& text) {
        std::regex const line("(\\S+) +OBJECT IDENTIFIER ::= \\{ (\\S+) (\\d+) \\}");
        for (std::sregex_iterator match(text.begin(), text.end(), line), end; match != end;
             ++match) {
            std::string const parent = (*match)[2];
            Oid place = parent == "mib-2" ? Oid{} : m_places.at(parent);
            place.push_back(static_cast<std::uint32_t>(std::stoul((*match)[3])));
            m_places[(*match)[1]] = place;
            m_parents.insert(parent);
        }
    }
};

TEST_F(CapabilitiesTest, ModulesAreValid) {
    int checked = 0;
    for (auto const& file : std::filesystem::directory_iterator(kFolder)) {
        if (file.path().extension() != ".txt") continue;
        EXPECT_THAT(lint(file.path()).output, IsEmpty());
        ++checked;
    }
    EXPECT_GT(checked, 4);
}

TEST_F(CapabilitiesTest, CheckFindsAnObjectThatDoesNotExist) {
    std::string const text =
        std::regex_replace(contentOf(kStatement), std::regex("ifAdminStatus"), "ifAdmniStatus");
    write(path("KVL-OAM-CAPABILITIES-MIB.txt"), text);
    EXPECT_THAT(lint(path("KVL-OAM-CAPABILITIES-MIB.txt")).output, HasSubstr("ifAdmniStatus"));
}

TEST_F(CapabilitiesTest, EveryServedObjectIsWhereItsStandInSays) {
    for (auto const& [name, place] : served()) {
        ASSERT_TRUE(m_places.contains(name)) << name;
        EXPECT_EQ(m_places.at(name), place) << name;
    }
}

TEST_F(CapabilitiesTest, ObjectsThatAreNotServedAreStatedAsNotImplemented) {
    auto const places = served();
    std::set<std::string> missing;
    for (std::string const& name : objects())
        if (!places.contains(name)) missing.insert(name);
    EXPECT_THAT(missing, Not(IsEmpty()));
    EXPECT_EQ(stated("not-implemented"), missing);
}

TEST_F(CapabilitiesTest, ColumnsThatCanBeSetAreNotStatedAsReadOnly) {
    auto const readOnly = stated("read-only");
    std::set<std::string> settable;
    for (Table const* const table : standardTables())
        for (std::size_t column = 0; column < table->columnCount(); ++column)
            if (ColumnHead const head = table->column(column); head.writable)
                settable.insert(head.name);
    EXPECT_THAT(settable, Not(IsEmpty()));
    for (std::string const& name : settable)
        EXPECT_FALSE(readOnly.contains(name)) << name;
}

TEST_F(CapabilitiesTest, EveryGroupOfTheOwnModuleIsIncluded) {
    auto const groups =
        found(contentOf(MIB_DIR "/KVL-OAM-MIB.txt"), "\n(\\w+) (?:OBJECT|NOTIFICATION)-GROUP\n");
    EXPECT_THAT(groups, Not(IsEmpty()));
    std::string const statement = contentOf(kStatement);
    for (std::string const& group : groups)
        EXPECT_THAT(statement, ContainsRegex("[ ]" + group + "[,\n]")) << group;
}

} // namespace
} // namespace kvloamd::e2e
