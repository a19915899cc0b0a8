// SPDX-License-Identifier: Apache-2.0
// The utility library's classes, as the recording fake has them.
#include <algorithm>
#include <array>
#include <atomic>
#include <new>
#include <stdexcept>

#include <gtest/gtest.h>

#include <AESCrypto.h>
#include <CoreLogger.h>
#include <CoreMutex.h>
#include <CoreMutexLock.h>
#include <CoreUtil.h>

#include "FakePlatform.h"

using namespace fake;

namespace {

void recordLogger(const char* operation)
{
    const AllocationPause pause;
    platform().record(Event::Kind::LOGGER, operation);
}

// The bytes that the library may write, and after them some that it may not.
struct FormatBuffer {
    static constexpr std::size_t USABLE = 599;
    static constexpr char UNTOUCHED = '\x7f';

    FormatBuffer()
    {
        bytes.fill(UNTOUCHED);
    }

    std::array<char, 1024> bytes;
};

// More buffers than a test of many threads writes lines.
std::array<FormatBuffer, 4096> buffers;
std::atomic<int> nextIndex{3};
int firstUsed = 3; // since the last clearing

FormatBuffer& bufferAt(int index)
{
    return buffers[static_cast<std::size_t>(index) % buffers.size()];
}

template <class Visit>
void visitUsedBuffers(Visit visit)
{
    const int end = nextIndex;
    for (int index = std::max(firstUsed, end - static_cast<int>(buffers.size())); index < end;
         ++index)
        visit(bufferAt(index));
}

// A named mutex; never destroyed. Nobody takes it twice on one thread: the device's own need not be
// recursive. The fake's is, so that a test fails and does not hang.
struct NamedLock {
    std::string name;
    std::recursive_mutex mutex;
    int depth = 0;
};

NamedLock& namedLock(const char* name)
{
    static std::mutex mutex;
    static auto& locks = *new std::map<std::string, NamedLock>;
    const AllocationPause pause;
    const std::lock_guard<std::mutex> guard(mutex);
    const auto [entry, added] = locks.try_emplace(name);
    if (added) // other threads read the name later, without this guard
        entry->second.name = name;
    return entry->second;
}

// The texts around the name tell the two styles of locking apart.
void acquire(void* mutex, const std::string& before, const std::string& after)
{
    auto& lock = *static_cast<NamedLock*>(mutex);
    lock.mutex.lock();
    EXPECT_EQ(++lock.depth, 1) << lock.name << " was taken twice by one thread";
    platform().record(Event::Kind::LOCK, before + lock.name + after);
}

void release(void* mutex, const std::string& before, const std::string& after)
{
    auto& lock = *static_cast<NamedLock*>(mutex);
    platform().record(Event::Kind::UNLOCK, before + lock.name + after);
    --lock.depth;
    lock.mutex.unlock();
}

} // namespace

bool fake::isInFormatBuffer(const std::string& text)
{
    bool found = false;
    visitUsedBuffers([&](const FormatBuffer& buffer) {
        found = found || std::search(buffer.bytes.begin(), buffer.bytes.end(), text.begin(),
                                     text.end()) != buffer.bytes.end();
    });
    return found;
}

void fake::clearFormatBuffers()
{
    visitUsedBuffers([](FormatBuffer& buffer) {
        EXPECT_TRUE(std::all_of(buffer.bytes.begin() + FormatBuffer::USABLE, buffer.bytes.end(),
                                [](char byte) { return byte == FormatBuffer::UNTOUCHED; }))
            << "a message was longer than its buffer";
        buffer = FormatBuffer();
    });
    firstUsed = nextIndex;
}

CoreLogger::CoreLogger() = default;

CoreLogger* CoreLogger::GetInstance()
{
    static CoreLogger instance;
    recordLogger("GetInstance");
    return &instance;
}

int CoreLogger::GetDebugMode()
{
    recordLogger("GetDebugMode");
    return platform().debugMode;
}

bool CoreLogger::HasLogTag()
{
    recordLogger("HasLogTag");
    return platform().tag.has_value();
}

const char* CoreLogger::GetLogTag() const
{
    recordLogger("GetLogTag");
    EXPECT_TRUE(platform().tag.has_value()) << "a tag was taken that is not set";
    return platform().tag->c_str();
}

int CoreLogger::GetBufferIndex()
{
    recordLogger("GetBufferIndex");
    return nextIndex++;
}

char* CoreLogger::GetBuffer(const int& index)
{
    recordLogger("GetBuffer");
    EXPECT_TRUE(index >= 3 && index < nextIndex) << "nobody handed out buffer " << index;
    return bufferAt(index).bytes.data();
}

AESCrypto::AESCrypto() = default;

AESCrypto* AESCrypto::GetInstance()
{
    static AESCrypto instance;
    return &instance;
}

std::string AESCrypto::Encrypt(const std::string& plain)
{
    const AllocationPause pause;
    platform().record(Event::Kind::CIPHER, callText("Encrypt", plain));
    if (platform().cipherThrows)
        throw std::runtime_error("the cipher failed");
    return encipher(plain);
}

CoreMutex::CoreMutex(const char* name) : mutex_(&namedLock(name)) {}
CoreMutex::~CoreMutex() = default;

void CoreMutex::Lock()
{
    const AllocationPause pause;
    acquire(mutex_, "", ".Lock()");
}

void CoreMutex::Unlock()
{
    const AllocationPause pause;
    release(mutex_, "", ".Unlock()");
}

CoreMutexLock::CoreMutexLock(const char* name) : mutex_(&namedLock(name))
{
    const AllocationPause pause;
    acquire(mutex_, "lock ", "");
}

CoreMutexLock::~CoreMutexLock()
{
    const AllocationPause pause;
    release(mutex_, "unlock ", "");
}

CoreUtil::CoreUtil() = default;

CoreUtil* CoreUtil::GetInstance()
{
    static CoreUtil instance;
    return &instance;
}

std::string CoreUtil::intToStr(int number)
{
    const AllocationPause pause;
    platform().record(Event::Kind::CALL, callText("intToStr", number));
    if (platform().numberTextThrows)
        throw std::bad_alloc();
    return std::to_string(number);
}
