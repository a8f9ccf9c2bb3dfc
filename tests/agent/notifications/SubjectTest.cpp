// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/SubjectObjects.h"

#include <gmock/gmock.h>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

Oid const kEnterprise{1, 3, 6, 1, 4, 1, 32473};

/// Board 2, which is the entity 17, has the interface 1000, which is the entity 18.
class SubjectTest : public ::testing::Test {
  protected:
    SubjectTest() {
        BoardRow& board = m_snapshot.boards.emplace_back();
        board.boardIndex = 2;
        board.name = "NX5-T1";
        board.serialNumber = "NX50001";
        InterfaceRow& interface = m_snapshot.interfaces.interfaces.emplace_back();
        interface.ifIndex = 1000;
        interface.boardIndex = 2;
        interface.name = "trunk-1";
        PhysicalEntities physical;
        PhysicalRow& module = physical.entities.emplace_back();
        module.entity = 17;
        module.boardIndex = 2;
        module.name = "NX5-T1";
        PhysicalRow& port = physical.entities.emplace_back();
        port.entity = 18;
        port.ifIndex = 1000;
        port.name = "trunk-1";
        m_snapshot.entities.physical = std::make_shared<PhysicalEntities>(physical);
        m_settings.exchange({Setting::InterfaceAlias, 1000}, "T1-0001");
        m_settings.exchange({Setting::EntityAlias, 17}, "west");
    }
    /// The texts that are appended to a notification about `subject`; each one is what a GET
    /// answers.
    std::vector<std::string> appended(Subject subject) {
        Notification notification{{1, 3}, {{{1, 7}, ValueType::Integer, 7}}, {}, subject};
        nameSubject(notification, m_trees, m_facts);
        EXPECT_EQ(notification.objects.front().name, (Oid{1, 7}));
        std::vector<std::string> texts;
        for (std::size_t i = 1; i < notification.objects.size(); ++i) {
            NotifiedObject const& object = notification.objects[i];
            EXPECT_EQ(octetsOf(get(object.name)), octetsOf(object.view()));
            texts.push_back(std::get<std::string>(object.value));
        }
        return texts;
    }
    Value get(Oid const& name) const {
        Instance found;
        for (ServedTree const& tree : m_trees)
            if (startsWith(name, tree.arc) &&
                tree.tree.find(m_facts, OidView(name).subspan(tree.arc.size()), found) ==
                    Lookup::Found)
                return found.value;
        return {};
    }

    std::vector<Table const*> const m_ownTables = tables();
    std::vector<Table const*> const m_standardTables = standardTables();
    ObjectTree const m_own{scalars(), m_ownTables};
    ObjectTree const m_standard{standardScalars(), m_standardTables};
    std::vector<ServedTree> const m_trees{{m_own, kEnterprise, {}}, {m_standard, kStandardArc, {}}};
    Snapshot m_snapshot;
    Counters m_counters;
    Settings m_settings;
    Facts const m_facts{m_snapshot, m_counters, &m_settings};
};

TEST_F(SubjectTest, InterfaceIsNamedWithItsBoard) {
    EXPECT_THAT(appended({.ifIndex = 1000}), ElementsAre("trunk-1", "T1-0001", "NX50001"));
}

TEST_F(SubjectTest, BoardAsAnEntityIsNamed) {
    EXPECT_THAT(appended({.entity = 17}), ElementsAre("NX5-T1", "west", "NX50001"));
}

TEST_F(SubjectTest, PortIsNamedWithItsBoard) {
    EXPECT_THAT(appended({.entity = 18}), ElementsAre("trunk-1", "", "NX50001"));
}

TEST_F(SubjectTest, BoardIsNamed) {
    EXPECT_THAT(appended({.boardIndex = 2}), ElementsAre("NX5-T1"));
}

TEST_F(SubjectTest, WhatIsNotThereAnyMoreIsLeftOut) {
    EXPECT_THAT(appended({.ifIndex = 1001}), IsEmpty());
    EXPECT_THAT(appended({.entity = 19}), IsEmpty());
    EXPECT_THAT(appended({.boardIndex = 3}), IsEmpty());
    m_snapshot.boards.clear();
    EXPECT_THAT(appended({.ifIndex = 1000}), ElementsAre("trunk-1", "T1-0001"));
}

TEST_F(SubjectTest, NotificationWithoutASubjectStaysAsItIs) {
    EXPECT_THAT(appended({}), IsEmpty());
}

} // namespace
} // namespace kvloamd
