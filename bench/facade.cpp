// SPDX-License-Identifier: Apache-2.0
// bench_facade [Google Benchmark options]   times every question over a platform that costs nothing
// bench_facade --count                      repeats every question, for callgrind
#include "Cases.h"

#include <cstdlib>
#include <string>

#include "support/Questions.h"

namespace {

// Some questions keep a copy for good, as they should: few enough calls that memory stays small.
constexpr std::size_t LEAKING_CALLS = 50000;

// Adds each question as a case.
struct Rows {
    template <class Ask>
    static void add(const std::string& name, Ask ask)
    {
        if (name != "GetDeviceUniqueID") // asks the bus, not the platform
            bench::addCase(
                name + "/-", [ask](std::size_t) { ask(); }, LEAKING_CALLS);
    }

    static void release(char* text)
    {
        std::free(text);
    }
    template <class Answer>
    static void release(const Answer&)
    {
    }

    template <class Plain>
    static void plain(const char* name, Plain ask)
    {
        add(name, [ask] {
            auto answer = ask();
            benchmark::DoNotOptimize(answer);
            release(answer);
        });
    }

    template <class Text>
    static void text(const char* name, Text ask)
    {
        add(name, [ask] {
            char* answer = nullptr;
            ask(&answer);
            benchmark::DoNotOptimize(answer);
            std::free(answer);
        });
    }

    template <class Answer, class OfSlot>
    static void ofSlot(const char* name, const Answer&, OfSlot ask)
    {
        add(name, [ask] {
            static char modem[] = "modem0";
            Answer answer = {};
            ask({0, modem}, &answer);
            benchmark::DoNotOptimize(answer); // a text is the platform's own here
        });
    }
};

} // namespace

int main(int argc, char** argv)
{
    Rows rows;
    questions::listTo(rows);
    return bench::runCases(argc, argv);
}
