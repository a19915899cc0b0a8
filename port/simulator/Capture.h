// SPDX-License-Identifier: Apache-2.0
// Writes down a device, whichever backend answers for it, as a device file.
#ifndef PORT_SIMULATOR_CAPTURE_H
#define PORT_SIMULATOR_CAPTURE_H

#include <string>

#include <coresystem_port.h>

#include "../backend/Backend.h"

namespace port::simulator {

/// See coresystem_port::captureDevice().
std::string capture(Backend& backend, const coresystem_port::CaptureOptions& options);

} // namespace port::simulator

#endif
