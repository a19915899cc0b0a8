// SPDX-License-Identifier: Apache-2.0
// The one way in which the port and the utility library read files.
#ifndef PORT_COMMON_REGULAR_FILE_H
#define PORT_COMMON_REGULAR_FILE_H

#include <cstddef>
#include <string>

#include "../../devicefile/Descriptor.h"

namespace port {

/// Opens a regular file to read. Never waits, for the writer of a pipe say. None, and the reason for
/// people in `problem`, when it cannot be opened or is another thing.
Descriptor openRegularFile(const std::string& path, std::string& problem);

/// The reason why a file larger than that is not read.
std::string largerThan(std::size_t limit);

/// Reads a whole regular file of at most `limit` bytes; false, and the reason in `problem`, when it
/// cannot be read.
bool readRegularFile(const std::string& path, std::size_t limit, std::string& content,
                     std::string& problem);

} // namespace port

#endif
