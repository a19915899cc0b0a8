// SPDX-License-Identifier: Apache-2.0
#include "Clock.h"

#include <mutex>
#include <set>

namespace port::simulator {
namespace {

// Kept for as long as the process runs: applications hold the pointer.
const char* kept(const std::string& name)
{
    static std::mutex mutex;
    static std::set<std::string>& names = *new std::set<std::string>;
    const std::lock_guard<std::mutex> lock(mutex);
    return names.insert(name).first->c_str();
}

} // namespace

std::tm timeAt(std::time_t moment, std::int64_t offset)
{
    const std::time_t shifted = moment + static_cast<std::time_t>(offset);
    std::tm time = {};
    gmtime_r(&shifted, &time);
    time.tm_gmtoff = static_cast<long>(offset);
    char zone[sizeof "+hhmm"] = "";
    std::strftime(zone, sizeof zone, "%z", &time);
    time.tm_zone = kept(zone);
    return time;
}

Result<Sourced<std::tm>> now(devicefile::DeviceFile& file)
{
    const auto offset = file.get<std::int64_t>("settings", "utc_offset");
    if (!offset)
        return offset.error();
    return Sourced<std::tm>{timeAt(std::time(nullptr), offset.value().value),
                            "system clock, " + offset.value().source};
}

} // namespace port::simulator
