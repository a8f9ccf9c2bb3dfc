// SPDX-License-Identifier: BSD-2-Clause
// A system that refuses new threads.
#pragma once

#include <pthread.h>

#include <cstddef>
#include <limits>

/// Lets every creation of a thread fail for a scope: the default stack is larger than any address
/// space.
class NoNewThreads {
  public:
    NoNewThreads() {
        pthread_getattr_default_np(&m_default);
        pthread_attr_t huge;
        pthread_getattr_default_np(&huge);
        pthread_attr_setstacksize(&huge, std::numeric_limits<std::size_t>::max() / 8 * 7);
        pthread_setattr_default_np(&huge);
        pthread_attr_destroy(&huge);
    }
    ~NoNewThreads() {
        pthread_setattr_default_np(&m_default);
        pthread_attr_destroy(&m_default);
    }
    NoNewThreads(NoNewThreads const&) = delete;
    NoNewThreads& operator=(NoNewThreads const&) = delete;

  private:
    pthread_attr_t m_default;
};
