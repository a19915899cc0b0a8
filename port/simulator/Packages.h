// SPDX-License-Identifier: Apache-2.0
// The installed packages from the section [packages] of a device file.
#ifndef PORT_SIMULATOR_PACKAGES_H
#define PORT_SIMULATOR_PACKAGES_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Packages.h"

namespace port::simulator {

class SimulatedPackages : public Packages {
public:
    explicit SimulatedPackages(devicefile::DeviceFile& file) : file_(file) {}

    Result<Sourced<std::optional<std::string>>> version(const std::string& name) override;

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
