// SPDX-License-Identifier: BSD-2-Clause
// A real Prometheus scrapes the agent, and its checker reads what the agent writes.
#include <memory>
#include <string>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using Json = nlohmann::json;
using ::testing::HasSubstr;

class ScrapeTest : public AgentFixture {
  protected:
    /// Starts the agent with an HTTP port, and waits until it answers there.
    void startServing() {
        m_http = "127.0.0.1:" + std::to_string(freePort());
        startAgent({"--http", m_http});
    }

    /// The metrics as they are written for `accept`.
    std::string metrics(std::string const& accept = "*/*", std::string const& query = "") const {
        Result const result = run(
            {"curl", "-sf", "-H", "Accept: " + accept, "http://" + m_http + "/metrics" + query});
        EXPECT_EQ(result.status, 0) << result.output;
        return result.output;
    }

    /// Starts a Prometheus that scrapes the agent every second, and waits until it has done so.
    void startPrometheus() {
        write(path("prometheus.yml"), "global: {scrape_interval: 1s}\n"
                                      "scrape_configs:\n"
                                      "- job_name: kvloam\n"
                                      "  static_configs: [{targets: ['" +
                                          m_http + "']}]\n");
        for (int attempt = 0; attempt < 10; ++attempt) {
            m_prometheusAddress = "127.0.0.1:" + std::to_string(freePort());
            m_prometheus = std::make_unique<Process>(
                std::vector<std::string>{"prometheus", "--config.file=" + path("prometheus.yml"),
                                         "--storage.tsdb.path=" + path("tsdb"),
                                         "--web.listen-address=" + m_prometheusAddress},
                environment());
            // Another process may take the port between the choice and the start.
            if (m_prometheus->waitFor("Server is ready to receive web requests")) break;
            ASSERT_TRUE(m_prometheus->hasNow("address already in use")) << m_prometheus->output();
        }
        ASSERT_TRUE(eventually([this] { return value("up") == "1"; })) << m_prometheus->output();
    }

    Json api(std::string const& path, std::string const& query) const {
        Result const result =
            run({"curl", "-sG", "http://" + m_prometheusAddress + "/api/v1/" + path,
                 "--data-urlencode", query});
        Json const answer = Json::parse(result.output, nullptr, false);
        return answer.is_object() && answer.contains("data") ? answer["data"] : Json();
    }
    /// The value of the one series that `query` finds; empty if there is none, or more.
    std::string value(std::string const& query) const {
        Json const data = api("query", "query=" + query);
        if (!data.contains("result") || data["result"].size() != 1) return "";
        return data["result"][0]["value"][1];
    }
    /// Waits until `query` has this value.
    ::testing::AssertionResult becomes(std::string const& query,
                                       std::string const& expected) const {
        if (eventually([&] { return value(query) == expected; }))
            return ::testing::AssertionSuccess();
        return ::testing::AssertionFailure() << query << " is '" << value(query) << "'";
    }

  private:
    std::string m_http;
    std::string m_prometheusAddress;
    std::unique_ptr<Process> m_prometheus;
};

TEST_F(ScrapeTest, CheckersFindNothingToRemark) {
    startServing();
    write(path("plain"), metrics("*/*", "?channels=1"));
    Result const checked = run({"sh", "-c", "promtool check metrics <" + path("plain")});
    EXPECT_EQ(checked.status, 0);
    EXPECT_EQ(checked.output, "");
    write(path("open"), metrics("application/openmetrics-text; version=1.0.0", "?channels=1"));
    Result const parsed =
        run({"/usr/bin/python3", "-c",
             "import sys\n"
             "from prometheus_client.openmetrics.parser import text_fd_to_metric_families\n"
             "print(len(list(text_fd_to_metric_families(open(sys.argv[1])))) > 50)\n",
             path("open")});
    EXPECT_EQ(parsed.output, "True\n");
}

TEST_F(ScrapeTest, PrometheusSeesBoardsComeAndGo) {
    startServing();
    startPrometheus();
    std::string const started = "kvloam_board_status{board=\"NX50001\",state=\"started\"}";
    EXPECT_TRUE(becomes("kvloam_boards", "3"));
    EXPECT_TRUE(becomes(started, "1"));
    sim({"fail", "1"});
    EXPECT_TRUE(becomes("kvloam_board_secondary_status{board=\"NX50001\",state=\"failed\"}", "1"));
    EXPECT_TRUE(becomes(started, "0"));
    EXPECT_TRUE(becomes("kvloam_alarm_active{kind=\"boardFailed\",board=\"NX50001\"}", "1"));
    sim({"remove", "1"});
    EXPECT_TRUE(becomes("kvloam_boards", "2"));
    EXPECT_TRUE(becomes("count({board=\"NX50001\"})", ""));
    EXPECT_TRUE(becomes("kvloam_alarm_transitions_total{kind=\"boardFailed\",to=\"raised\"}", "1"));
}

TEST_F(ScrapeTest, PrometheusKnowsTypesAndUnits) {
    startServing();
    startPrometheus();
    // Type and unit; Prometheus learns them from its first scrapes.
    auto const hasMetadata = [&](std::string const& metric, std::string const& expected) {
        return eventually([&] {
            Json const known = api("metadata", "metric=" + metric);
            return known.contains(metric) &&
                   known[metric][0].value("type", "") + " " + known[metric][0].value("unit", "") ==
                       expected;
        });
    };
    EXPECT_TRUE(hasMetadata("kvloam_line_errored_seconds", "counter seconds"));
    EXPECT_TRUE(hasMetadata("kvloam_board", "info "));
    EXPECT_TRUE(hasMetadata("kvloam_board_status", "gauge "));
}

TEST_F(ScrapeTest, ErrorsOfALineAreCountedOnceTheyAreFinal) {
    startServing();
    startPrometheus();
    std::string const errors =
        "kvloam_line_severely_errored_seconds_total{board=\"NX50001\",line=\"nx5-trunk-1\"}";
    ASSERT_TRUE(becomes("count(" + errors + ")", "1"));
    std::string const before = value(errors);
    sim({"line", "errors", "nx5-trunk-1", "--path-violations", "400"});
    EXPECT_TRUE(becomes(errors + " > bool " + before, "1"));
    // What it has shown, it never takes back.
    EXPECT_EQ(value("resets(" + errors + "[10m])"), "0");
}

} // namespace
} // namespace kvloamd::e2e
