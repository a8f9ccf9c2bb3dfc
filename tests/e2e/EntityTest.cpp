// SPDX-License-Identifier: BSD-2-Clause
// The physical entities and their states, as the real agent serves them.
#include <algorithm>
#include <cstdio>
#include <map>

#include <gmock/gmock.h>

#include "agent/daemon/Options.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

constexpr char kEntity[] = "1.3.6.1.2.1.47";
constexpr char kPhysical[] = "1.3.6.1.2.1.47.1.1.1.1.";
constexpr char kAlias[] = "1.3.6.1.2.1.47.1.3.2.1.2";
constexpr char kContains[] = "1.3.6.1.2.1.47.1.3.3.1.1";
constexpr char kLastChange[] = "1.3.6.1.2.1.47.1.4.1.0";
constexpr char kState[] = "1.3.6.1.2.1.131.1.1.1.";

// As a receiver without the standard MIB modules prints them.
constexpr char kConfigChange[] = "SNMPv2-SMI::mib-2.47.2.0.1";
constexpr char kOperEnabled[] = "SNMPv2-SMI::mib-2.131.0.1";
constexpr char kOperDisabled[] = "SNMPv2-SMI::mib-2.131.0.2";

class EntityTest : public AgentFixture {
  protected:
    /// The values of a column by index, such as "17".
    std::map<std::string, std::string> column(std::string const& name) const {
        std::map<std::string, std::string> values;
        for (Answer const& answer : answers("snmpbulkwalk", {"-Oe", "-Cr50", name})) {
            if (answer.value.starts_with("No Such")) continue;
            std::string index;
            for (std::size_t i = parseOid(name)->size(); i < answer.name.size(); ++i)
                index += (index.empty() ? "" : ".") + std::to_string(answer.name[i]);
            values[index] = answer.value;
        }
        return values;
    }
    std::map<std::string, std::string> physical(int number) const {
        return column(kPhysical + std::to_string(number));
    }
    std::string state(int number, std::string const& entity) const {
        return get(kState + std::to_string(number) + "." + entity);
    }
    /// The index of the row in which a column has this text; "none" if there is none.
    std::string entityWith(int number, std::string const& text) const {
        for (auto const& [index, value] : physical(number))
            if (value == "STRING: \"" + text + "\"") return index;
        return "none";
    }
    std::string boardOf(std::string const& serialNumber) const {
        return entityWith(11, serialNumber);
    }
    std::string portNamed(std::string const& name) const { return entityWith(7, name); }
    long lastChange() const {
        std::string const value = get(kLastChange);
        auto const open = value.find('(');
        return open == std::string::npos ? -1 : std::stol(value.substr(open + 1));
    }
    std::string containerOf(std::string const& entity) const {
        return get(kPhysical + ("4." + entity)).substr(std::string("INTEGER: ").size());
    }
    /// The sysUpTime, in seconds, of every notification of that name.
    std::vector<double> uptimesOf(std::string const& notification) {
        std::vector<double> times;
        for (std::string const& line : linesOf(trapReceiver().output())) {
            int hours = 0;
            int minutes = 0;
            double seconds = 0;
            if (line.find(notification) != std::string::npos &&
                std::sscanf(line.c_str(), "%*s = 0:%d:%d:%lf", &hours, &minutes, &seconds) == 3)
                times.push_back(hours * 3600 + minutes * 60 + seconds);
        }
        return times;
    }
    /// A board of a chassis in the slot of its handle, with a processor and a line.
    static std::string boardInSlot(int handle, std::string const& serialNumber) {
        std::string const number = std::to_string(handle);
        return "  - handle: " + number + "\n    attributes: {SERIAL_NUMBER: " + serialNumber +
               ", PCI_SLOT_NUMBER: " + number + "}\n    devices: [{handle: " + number +
               "0, type: 501, attributes: {NAME: line-" + serialNumber +
               "}, line: {type: esf}}]\n    processors: [{handle: " + number + "1}]\n";
    }
};

TEST_F(EntityTest, ExampleChassisHasAnEntityForEveryPart) {
    startAgent();
    std::map<std::string, int> classes;
    for (auto const& [index, value] : physical(5))
        ++classes[value];
    EXPECT_EQ(classes["INTEGER: 3"], 1);  // the chassis
    EXPECT_EQ(classes["INTEGER: 5"], 3);  // slots
    EXPECT_EQ(classes["INTEGER: 9"], 3);  // boards
    EXPECT_EQ(classes["INTEGER: 12"], 4); // processors
    EXPECT_EQ(classes["INTEGER: 10"], 7); // ports
    EXPECT_THAT(classes, SizeIs(5));
    EXPECT_EQ(get(kLastChange), "Timeticks: (0) 0:00:00.00");
}

TEST_F(EntityTest, EveryEntityLeadsToTheChassis) {
    startAgent();
    auto const containers = physical(4);
    EXPECT_THAT(containers, SizeIs(18));
    for (auto const& [entity, container] : containers) {
        std::string at = entity;
        for (int steps = 0; containers.contains(at) && steps < 5; ++steps)
            at = containers.at(at).substr(std::string("INTEGER: ").size());
        EXPECT_EQ(at, "0") << entity;
    }
    // entPhysicalContainsTable agrees.
    auto const contains = column(kContains);
    EXPECT_THAT(contains, SizeIs(17));
    for (auto const& [pair, child] : contains) {
        auto const dot = pair.find('.');
        EXPECT_EQ(containers.at(pair.substr(dot + 1)), "INTEGER: " + pair.substr(0, dot));
        EXPECT_EQ(child, "INTEGER: " + pair.substr(dot + 1));
    }
}

TEST_F(EntityTest, BoardIsDescribed) {
    startAgent();
    std::string const board = boardOf("NX50001");
    EXPECT_EQ(physical(2).at(board), "STRING: \"Dual-span T1 trunk board\"");
    EXPECT_EQ(get(kPhysical + ("3." + board)), "OID: .0.0");
    EXPECT_EQ(physical(7).at(board), "STRING: \"NX5-T1\"");
    EXPECT_EQ(physical(9).at(board), "STRING: \"4.2.117\"");
    EXPECT_EQ(physical(16).at(board), "INTEGER: 1");
    std::string const slot = containerOf(board);
    EXPECT_EQ(physical(7).at(slot), "STRING: \"shelf 1 bus 2 slot 4\"");
    EXPECT_EQ(physical(6).at(slot), "INTEGER: 4");
}

TEST_F(EntityTest, BoardAndInterfacesLeadToTheirEntities) {
    startAgent();
    std::string const board = boardOf("NX50001");
    EXPECT_EQ(get("kvlBoardPhysicalIndex.1"), "INTEGER: " + board);
    std::string const port = portNamed("nx5-trunk-1");
    EXPECT_EQ(get("kvlInterfacePhysicalIndex.1000"), "INTEGER: " + port);
    EXPECT_EQ(get("kvlInterfaceBoardIndex.1000"), "INTEGER: 1");
    EXPECT_EQ(get("kvlInterfaceBoardSerialNumber.1000"), "STRING: NX50001");
    // Every interface belongs to a board and is somewhere in it.
    std::size_t const interfaces = column("1.3.6.1.2.1.2.2.1.1").size();
    auto const boards = column("1.3.6.1.4.1.32473.1.1.10.1.1.2");
    EXPECT_EQ(boards.size(), interfaces);
    auto const entities = column("1.3.6.1.4.1.32473.1.1.10.1.1.4");
    EXPECT_EQ(entities.size(), interfaces);
    auto const containers = physical(4);
    for (auto const& [index, entity] : entities) {
        std::string const own = get("kvlBoardPhysicalIndex." + boards.at(index).substr(9));
        EXPECT_TRUE(entity == own || containers.at(entity.substr(9)) == own) << index;
    }
}

TEST_F(EntityTest, PortIsMappedToTheInterfaceOfItsName) {
    startAgent();
    auto const aliases = column(kAlias);
    EXPECT_THAT(aliases, SizeIs(7));
    std::string const alias = aliases.at(portNamed("quillon-span-1") + ".0");
    // "OID: .1.3.6.1.2.1.2.2.1.1.1032"
    ASSERT_THAT(alias, HasSubstr("1.3.6.1.2.1.2.2.1.1."));
    std::string const index = alias.substr(alias.rfind('.') + 1);
    EXPECT_EQ(get("1.3.6.1.2.1.31.1.1.1.1." + index), "STRING: \"quillon-span-1\"");
}

TEST_F(EntityTest, WalkIsInOrderAndEveryInstanceCanBeAsked) {
    startAgent();
    for (char const* const from : {kEntity, "1.3.6.1.2.1.131"}) {
        auto const walked = walk(from);
        EXPECT_GT(walked.size(), 50U);
        EXPECT_EQ(std::ranges::adjacent_find(walked,
                                             [](Answer const& a, Answer const& b) {
                                                 return compare(a.name, b.name) >= 0;
                                             }),
                  walked.end());
        EXPECT_EQ(answers("snmpbulkwalk", {"-Cr50", from}), walked);
        for (std::size_t i = 0; i < walked.size(); i += 17) {
            std::string name;
            for (std::uint32_t const number : walked[i].name)
                name += "." + std::to_string(number);
            EXPECT_EQ(get(name), walked[i].value) << name;
        }
    }
}

TEST_F(EntityTest, PulledBoardIsGoneAndComesBackUnderItsIndices) {
    useChassis("boards:\n" + boardInSlot(1, "ONE") + boardInSlot(2, "TWO"));
    startWithReceiver();
    auto const before = physical(7);
    ASSERT_THAT(before, SizeIs(9)); // the chassis, and twice slot, board, processor and port
    std::string const board = boardOf("TWO");
    std::string const port = portNamed("line-TWO");

    sim({"remove", "2"});
    EXPECT_TRUE(trapReceiver().waitFor(kConfigChange)) << trapReceiver().output();
    auto const without = physical(7);
    EXPECT_THAT(without, SizeIs(5));
    EXPECT_FALSE(without.contains(board));
    EXPECT_EQ(state(3, board), "No Such Instance currently exists at this OID");
    long const removed = lastChange();
    EXPECT_GT(removed, 0);

    // The other slot is a new entity; the board keeps its index.
    write(path("board.yaml"), "boards:\n" + boardInSlot(5, "TWO"));
    sim({"insert", path("board.yaml")});
    EXPECT_TRUE(eventually([&] { return portNamed("line-TWO") == port; }));
    EXPECT_EQ(boardOf("TWO"), board);
    EXPECT_THAT(physical(7).at(containerOf(board)), HasSubstr("slot 5"));
    EXPECT_GT(lastChange(), removed);
    EXPECT_TRUE(trapReceiver().waitFor(kConfigChange, 2)) << trapReceiver().output();
    EXPECT_THAT(trapReceiver().output(), Not(HasSubstr(kOperDisabled)));
    EXPECT_THAT(trapReceiver().output(), Not(HasSubstr(kOperEnabled)));
}

TEST_F(EntityTest, ChangesWithinThePauseAreToldAtItsEnd) {
    startWithReceiver();
    sim({"remove", "1"});
    EXPECT_TRUE(trapReceiver().waitFor(kConfigChange)) << trapReceiver().output();
    sim({"remove", "2"});
    sim({"remove", "3"});
    EXPECT_TRUE(eventually([&] { return physical(5).size() == 1; }));
    EXPECT_TRUE(trapReceiver().waitFor(kConfigChange, 2)) << trapReceiver().output();
    auto const times = uptimesOf(kConfigChange);
    ASSERT_GE(times.size(), 2U);
    // Half of the pause, because a machine that stalls may send the first of two late.
    for (std::size_t i = 1; i < times.size(); ++i)
        EXPECT_GE(times[i] - times[i - 1], 2.5);
}

TEST_F(EntityTest, StoppedBoardIsLockedWhichIsNoFailure) {
    startWithReceiver();
    std::string const board = boardOf("NX50001");
    EXPECT_EQ(state(3, board), "INTEGER: 3");
    sim({"stop", "1"});
    EXPECT_TRUE(eventually([&] { return state(2, board) == "INTEGER: 2"; }));
    EXPECT_EQ(state(3, board), "INTEGER: 1");
    EXPECT_EQ(state(4, board), "INTEGER: 4");
    EXPECT_EQ(state(6, board), "INTEGER: 4");
    sim({"start", "1"});
    std::string const objects = "\tSNMPv2-SMI::mib-2.131.1.1.1.2." + board + " = ";
    EXPECT_TRUE(trapReceiver().waitFor(kOperEnabled + objects + "4")) << trapReceiver().output();
    // After the objects of the standard: whose state it is.
    EXPECT_TRUE(trapReceiver().waitFor("\tSNMPv2-SMI::mib-2.47.1.1.1.1.7." + board +
                                       " = \"NX5-T1\"\tSNMPv2-SMI::mib-2.47.1.1.1.1.14." + board +
                                       " = \"\"\tKVL-OAM-MIB::kvlBoardSerialNumber.1 = NX50001"))
        << trapReceiver().output();
    EXPECT_EQ(state(2, board), "INTEGER: 4");
    EXPECT_THAT(trapReceiver().output(), Not(HasSubstr(kOperDisabled)));
}

TEST_F(EntityTest, FailedBoardHasACriticalAlarm) {
    startWithReceiver();
    std::string const board = boardOf("NX50001");
    EXPECT_EQ(state(5, board), "Hex-STRING: 00 ");
    sim({"fail", "1"});
    EXPECT_TRUE(trapReceiver().waitFor(kOperDisabled)) << trapReceiver().output();
    EXPECT_THAT(trapReceiver().output(), HasSubstr("mib-2.131.1.1.1.5." + board + " = \" \""));
    EXPECT_EQ(state(2, board), "INTEGER: 1");
    EXPECT_EQ(state(3, board), "INTEGER: 2");
}

TEST_F(EntityTest, BrokenLineIsADisabledPortWithAnAlarm) {
    startWithReceiver();
    std::string const port = portNamed("nx5-trunk-2");
    EXPECT_EQ(state(3, port), "INTEGER: 3");
    EXPECT_EQ(state(5, port), "Hex-STRING: 00 ");
    sim({"line", "alarm", "102", "ais"});
    // Critical and major: the line has no frame, and receives AIS. The two bits are a printable 0.
    EXPECT_TRUE(eventually([&] { return state(5, port) == "STRING: \"0\""; })) << state(5, port);
    EXPECT_EQ(state(3, port), "INTEGER: 2");
    EXPECT_TRUE(trapReceiver().waitFor(std::string(kOperDisabled) +
                                       "\tSNMPv2-SMI::mib-2.131.1.1.1.2." + port + " = 4"))
        << trapReceiver().output();
    sim({"line", "mend", "102"});
    EXPECT_TRUE(eventually([&] { return state(3, port) == "INTEGER: 3"; }));
}

TEST_F(EntityTest, PortIsBusyWhateverItsCalls) {
    startAgent();
    std::string const port = portNamed("vorn-primary-rate-1");
    EXPECT_EQ(state(4, port), "INTEGER: 4");
    sim({"call", "setup", "301"});
    // A bearer channel, which is dormant without a call, is up.
    EXPECT_TRUE(eventually([this] {
        auto const states = column("1.3.6.1.2.1.10.20.1.2.1.1.2");
        return std::ranges::any_of(
            states, [](auto const& channel) { return channel.second != "INTEGER: 1"; });
    }));
    EXPECT_EQ(state(4, port), "INTEGER: 4");
}

TEST_F(EntityTest, EveryBoardProcessorAndPortHasStates) {
    startAgent();
    auto const classes = physical(5);
    auto const states = column(kState + std::string("3"));
    EXPECT_THAT(states, SizeIs(3 + 4 + 7));
    for (auto const& [entity, value] : states) {
        EXPECT_THAT(classes.at(entity),
                    ::testing::AnyOf("INTEGER: 9", "INTEGER: 10", "INTEGER: 12"));
        // The platform does not tell how processors are.
        bool const isProcessor = classes.at(entity) == "INTEGER: 12";
        if (isProcessor) {
            EXPECT_EQ(value, "INTEGER: 1") << entity;
        }
    }
}

TEST_F(EntityTest, IndicesAreTheSameAfterARestart) {
    startAgent();
    sim({"remove", "1"});
    EXPECT_TRUE(eventually([&] { return boardOf("NX50001") == "none"; }));
    auto const before = physical(7);
    EXPECT_EQ(stopAgent(), 0);
    // The original chassis again: its entities have their original indices.
    startAgent();
    auto const after = physical(7);
    EXPECT_GT(after.size(), before.size());
    EXPECT_TRUE(std::ranges::all_of(before, [&](auto const& entity) {
        auto const found = after.find(entity.first);
        return found != after.end() && found->second == entity.second;
    }));
}

TEST_F(EntityTest, StatesCannotBeWritten) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    Result const set = ask("snmpset", {kState + ("2." + boardOf("NX50001")), "i", "2"});
    EXPECT_NE(set.status, 0);
    EXPECT_THAT(set.output, HasSubstr("notWritable"));
    EXPECT_EQ(state(2, boardOf("NX50001")), "INTEGER: 4");
}

TEST_F(EntityTest, NamesThatAnOperatorGivesShowAtOnceAndSurviveARestart) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    std::string const board = boardOf("NX50001");
    std::map<std::string, std::string> const names{
        {"14." + board, "trunks west"}, {"15." + board, "004711"}, {"18.1", "urn:example:rack-7"}};
    std::vector<std::string> arguments;
    for (auto const& [instance, name] : names) {
        EXPECT_EQ(get(kPhysical + instance), "\"\"");
        arguments.insert(arguments.end(), {kPhysical + instance, "s", name});
    }
    EXPECT_EQ(ask("snmpset", arguments).status, 0);
    auto const expectNames = [&] {
        for (auto const& [instance, name] : names)
            EXPECT_EQ(get(kPhysical + instance), "STRING: \"" + name + "\"");
    };
    expectNames();
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startAgent();
    expectNames();
}

TEST_F(EntityTest, NameThatAnOperatorGivesIsAChangeOfEntities) {
    startWithReceiver("rwcommunity");
    EXPECT_EQ(lastChange(), 0);
    EXPECT_EQ(ask("snmpset", {kPhysical + std::string("14.1"), "s", "rack 7"}).status, 0);
    EXPECT_TRUE(trapReceiver().waitFor(kConfigChange)) << trapReceiver().output();
    EXPECT_GT(lastChange(), 0);
}

TEST_F(EntityTest, NameThatDoesNotFitIsRefused) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    auto const refusal = [this](std::vector<std::string> const& arguments) {
        return ask("snmpset", arguments).output;
    };
    std::string const alias = kPhysical + std::string("14.1");
    EXPECT_THAT(refusal({alias, "s", std::string(33, 'a')}), HasSubstr("wrongLength"));
    EXPECT_THAT(refusal({alias, "x", "1b5b324a"}), HasSubstr("wrongValue"));
    EXPECT_THAT(refusal({alias, "i", "1"}), HasSubstr("wrongType"));
    EXPECT_THAT(refusal({kPhysical + std::string("14.4711"), "s", "x"}), HasSubstr("noCreation"));
    EXPECT_THAT(refusal({alias, "s", "x", kPhysical + std::string("7.1"), "s", "x"}),
                HasSubstr("notWritable"));
    EXPECT_EQ(get(alias), "\"\"");
}

} // namespace
} // namespace kvloamd::e2e
