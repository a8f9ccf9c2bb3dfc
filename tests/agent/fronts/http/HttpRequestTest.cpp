// SPDX-License-Identifier: BSD-2-Clause
// Which HTTP requests are answered, which are refused, and which find nothing new.
#include <gmock/gmock.h>

#include "tests/agent/fronts/http/HttpAnswersFixture.h"

namespace kvloamd {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Key;
using ::testing::Not;

using HttpRequestTest = HttpAnswersFixture;

TEST_F(HttpRequestTest, KnownEtagIsAnsweredWithoutABody) {
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

TEST_F(HttpRequestTest, AnotherRunsEtagIsUnknown) {
    HttpRequest request{.method = "GET", .target = "/api/v1/boards", .isLocal = true};
    request.ifNoneMatch = "\"7\"";
    EXPECT_EQ(ask(request).status, 200);
}

TEST_F(HttpRequestTest, OtherMethodsAreRefusedEverywhere) {
    for (char const* const target : {"/api/v1/boards", "/nothing", "/"})
        for (char const* const method : {"POST", "PUT", "DELETE", "OPTIONS", "get", ""}) {
            HttpAnswer const answer = ask({.method = method, .target = target, .isLocal = true});
            EXPECT_EQ(answer.status, 405) << method << ' ' << target;
            EXPECT_THAT(answer.headers,
                        Contains(std::pair<std::string, std::string>("Allow", "GET, HEAD")));
        }
}

TEST_F(HttpRequestTest, OtherAddressesAreNotFound) {
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

TEST_F(HttpRequestTest, MalformedAddressIsABadRequest) {
    EXPECT_EQ(get("/api/v1/%zz").status, 400);
    EXPECT_EQ(get("*").status, 400);
}

TEST_F(HttpRequestTest, NameThatIsNoTextIsAnsweredInUtf8) {
    HttpAnswer const answer = get("/api/v1/lines/%ff%00%22");
    EXPECT_EQ(answer.status, 404);
    EXPECT_TRUE(Json::accept(*answer.body));
}

TEST_F(HttpRequestTest, SizesAreLimited) {
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

TEST_F(HttpRequestTest, HostOverTcpMustBeThisOne) {
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

TEST_F(HttpRequestTest, TokenIsRequiredOverTcpOnly) {
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

TEST_F(HttpRequestTest, PageNeedsNoToken) {
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

} // namespace
} // namespace kvloamd
