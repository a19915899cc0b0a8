// SPDX-License-Identifier: Apache-2.0
// The user's settings from hostname1, locale1, the kernel, the environment and the desktop.
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
    Result<Sourced<FontSize>> fontSize() override;

private:
    Bus& bus_;
};

/// The size that the platform would call a factor to the usual size of texts.
FontSize fontSizeOf(double textScaling);

} // namespace port::linux_backend

#endif
