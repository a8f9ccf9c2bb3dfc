// SPDX-License-Identifier: BSD-2-Clause
// Answers to HTTP requests, from a snapshot that the test makes.
#pragma once

#include <memory>
#include <optional>
#include <string_view>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "agent/fronts/http/HttpAnswers.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "board/Board.h"
#include "board/ISDNChannel.h"

namespace kvloamd {

using Json = nlohmann::json;

inline DescribedObjects allObjects() {
    DescribedObjects objects{tables(), {scalars(), standardScalars()}};
    auto const standard = standardTables();
    objects.tables.insert(objects.tables.end(), standard.begin(), standard.end());
    return objects;
}

/// Board NX50001 with line trunk-1, which has two closed intervals and a channel; board 77.
class HttpAnswersFixture : public ::testing::Test {
  protected:
    HttpAnswersFixture() {
        m_snapshot->number = 7;
        m_snapshot->begun = Clock::now();
        BoardRow board;
        board.boardIndex = 1;
        board.status = BoardStatusStarted;
        board.serialNumber = "NX50001";
        BoardRow other;
        other.boardIndex = 2;
        other.serialNumber = "77";
        m_snapshot->boards = {board, other};
        InterfaceRow line;
        line.ifIndex = 1000;
        line.boardIndex = 1;
        line.name = "trunk-1";
        line.operStatus = kUp;
        line.counters[kInOctets] = 0xfffffffffffffffeU;
        InterfaceRow channel;
        channel.ifIndex = 1001;
        channel.boardIndex = 1;
        channel.name = "trunk-1/1";
        m_snapshot->interfaces.interfaces = {line, channel};
        auto closed = std::make_shared<ClosedIntervals>();
        closed->counts = {LineCounts{3, 2, 1}, LineCounts{}};
        closed->valid = {true, false};
        LineRow row;
        row.ifIndex = 1000;
        row.lineStatus = 64;
        row.timeElapsed = 100;
        row.closed = closed;
        m_snapshot->interfaces.lines = {row};
        countIntervals(m_snapshot->interfaces);
        BearerRow bearer;
        bearer.ifIndex = 1001;
        m_snapshot->interfaces.bearers = {bearer};
        m_snapshot->interfaces.stack = {{0, 1001}, {1000, 0}, {1001, 1000}};
        m_snapshot->interfaces.ds0Channels = {{1000, 5, 1001}};
    }

    HttpAnswer ask(HttpRequest const& request) { return m_answers.answer(request); }
    HttpAnswer get(std::string_view target) {
        return ask({.method = "GET", .target = target, .isLocal = true});
    }
    Json document(std::string_view target) {
        HttpAnswer const answer = get(target);
        EXPECT_EQ(answer.status, 200) << target << ": " << *answer.body;
        return Json::parse(*answer.body);
    }
    static HttpRequest byTcp(std::string_view host) {
        return {.method = "GET", .target = "/api/v1/boards", .host = host};
    }

    std::shared_ptr<Snapshot> m_snapshot = std::make_shared<Snapshot>();
    Counters m_counters;
    Settings m_settings;
    JournalQuery m_asked;
    std::optional<JournalPage> m_journal = JournalPage{};
    std::uint32_t m_newest = 0;
    HttpAnswers m_answers{{allObjects(), m_counters, m_settings, [this] { return m_snapshot; },
                           [this](JournalQuery const& query) {
                               m_asked = query;
                               return m_journal;
                           },
                           [this] { return m_newest; }},
                          "gw1.example"};
};

} // namespace kvloamd
