// SPDX-License-Identifier: Apache-2.0
// The configuration store of a device file: the sales code is all it holds.
#ifndef PORT_SIMULATOR_CONFIGURATION_H
#define PORT_SIMULATOR_CONFIGURATION_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Configuration.h"

namespace port::simulator {

class SimulatedConfiguration : public Configuration {
public:
    explicit SimulatedConfiguration(devicefile::DeviceFile& file) : file_(file) {}

    Result<Fact> text(const std::string& key) override
    {
        if (key != "db/csc/salescode")
            return notAvailable(file_.path() + ": no configuration key " + key);
        return file_.get<std::string>("settings", "sales_code");
    }

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
