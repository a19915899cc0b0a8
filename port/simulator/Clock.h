// SPDX-License-Identifier: Apache-2.0
// The machine's clock in the time zone of a device file.
#ifndef PORT_SIMULATOR_CLOCK_H
#define PORT_SIMULATOR_CLOCK_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Clock.h"

namespace port::simulator {

/// A moment broken down at an offset in seconds east of UTC; the zone's name is the offset,
/// "+0530".
std::tm timeAt(std::time_t moment, std::int64_t offset);

class SimulatedClock : public Clock {
public:
    explicit SimulatedClock(devicefile::DeviceFile& file) : file_(file) {}

    Result<Sourced<std::tm>> now() override;

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
