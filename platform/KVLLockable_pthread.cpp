// SPDX-License-Identifier: BSD-2-Clause
#include "platform/KVLLockable_pthread.h"

#include <cerrno>

KVLLockable_pthread::KVLLockable_pthread(LockType type) {
    pthread_mutexattr_init(&m_attributes);
    switch (type) {
    case ErrorCheckLock:
        pthread_mutexattr_settype(&m_attributes, PTHREAD_MUTEX_ERRORCHECK);
        break;
    case RecursiveLock:
        pthread_mutexattr_settype(&m_attributes, PTHREAD_MUTEX_RECURSIVE);
        break;
    case NormalLock:
        pthread_mutexattr_settype(&m_attributes, PTHREAD_MUTEX_NORMAL);
        break;
    default:
        break;
    }
    pthread_mutex_init(&m_mutex, &m_attributes);
}

KVLLockable_pthread::~KVLLockable_pthread() {
    pthread_mutexattr_destroy(&m_attributes);
    pthread_mutex_destroy(&m_mutex);
}

int KVLLockable_pthread::lock() {
    return GetError(pthread_mutex_lock(&m_mutex));
}

int KVLLockable_pthread::trylock() {
    return GetError(pthread_mutex_trylock(&m_mutex));
}

int KVLLockable_pthread::unlock() {
    return GetError(pthread_mutex_unlock(&m_mutex));
}

int KVLLockable_pthread::GetError(int result) {
    switch (result) {
    case 0:
        return KVLLockOk;
    case EBUSY:
        return KVLLockBusy;
    case EDEADLK:
        return KVLLockDeadlock;
    case EINVAL:
        return KVLLockNotInitialized;
    case EPERM:
        return KVLLockNotOwner;
    default:
        return KVLLockUnknown;
    }
}

std::string KVLLockable_pthread::GetErrorText(int result) {
    switch (result) {
    case 0:
        return {};
    case EBUSY:
        return "KVLLockable_pthread: mutex is busy, continuing...";
    case EDEADLK:
        return "KVLLockable_pthread: mutex already exists in this thread, deadlock avoided...";
    case EINVAL:
        return "KVLLockable_pthread: mutex has not been initialized, action denied...";
    case EPERM:
        return "KVLLockable_pthread: mutex is not owned by calling thread, action denied...";
    default:
        // Deliberate: "unkown" is how this message has always read; log filters match it.
        return "KVLLockable_pthread: unkown error condition: " + std::to_string(result);
    }
}
