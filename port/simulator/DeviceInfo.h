// SPDX-License-Identifier: Apache-2.0
// Fixed facts from the section [device] of a device file.
#ifndef PORT_SIMULATOR_DEVICE_INFO_H
#define PORT_SIMULATOR_DEVICE_INFO_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/DeviceInfo.h"

namespace port::simulator {

class SimulatedDeviceInfo : public DeviceInfo {
public:
    explicit SimulatedDeviceInfo(devicefile::DeviceFile& file) : file_(file) {}

    Result<Fact> platformId() override
    {
        return file_.get<std::string>("device", "platform_id");
    }
    Result<Fact> platformName() override
    {
        return file_.get<std::string>("device", "platform_name");
    }
    Result<Fact> platformVersion() override
    {
        return file_.get<std::string>("device", "platform_version");
    }
    Result<Fact> modelName() override
    {
        return file_.get<std::string>("device", "model_name");
    }
    Result<Fact> serial() override
    {
        return file_.get<std::string>("device", "serial");
    }

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
