// SPDX-License-Identifier: Apache-2.0
// The machine's clock in the time zone of a device file.
#ifndef PORT_SIMULATOR_CLOCK_H
#define PORT_SIMULATOR_CLOCK_H

#include "../../devicefile/DeviceFile.h"
#include <ctime>

namespace port::simulator {

/// A moment broken down at an offset in seconds east of UTC; the zone's name is the offset,
/// "+0530".
std::tm timeAt(std::time_t moment, std::int64_t offset);

/// See Backend::now().
Result<Sourced<std::tm>> now(devicefile::DeviceFile& file);

} // namespace port::simulator

#endif
