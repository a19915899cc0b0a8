// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstdlib>
#include <new>

#include "FailingAllocation.h"

using namespace fake;

extern "C" {
// Reached from the program's own calls of free and strdup (the linker's --wrap).
void __real_free(void* memory);
char* __real_strdup(const char* text);
}

namespace {

struct ThreadState {
    Allocation kind = Allocation::THROWING;
    int countdown = -1; // below 0: nothing fails
    bool happened = false;
    int pauses = 0;
};
thread_local ThreadState state;

bool failsNow(Allocation kind)
{
    if (state.pauses > 0 || state.countdown < 0 || state.kind != kind || state.countdown-- > 0)
        return false;
    state.happened = true;
    return true;
}

std::uintptr_t hidden(const void* address)
{
    return ~reinterpret_cast<std::uintptr_t>(address);
}

} // namespace

FailingAllocation::FailingAllocation(Allocation kind, int skipped)
{
    state.kind = kind;
    state.countdown = skipped;
    state.happened = false;
}

FailingAllocation::~FailingAllocation()
{
    state.countdown = -1;
}

bool FailingAllocation::happened() const
{
    return state.happened;
}

AllocationPause::AllocationPause()
{
    ++state.pauses;
}

AllocationPause::~AllocationPause()
{
    --state.pauses;
}

Ledger& fake::ledger()
{
    static Ledger& instance = *new Ledger;
    return instance;
}

char* Ledger::handOut(const std::string& text)
{
    char* const copy = __real_strdup(text.c_str());
    add(copy, "platform: ");
    return copy;
}

void Ledger::add(const char* text, const char* owner)
{
    const AllocationPause pause;
    const std::lock_guard<std::mutex> lock(mutex_);
    live_[hidden(text)] = owner + std::string(text);
}

void Ledger::remove(const void* address)
{
    const AllocationPause pause;
    const std::lock_guard<std::mutex> lock(mutex_);
    live_.erase(hidden(address));
}

void Ledger::clear()
{
    const std::lock_guard<std::mutex> lock(mutex_);
    live_.clear();
}

std::vector<std::string> Ledger::live() const
{
    const std::lock_guard<std::mutex> lock(mutex_);
    std::vector<std::string> texts;
    for (const auto& entry : live_)
        texts.push_back(entry.second);
    std::sort(texts.begin(), texts.end());
    return texts;
}

std::vector<std::string> Ledger::freeAll()
{
    const std::vector<std::string> freed = live();
    for (const auto& entry : live_)
        __real_free(reinterpret_cast<void*>(~entry.first));
    clear();
    return freed;
}

std::string Ledger::origin(const char* text) const
{
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto entry = live_.find(hidden(text));
    return entry != live_.end() ? entry->second : "";
}

extern "C" void __wrap_free(void* memory)
{
    ledger().remove(memory);
    __real_free(memory);
}

extern "C" char* __wrap_strdup(const char* text)
{
    if (failsNow(Allocation::STRDUP))
        return nullptr;
    char* const copy = __real_strdup(text);
    if (state.pauses == 0)
        ledger().add(copy, "copy: ");
    return copy;
}

void* operator new(std::size_t size)
{
    void* const memory =
        failsNow(Allocation::THROWING) ? nullptr : std::malloc(std::max<std::size_t>(size, 1));
    if (memory == nullptr)
        throw std::bad_alloc();
    return memory;
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    return failsNow(Allocation::NOTHROW) ? nullptr : std::malloc(std::max<std::size_t>(size, 1));
}

void operator delete(void* memory) noexcept
{
    __real_free(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    __real_free(memory);
}

void operator delete(void* memory, const std::nothrow_t&) noexcept
{
    __real_free(memory);
}
