// SPDX-License-Identifier: Apache-2.0
// bench_calls [Google Benchmark options]   times every case
// bench_calls --count                      runs every case the same number of times, for callgrind
// bench_calls --pages                      asks once, then shows what the library's pages cost
#include "Cases.h"

#include <cstdlib>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>

#include <CoreSystem.h>
#include <coresystem_port.h>

namespace {

// Permissions and private dirty memory of each mapping of the library.
int showPages()
{
    char* country = nullptr;
    CoreSystem::GetInstance()->GetCountryCodeFromMcc("450", &country);
    std::free(country);

    std::ifstream mappings("/proc/self/smaps");
    std::string permissions;
    for (std::string line; std::getline(mappings, line);) {
        std::istringstream words(line);
        std::string first, second;
        words >> first >> second;
        if (first.back() != ':')
            permissions = line.find("/libcoresystem.so") != std::string::npos ? second : "";
        else if (first == "Private_Dirty:" && !permissions.empty())
            std::cout << permissions << '\t' << second << '\n';
    }
    return EXIT_SUCCESS;
}

} // namespace

int main(int argc, char** argv)
{
    // Error lines are written nowhere: a journal's speed is not ours.
    coresystem_port::setLogSink(coresystem_port::LogSink::None);
    bench::addSharedParts();
    bench::addCountryQueries();
    bench::addPeers();
    if (argc == 2 && std::string(argv[1]) == "--pages")
        return showPages();
    return bench::runCases(argc, argv);
}
