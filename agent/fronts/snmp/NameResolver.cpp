// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/NameResolver.h"

#include <netdb.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <condition_variable>
#include <deque>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>

#include "agent/fronts/Wakeup.h"

namespace kvloamd {

namespace {

struct Question {
    std::uint64_t number;
    std::string name;
    int family;
};

NameResolver::Answer resolve(Question const& question) {
    addrinfo hints{};
    hints.ai_family = question.family;
    hints.ai_socktype = SOCK_DGRAM;
    addrinfo* found = nullptr;
    if (int const fault = getaddrinfo(question.name.c_str(), nullptr, &hints, &found); fault != 0)
        return {question.number, std::nullopt, gai_strerror(fault)};
    char number[NI_MAXHOST] = "";
    int const fault = getnameinfo(found->ai_addr, found->ai_addrlen, number, sizeof number, nullptr,
                                  0, NI_NUMERICHOST);
    freeaddrinfo(found);
    if (fault != 0) return {question.number, std::nullopt, gai_strerror(fault)};
    return {question.number, number, {}};
}

} // namespace

struct NameResolver::State {
    std::mutex mutex;
    std::condition_variable changed;
    std::deque<Question> questions;
    std::vector<Answer> answers;
    bool ended = false;
    Wakeup answered;
};

NameResolver::NameResolver() : m_state(std::make_shared<State>()) {}

NameResolver::~NameResolver() {
    std::scoped_lock const guard(m_state->mutex);
    m_state->ended = true;
    m_state->changed.notify_one();
}

int NameResolver::descriptor() const {
    return m_state->answered.descriptor();
}

std::uint64_t NameResolver::ask(std::string const& name, int family) {
    ++m_lastQuestion;
    if (!m_started) {
        try {
            std::thread([state = m_state] { run(state); }).detach();
            m_started = true;
        } catch (std::system_error const& error) {
            std::scoped_lock const guard(m_state->mutex);
            m_state->answers.push_back({m_lastQuestion, std::nullopt,
                                        std::string("no thread to resolve it: ") + error.what()});
            m_state->answered.wake();
            return m_lastQuestion;
        }
    }
    std::scoped_lock const guard(m_state->mutex);
    m_state->questions.push_back({m_lastQuestion, name, family});
    m_state->changed.notify_one();
    return m_lastQuestion;
}

void NameResolver::dropQuestions() {
    std::scoped_lock const guard(m_state->mutex);
    m_state->questions.clear();
}

std::vector<NameResolver::Answer> NameResolver::take() {
    std::scoped_lock const guard(m_state->mutex);
    m_state->answered.clear();
    return std::exchange(m_state->answers, {});
}

void NameResolver::run(std::shared_ptr<State> const& state) {
    std::unique_lock guard(state->mutex);
    for (;;) {
        state->changed.wait(guard, [&] { return state->ended || !state->questions.empty(); });
        if (state->ended) return;
        Question const question = std::move(state->questions.front());
        state->questions.pop_front();
        guard.unlock();
        Answer answer = resolve(question);
        guard.lock();
        state->answers.push_back(std::move(answer));
        state->answered.wake();
    }
}

} // namespace kvloamd
