// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the way from an HTTP request to its answer: the lines of the input are the target, the
// method, and the fields Host, Authorization, If-None-Match and Accept.
#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <nlohmann/json.hpp>

#include "agent/fronts/http/HttpAnswers.h"
#include "agent/log/Log.h"
#include "tests/fuzz/FuzzInput.h"
#include "tests/fuzz/SampleRows.h"

namespace kvloamd {
namespace {

constexpr std::array kStatuses = {200, 304, 400, 401, 403, 404, 405, 409, 414, 431, 503};

class Agent {
  public:
    Agent() {
        setLogLevel(LogLevel::Error);
        m_answers.requireToken("0123456789abcdef");
    }

    void ask(fuzz::FuzzInput input) {
        HttpRequest request;
        request.target = input.line('\n');
        request.method = input.line('\n');
        if (request.method.empty()) request.method = "GET";
        request.host = field(input.line('\n'));
        request.authorization = field(input.line('\n'));
        request.ifNoneMatch = field(input.line('\n'));
        request.accept = field(input.line('\n'));
        request.headerOctets = input.rest().size() * 100;
        // Without a host, it comes by the Unix socket.
        request.isLocal = !request.host;
        HttpAnswer const answer = m_answers.answer(request);
        fuzz::require(std::ranges::find(kStatuses, answer.status) != kStatuses.end(),
                      "the status is a documented one");
        fuzz::require(answer.body != nullptr, "an answer has a body, which may be empty");
        if (answer.status == 304) return fuzz::require(answer.body->empty(), "a 304 has no body");
        if (answer.contentType == "application/json")
            fuzz::require(nlohmann::json::accept(*answer.body), "JSON is well-formed");
        fuzz::require(answer.status == 200 || answer.etag.empty(), "a fault has no ETag");
    }

  private:
    static std::optional<std::string_view> field(std::string_view text) {
        return text.empty() ? std::nullopt : std::optional(text);
    }
    static DescribedObjects objects() {
        DescribedObjects all{tables(), {scalars(), standardScalars()}};
        auto const standard = standardTables();
        all.tables.insert(all.tables.end(), standard.begin(), standard.end());
        return all;
    }
    static JournalPage page() {
        JournalRow row;
        row.number = 1;
        row.text = "\xff\"\n";
        row.ifIndex = 1000;
        row.alarm = "lossOfSignal";
        row.severity = 99;
        return {{row}, 1};
    }

    Counters m_counters;
    Settings m_settings;
    HttpAnswers m_answers{{objects(), m_counters, m_settings, sampleSnapshot,
                           [](JournalQuery const& query) {
                               return query.limit == 2 ? std::nullopt : std::optional(page());
                           },
                           [] { return std::uint32_t{1}; }},
                          "gw1.example"};
};

} // namespace
} // namespace kvloamd

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    static auto* const agent = new kvloamd::Agent;
    agent->ask(fuzz::FuzzInput(octets, size));
    return 0;
}
