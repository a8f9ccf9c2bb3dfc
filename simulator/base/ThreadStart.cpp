// SPDX-License-Identifier: BSD-2-Clause
// Starts a thread of the simulator in the host process.
#include "simulator/base/ThreadStart.h"

#include <csignal>
#include <pthread.h>

#include <utility>

namespace kvlsim {

std::thread startThread(char const* name, std::function<void()> body) {
    sigset_t all;
    sigset_t before;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &before);
    std::thread thread;
    try {
        thread = std::thread(std::move(body));
    } catch (...) {
        pthread_sigmask(SIG_SETMASK, &before, nullptr);
        throw;
    }
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    pthread_setname_np(thread.native_handle(), name);
    return thread;
}

} // namespace kvlsim
