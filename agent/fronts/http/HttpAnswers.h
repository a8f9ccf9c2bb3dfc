// SPDX-License-Identifier: BSD-2-Clause
// From a request to its answer, without the protocol around them.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "agent/fronts/http/Documents.h"
#include "agent/fronts/metrics/Metrics.h"
#include "agent/rows/Counters.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// What the HTTP side serves. Outlives it.
struct HttpServed {
    DescribedObjects objects;
    Counters const& counters;
    Settings const& settings;
    std::function<std::shared_ptr<Snapshot const>()> takeSnapshot; ///< on the HTTP thread
    /// Reads entries of the journal; nothing when it cannot be read. On the HTTP thread.
    std::function<std::optional<JournalPage>(JournalQuery const&)> readJournal;
    std::function<std::uint32_t()> newestEntry; ///< the number of the journal's newest entry
};

/// What the answer to a request depends on. Refers to the request's octets.
struct HttpRequest {
    std::string_view method = {};
    std::string_view target = {}; ///< as it was sent
    std::optional<std::string_view> host = {};
    std::optional<std::string_view> authorization = {};
    std::optional<std::string_view> ifNoneMatch = {};
    std::optional<std::string_view> accept = {};
    std::size_t headerOctets = 0; ///< names and values of all header fields
    bool isLocal = false;         ///< came by the Unix socket, whose mode controls access
};

struct HttpAnswer {
    int status = 200;
    std::string contentType;
    std::shared_ptr<std::string const> body; ///< set, but may be empty
    std::string etag;                        ///< empty: none
    std::vector<std::pair<std::string, std::string>> headers = {};
};

/// An `HttpAnswers` answers requests from the newest snapshot. The first answer from a snapshot
/// fixes what all others from it show. Documents are kept until the next snapshot, within limits.
/// Thread-bound to the HTTP thread, except where noted.
class HttpAnswers {
  public:
    static constexpr std::size_t kLongestTarget = 2048;
    static constexpr std::size_t kMostHeaders = 8192;
    /// What is kept of the documents of a moment.
    static constexpr std::size_t kMostKept = 64;
    static constexpr std::size_t kMostKeptOctets = std::size_t{32} << 20U;

    /// `hostName`: a name by which clients may address the agent over TCP, beside the names and
    /// addresses that no other site can take; may be empty.
    explicit HttpAnswers(HttpServed served, std::string hostName = {});

    /// What clients must send as a bearer token over TCP; empty: nothing. Thread-safe.
    void requireToken(std::string token);

    /// What fails becomes an answer with status 500. Throws when there is no memory even for that.
    HttpAnswer answer(HttpRequest const& request);

  private:
    HttpAnswer answerOrThrow(HttpRequest const& request);
    void checkHost(HttpRequest const& request) const;
    void checkToken(HttpRequest const& request);
    std::shared_ptr<Snapshot const> takeSnapshot();
    HttpAnswer fromSnapshot(HttpRequest const& request, Target const& target);
    HttpAnswer journal(View const& view, Target const& target);
    HttpAnswer metrics(Target const& target, std::string_view accept);
    void keep(std::string_view target, std::shared_ptr<std::string const> const& body);
    std::string etag(std::string const& more = {}) const;

    HttpServed m_served;
    Documents m_documents;
    std::string m_hostName;
    std::string const m_run; ///< distinguishes the snapshots of this run of the agent
    std::unique_ptr<Moment const> m_moment;
    std::uint64_t m_moments = 0; ///< how many there have been
    /// Documents of the moment, by their targets.
    std::map<std::string, std::shared_ptr<std::string const>, std::less<>> m_written;
    std::size_t m_writtenOctets = 0;
    MetricsCache m_metrics;

    std::mutex m_mutex; ///< guards what follows
    std::string m_token;
};

/// An answer that says what is wrong.
HttpAnswer faultAnswer(int status, std::string_view message);

/// Whether a Host field names this host in a way that no other site can: by an address or
/// "localhost", or by `ownName`, with or without a port.
bool isOwnHost(std::string_view host, std::string_view ownName);

} // namespace kvloamd
