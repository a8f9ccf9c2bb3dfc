// SPDX-License-Identifier: BSD-2-Clause
// Requests and their answers, from a snapshot that the test makes.
#include "agent/fronts/http/HttpAnswers.h"

#include <set>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "board/Board.h"
#include "board/ISDNChannel.h"

namespace kvloamd {
namespace {

using Json = nlohmann::json;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Key;
using ::testing::Not;

DescribedObjects allObjects() {
    DescribedObjects objects{tables(), {scalars(), standardScalars()}};
    auto const standard = standardTables();
    objects.tables.insert(objects.tables.end(), standard.begin(), standard.end());
    return objects;
}

/// Board NX50001 with line trunk-1, which has two closed intervals and a channel; board 77.
class HttpAnswersTest : public ::testing::Test {
  protected:
    HttpAnswersTest() {
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
    m_snapshot->interfaces.lines[0].closed = nullptr;
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
    m_snapshot->interfaces.interfaces[1].name = "trunk-1";
    LineRow second = m_snapshot->interfaces.lines[0];
    second.ifIndex = 1001;
    second.intervalsBefore = 2;
    m_snapshot->interfaces.lines.push_back(second);
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
    m_snapshot->interfaces.interfaces[0].lastChange = 150;
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

TEST_F(HttpAnswersTest, KnownEtagIsAnsweredWithoutABody) {
    std::string const etag = get("/api/v1/boards").etag;
    HttpRequest request{.method = "GET", .target = "/api/v1/boards", .isLocal = true};
    for (std::string const& known : {etag, "\"x\", W/" + etag, std::string("*")}) {
        request.ifNoneMatch = known;
        HttpAnswer const answer = ask(request);
        EXPECT_EQ(answer.status, 304) << known;
        EXPECT_TRUE(answer.body->empty());
        EXPECT_EQ(answer.etag, etag);
    }
    m_snapshot->number = 8;
    request.ifNoneMatch = "*";
    EXPECT_EQ(ask(request).status, 304);
    request.ifNoneMatch = etag;
    HttpAnswer const renewed = ask(request);
    EXPECT_EQ(renewed.status, 200);
    EXPECT_NE(renewed.etag, etag);
}

TEST_F(HttpAnswersTest, AnotherRunsEtagIsUnknown) {
    HttpRequest request{.method = "GET", .target = "/api/v1/boards", .isLocal = true};
    request.ifNoneMatch = "\"7\"";
    EXPECT_EQ(ask(request).status, 200);
}

TEST_F(HttpAnswersTest, OtherMethodsAreRefusedEverywhere) {
    for (char const* const target : {"/api/v1/boards", "/nothing", "/"})
        for (char const* const method : {"POST", "PUT", "DELETE", "OPTIONS", "get", ""}) {
            HttpAnswer const answer = ask({.method = method, .target = target, .isLocal = true});
            EXPECT_EQ(answer.status, 405) << method << ' ' << target;
            EXPECT_THAT(answer.headers,
                        Contains(std::pair<std::string, std::string>("Allow", "GET, HEAD")));
        }
}

TEST_F(HttpAnswersTest, OtherAddressesAreNotFound) {
    for (char const* const target :
         {"/api", "/api/v1", "/api/v1/", "/api/v2/boards", "/api/v1/boards/", "/api/v1/boards/1/x",
          "/api/v1/lines/x", "/page", "/page/", "/page/../Daemon.cpp", "/page/%2e%2e", "/boards",
          "//api/v1/boards", "/API/v1/boards"}) {
        HttpAnswer const answer = get(target);
        EXPECT_EQ(answer.status, 404) << target;
        EXPECT_EQ(Json::parse(*answer.body)["error"]["status"], 404);
        EXPECT_EQ(answer.contentType, "application/json");
    }
}

TEST_F(HttpAnswersTest, MalformedAddressIsABadRequest) {
    EXPECT_EQ(get("/api/v1/%zz").status, 400);
    EXPECT_EQ(get("*").status, 400);
}

TEST_F(HttpAnswersTest, NameThatIsNoTextIsAnsweredInUtf8) {
    HttpAnswer const answer = get("/api/v1/lines/%ff%00%22");
    EXPECT_EQ(answer.status, 404);
    EXPECT_TRUE(Json::accept(*answer.body));
}

TEST_F(HttpAnswersTest, SizesAreLimited) {
    HttpRequest request{.method = "GET", .isLocal = true};
    std::string target = "/api/v1/boards/";
    target.resize(HttpAnswers::kLongestTarget, 'x');
    request.target = target;
    EXPECT_EQ(ask(request).status, 404);
    target += 'x';
    request.target = target;
    EXPECT_EQ(ask(request).status, 414);
    request.target = "/api/v1/boards";
    request.headerOctets = HttpAnswers::kMostHeaders;
    EXPECT_EQ(ask(request).status, 200);
    request.headerOctets = HttpAnswers::kMostHeaders + 1;
    EXPECT_EQ(ask(request).status, 431);
}

TEST_F(HttpAnswersTest, HostOverTcpMustBeThisOne) {
    for (char const* const host :
         {"127.0.0.1", "127.0.0.1:8161", "localhost", "LocalHost:80", "[::1]", "[::1]:8161",
          "10.1.2.3", "gw1.example", "GW1.example:8161"})
        EXPECT_EQ(ask(byTcp(host)).status, 200) << host;
    for (char const* const host :
         {"evil.example", "localhost.evil.example", "127.0.0.1.evil.example", "", ":80", "[::1",
          "[evil]", "gw1.example.evil", "1", "[", "[]"})
        EXPECT_EQ(ask(byTcp(host)).status, 403) << host;
    EXPECT_EQ(ask({.method = "GET", .target = "/api/v1/boards"}).status, 403);
}

TEST_F(HttpAnswersTest, TokenIsRequiredOverTcpOnly) {
    m_answers.requireToken("0123456789abcdef");
    HttpRequest request = byTcp("localhost");
    HttpAnswer const refused = ask(request);
    EXPECT_EQ(refused.status, 401);
    EXPECT_THAT(refused.headers, Contains(Key("WWW-Authenticate")));
    EXPECT_THAT(*refused.body, Not(HasSubstr("0123456789abcdef")));
    for (char const* const wrong :
         {"Bearer 0123456789abcdeg", "Bearer 0123456789abcde", "Bearer ",
          "Bearer 0123456789abcdef0", "Basic 0123456789abcdef", "", "0123456789abcdef"}) {
        request.authorization = wrong;
        EXPECT_EQ(ask(request).status, 401) << wrong;
    }
    request.authorization = "bearer 0123456789abcdef";
    EXPECT_EQ(ask(request).status, 200);
    EXPECT_EQ(get("/api/v1/boards").status, 200);
}

TEST_F(HttpAnswersTest, PageNeedsNoToken) {
    m_answers.requireToken("0123456789abcdef");
    HttpRequest request = byTcp("localhost");
    request.target = "/";
    HttpAnswer const page = ask(request);
    EXPECT_EQ(page.status, 200);
    EXPECT_EQ(page.contentType, "text/html; charset=utf-8");
    EXPECT_THAT(page.headers, Contains(Key("Content-Security-Policy")));
    request.target = "/page/style.css";
    EXPECT_EQ(ask(request).contentType, "text/css; charset=utf-8");
    std::string const etag = ask(request).etag;
    request.ifNoneMatch = etag;
    EXPECT_EQ(ask(request).status, 304);
    request.target = "/api/v1/health";
    EXPECT_EQ(ask(request).status, 401);
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
    m_snapshot->interfaces.lines[0].closed = nullptr;
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
    m_snapshot->interfaces.bearers[0].operStatus = ISDNBChannelStatusActive;
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
    m_snapshot->interfaces.interfaces[1].type = kTypeDs0;
    m_snapshot->interfaces.bearers[0].operStatus = 1;
    EXPECT_THAT(*get("/metrics").body, Not(HasSubstr("trunk-1/1")));
    EXPECT_THAT(*get("/metrics?channels=1").body, HasSubstr("channel=\"trunk-1/1\""));
    EXPECT_EQ(get("/metrics/more").status, 404);
}

} // namespace
} // namespace kvloamd
