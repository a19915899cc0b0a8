// SPDX-License-Identifier: Apache-2.0
// The user's settings from hostname1, locale1, the kernel, the environment and the desktop.
#ifndef PORT_LINUX_SETTINGS_H
#define PORT_LINUX_SETTINGS_H

#include "../facts/Facts.h"
#include "Bus.h"

namespace port::linux_backend {

class LinuxSettings {
public:
    explicit LinuxSettings(Bus& bus) : bus_(bus) {}

    Result<Fact> deviceName();
    Result<Fact> language();
    Result<Sourced<FontSize>> fontSize();

private:
    Bus& bus_;
};

/// The size that the platform would call a factor to the usual size of texts.
FontSize fontSizeOf(double textScaling);

} // namespace port::linux_backend

#endif
