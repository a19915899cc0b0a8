// SPDX-License-Identifier: Apache-2.0
// A mutex that no forked child finds locked: a fork waits until it is free. Whoever holds one takes
// no other of them, and does not fork.
#ifndef DEVICEFILE_FORK_MUTEX_H
#define DEVICEFILE_FORK_MUTEX_H

#include <mutex>
#include <set>

#include <pthread.h>

namespace port::devicefile {

class ForkMutex {
public:
    ForkMutex()
    {
        const std::lock_guard<std::mutex> lock(all().mutex);
        all().members.insert(this);
    }
    ~ForkMutex()
    {
        const std::lock_guard<std::mutex> lock(all().mutex);
        all().members.erase(this);
    }
    ForkMutex(const ForkMutex&) = delete;
    ForkMutex& operator=(const ForkMutex&) = delete;

    void lock()
    {
        mutex_.lock();
    }
    void unlock()
    {
        mutex_.unlock();
    }

private:
    struct All {
        All()
        {
            pthread_atfork(lockAll, unlockAll, unlockAll);
        }
        std::mutex mutex;
        std::set<ForkMutex*> members;
    };
    // Never destroyed: a thread may still ask while the process ends.
    static All& all()
    {
        static All& only = *new All;
        return only;
    }
    static void lockAll()
    {
        all().mutex.lock();
        for (ForkMutex* const member : all().members)
            member->lock();
    }
    static void unlockAll()
    {
        for (ForkMutex* const member : all().members)
            member->unlock();
        all().mutex.unlock();
    }

    std::mutex mutex_;
};

} // namespace port::devicefile

#endif
