// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/HttpServer.h"

#include <poll.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <exception>
#include <stdexcept>

#include <microhttpd.h>

#include "agent/log/Log.h"
#include "agent/rows/Clock.h"

namespace kvloamd {

namespace {

/// Lower than SNMP's thread, higher than the collector's: on a busy processor a reader of the page
/// waits rather than a manager.
constexpr int kNiceness = 10;

/// The memory of one connection: a target and a header of the greatest size, and what the library
/// adds to them. The library itself refuses what does not fit.
constexpr std::size_t kConnectionMemory = 32768;

/// What the library keeps of a request between its callbacks.
struct Pending {
    std::string target;
    bool hasNoBody = false;
};

MHD_Result addOctets(void* closure, MHD_ValueKind /*kind*/, char const* name, char const* value) {
    auto& octets = *static_cast<std::size_t*>(closure);
    octets += std::string_view(name).size();
    if (value != nullptr) octets += std::string_view(value).size();
    return MHD_YES;
}

std::optional<std::string_view> field(MHD_Connection* connection, char const* name) {
    char const* const value = MHD_lookup_connection_value(connection, MHD_HEADER_KIND, name);
    return value == nullptr ? std::nullopt : std::optional<std::string_view>(value);
}

/// A `HeldBody` is the body of an answer that is being sent, and counts its octets meanwhile.
class HeldBody {
  public:
    HeldBody(std::shared_ptr<std::string const> body, std::size_t& octets)
        : m_body(std::move(body)), m_octets(octets) {
        m_octets += m_body->size();
    }
    ~HeldBody() { m_octets -= m_body->size(); }
    HeldBody(HeldBody const&) = delete;
    HeldBody& operator=(HeldBody const&) = delete;

  private:
    std::shared_ptr<std::string const> m_body;
    std::size_t& m_octets;
};

/// Queues the answer. `octets`: those of all bodies that are being sent.
MHD_Result queue(MHD_Connection* connection, HttpAnswer const& answer, std::size_t& octets) {
    auto kept = std::make_unique<HeldBody>(answer.body, octets);
    auto* const response = MHD_create_response_from_buffer_with_free_callback_cls(
        answer.body->size(), const_cast<char*>(answer.body->data()),
        [](void* body) { delete static_cast<HeldBody*>(body); }, kept.get());
    if (response == nullptr) return MHD_NO;
    (void)kept.release(); // the response's
    auto const add = [&](char const* name, std::string const& value) {
        if (!value.empty()) MHD_add_response_header(response, name, value.c_str());
    };
    if (answer.status != MHD_HTTP_NOT_MODIFIED) add("Content-Type", answer.contentType);
    add("ETag", answer.etag);
    for (auto const& [name, value] : answer.headers)
        add(name.c_str(), value);
    MHD_Result const queued =
        MHD_queue_response(connection, static_cast<unsigned>(answer.status), response);
    MHD_destroy_response(response); // the library keeps it until it is sent
    return queued;
}

} // namespace

/// A `Listener` is one listening socket and its connections. Thread-bound to the HTTP thread.
class HttpServer::Listener {
  public:
    Listener(ListeningSocket const& socket, HttpAnswers& answers, HttpLimits limits)
        : m_answers(answers), m_limits(limits), m_isLocal(socket.isUnix()) {
        m_daemon =
            MHD_start_daemon(MHD_USE_EPOLL | MHD_USE_ERROR_LOG, 0, nullptr, nullptr, handle, this,
                             MHD_OPTION_EXTERNAL_LOGGER, logNothing, nullptr,       //
                             MHD_OPTION_LISTEN_SOCKET, socket.descriptor(),         //
                             MHD_OPTION_CONNECTION_LIMIT, limits.connections,       //
                             MHD_OPTION_CONNECTION_MEMORY_LIMIT, kConnectionMemory, //
                             MHD_OPTION_URI_LOG_CALLBACK, keepTarget, nullptr,      //
                             MHD_OPTION_NOTIFY_COMPLETED, completed, this,          //
                             MHD_OPTION_NOTIFY_CONNECTION, noteConnection, this, MHD_OPTION_END);
        if (m_daemon == nullptr)
            throw std::runtime_error("the HTTP library cannot serve " + socket.place());
    }
    ~Listener() {
        // The listening socket stays the caller's.
        MHD_quiesce_daemon(m_daemon);
        MHD_stop_daemon(m_daemon);
    }
    Listener(Listener const&) = delete;
    Listener& operator=(Listener const&) = delete;

    int descriptor() const {
        return MHD_get_daemon_info(m_daemon, MHD_DAEMON_INFO_EPOLL_FD)->epoll_fd;
    }
    /// Does what the library can do now, and closes connections that take too long. Returns when
    /// to come back at the latest.
    Clock::time_point turn() {
        // A connection that ends makes room for one that waits, which the library notices only when
        // it runs again.
        std::size_t before = 0;
        do {
            before = m_connections.size();
            MHD_run(m_daemon);
        } while (m_connections.size() < before);
        auto const now = Clock::now();
        auto next = Clock::time_point::max();
        for (auto& [connection, known] : m_connections) {
            auto const end = known.since + m_limits.patience;
            // The library notices the end of the stream.
            if (!known.isCut && end <= now) {
                shutdown(known.socket, SHUT_RDWR);
                known.isCut = true;
                next = now;
            }
            if (!known.isCut) next = std::min(next, end);
        }
        MHD_UNSIGNED_LONG_LONG wanted = 0;
        if (MHD_get_timeout(m_daemon, &wanted) == MHD_YES)
            next = std::min(next, now + std::chrono::milliseconds(
                                            static_cast<std::int64_t>(std::min(wanted, kLongest))));
        return next;
    }

  private:
    static constexpr MHD_UNSIGNED_LONG_LONG kLongest = 60000;

    struct Known {
        int socket;
        Clock::time_point since; ///< the connection's begin, or the end of its last answer
        bool isCut = false;
    };

    static void logNothing(void* /*closure*/, char const* /*format*/, va_list /*values*/) {
        // What clients do wrong is answered to them.
    }

    static void* keepTarget(void* /*closure*/, char const* target,
                            MHD_Connection* /*connection*/) noexcept {
        try {
            // A target that is too long is not kept whole, but still too long.
            std::string_view const text = target;
            return new Pending{std::string(text.substr(0, HttpAnswers::kLongestTarget + 1))};
        } catch (...) {
            return nullptr;
        }
    }

    static MHD_Result handle(void* closure, MHD_Connection* connection, char const* /*path*/,
                             char const* method, char const* /*version*/, char const* /*upload*/,
                             std::size_t* /*uploadSize*/, void** pending) noexcept {
        auto* const request = static_cast<Pending*>(*pending);
        if (request == nullptr) return MHD_NO;
        // The library calls once for the header, and again at the end of the request. An answer to
        // the first call leaves a body unread, and ends the connection.
        if (!request->hasNoBody && !field(connection, MHD_HTTP_HEADER_CONTENT_LENGTH) &&
            !field(connection, MHD_HTTP_HEADER_TRANSFER_ENCODING)) {
            request->hasNoBody = true;
            return MHD_YES;
        }
        try {
            auto& self = *static_cast<Listener*>(closure);
            std::size_t headerOctets = 0;
            MHD_get_connection_values(connection, MHD_HEADER_KIND, addOctets, &headerOctets);
            HttpRequest const asked{method,
                                    request->target,
                                    field(connection, MHD_HTTP_HEADER_HOST),
                                    field(connection, MHD_HTTP_HEADER_AUTHORIZATION),
                                    field(connection, MHD_HTTP_HEADER_IF_NONE_MATCH),
                                    field(connection, MHD_HTTP_HEADER_ACCEPT),
                                    headerOctets,
                                    self.m_isLocal};
            HttpAnswer answer = self.m_answers.answer(asked);
            if (self.m_octets + answer.body->size() > self.m_limits.octets)
                answer = faultAnswer(503, "clients do not read their answers; ask again later");
            return queue(connection, answer, self.m_octets);
        } catch (...) {
            return MHD_NO; // closes the connection
        }
    }

    static void completed(void* closure, MHD_Connection* connection, void** pending,
                          MHD_RequestTerminationCode /*how*/) noexcept {
        delete static_cast<Pending*>(*pending);
        *pending = nullptr;
        auto& connections = static_cast<Listener*>(closure)->m_connections;
        if (auto const known = connections.find(connection); known != connections.end())
            known->second.since = Clock::now();
    }

    static void noteConnection(void* closure, MHD_Connection* connection, void** /*context*/,
                               MHD_ConnectionNotificationCode what) noexcept {
        auto& connections = static_cast<Listener*>(closure)->m_connections;
        if (what == MHD_CONNECTION_NOTIFY_CLOSED) {
            connections.erase(connection);
            return;
        }
        int const socket =
            MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD)->connect_fd;
        try {
            connections.insert_or_assign(connection, Known{socket, Clock::now()});
        } catch (...) {
            shutdown(socket, SHUT_RDWR); // it could not be limited
        }
    }

    HttpAnswers& m_answers;
    HttpLimits m_limits;
    bool m_isLocal;
    std::map<MHD_Connection*, Known> m_connections;
    std::size_t m_octets = 0; ///< of the bodies that are being sent
    MHD_Daemon* m_daemon = nullptr;
};

HttpServer::HttpServer(std::vector<ListeningSocket> const& sockets, HttpServed served,
                       std::string token, HttpLimits limits)
    : m_answers(std::move(served), [&] {
          auto const tcp = std::ranges::find_if_not(sockets, &ListeningSocket::isUnix);
          return tcp == sockets.end() ? std::string() : tcp->host();
      }()) {
    m_answers.requireToken(std::move(token));
    for (ListeningSocket const& socket : sockets)
        m_listeners.push_back(std::make_unique<Listener>(socket, m_answers, limits));
    m_thread = std::thread([this] { run(); });
}

HttpServer::~HttpServer() {
    m_stop.wake();
    m_thread.join();
}

void HttpServer::run() {
    // For this thread only.
    setpriority(PRIO_PROCESS, static_cast<id_t>(gettid()), kNiceness);
    std::vector<pollfd> polled{{m_stop.descriptor(), POLLIN, 0}};
    for (auto const& listener : m_listeners)
        polled.push_back({listener->descriptor(), POLLIN, 0});
    while (polled.front().revents == 0) {
        auto next = Clock::time_point::max();
        for (auto const& listener : m_listeners)
            next = std::min(next, listener->turn());
        int wait = -1;
        if (next != Clock::time_point::max()) {
            auto const left = std::chrono::ceil<std::chrono::milliseconds>(next - Clock::now());
            wait = static_cast<int>(std::clamp<std::int64_t>(left.count(), 0, 60000));
        }
        if (poll(polled.data(), polled.size(), wait) < 0 && errno != EINTR) {
            log(LogLevel::Error, "the HTTP side ends: it cannot wait for requests");
            return;
        }
    }
}

} // namespace kvloamd
