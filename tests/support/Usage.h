// SPDX-License-Identifier: Apache-2.0
#ifndef TESTS_SUPPORT_USAGE_H
#define TESTS_SUPPORT_USAGE_H

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

#include <unistd.h>

// The resources of this process now.
struct Usage {
    long memory = statusLine("VmRSS:"); // kB
    long threads = statusLine("Threads:");
    long descriptors = std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});

    static long statusLine(const std::string& name, pid_t process = getpid())
    {
        std::ifstream status("/proc/" + std::to_string(process) + "/status");
        for (std::string line; std::getline(status, line);)
            if (line.rfind(name, 0) == 0)
                return std::strtol(line.c_str() + name.size(), nullptr, 10);
        return 0;
    }
};

#endif
