// SPDX-License-Identifier: Apache-2.0
// Fixed facts from the section [device] of a device file.
#ifndef PORT_SIMULATOR_DEVICE_INFO_H
#define PORT_SIMULATOR_DEVICE_INFO_H

#include "../backend/DeviceInfo.h"
#include "DeviceFile.h"

namespace port::simulator {

class SimulatedDeviceInfo : public DeviceInfo {
public:
    explicit SimulatedDeviceInfo(DeviceFile& file) : file_(file) {}

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
    DeviceFile& file_;
};

} // namespace port::simulator

#endif
