// SPDX-License-Identifier: Apache-2.0
#include "Cases.h"

#include <cstdlib>
#include <string>

#include <valgrind/callgrind.h>

namespace {

// One dump a case, named after it: the instructions of COUNTED_CALLS calls, after as many to warm
// up.
int countAll()
{
    for (const bench::Case& each : bench::cases()) {
        each.repeat(bench::COUNTED_CALLS);
        CALLGRIND_ZERO_STATS;
        each.repeat(bench::COUNTED_CALLS);
        CALLGRIND_DUMP_STATS_AT(each.name.c_str());
    }
    return EXIT_SUCCESS;
}

int timeAll(int argc, char** argv)
{
    for (const bench::Case& each : bench::cases()) {
        auto* const registered = benchmark::RegisterBenchmark(each.name.c_str(), each.time);
        if (each.fixedIterations != 0)
            registered->Iterations(static_cast<benchmark::IterationCount>(each.fixedIterations));
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return EXIT_FAILURE;
    benchmark::RunSpecifiedBenchmarks();
    return EXIT_SUCCESS;
}

} // namespace

int bench::runCases(int argc, char** argv)
{
    return argc == 2 && std::string(argv[1]) == "--count" ? countAll() : timeAll(argc, argv);
}
