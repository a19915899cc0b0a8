// SPDX-License-Identifier: Apache-2.0
// Writes device files: all or nothing, in turns with everyone else who does.
#ifndef CLI_DEVICE_WRITE_H
#define CLI_DEVICE_WRITE_H

#include <string>
#include <vector>

#include "devicefile/DeviceText.h"

namespace cli {

/// A whole file; one that is there stays unless it is to be replaced. Throws std::runtime_error, as
/// changeDevice() does.
void writeDevice(const std::string& path, const std::string& text, bool replace);

/// Some values of a file, all at once.
void changeDevice(const std::string& path, const std::vector<port::devicefile::Edit>& changes);

} // namespace cli

#endif
