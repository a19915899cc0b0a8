// SPDX-License-Identifier: Apache-2.0
// The internal storage from the section [storage] of a device file.
#ifndef PORT_SIMULATOR_STORAGE_H
#define PORT_SIMULATOR_STORAGE_H

#include "../backend/Storage.h"
#include "DeviceFile.h"

namespace port::simulator {

class SimulatedStorage : public Storage {
public:
    explicit SimulatedStorage(DeviceFile& file) : file_(file) {}

    Result<Sourced<VolumeSize>> internal() override;

private:
    DeviceFile& file_;
};

} // namespace port::simulator

#endif
