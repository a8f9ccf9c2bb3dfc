// SPDX-License-Identifier: BSD-2-Clause
// KVL-OAM-MIB is valid, and the agent's descriptions agree with it.
#include <fstream>
#include <sstream>

#include <gmock/gmock.h>

#include "agent/notifications/Notification.h"
#include "agent/objects/OwnObjects.h"
#include "board/Board.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

class MibTest : public AgentFixture {
  protected:
    /// The output of smilint for `file`, without the host's configuration.
    Result lint(std::string const& file) {
        write(path("smi.conf"), "path " MIB_PATH "\n");
        return run({"smilint", "-c", path("smi.conf"), "-l", "4", file});
    }
    /// The number of the object with this name in the MIB module.
    std::string numberOf(std::string const& name) {
        Result const result = snmp("snmptranslate", {"-On", "KVL-OAM-MIB::" + name});
        return result.output.substr(0, result.output.find('\n'));
    }
    /// The base type of an object's syntax in the MIB module.
    std::string syntaxOf(std::string const& name) {
        Result const result = snmp("snmptranslate", {"-Td", "KVL-OAM-MIB::" + name});
        auto const at = result.output.find("SYNTAX");
        if (at == std::string::npos) return result.output;
        std::istringstream words(result.output.substr(at));
        std::string keyword;
        std::string type;
        words >> keyword >> type;
        return type;
    }
    static std::string place(Oid const& relative) {
        std::string text = ".1.3.6.1.4.1.32473";
        for (std::uint32_t const number : relative)
            text += "." + std::to_string(number);
        return text;
    }
    static ::testing::Matcher<std::string> syntaxFor(ValueType type) {
        switch (type) {
        case ValueType::Integer:
            return ::testing::AnyOf("Integer32", "INTEGER");
        case ValueType::Counter:
            return ::testing::Eq("Counter32");
        case ValueType::Counter64:
            return ::testing::Eq("Counter64");
        case ValueType::Gauge:
            return ::testing::AnyOf("Gauge32", "Unsigned32");
        case ValueType::TimeTicks:
        case ValueType::BeginStamp:
        case ValueType::TimeStamp: // a textual convention of TimeTicks
            return ::testing::Eq("TimeTicks");
        case ValueType::ObjectId:
            return ::testing::Eq("OBJECT");
        case ValueType::Text:
        case ValueType::Octets:
        case ValueType::Date:
            break;
        }
        return ::testing::Eq("OCTET");
    }
    void expectDescribed(std::string const& name, Oid const& relative, ValueType type) {
        EXPECT_EQ(numberOf(name), place(relative)) << name;
        EXPECT_THAT(syntaxOf(name), syntaxFor(type)) << name;
    }
    /// `notification`: below no arc.
    void expectCarried(Notification const& notification, std::vector<std::string> const& names) {
        ASSERT_EQ(notification.objects.size(), names.size());
        for (std::size_t i = 0; i < names.size(); ++i) {
            NotifiedObject const& object = notification.objects[i];
            ASSERT_EQ(object.name.back(), 0U);
            expectDescribed(names[i], {object.name.begin(), object.name.end() - 1}, object.type);
        }
    }
};

TEST_F(MibTest, ModuleIsValid) {
    EXPECT_THAT(lint(MIB_DIR "/KVL-OAM-MIB.txt").output, IsEmpty());
}

TEST_F(MibTest, CheckFindsAFault) {
    std::ifstream file(MIB_DIR "/KVL-OAM-MIB.txt");
    std::string text((std::istreambuf_iterator<char>(file)), {});
    auto const at = text.find("::= { kvlBoards 1 }");
    ASSERT_NE(at, std::string::npos);
    text.replace(at, 19, "::= { kvlBordas 1 }");
    write(path("KVL-OAM-MIB.txt"), text);
    EXPECT_THAT(lint(path("KVL-OAM-MIB.txt")).output, HasSubstr("kvlBordas"));
}

TEST_F(MibTest, ScalarsAreWhereTheModuleSays) {
    ASSERT_THAT(scalars(), Not(IsEmpty()));
    for (Scalar const& scalar : scalars())
        expectDescribed(scalar.name, scalar.place, scalar.type);
}

TEST_F(MibTest, ColumnsAreWhereTheModuleSays) {
    for (Table const* const table : tables()) {
        ASSERT_GT(table->columnCount(), 0U);
        Oid const& entry = table->entry();
        EXPECT_EQ(numberOf(table->name()), place({entry.begin(), entry.end() - 1}));
        for (std::size_t column = 0; column < table->columnCount(); ++column) {
            ColumnHead const head = table->column(column);
            Oid where = entry;
            where.push_back(head.number);
            expectDescribed(head.name, where, head.type);
        }
    }
}

TEST_F(MibTest, NotificationsAreWhereTheModuleSays) {
    EXPECT_EQ(numberOf("kvlBoardStatusChange"), place(kBoardStatusChangePlace));
    EXPECT_EQ(numberOf("kvlFaultRaised"), place(kFaultRaisedPlace));
    EXPECT_EQ(numberOf("kvlFaultCleared"), place(kFaultClearedPlace));
    EXPECT_EQ(numberOf("kvlNotifyObjects"), place(kNotifyObjectsPlace));
}

TEST_F(MibTest, NotificationsCarryWhatTheModuleSays) {
    expectCarried(boardStatusNotification({}, 1, "A", BoardStatusAdded),
                  {"kvlNotifyBoardIndex", "kvlNotifyBoardSerialNumber", "kvlNotifyBoardStatus"});
    expectCarried(faultNotification({}, FaultChange{}),
                  {"kvlNotifyBoardIndex", "kvlNotifyBoardSerialNumber", "kvlNotifyFaultValue",
                   "kvlNotifyFaultPlatformBoard", "kvlNotifyFaultKind"});
}

TEST_F(MibTest, EveryReadableObjectOfTheModuleIsDescribed) {
    std::size_t described = scalars().size();
    for (Table const* const table : tables())
        described += table->columnCount();
    Result const tree = snmp("snmptranslate", {"-Tp", "KVL-OAM-MIB::kvl"});
    std::size_t readable = 0;
    for (std::string const& line : linesOf(tree.output))
        if (line.find(" -R-- ") != std::string::npos || line.find(" -RW- ") != std::string::npos)
            ++readable;
    EXPECT_EQ(readable, described);
}

} // namespace
} // namespace kvloamd::e2e
