// SPDX-License-Identifier: Apache-2.0
// Fixed facts from os-release, machine-id, hostname1, DMI and the device tree.
#ifndef PORT_LINUX_DEVICE_INFO_H
#define PORT_LINUX_DEVICE_INFO_H

#include "Bus.h"

namespace port::linux_backend {

class LinuxDeviceInfo {
public:
    /// `root` stands before every path that is read; "" for this machine.
    LinuxDeviceInfo(Bus& bus, std::string root) : bus_(bus), root_(std::move(root)) {}

    Result<Fact> platformId();
    Result<Fact> platformName();
    Result<Fact> platformVersion();
    Result<Fact> modelName();
    Result<Fact> serial();

private:
    Result<Fact> osRelease(const char* variable);

    Bus& bus_;
    const std::string root_;
};

} // namespace port::linux_backend

#endif
