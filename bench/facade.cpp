// SPDX-License-Identifier: Apache-2.0
// bench_facade [Google Benchmark options]   times every question over a platform that costs nothing
// bench_facade --count                      repeats every question, for callgrind
#include "Cases.h"

#include <string>

#include "support/Questions.h"

namespace {

// Some questions keep a copy for good, as they should: few enough calls that memory stays small.
constexpr std::size_t LEAKING_CALLS = 50000;

struct AddCase {
    template <class Ask>
    void operator()(const std::string& name, Ask ask)
    {
        if (name != "GetDeviceUniqueID") // asks the bus, not the platform
            bench::addCase(
                name + "/-", [ask](std::size_t) { ask(); }, LEAKING_CALLS);
    }
};

} // namespace

int main(int argc, char** argv)
{
    questions::Unanswered<AddCase> rows{{}};
    questions::listTo(rows);
    return bench::runCases(argc, argv);
}
