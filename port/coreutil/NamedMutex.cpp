// SPDX-License-Identifier: Apache-2.0
#include "NamedMutex.h"

#include <array>
#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "CoreMutex.h"
#include "CoreMutexLock.h"

namespace {

struct Entry {
    const std::string name;
    const Entry* const next;
    mutable std::recursive_mutex mutex;
};

// Entries are only ever added, at the head of a bucket, and never removed: finding one needs no
// lock.
std::array<std::atomic<const Entry*>, 64> buckets{};
std::mutex additions;

const Entry* findEntry(const Entry* entry, std::string_view name)
{
    while (entry != nullptr && entry->name != name)
        entry = entry->next;
    return entry;
}

const Entry& addEntry(std::atomic<const Entry*>& bucket, std::string_view name)
{
    const std::lock_guard<std::mutex> lock(additions);
    const Entry* const head = bucket.load(std::memory_order_relaxed);
    const Entry* entry = findEntry(head, name); // another thread may have been faster
    if (entry == nullptr) {
        entry = new Entry{std::string(name), head, {}};
        bucket.store(entry, std::memory_order_release);
    }
    return *entry;
}

std::recursive_mutex& asMutex(void* mutex)
{
    return *static_cast<std::recursive_mutex*>(mutex);
}

} // namespace

std::recursive_mutex& coreutil::namedMutex(const char* text)
{
    const std::string_view name(text != nullptr ? text : "");
    auto& bucket = buckets[std::hash<std::string_view>()(name) % buckets.size()];
    const Entry* const found = findEntry(bucket.load(std::memory_order_acquire), name);
    return found != nullptr ? found->mutex : addEntry(bucket, name).mutex;
}

CoreMutex::CoreMutex(const char* name) : mutex_(&coreutil::namedMutex(name)) {}

CoreMutex::~CoreMutex() = default;

void CoreMutex::Lock()
{
    asMutex(mutex_).lock();
}

void CoreMutex::Unlock()
{
    asMutex(mutex_).unlock();
}

CoreMutexLock::CoreMutexLock(const char* name) : mutex_(&coreutil::namedMutex(name))
{
    asMutex(mutex_).lock();
}

CoreMutexLock::~CoreMutexLock()
{
    asMutex(mutex_).unlock();
}
