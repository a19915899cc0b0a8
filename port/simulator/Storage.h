// SPDX-License-Identifier: Apache-2.0
// The internal storage from the section [storage] of a device file.
#ifndef PORT_SIMULATOR_STORAGE_H
#define PORT_SIMULATOR_STORAGE_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Storage.h"

namespace port::simulator {

class SimulatedStorage : public Storage {
public:
    explicit SimulatedStorage(devicefile::DeviceFile& file) : file_(file) {}

    Result<Sourced<VolumeSize>> internal() override;

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
