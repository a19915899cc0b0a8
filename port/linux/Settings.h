// SPDX-License-Identifier: Apache-2.0
// The user's settings from hostname1, locale1, the kernel and the environment.
#ifndef PORT_LINUX_SETTINGS_H
#define PORT_LINUX_SETTINGS_H

#include "../backend/Settings.h"
#include "Bus.h"

namespace port::linux_backend {

class LinuxSettings : public Settings {
public:
    explicit LinuxSettings(Bus& bus) : bus_(bus) {}

    Result<Fact> deviceName() override;
    Result<Fact> language() override;

private:
    Bus& bus_;
};

} // namespace port::linux_backend

#endif
