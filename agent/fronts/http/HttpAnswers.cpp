// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/HttpAnswers.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>

#include "agent/fronts/http/PageFiles.h"
#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr char kJson[] = "application/json";

/// The page fetches from the agent only, and is shown in no other site's page.
constexpr char kPagePolicy[] =
    "default-src 'self'; base-uri 'none'; form-action 'none'; frame-ancestors 'none'";

bool isBlank(char character) {
    return character == ' ' || character == '\t';
}

/// Whether an If-None-Match field lists `etag`. Whether a tag is weak does not matter to it.
bool lists(std::string_view field, std::string_view etag) {
    while (!field.empty()) {
        std::size_t const end = std::min(field.find(','), field.size());
        std::string_view one = field.substr(0, end);
        field.remove_prefix(std::min(end + 1, field.size()));
        while (!one.empty() && isBlank(one.front()))
            one.remove_prefix(1);
        while (!one.empty() && isBlank(one.back()))
            one.remove_suffix(1);
        if (one.starts_with("W/")) one.remove_prefix(2);
        if (one == "*" || one == etag) return true;
    }
    return false;
}

/// Takes the same time wherever two texts of one length differ.
bool isSame(std::string_view one, std::string_view other) {
    bool same = one.size() == other.size();
    for (std::size_t i = 0; i < std::min(one.size(), other.size()); ++i)
        same &= one[i] == other[i];
    return same;
}

bool equalsIgnoringCase(std::string_view one, std::string_view other) {
    auto const small = [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    };
    return std::ranges::equal(one, other, {}, small, small);
}

std::optional<std::string_view> bearerToken(std::optional<std::string_view> field) {
    constexpr std::string_view kScheme = "Bearer ";
    if (!field || !equalsIgnoringCase(field->substr(0, kScheme.size()), kScheme))
        return std::nullopt;
    return field->substr(kScheme.size());
}

HttpAnswer pageAnswer(std::string_view name) {
    for (PageFile const& file : pageFiles())
        if (file.name == name)
            return {200,
                    std::string(contentType(name)),
                    std::make_shared<std::string const>(file.contents),
                    '"' + std::string(file.digest) + '"',
                    {{"Content-Security-Policy", kPagePolicy}}};
    throw HttpFault(404, "there is nothing at this address");
}

/// Texts that differ between two runs of the agent.
std::string runName() {
    std::array<char, 17> digits{};
    auto const now = std::chrono::system_clock::now().time_since_epoch();
    auto const milliseconds = std::chrono::duration_cast<std::chrono::milliseconds>(now).count();
    return {digits.data(), std::to_chars(digits.data(), digits.data() + digits.size(),
                                         static_cast<std::uint64_t>(milliseconds), 16)
                               .ptr};
}

} // namespace

HttpAnswers::HttpAnswers(HttpServed served, std::string hostName)
    : m_served(std::move(served)),
      m_documents(m_served.objects),
      m_hostName(std::move(hostName)),
      m_run(runName()) {}

void HttpAnswers::requireToken(std::string token) {
    std::scoped_lock const guard(m_mutex);
    m_token = std::move(token);
}

HttpAnswer HttpAnswers::answer(HttpRequest const& request) {
    HttpAnswer answer;
    try {
        answer = answerOrThrow(request);
    } catch (HttpFault const& fault) {
        answer = faultAnswer(fault.status(), fault.what());
        if (fault.status() == 405) answer.headers.emplace_back("Allow", "GET, HEAD");
        if (fault.status() == 401)
            answer.headers.emplace_back("WWW-Authenticate", "Bearer realm=\"kvloamd\"");
    } catch (std::exception const& error) {
        log(LogLevel::Error, std::string("an HTTP request cannot be answered: ") + error.what());
        answer = faultAnswer(500, "the agent cannot answer now");
    }
    if (!answer.etag.empty() && request.ifNoneMatch && lists(*request.ifNoneMatch, answer.etag)) {
        answer.status = 304;
        answer.body = std::make_shared<std::string const>();
    }
    answer.headers.insert(answer.headers.end(), {{"Cache-Control", "no-cache"},
                                                 {"X-Content-Type-Options", "nosniff"},
                                                 {"Cross-Origin-Resource-Policy", "same-origin"}});
    return answer;
}

HttpAnswer HttpAnswers::answerOrThrow(HttpRequest const& request) {
    if (request.target.size() > kLongestTarget)
        throw HttpFault(414,
                        "the address has more than " + std::to_string(kLongestTarget) + " octets");
    if (request.headerOctets > kMostHeaders)
        throw HttpFault(431,
                        "the header has more than " + std::to_string(kMostHeaders) + " octets");
    checkHost(request);
    if (request.method != "GET" && request.method != "HEAD")
        throw HttpFault(405, "the agent can only be read, by GET and HEAD");
    auto const target = parseTarget(request.target);
    if (!target) throw HttpFault(400, "the address is not well-formed");
    auto const& segments = target->segments;
    // The page's files are no secret, and a browser sends no token of its own accord.
    if (segments.empty()) return pageAnswer("index.html");
    if (segments.size() == 2 && segments[0] == "page") return pageAnswer(segments[1]);
    checkToken(request);
    if (segments.size() > 2 && segments[0] == "api" && segments[1] == "v1")
        return fromSnapshot(request, *target);
    if (segments.size() == 1 && segments[0] == "metrics")
        return metrics(*target, request.accept.value_or(""));
    throw HttpFault(404, "there is nothing at this address");
}

void HttpAnswers::checkHost(HttpRequest const& request) const {
    if (request.isLocal) return;
    if (!request.host || !isOwnHost(*request.host, m_hostName))
        throw HttpFault(403, "the agent does not answer to the name in the Host field; use an "
                             "address, localhost, or the name in --http");
}

void HttpAnswers::checkToken(HttpRequest const& request) {
    if (request.isLocal) return;
    std::scoped_lock const guard(m_mutex);
    if (m_token.empty()) return;
    auto const token = bearerToken(request.authorization);
    if (!token || !isSame(*token, m_token))
        throw HttpFault(401, "send the token of --http-token-file: Authorization: Bearer <token>");
}

std::shared_ptr<Snapshot const> HttpAnswers::takeSnapshot() {
    auto snapshot = m_served.takeSnapshot();
    bool const isKnown =
        m_moment && m_moment->number == snapshot->number && m_moment->alarms == snapshot->alarms;
    if (isKnown) return snapshot;
    m_written.clear();
    m_writtenOctets = 0;
    m_moment = std::make_unique<Moment const>(*snapshot, m_served.settings);
    ++m_moments;
    return snapshot;
}

HttpAnswer HttpAnswers::fromSnapshot(HttpRequest const& request, Target const& target) {
    auto const snapshot = takeSnapshot();
    View const view(*snapshot, *m_moment, m_served.counters);
    if (target.segments.size() == 3 && target.segments[2] == "journal")
        return journal(view, target);
    HttpAnswer answer{200, kJson, {}, etag()};
    if (auto const written = m_written.find(request.target); written != m_written.end()) {
        answer.body = written->second;
        return answer;
    }
    answer.body = std::make_shared<std::string const>(m_documents.write(view, target));
    keep(request.target, answer.body);
    return answer;
}

/// Has no ETag: the agent's own counters go on while its snapshot stays.
HttpAnswer HttpAnswers::metrics(Target const& target, std::string_view accept) {
    MetricOptions options{metricFormat(accept), false};
    if (std::string const* const channels = target.parameter("channels"))
        options.channels = *channels == "1";
    auto const snapshot = takeSnapshot();
    return {200,
            contentType(options.format),
            m_metrics.text({*snapshot, m_served.counters, &m_moment->settings}, options),
            {},
            {{"Vary", "Accept"}}};
}

HttpAnswer HttpAnswers::journal(View const& view, Target const& target) {
    JournalQuery const query = Documents::journalQuery(target);
    // Read first: an entry that is added meanwhile makes the next answer another one.
    std::string const newest = std::to_string(m_served.newestEntry());
    auto const page = m_served.readJournal(query);
    if (!page) throw HttpFault(503, "the journal cannot be read now");
    return {200, kJson, std::make_shared<std::string const>(Documents::journal(view, *page)),
            etag('-' + newest)};
}

void HttpAnswers::keep(std::string_view target, std::shared_ptr<std::string const> const& body) {
    if (m_written.size() >= kMostKept || m_writtenOctets + body->size() > kMostKeptOctets) return;
    m_written.emplace(target, body);
    m_writtenOctets += body->size();
}

std::string HttpAnswers::etag(std::string const& more) const {
    return '"' + std::to_string(m_moment->number) + more + '.' + std::to_string(m_moments) + '.' +
           m_run + '"';
}

HttpAnswer faultAnswer(int status, std::string_view message) {
    JsonWriter json;
    json.beginObject().key("error").beginObject();
    json.key("status").number(std::int64_t{status}).key("message").text(message);
    json.endObject().endObject();
    return {status, kJson, std::make_shared<std::string const>(json.take()), {}};
}

bool isOwnHost(std::string_view host, std::string_view ownName) {
    if (host.starts_with('[')) {
        std::size_t const end = std::min(host.find(']'), host.size());
        std::string const address(host.substr(1, end - 1));
        in6_addr ignored{};
        return end < host.size() && inet_pton(AF_INET6, address.c_str(), &ignored) == 1;
    }
    std::string const name(host.substr(0, host.find(':')));
    in_addr ignored{};
    return inet_pton(AF_INET, name.c_str(), &ignored) == 1 ||
           equalsIgnoringCase(name, "localhost") ||
           (!ownName.empty() && equalsIgnoringCase(name, ownName));
}

} // namespace kvloamd
