// SPDX-License-Identifier: Apache-2.0
#include "Clock.h"

namespace port::linux_backend {

Result<Sourced<std::tm>> localTime(std::time_t moment)
{
    tzset(); // which localtime_r need not do
    std::tm local = {};
    if (localtime_r(&moment, &local) == nullptr)
        return notAvailable("the clock is set to a year that no calendar holds");
    return Sourced<std::tm>{local, "system clock"};
}

} // namespace port::linux_backend
