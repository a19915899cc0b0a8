// SPDX-License-Identifier: Apache-2.0
// time_starts ROUNDS PROGRAM...
// Starts every program once a round, one after the other, so that a busy moment of the machine
// strikes all alike, and prints for each program the median microseconds from start to exit, and
// the median microseconds of processor time.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <vector>

#include <spawn.h>
#include <sys/resource.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

struct Run {
    double elapsed;
    double processor;
};

double microseconds(const timeval& time)
{
    return 1e6 * static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec);
}

Run run(char* program)
{
    const auto begin = std::chrono::steady_clock::now();
    char* const arguments[] = {program, nullptr};
    pid_t process = 0;
    int status = 0;
    rusage used;
    if (posix_spawn(&process, program, nullptr, nullptr, arguments, environ) != 0 ||
        wait4(process, &status, 0, &used) != process || status != 0) {
        std::fprintf(stderr, "%s failed\n", program);
        std::exit(EXIT_FAILURE);
    }
    const std::chrono::duration<double, std::micro> elapsed =
        std::chrono::steady_clock::now() - begin;
    return {elapsed.count(), microseconds(used.ru_utime) + microseconds(used.ru_stime)};
}

double median(std::vector<Run> runs, double Run::*field)
{
    const auto middle = runs.begin() + static_cast<std::ptrdiff_t>(runs.size() / 2);
    std::nth_element(runs.begin(), middle, runs.end(),
                     [=](const Run& a, const Run& b) { return a.*field < b.*field; });
    return *middle.*field;
}

} // namespace

int main(int argc, char** argv)
{
    const int rounds = argc > 2 ? std::atoi(argv[1]) : 0;
    if (rounds < 1) {
        std::fprintf(stderr, "usage: time_starts ROUNDS PROGRAM...\n");
        return EXIT_FAILURE;
    }
    const std::vector<char*> programs(argv + 2, argv + argc);
    std::vector<std::vector<Run>> runs(programs.size());
    for (int round = 0; round < rounds; ++round)
        for (std::size_t i = 0; i < programs.size(); ++i)
            runs[i].push_back(run(programs[i]));
    for (std::size_t i = 0; i < programs.size(); ++i)
        std::printf("%s\t%.1f\t%.1f\n", programs[i], median(runs[i], &Run::elapsed),
                    median(runs[i], &Run::processor));
}
