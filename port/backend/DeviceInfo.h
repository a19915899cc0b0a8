// SPDX-License-Identifier: Apache-2.0
// Fixed facts about the device. Any thread.
#ifndef PORT_BACKEND_DEVICE_INFO_H
#define PORT_BACKEND_DEVICE_INFO_H

#include "Result.h"

namespace port {

class DeviceInfo {
public:
    virtual ~DeviceInfo() = default;

    /// An identifier of this device that says nothing else about it.
    virtual Result<Fact> platformId()
    {
        return notSupported("no platform identifier");
    }
    /// Name of the operating system.
    virtual Result<Fact> platformName()
    {
        return notSupported("no platform name");
    }
    /// Version of the operating system.
    virtual Result<Fact> platformVersion()
    {
        return notSupported("no platform version");
    }
    /// Model of the hardware.
    virtual Result<Fact> modelName()
    {
        return notSupported("no model name");
    }
    /// Serial number of the board, as its maker gave it.
    virtual Result<Fact> serial()
    {
        return notSupported("no serial number");
    }
};

} // namespace port

#endif
