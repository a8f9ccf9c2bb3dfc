// SPDX-License-Identifier: BSD-2-Clause
// What the answers to HTTP requests contain.
#include <gmock/gmock.h>

#include "tests/agent/fronts/http/HttpAnswersFixture.h"

namespace kvloamd {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

using HttpAnswersTest = HttpAnswersFixture;

TEST_F(HttpAnswersTest, BoardsAreListedWithShortKeys) {
    Json const answer = document("/api/v1/boards");
    EXPECT_EQ(answer["snapshot"], 7);
    EXPECT_LT(answer["ageSeconds"], 60);
    Json const& board = answer["boards"][0];
    EXPECT_EQ(board["serialNumber"], "NX50001");
    EXPECT_EQ(board["board"], "NX50001");
    EXPECT_EQ(board["boardIndex"], 1);
    EXPECT_EQ(board["status"], "started");
    EXPECT_EQ(board["irq"], nullptr);
}

TEST_F(HttpAnswersTest, LineIsJoinedFromTheTablesOfItsIndex) {
    Json const line = document("/api/v1/lines")["lines"][0];
    EXPECT_EQ(line["name"], "trunk-1");
    EXPECT_EQ(line["board"], "NX50001");
    EXPECT_EQ(line["operStatus"], "up");
    EXPECT_EQ(line["lineStatus"], Json::parse(R"(["dsx1LossOfSignal"])"));
    EXPECT_EQ(line["current"]["es"], 0);
    EXPECT_FALSE(line.contains("intervals"));
}

TEST_F(HttpAnswersTest, LineWithoutHistoryHasNoCounts) {
    m_snapshot->interfaces.lines.edit(0).closed = nullptr;
    countIntervals(m_snapshot->interfaces);
    Json const line = document("/api/v1/lines")["lines"][0];
    EXPECT_EQ(line["current"]["es"], nullptr);
    EXPECT_EQ(document("/api/v1/lines/1000")["line"]["intervals"], Json::array());
}

TEST_F(HttpAnswersTest, OneLineHasItsHistoryFromTheNewestInterval) {
    Json const answer = document("/api/v1/lines/trunk-1");
    Json const& intervals = answer["line"]["intervals"];
    ASSERT_EQ(intervals.size(), 2U);
    EXPECT_EQ(intervals[0]["number"], 1);
    EXPECT_EQ(intervals[0]["es"], 3);
    EXPECT_EQ(intervals[0]["validData"], true);
    EXPECT_EQ(intervals[1]["es"], nullptr);
    EXPECT_EQ(intervals[1]["validData"], false);
    EXPECT_EQ(document("/api/v1/lines/1000")["line"], answer["line"]);
}

TEST_F(HttpAnswersTest, IntervalsBeginAQuarterOfAnHourApart) {
    m_snapshot->begun = Clock::now() - std::chrono::hours(2);
    Json const answer = document("/api/v1/lines/1000");
    std::string const first = answer["line"]["intervals"][0]["start"];
    std::string const second = answer["line"]["intervals"][1]["start"];
    auto const secondsOf = [](std::string const& date) {
        return std::stoi(date.substr(14, 2)) * 60 + std::stoi(date.substr(17, 2));
    };
    EXPECT_EQ((secondsOf(first) - secondsOf(second) + 3600) % 3600, 900);
    std::string const taken = answer["time"];
    EXPECT_EQ((secondsOf(taken) - secondsOf(first) + 3600) % 3600, 1000);
}

TEST_F(HttpAnswersTest, NameOfSeveralLinesIsAConflict) {
    m_snapshot->interfaces.interfaces.edit(1).name = "trunk-1";
    LineRow second = m_snapshot->interfaces.lines[0];
    second.ifIndex = 1001;
    m_snapshot->interfaces.lines.push_back(second);
    countIntervals(m_snapshot->interfaces);
    EXPECT_EQ(get("/api/v1/lines/trunk-1").status, 409);
    EXPECT_EQ(document("/api/v1/lines/1001")["line"]["ifIndex"], 1001);
}

TEST_F(HttpAnswersTest, OneBoardIsFoundBySerialNumberBeforeItsIndex) {
    EXPECT_EQ(document("/api/v1/boards/NX50001")["board"]["boardIndex"], 1);
    EXPECT_EQ(document("/api/v1/boards/1")["board"]["serialNumber"], "NX50001");
    EXPECT_EQ(document("/api/v1/boards/77")["board"]["boardIndex"], 2);
    EXPECT_EQ(get("/api/v1/boards/3").status, 404);
}

TEST_F(HttpAnswersTest, OneBoardHasItsOwnLinesOnly) {
    EXPECT_EQ(document("/api/v1/boards/1")["lines"].size(), 1U);
    EXPECT_EQ(document("/api/v1/boards/2")["lines"], Json::array());
}

TEST_F(HttpAnswersTest, ChannelNamesItsLineAndTimeSlot) {
    Json const channel = document("/api/v1/channels")["channels"][0];
    EXPECT_EQ(channel["line"], "trunk-1");
    EXPECT_EQ(channel["lineIfIndex"], 1000);
    EXPECT_EQ(channel["timeSlot"], 5);
    m_snapshot->number = 8;
    m_snapshot->interfaces.ds0Channels.clear();
    EXPECT_EQ(document("/api/v1/channels")["channels"][0]["line"], nullptr);
}

TEST_F(HttpAnswersTest, CounterOf64BitsIsWhole) {
    Json const row = document("/api/v1/interfaces")["interfaces"][0];
    EXPECT_EQ(row["hcInOctets"], 0xfffffffffffffffeU);
    EXPECT_EQ(row["inOctets"], 0xfffffffeU);
    EXPECT_EQ(row["ethernet"], nullptr);
}

TEST_F(HttpAnswersTest, TableHasNamesAndUnitsOfItsModule) {
    m_snapshot->interfaces.interfaces.edit(0).lastChange = 150;
    Json const answer = document("/api/v1/tables/ifTable");
    EXPECT_EQ(answer["table"], "ifTable");
    EXPECT_EQ(answer["rows"][0]["index"], Json::array({1000}));
    EXPECT_EQ(answer["rows"][0]["ifOperStatus"], "up");
    EXPECT_EQ(answer["rows"][0]["ifLastChange"], 150);
    EXPECT_EQ(answer["next"], nullptr);
}

TEST_F(HttpAnswersTest, TableIsReadInPages) {
    Json const first = document("/api/v1/tables/dsx1IntervalTable?limit=1");
    EXPECT_EQ(first["rows"].size(), 1U);
    EXPECT_EQ(first["next"], "1000.1");
    Json const second = document("/api/v1/tables/dsx1IntervalTable?limit=1&after=1000.1");
    EXPECT_EQ(second["rows"][0]["index"], Json::array({1000, 2}));
    EXPECT_EQ(second["next"], nullptr);
    EXPECT_EQ(document("/api/v1/tables/dsx1IntervalTable?after=9999")["rows"], Json::array());
}

TEST_F(HttpAnswersTest, PageThatIsNoneIsABadRequest) {
    for (char const* const query : {"limit=0", "limit=10001", "limit=x", "limit=", "after=",
                                    "after=1.", "after=x", "after=4294967296", "after=-1"})
        EXPECT_EQ(get(std::string("/api/v1/tables/ifTable?") + query).status, 400) << query;
}

TEST_F(HttpAnswersTest, EveryTableThatIsNamedIsServed) {
    Json const names = document("/api/v1/tables")["tables"];
    EXPECT_EQ(names.size(), allObjects().tables.size());
    for (auto const& name : names)
        EXPECT_EQ(document("/api/v1/tables/" + name.get<std::string>())["table"], name);
    EXPECT_EQ(get("/api/v1/tables/noTable").status, 404);
}

TEST_F(HttpAnswersTest, HealthHasTheAgentsScalarsAndItsHost) {
    Json const health = document("/api/v1/health")["health"];
    EXPECT_EQ(health["boardCount"], 2);
    EXPECT_EQ(health["persistence"], "kept");
    EXPECT_GE(health["agentUpTimeSeconds"], 0);
    EXPECT_FALSE(health["host"].get<std::string>().empty());
    EXPECT_FALSE(health.contains("healthFaultCount"));
}

TEST_F(HttpAnswersTest, ScalarsHaveTheirNamesInTheModules) {
    Json const answer = document("/api/v1/scalars")["scalars"];
    EXPECT_EQ(answer["kvlBoardCount"], 2);
    EXPECT_EQ(answer["ifNumber"], 2);
}

TEST_F(HttpAnswersTest, AllOfASnapshotsAnswersShowTheSameSettings) {
    auto const alias = [&] {
        return document("/api/v1/interfaces")["interfaces"][0]["alias"].get<std::string>();
    };
    EXPECT_EQ(alias(), "");
    m_settings.exchange({Setting::InterfaceAlias, 1000}, "to the carrier");
    EXPECT_EQ(document("/api/v1/tables/ifXTable")["rows"][0]["ifAlias"], "");
    EXPECT_EQ(alias(), "");
    m_snapshot->number = 8;
    EXPECT_EQ(alias(), "to the carrier");
    EXPECT_EQ(document("/api/v1/tables/ifXTable")["rows"][0]["ifAlias"], "to the carrier");
}

TEST_F(HttpAnswersTest, RowsHaveTheAskedKeysOnly) {
    EXPECT_EQ(document("/api/v1/lines?fields=name,current,boardIndex")["lines"][0].size(), 3U);
    EXPECT_EQ(document("/api/v1/boards?fields=board,status")["boards"][0],
              (Json{{"board", "NX50001"}, {"status", "started"}}));
    for (char const* const fields : {"nothing", "", "name,", "current.es", "es"})
        EXPECT_EQ(get(std::string("/api/v1/lines?fields=") + fields).status, 400) << fields;
}

TEST_F(HttpAnswersTest, KeyOfOneListOfSeveralIsKnownToAll) {
    Json const answer = document("/api/v1/channels?fields=timeSlot");
    EXPECT_EQ(answer["channels"][0], (Json{{"timeSlot", 5}}));
    EXPECT_EQ(answer["signallingChannels"], Json::array());
}

TEST_F(HttpAnswersTest, StripIsShownOnRequest) {
    EXPECT_FALSE(document("/api/v1/lines")["lines"][0].contains("strip"));
    EXPECT_EQ(document("/api/v1/lines?fields=strip")["lines"][0]["strip"],
              Json::parse("[[3,2,0],null]"));
    m_snapshot->number = 8;
    m_snapshot->interfaces.lines.edit(0).closed = nullptr;
    countIntervals(m_snapshot->interfaces);
    EXPECT_EQ(document("/api/v1/lines?fields=strip")["lines"][0]["strip"], nullptr);
}

TEST_F(HttpAnswersTest, RowsAreFilteredByBoardLineAndIndex) {
    EXPECT_EQ(document("/api/v1/lines?board=NX50001")["lines"].size(), 1U);
    EXPECT_EQ(document("/api/v1/lines?board=77")["lines"].size(), 0U);
    EXPECT_EQ(get("/api/v1/lines?board=none").status, 404);
    EXPECT_EQ(document("/api/v1/interfaces?ifIndex=1001,7")["interfaces"].size(), 1U);
    EXPECT_EQ(document("/api/v1/interfaces?ifIndex=1001,1000")["interfaces"].size(), 2U);
    EXPECT_EQ(document("/api/v1/channels?line=1000")["channels"].size(), 1U);
    EXPECT_EQ(document("/api/v1/channels?line=1001")["channels"].size(), 0U);
    for (char const* const query : {"lines?ifIndex=", "lines?ifIndex=x", "channels?line=0",
                                    "lines?line=1000", "boards?ifIndex=1", "lines?filds=name"})
        EXPECT_EQ(get(std::string("/api/v1/") + query).status, 400) << query;
}

TEST_F(HttpAnswersTest, ChannelsInUseAreCounted) {
    Json const idle = document("/api/v1/lines")["lines"][0];
    EXPECT_EQ(idle["channels"], 1);
    EXPECT_EQ(idle["channelsInUse"], 0);
    m_snapshot->number = 8;
    m_snapshot->interfaces.bearers.edit(0).operStatus = ISDNBChannelStatusActive;
    EXPECT_EQ(document("/api/v1/lines")["lines"][0]["channelsInUse"], 1);
    EXPECT_EQ(document("/api/v1/health")["health"]["channelsInUse"], 1);
}

TEST_F(HttpAnswersTest, AlarmNamesItsBoardAndLine) {
    auto alarms = std::make_shared<AlarmRows>();
    AlarmRow alarm;
    alarm.number = 12;
    alarm.kind = "lossOfSignal";
    alarm.severity = 4;
    alarm.boardIndex = 1;
    alarm.ifIndex = 1000;
    alarms->alarms = {alarm};
    m_snapshot->alarms = alarms;
    Json const row = document("/api/v1/alarms")["alarms"][0];
    EXPECT_EQ(row["number"], 12);
    EXPECT_EQ(row["severity"], "major");
    EXPECT_EQ(row["board"], "NX50001");
    EXPECT_EQ(row["line"], "trunk-1");
}

TEST_F(HttpAnswersTest, SnapshotWithOtherAlarmsIsAnotherOne) {
    std::string const etag = get("/api/v1/alarms").etag;
    EXPECT_EQ(get("/api/v1/alarms").etag, etag);
    m_snapshot->alarms = std::make_shared<AlarmRows>();
    EXPECT_NE(get("/api/v1/alarms").etag, etag);
}

TEST_F(HttpAnswersTest, JournalIsReadAfterAnEntry) {
    JournalRow entry;
    entry.number = 41;
    entry.event = "alarmRaised";
    entry.text = "alarm raised";
    entry.board = "NX50001";
    entry.ifIndex = 1000;
    entry.alarm = "lossOfSignal";
    entry.severity = 4;
    JournalRow start;
    start.number = 42;
    start.event = "agentStarted";
    m_journal = JournalPage{{entry, start}, 42};
    Json const answer = document("/api/v1/journal?after=40&limit=5");
    EXPECT_EQ(m_asked.after, 40U);
    EXPECT_EQ(m_asked.limit, 5U);
    EXPECT_EQ(answer["newest"], 42);
    EXPECT_EQ(answer["entries"][0]["severity"], "major");
    EXPECT_EQ(answer["entries"][0]["line"], "trunk-1");
    EXPECT_EQ(answer["entries"][0]["date"], "1970-01-01T00:00:00Z");
    EXPECT_EQ(answer["entries"][1]["severity"], nullptr);
    EXPECT_EQ(answer["entries"][1]["board"], nullptr);
    document("/api/v1/journal");
    EXPECT_EQ(m_asked.after, std::nullopt);
    for (char const* const query :
         {"after=", "after=-1", "after=4294967296", "limit=0", "limit=1001"})
        EXPECT_EQ(get(std::string("/api/v1/journal?") + query).status, 400) << query;
}

TEST_F(HttpAnswersTest, JournalsEtagChangesWithANewEntry) {
    std::string const etag = get("/api/v1/journal").etag;
    EXPECT_EQ(get("/api/v1/journal").etag, etag);
    m_newest = 1;
    EXPECT_NE(get("/api/v1/journal").etag, etag);
}

TEST_F(HttpAnswersTest, JournalThatCannotBeReadIsUnavailable) {
    m_journal = std::nullopt;
    EXPECT_EQ(get("/api/v1/journal").status, 503);
}

TEST_F(HttpAnswersTest, DocumentIsWrittenOnceForASnapshot) {
    auto const first = get("/api/v1/lines").body;
    EXPECT_EQ(get("/api/v1/lines").body, first);
    m_snapshot->number = 8;
    EXPECT_NE(get("/api/v1/lines").body, first);
}

TEST_F(HttpAnswersTest, FewDocumentsAreKept) {
    auto const bodyOf = [&](std::size_t limit) {
        return get("/api/v1/tables/ifTable?limit=" + std::to_string(limit)).body;
    };
    for (std::size_t limit = 1; limit <= HttpAnswers::kMostKept + 1; ++limit)
        bodyOf(limit);
    EXPECT_EQ(bodyOf(HttpAnswers::kMostKept), bodyOf(HttpAnswers::kMostKept));
    EXPECT_NE(bodyOf(HttpAnswers::kMostKept + 1), bodyOf(HttpAnswers::kMostKept + 1));
}

TEST_F(HttpAnswersTest, FailureIsAnsweredWithoutItsReason) {
    HttpAnswers failing(
        {allObjects(),
         m_counters,
         m_settings,
         []() -> std::shared_ptr<Snapshot const> { throw std::runtime_error("secret"); },
         {},
         {}});
    HttpAnswer const answer =
        failing.answer({.method = "GET", .target = "/api/v1/boards", .isLocal = true});
    EXPECT_EQ(answer.status, 500);
    EXPECT_THAT(*answer.body, Not(HasSubstr("secret")));
}

TEST_F(HttpAnswersTest, MetricsComeInTheFormatThatTheRequestPrefers) {
    HttpAnswer const plain = get("/metrics");
    EXPECT_EQ(plain.status, 200);
    EXPECT_EQ(plain.contentType, "text/plain; version=0.0.4; charset=utf-8");
    EXPECT_THAT(*plain.body, HasSubstr("\nkvloam_board_status{board=\"NX50001\",state="
                                       "\"started\"} 1\n"));
    EXPECT_EQ(get("/metrics").body, plain.body);
    HttpAnswer const open = ask({.method = "GET",
                                 .target = "/metrics",
                                 .accept = "application/openmetrics-text;version=1.0.0",
                                 .isLocal = true});
    EXPECT_EQ(open.contentType, "application/openmetrics-text; version=1.0.0; charset=utf-8");
    EXPECT_THAT(*open.body, HasSubstr("# TYPE kvloam_requests counter\n"));
}

TEST_F(HttpAnswersTest, MetricsOfChannelsComeIfAskedFor) {
    m_snapshot->interfaces.interfaces.edit(1).type = kTypeDs0;
    m_snapshot->interfaces.bearers.edit(0).operStatus = 1;
    EXPECT_THAT(*get("/metrics").body, Not(HasSubstr("trunk-1/1")));
    EXPECT_THAT(*get("/metrics?channels=1").body, HasSubstr("channel=\"trunk-1/1\""));
    EXPECT_EQ(get("/metrics/more").status, 404);
}

} // namespace
} // namespace kvloamd
