// SPDX-License-Identifier: Apache-2.0
// The one way in which the port and the utility library read files.
#ifndef PORT_COMMON_REGULAR_FILE_H
#define PORT_COMMON_REGULAR_FILE_H

#include <cstddef>
#include <string>

namespace port {

/// Reads a whole regular file of at most `limit` bytes. Never waits, for the writer of a pipe say.
/// False, and the reason for people in `problem`, when it cannot be read.
bool readRegularFile(const std::string& path, std::size_t limit, std::string& content,
                     std::string& problem);

} // namespace port

#endif
