// SPDX-License-Identifier: Apache-2.0
// The internal storage from the section [storage] of a device file.
#ifndef PORT_SIMULATOR_STORAGE_H
#define PORT_SIMULATOR_STORAGE_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/VolumeSize.h"

namespace port::simulator {

/// See Backend::internalStorage().
Result<Sourced<VolumeSize>> internalStorage(devicefile::DeviceFile& file);

} // namespace port::simulator

#endif
