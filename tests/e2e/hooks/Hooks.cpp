// SPDX-License-Identifier: BSD-2-Clause
// Preloaded into a program under test, where environment variables ask for it:
//   HOOK_NAME_GATE   a FIFO; the name slow.invalid resolves to 127.0.0.1 once it is opened to write
//   HOOK_CLOCK       a file of an std::int64_t: the seconds by which the realtime clock is stepped
#include <dlfcn.h>
#include <fcntl.h>
#include <netdb.h>
#include <pthread.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <sys/time.h>
#include <unistd.h>

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <ctime>

namespace {

std::atomic<std::int64_t> const* mappedStep() {
    char const* const path = std::getenv("HOOK_CLOCK");
    int const file = path == nullptr ? -1 : open(path, O_RDONLY | O_CLOEXEC);
    if (file < 0) return nullptr;
    void* const mapped = mmap(nullptr, sizeof(std::int64_t), PROT_READ, MAP_SHARED, file, 0);
    close(file);
    return mapped == MAP_FAILED ? nullptr : static_cast<std::atomic<std::int64_t> const*>(mapped);
}

/// Null before the program's environment is there, or without a file.
std::atomic<std::atomic<std::int64_t> const*> step{nullptr};

__attribute__((constructor)) void begin() {
    step = mappedStep();
}

std::int64_t stepped() {
    auto const* const mapped = step.load();
    return mapped == nullptr ? 0 : mapped->load();
}

template <class Function>
Function next(char const* name) {
    return reinterpret_cast<Function>(dlsym(RTLD_NEXT, name));
}

using TimedWait = int (*)(pthread_cond_t*, pthread_mutex_t*, timespec const*);

/// ThreadSanitizer's own, which it needs to see, or else the C library's.
TimedWait nextTimedWait() {
    void* found = dlsym(RTLD_DEFAULT, "__interceptor_pthread_cond_timedwait");
    if (found == nullptr) found = dlvsym(RTLD_NEXT, "pthread_cond_timedwait", "GLIBC_2.3.2");
    return reinterpret_cast<TimedWait>(found);
}

} // namespace

// The names of the C library's own parameters are reserved.
// NOLINTBEGIN(readability-inconsistent-declaration-parameter-name)
extern "C" {

__attribute__((visibility("default"))) int clock_gettime(clockid_t clock, timespec* time) noexcept {
    long const result = syscall(SYS_clock_gettime, clock, time);
    if (result == 0 && (clock == CLOCK_REALTIME || clock == CLOCK_REALTIME_COARSE))
        time->tv_sec += static_cast<time_t>(stepped());
    return static_cast<int>(result);
}

__attribute__((visibility("default"))) int gettimeofday(timeval* time, void* /*zone*/) noexcept {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    time->tv_sec = now.tv_sec;
    time->tv_usec = now.tv_nsec / 1000;
    return 0;
}

__attribute__((visibility("default"))) time_t time(time_t* where) noexcept {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    if (where != nullptr) *where = now.tv_sec;
    return now.tv_sec;
}

/// The kernel waits by the clock that has not been stepped.
__attribute__((visibility("default"))) int
pthread_cond_timedwait(pthread_cond_t* condition, pthread_mutex_t* mutex, timespec const* until) {
    static TimedWait const wait = nextTimedWait();
    timespec real = *until;
    real.tv_sec -= static_cast<time_t>(stepped());
    return wait(condition, mutex, &real);
}

__attribute__((visibility("default"))) int getaddrinfo(char const* name, char const* service,
                                                       addrinfo const* hints, addrinfo** found) {
    using Resolve = int (*)(char const*, char const*, addrinfo const*, addrinfo**);
    static auto const resolve = next<Resolve>("getaddrinfo");
    if (name == nullptr || std::strcmp(name, "slow.invalid") != 0)
        return resolve(name, service, hints, found);
    char const* const gate = std::getenv("HOOK_NAME_GATE");
    if (gate != nullptr) close(open(gate, O_RDONLY | O_CLOEXEC)); // blocks until it is opened
    return resolve("127.0.0.1", service, hints, found);
}

} // extern "C"
// NOLINTEND(readability-inconsistent-declaration-parameter-name)
