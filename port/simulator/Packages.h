// SPDX-License-Identifier: Apache-2.0
// The installed packages from the section [packages] of a device file.
#ifndef PORT_SIMULATOR_PACKAGES_H
#define PORT_SIMULATOR_PACKAGES_H

#include "../../devicefile/DeviceFile.h"
#include <optional>

namespace port::simulator {

/// See Backend::packageVersion().
Result<Sourced<std::optional<std::string>>> packageVersion(devicefile::DeviceFile& file,
                                                           const std::string& name);

} // namespace port::simulator

#endif
