// SPDX-License-Identifier: Apache-2.0
// A program that a test runs to its end.
#ifndef TESTS_SUPPORT_PROGRAM_H
#define TESTS_SUPPORT_PROGRAM_H

#include <cstdio>
#include <stdexcept>
#include <string>

/// Both outputs of a shell command that must succeed.
inline std::string outputOf(const std::string& command)
{
    std::FILE* const pipe = popen(("{ " + command + "; } 2>&1").c_str(), "r");
    if (pipe == nullptr)
        throw std::runtime_error("cannot run " + command);
    std::string output;
    char block[4096];
    while (const std::size_t size = std::fread(block, 1, sizeof block, pipe))
        output.append(block, size);
    if (pclose(pipe) != 0)
        throw std::runtime_error(command + " failed: " + output);
    return output;
}

#endif
