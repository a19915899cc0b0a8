// SPDX-License-Identifier: Apache-2.0
// The user's settings from the section [settings] of a device file.
#ifndef PORT_SIMULATOR_SETTINGS_H
#define PORT_SIMULATOR_SETTINGS_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Settings.h"

namespace port::simulator {

class SimulatedSettings : public Settings {
public:
    explicit SimulatedSettings(devicefile::DeviceFile& file) : file_(file) {}

    Result<Fact> deviceName() override
    {
        return file_.get<std::string>("settings", "device_name");
    }
    Result<Fact> language() override
    {
        return file_.get<std::string>("settings", "language");
    }
    Result<Sourced<FontSize>> fontSize() override
    {
        return file_.get<FontSize>("settings", "font_size");
    }

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
