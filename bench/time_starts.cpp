// SPDX-License-Identifier: Apache-2.0
// time_starts ROUNDS PROGRAM...
// Starts every program once a round, one after the other, so that a busy moment of the machine
// strikes all alike, and prints each program's median microseconds from start to exit.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <vector>

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

double secondsToRun(char* program)
{
    const auto begin = std::chrono::steady_clock::now();
    char* const arguments[] = {program, nullptr};
    pid_t process = 0;
    int status = 0;
    if (posix_spawn(&process, program, nullptr, nullptr, arguments, environ) != 0 ||
        waitpid(process, &status, 0) != process || status != 0) {
        std::fprintf(stderr, "%s failed\n", program);
        std::exit(EXIT_FAILURE);
    }
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count();
}

double median(std::vector<double> values)
{
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
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
    std::vector<std::vector<double>> times(programs.size());
    for (int round = 0; round < rounds; ++round)
        for (std::size_t i = 0; i < programs.size(); ++i)
            times[i].push_back(secondsToRun(programs[i]));
    for (std::size_t i = 0; i < programs.size(); ++i)
        std::printf("%s\t%.1f\n", programs[i], 1e6 * median(times[i]));
}
