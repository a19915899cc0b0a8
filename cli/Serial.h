// SPDX-License-Identifier: Apache-2.0
// Why there is no serial number.
#ifndef CLI_SERIAL_H
#define CLI_SERIAL_H

#include <string>

namespace cli {

/// By the code of CoreSystem::GetDeviceUniqueID(), which tells no more: of a fault in the device
/// file its line, otherwise what the device daemon says.
std::string whyNoSerial(int code);

} // namespace cli

#endif
