// SPDX-License-Identifier: Apache-2.0
// Small text files of this machine.
#ifndef PORT_LINUX_FILES_H
#define PORT_LINUX_FILES_H

#include <optional>
#include <string>

namespace port::linux_backend {

/// The text of a file up to its first NUL, without white space at its end; nothing when it cannot
/// be read, is empty, is no regular file or is larger than 64 KiB.
std::optional<std::string> readSmallFile(const std::string& path);

/// A variable of an os-release(5) file, unquoted; nothing when it is missing, empty or malformed.
std::optional<std::string> osReleaseVariable(const std::string& content, const std::string& name);

} // namespace port::linux_backend

#endif
