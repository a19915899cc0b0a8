// SPDX-License-Identifier: Apache-2.0
// Gives every file of some folders to a fuzzer's function, for compilers without a fuzzer.
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <string>

#include "Fuzz.h"

int main(int count, char** arguments)
{
    int files = 0;
    for (int i = 1; i < count; ++i)
        for (const auto& entry : std::filesystem::recursive_directory_iterator(arguments[i])) {
            if (!entry.is_regular_file())
                continue;
            std::cout << entry.path().string() << std::endl; // a crash is of the last one
            std::ifstream file(entry.path(), std::ios::binary);
            const std::string text{std::istreambuf_iterator<char>(file), {}};
            LLVMFuzzerTestOneInput(reinterpret_cast<const unsigned char*>(text.data()),
                                   text.size());
            ++files;
        }
    std::cout << files << " files" << std::endl;
    return files > 0 ? 0 : 1;
}
