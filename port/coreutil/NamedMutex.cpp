// SPDX-License-Identifier: Apache-2.0
// The registry behind CoreMutex and CoreMutexLock.

#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <map>
#include <mutex>
#include <string>

#include "CoreMutex.h"
#include "CoreMutexLock.h"

namespace {

struct Entry {
    const char* const name;
    std::recursive_mutex& mutex;
    const Entry* const next;
};

// The address of the caller's text chooses the bucket, which is cheaper than reading the text and
// serves because names are literals as a rule; the text itself decides. The same text at another
// address may get an entry in another bucket, for the same mutex. Entries are only ever added, at
// the head, and never removed: finding one needs no lock.
std::array<std::atomic<const Entry*>, 64> buckets{};

std::atomic<const Entry*>& bucketOf(const char* name)
{
    return buckets[reinterpret_cast<std::uintptr_t>(name) / 8 % buckets.size()];
}

const Entry* findEntry(const Entry* entry, const char* name)
{
    while (entry != nullptr && std::strcmp(entry->name, name) != 0)
        entry = entry->next;
    return entry;
}

[[gnu::cold, gnu::noinline]] const Entry* addEntry(const char* name)
{
    static std::mutex additions;
    static auto& mutexes = *new std::map<std::string, std::recursive_mutex>;
    const std::lock_guard<std::mutex> lock(additions);
    auto& bucket = bucketOf(name);
    const Entry* const head = bucket.load(std::memory_order_relaxed);
    if (const Entry* const found = findEntry(head, name)) // another thread was faster
        return found;
    auto& named = *mutexes.try_emplace(name).first;
    const Entry* const entry = new Entry{named.first.c_str(), named.second, head};
    bucket.store(entry, std::memory_order_release);
    return entry;
}

std::recursive_mutex& asMutex(void* mutex)
{
    return *static_cast<std::recursive_mutex*>(mutex);
}

// The mutex known by a name in this process; made on first use, never destroyed.
[[gnu::always_inline]] inline std::recursive_mutex& namedMutex(const char* text)
{
    const char* const name = text != nullptr ? text : "";
    const Entry* const found = findEntry(bucketOf(name).load(std::memory_order_acquire), name);
    return (found != nullptr ? found : addEntry(name))->mutex;
}

} // namespace

CoreMutex::CoreMutex(const char* name) : mutex_(&namedMutex(name)) {}

CoreMutex::~CoreMutex() = default;

void CoreMutex::Lock()
{
    asMutex(mutex_).lock();
}

void CoreMutex::Unlock()
{
    asMutex(mutex_).unlock();
}

CoreMutexLock::CoreMutexLock(const char* name) : mutex_(&namedMutex(name))
{
    asMutex(mutex_).lock();
}

CoreMutexLock::~CoreMutexLock()
{
    asMutex(mutex_).unlock();
}
