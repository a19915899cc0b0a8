// SPDX-License-Identifier: Apache-2.0
// The device's clock. Any thread.
#ifndef PORT_BACKEND_CLOCK_H
#define PORT_BACKEND_CLOCK_H

#include <ctime>

#include "Result.h"

namespace port {

class Clock {
public:
    virtual ~Clock() = default;

    /// Now, local and broken down. The zone name (tm_zone) outlives the process's use of it.
    virtual Result<Sourced<std::tm>> now()
    {
        return notSupported("no clock");
    }
};

} // namespace port

#endif
