// SPDX-License-Identifier: Apache-2.0
#include "CoreLogger.h"

#include <atomic>
#include <cstdlib>
#include <mutex>
#include <set>
#include <string>

namespace {

std::atomic<int> debugMode{0};
std::atomic<const char*> logTag{nullptr};

// Tags stay for good: a line may still be using the one that was just replaced.
const char* internTag(const char* tag)
{
    static std::mutex mutex;
    static auto& tags = *new std::set<std::string>;
    const std::lock_guard<std::mutex> lock(mutex);
    return tags.insert(tag).first->c_str();
}

// Per thread, and without a destructor: a thread may log until its very end.
struct BufferRing {
    unsigned next = 0;
    char buffers[CoreLogger::BUFFER_COUNT][CoreLogger::BUFFER_SIZE] = {};
};
thread_local BufferRing ring;

} // namespace

const int CoreLogger::BUFFER_COUNT;
const int CoreLogger::BUFFER_SIZE;

CoreLogger::CoreLogger()
{
    const char* const debug = secure_getenv("CORESYSTEM_LOG_DEBUG");
    SetDebugMode(debug != nullptr && std::string(debug) == "1" ? 1 : 0);
    SetLogTag(secure_getenv("CORESYSTEM_LOG_TAG"));
}

CoreLogger* CoreLogger::GetInstance()
{
    // Paid by every debug line, also when it is off. Made behind a pointer, it costs the compilers
    // fewer instructions to hand out than an object in place.
    static CoreLogger* const instance = new CoreLogger;
    return instance;
}

int CoreLogger::GetDebugMode()
{
    return debugMode.load(std::memory_order_relaxed);
}

void CoreLogger::SetDebugMode(int mode)
{
    debugMode.store(mode, std::memory_order_relaxed);
}

bool CoreLogger::HasLogTag()
{
    return logTag.load(std::memory_order_acquire) != nullptr;
}

const char* CoreLogger::GetLogTag() const
{
    const char* const tag = logTag.load(std::memory_order_acquire);
    return tag != nullptr ? tag : "";
}

void CoreLogger::SetLogTag(const char* tag)
{
    const bool none = tag == nullptr || *tag == '\0';
    logTag.store(none ? nullptr : internTag(tag), std::memory_order_release);
}

int CoreLogger::GetBufferIndex()
{
    return static_cast<int>(ring.next++ % BUFFER_COUNT);
}

char* CoreLogger::GetBuffer(const int& index)
{
    return ring.buffers[static_cast<unsigned>(index) % BUFFER_COUNT];
}
