// SPDX-License-Identifier: Apache-2.0
// Plays commute.toml to the monitor, in this process: test SCENARIO
#include "Monitor.h"

#include <coresystem_testing.h>

#include <iostream>
#include <vector>

int main(int, char** argv)
{
    coresystem_testing::Device device(argv[1]);
    std::vector<std::string> told;
    const Monitor monitor([&](const std::string& how) { told.push_back(how); });
    // Each step is made when the one before it was told: nothing sleeps.
    while (device.step()) {
        const auto before = told.size();
        if (!coresystem_testing::runUntil([&] { return told.size() > before; }))
            return std::cerr << "not told of a change from " << told.back() << std::endl, 1;
    }
    const std::vector<std::string> expected = {
        "downloading over Wi-Fi", "paused: cellular network only", "offline",
        "offline: flight mode",   "downloading over Wi-Fi",
    };
    for (const std::string& how : told)
        std::cout << how << std::endl;
    return told == expected ? 0 : 1;
}
