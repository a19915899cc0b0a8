// SPDX-License-Identifier: Apache-2.0
// The machine's clock, in the time zone of TZ or /etc/localtime.
#ifndef PORT_LINUX_CLOCK_H
#define PORT_LINUX_CLOCK_H

#include <ctime>

#include "../backend/Result.h"

namespace port::linux_backend {

/// A moment broken down in the local time zone as it is set now.
Result<Sourced<std::tm>> localTime(std::time_t moment);

} // namespace port::linux_backend

#endif
