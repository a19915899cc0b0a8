// SPDX-License-Identifier: Apache-2.0
/// \file
/// Named mutexes.
#ifndef COREUTIL_CORE_MUTEX_H
#define COREUTIL_CORE_MUTEX_H

/// The mutex known by a name in this process, made on first use and never destroyed.
///
/// Every object with the same name is the same mutex. It is recursive: a thread that holds it may
/// take it again and releases it as often. So an application that holds one of these names, in a
/// callback say, can call a library that takes it too without a deadlock. A null name is the name
/// "".
class CoreMutex {
public:
    /// Finds or makes the mutex; does not lock it. The name is copied.
    explicit CoreMutex(const char* name);
    /// Leaves the mutex as it is, locked or not.
    ~CoreMutex();

    void Lock();
    /// Does nothing when the calling thread does not hold the mutex.
    void Unlock();

private:
    CoreMutex(const CoreMutex&) = delete;
    CoreMutex& operator=(const CoreMutex&) = delete;

    void* mutex_;
};

#endif
