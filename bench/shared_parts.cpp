// SPDX-License-Identifier: Apache-2.0
// What every question pays: instance access, a lock by name, debug lines; and the floor that no
// implementation with these locks, scans and copies gets below.
#include "Cases.h"

#include <cstdlib>
#include <cstring>
#include <mutex>

#include <CoreLogger.h>
#include <CoreMutexLock.h>
#include <CoreSystem.h>

#include "Log.h"
#include "tables/MccCountryTable.h"

using namespace coresystem;

namespace {

void withDebugMode(int mode, const char* text)
{
    // Set once; asking it back is what each line does anyway.
    static int current = 0;
    if (current != mode) {
        current = mode;
        CoreLogger::GetInstance()->SetDebugMode(mode);
    }
    DEBUG_LINE("countrycode : %s", text);
}

std::mutex firstLock;
std::mutex secondLock;

// Two locks, the scan, the copy, all in this program: no library call but those of the C library.
void floorQuery(const char* key)
{
    {
        const std::lock_guard<std::mutex> lock(firstLock);
        benchmark::ClobberMemory();
    }
    {
        const std::lock_guard<std::mutex> lock(secondLock);
        benchmark::ClobberMemory();
    }
    const std::size_t row = findFirst(MccCountryTable::MCC, key);
    char* const answer =
        row < MccCountryTable::ROWS ? strdup(MccCountryTable::ALPHA2.cells[row]) : nullptr;
    benchmark::DoNotOptimize(answer);
    std::free(answer);
}

} // namespace

void bench::addSharedParts()
{
    addRounds("floor", roundsOf(textsOf(MccCountryTable::MCC), "999"), floorQuery);
    addCase("GetInstance/-",
            [](std::size_t) { benchmark::DoNotOptimize(CoreSystem::GetInstance()); });
    addCase("lock by name/-", [](std::size_t) {
        const CoreMutexLock lock("CoreSystem.cpp::GetInstance");
        benchmark::ClobberMemory();
    });
    addCase("debug line off/-", [](std::size_t) { withDebugMode(0, "kr"); });
    addCase("debug line on/-", [](std::size_t) { withDebugMode(1, "kr"); });
    // Off again for what is measured next.
    addCase("debug line off again/-", [](std::size_t) { withDebugMode(0, "kr"); });
}
