// SPDX-License-Identifier: Apache-2.0
// The price of every question: instance access, a lock by name, debug lines; and the floor: what
// two locks, a search in constant time and a copy cost at least.
#include "Cases.h"

#include <cstdlib>
#include <cstring>
#include <mutex>

#include <CoreLogger.h>
#include <CoreMutexLock.h>

#include "Conversions.h"
#include "Log.h"

using namespace coresystem;

namespace {

void debugLine(std::size_t)
{
    DEBUG_LINE("countrycode : %s", "kr");
}

// Off again after each: the cases run in any order. The switching is no part that counts.
void debugLineOn(std::size_t)
{
    CoreLogger::GetInstance()->SetDebugMode(1);
    debugLine(0);
    CoreLogger::GetInstance()->SetDebugMode(0);
}

std::mutex firstLock;
std::mutex secondLock;

// Two locks, a ready-built hash map, the copy, all in this program: no library call but those of
// the C library.
template <class Keys, class Values>
void addFloor(const std::string& question, const Keys& keys, const Values& values,
              const char* noMatch)
{
    const auto map = bench::hashMapOf(keys, values);
    bench::addRounds("floor " + question, bench::roundsOf(bench::textsOf(keys), noMatch),
                     [map](const char* key) {
                         {
                             const std::lock_guard<std::mutex> lock(firstLock);
                             benchmark::ClobberMemory();
                         }
                         {
                             const std::lock_guard<std::mutex> lock(secondLock);
                             benchmark::ClobberMemory();
                         }
                         char* const answer = bench::copyOfAnswer(map, key);
                         benchmark::DoNotOptimize(answer);
                         std::free(answer);
                     });
}

} // namespace

void bench::addSharedParts()
{
    forEachConversion([](const char* name, auto, const auto& keys, const auto& values,
                         const char* noMatch) { addFloor(name, keys, values, noMatch); });
    addCase("GetInstance/-",
            [](std::size_t) { benchmark::DoNotOptimize(CoreSystem::GetInstance()); });
    addCase("lock by name/-", [](std::size_t) {
        const CoreMutexLock lock("CoreSystem.cpp::GetInstance");
        benchmark::ClobberMemory();
    });
    addCase("debug line off/-", debugLine);
    addCase("debug line on/-", debugLineOn);
}
