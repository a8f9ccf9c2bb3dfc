// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/HttpSide.h"

#include <stdexcept>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

HttpSide::HttpSide(Options const& options) : m_tokenFile(options.httpTokenFile) {
    if (!m_tokenFile.empty()) m_token = readToken(m_tokenFile);
    if (!options.httpSocket.empty())
        m_sockets.push_back(ListeningSocket::unixAt(options.httpSocket));
    if (options.http.empty()) return;
    m_sockets.push_back(ListeningSocket::tcpAt(options.http));
    if (m_sockets.back().isRemote() && m_token.empty())
        throw std::runtime_error(checkTcpAddress(options.http, false));
}

void HttpSide::serve(HttpServed served) {
    if (m_sockets.empty()) return;
    m_server.emplace(m_sockets, std::move(served), m_token);
    std::string places;
    for (ListeningSocket const& socket : m_sockets)
        places += (places.empty() ? "" : " and ") + socket.place();
    log(LogLevel::Info, "answering HTTP " + places);
}

void HttpSide::readTokenAgain() {
    if (m_tokenFile.empty() || !m_server) return;
    try {
        m_server->requireToken(readToken(m_tokenFile));
    } catch (std::runtime_error const& error) {
        log(LogLevel::Error, std::string(error.what()) + "; keeping the previous token");
    }
}

std::vector<std::string> checkHttpSide(Options const& options) {
    std::vector<std::string> faults;
    auto const note = [&](std::string fault) {
        if (!fault.empty()) faults.push_back(std::move(fault));
    };
    if (!options.httpTokenFile.empty()) {
        try {
            readToken(options.httpTokenFile);
        } catch (std::runtime_error const& error) {
            note(error.what());
        }
    }
    if (!options.httpSocket.empty()) note(checkUnixSocket(options.httpSocket));
    if (!options.http.empty()) note(checkTcpAddress(options.http, !options.httpTokenFile.empty()));
    return faults;
}

} // namespace kvloamd
