// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Client.h"

#include <strings.h>

#include <cerrno>
#include <cstring>
#include <fstream>
#include <utility>

#include <curl/curl.h>

#include "cli/Text.h"

namespace kvloam {

namespace {

constexpr long kOk = 200;
constexpr long kNotModified = 304;
constexpr long kUnauthorized = 401;
constexpr long kForbidden = 403;
constexpr long kNotFound = 404;
constexpr long kUnavailable = 503;

bool isUrl(std::string const& host) {
    return host.starts_with("http://") || host.starts_with("https://");
}

std::string readToken(std::string const& path) {
    std::ifstream file(path);
    std::string token;
    if (!std::getline(file, token))
        throw CliError(kUsage, path + ": cannot read a token; its first line must be one");
    while (!token.empty() && (token.back() == '\r' || token.back() == ' '))
        token.pop_back();
    // It becomes part of a header.
    if (token.empty() || token.find(' ') != std::string::npos || printableAscii(token) != token)
        throw CliError(kUsage, path + ": the first line is no token: it must consist of printable "
                                      "ASCII characters without blanks");
    return token;
}

/// What the agent says about an error, from the body of its answer; the status' number without.
std::string reasonIn(std::string const& body, long status) {
    try {
        Json const answer = readAnswer(body);
        if (std::string const message = textIn(field(answer, "error"), "message"); !message.empty())
            return printable(message);
    } catch (CliError const&) {
        // An intermediate server writes its own pages.
    }
    return "HTTP status " + std::to_string(status);
}

} // namespace

struct Client::Response {
    long status = 0;
    std::string body;
    std::string etag;
    std::size_t mostOctets = 0;
    bool isTooLarge = false;
};

struct Client::Handle {
    Handle() : curl(curl_easy_init()) {
        if (curl == nullptr) throw CliError(kFailure, "the HTTP library cannot be initialised");
    }
    ~Handle() { curl_easy_cleanup(curl); }
    Handle(Handle const&) = delete;
    Handle& operator=(Handle const&) = delete;

    std::string escaped(std::string const& text) const {
        char* const escaped = curl_easy_escape(curl, text.data(), static_cast<int>(text.size()));
        if (escaped == nullptr) throw CliError(kUsage, "a name is too long");
        std::string result(escaped);
        curl_free(escaped);
        return result;
    }

    CURL* curl;
};

Client::Client(AgentAddress address, std::size_t mostOctets)
    : m_handle(std::make_unique<Handle>()),
      m_address(std::move(address)),
      m_mostOctets(mostOctets) {
    if (!m_address.tokenFile.empty()) m_token = readToken(m_address.tokenFile);
    if (m_address.host.empty())
        m_base = "http://localhost";
    else
        m_base = isUrl(m_address.host) ? m_address.host : "http://" + m_address.host;
    while (m_base.ends_with('/'))
        m_base.pop_back();
}

Client::~Client() = default;

Json Client::get(std::vector<std::string> const& path, std::string const& query) {
    if (auto answer = find(path, query)) return std::move(*answer);
    throw CliError(kFailure, "the agent does not know /api/v1/" + path.front() +
                                 "; is it an agent of this version?");
}

std::optional<Json> Client::find(std::vector<std::string> const& path, std::string const& query) {
    std::string url = m_base + "/api/v1";
    for (std::string const& name : path)
        url += "/" + m_handle->escaped(name);
    if (!query.empty()) url += "?" + query;

    auto const kept = m_kept.find(url);
    Response const response = perform(url, kept == m_kept.end() ? "" : kept->second.etag);
    switch (response.status) {
    case kOk:
        break;
    case kNotFound:
        return {};
    case kNotModified:
        if (kept != m_kept.end()) return kept->second.present();
        [[fallthrough]];
    default: {
        std::string advice;
        if (response.status == kUnauthorized || response.status == kForbidden)
            advice = m_token.empty() ? "; give --token-file" : "; is the token the agent's?";
        // An agent that starts is there soon.
        throw CliError(response.status == kUnavailable ? kNoAgent : kFailure,
                       "the agent refuses: " + reasonIn(response.body, response.status) + advice);
    }
    }
    Json answer = readAnswer(response.body);
    // Questions with a query ask for what is new: their answers are not asked for again.
    if (m_keeps && query.empty() && !response.etag.empty())
        m_kept.insert_or_assign(url, Kept{response.etag, answer, std::chrono::steady_clock::now()});
    return answer;
}

Json Client::Kept::present() const {
    Json present = answer;
    std::chrono::duration<double> const since = std::chrono::steady_clock::now() - received;
    if (auto const age = realIn(answer, "ageSeconds")) present["ageSeconds"] = *age + since.count();
    return present;
}

Client::Response Client::perform(std::string const& url, std::string const& etag) {
    using Headers = std::unique_ptr<curl_slist, decltype(&curl_slist_free_all)>;
    Headers headers(nullptr, curl_slist_free_all);
    auto const addHeader = [&](std::string const& header) {
        curl_slist* const longer = curl_slist_append(headers.get(), header.c_str());
        if (longer == nullptr) throw CliError(kFailure, "out of memory");
        static_cast<void>(headers.release()); // it is part of the longer list
        headers.reset(longer);
    };
    addHeader("Accept: application/json");
    if (!m_token.empty()) addHeader("Authorization: Bearer " + m_token);
    if (!etag.empty()) addHeader("If-None-Match: " + etag);

    Response response;
    response.mostOctets = m_mostOctets;
    using Receive = std::size_t (*)(char const*, std::size_t, std::size_t, void*);
    constexpr Receive receiveBody = [](char const* octets, std::size_t, std::size_t count,
                                       void* to) {
        auto& into = *static_cast<Response*>(to);
        into.isTooLarge = into.isTooLarge || count > into.mostOctets - into.body.size();
        if (into.isTooLarge) return std::size_t{0};
        into.body.append(octets, count);
        return count;
    };
    constexpr Receive receiveHeader = [](char const* octets, std::size_t, std::size_t count,
                                         void* to) {
        std::string_view header(octets, count);
        constexpr std::string_view name = "etag:";
        if (header.size() > name.size() &&
            strncasecmp(header.data(), name.data(), name.size()) == 0) {
            header.remove_prefix(name.size());
            std::size_t const first = header.find_first_not_of(" \t");
            std::size_t const last = header.find_last_not_of(" \t\r\n");
            if (first != std::string_view::npos && first <= last)
                static_cast<Response*>(to)->etag = header.substr(first, last - first + 1);
        }
        return count;
    };

    CURL* const curl = m_handle->curl;
    curl_easy_reset(curl); // its connections stay
    curl_easy_setopt(curl, CURLOPT_URL, url.c_str());
    curl_easy_setopt(curl, CURLOPT_PROTOCOLS_STR, "http,https");
    curl_easy_setopt(curl, CURLOPT_PROXY, ""); // the token is for the agent only
    curl_easy_setopt(curl, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(curl, CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
    curl_easy_setopt(curl, CURLOPT_TIMEOUT_MS, static_cast<long>(m_address.timeout.count()));
    curl_easy_setopt(curl, CURLOPT_USERAGENT, "kvloam/" KVLOAM_VERSION);
    curl_easy_setopt(curl, CURLOPT_HTTPHEADER, headers.get());
    curl_easy_setopt(curl, CURLOPT_WRITEFUNCTION, receiveBody);
    curl_easy_setopt(curl, CURLOPT_WRITEDATA, &response);
    curl_easy_setopt(curl, CURLOPT_HEADERFUNCTION, receiveHeader);
    curl_easy_setopt(curl, CURLOPT_HEADERDATA, &response);
    if (m_address.host.empty())
        curl_easy_setopt(curl, CURLOPT_UNIX_SOCKET_PATH, m_address.socket.c_str());

    CURLcode const code = curl_easy_perform(curl);
    if (response.isTooLarge)
        throw CliError(kFailure, "the agent's answer is larger than " +
                                     std::to_string(m_mostOctets >> 20U) + " MiB");
    if (code != CURLE_OK) {
        long systemError = 0;
        curl_easy_getinfo(curl, CURLINFO_OS_ERRNO, &systemError);
        refuse(code, curl_easy_strerror(code), systemError);
    }
    curl_easy_getinfo(curl, CURLINFO_RESPONSE_CODE, &response.status);
    return response;
}

void Client::refuse(int code, char const* reason, long systemError) const {
    bool const isLocal = m_address.host.empty();
    std::string const where = isLocal ? m_address.socket : m_address.host;
    if (code == CURLE_URL_MALFORMAT)
        throw CliError(kUsage, where + " is no address; write HOST:PORT or a URL");
    if (code == CURLE_COULDNT_CONNECT || code == CURLE_COULDNT_RESOLVE_HOST) {
        if (isLocal && systemError == EACCES)
            throw CliError(kNoAgent, "no permission to use " + where +
                                         "; run as root or as a member of the group kvloam");
        std::string const why =
            systemError == 0 ? std::string(reason) : std::strerror(static_cast<int>(systemError));
        throw CliError(kNoAgent, "no agent at " + where + " (" + why + "); " +
                                     (isLocal ? "start it with: systemctl start kvloamd"
                                              : "start it there with: kvloamd --http ADDRESS"));
    }
    if (code == CURLE_OPERATION_TIMEDOUT)
        throw CliError(kNoAgent, "the agent at " + where + " does not answer in " +
                                     std::to_string(m_address.timeout.count() / 1000) +
                                     " s; see its log");
    throw CliError(kFailure, "the agent's answer cannot be read: " + std::string(reason));
}

} // namespace kvloam
