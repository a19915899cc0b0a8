// SPDX-License-Identifier: Apache-2.0
// bench_calls [Google Benchmark options]   times every case
// bench_calls --list                       names them
// bench_calls --repeat NAME COUNT          runs one case COUNT times and nothing else
#include "Cases.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <coresystem_port.h>

namespace {

int list()
{
    for (const bench::Case& each : bench::cases())
        std::puts(each.name.c_str());
    return EXIT_SUCCESS;
}

int repeat(const char* name, const char* count)
{
    for (const bench::Case& each : bench::cases())
        if (each.name == name) {
            each.repeat(std::strtoul(count, nullptr, 10));
            return EXIT_SUCCESS;
        }
    std::fprintf(stderr, "no case %s\n", name);
    return EXIT_FAILURE;
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

int main(int argc, char** argv)
{
    // Error lines are formatted but written nowhere: a journal's speed is not ours.
    coresystem_port::setLogSink(coresystem_port::LogSink::None);
    bench::addSharedParts();
    bench::addCountryQueries();
    bench::addPeers();
    if (argc == 2 && std::strcmp(argv[1], "--list") == 0)
        return list();
    if (argc == 4 && std::strcmp(argv[1], "--repeat") == 0)
        return repeat(argv[2], argv[3]);
    return timeAll(argc, argv);
}
