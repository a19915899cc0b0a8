// SPDX-License-Identifier: Apache-2.0
/// \file
/// Scoped lock on a named mutex.
#ifndef COREUTIL_CORE_MUTEX_LOCK_H
#define COREUTIL_CORE_MUTEX_LOCK_H

/// Holds the mutex of a name (see CoreMutex) from construction to destruction.
class CoreMutexLock {
public:
    explicit CoreMutexLock(const char* name);
    ~CoreMutexLock();

private:
    CoreMutexLock(const CoreMutexLock&) = delete;
    CoreMutexLock& operator=(const CoreMutexLock&) = delete;

    void* mutex_;
};

#endif
