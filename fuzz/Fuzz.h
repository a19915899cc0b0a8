// SPDX-License-Identifier: Apache-2.0
// Shared by the fuzzers.
#ifndef FUZZ_FUZZ_H
#define FUZZ_FUZZ_H

#include <cstdlib>
#include <iostream>
#include <string>

// Ends the process, so that the fuzzer keeps the input.
inline void require(bool holds, const std::string& property, const std::string& seen = "")
{
    if (holds)
        return;
    std::cerr << "broken: " << property << ": " << seen << std::endl;
    std::abort();
}

// The fuzzer's function, which each of them is.
// NOLINTNEXTLINE(readability-identifier-naming): its name there
extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size);

#endif
