// SPDX-License-Identifier: Apache-2.0
// The packages that the machine's package manager has installed.
#ifndef PORT_LINUX_PACKAGES_H
#define PORT_LINUX_PACKAGES_H

#include <optional>
#include <string>
#include <utility>

#include "../backend/Result.h"

namespace port::linux_backend {

class LinuxPackages {
public:
    /// `root` stands before every path that is read; "" for this machine.
    explicit LinuxPackages(std::string root) : root_(std::move(root)) {}

    Result<Sourced<std::optional<std::string>>> version(const std::string& name);

private:
    const std::string root_;
};

/// The package database of dpkg(1), below the root.
constexpr const char DPKG_STATUS[] = "/var/lib/dpkg/status";

/// The version of an installed package in the text of that database. The error says what is wrong
/// with the text.
Result<std::optional<std::string>> versionIn(const std::string& status, const std::string& name);

} // namespace port::linux_backend

#endif
