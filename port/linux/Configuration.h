// SPDX-License-Identifier: Apache-2.0
// The configuration store: key files of the user and of the machine.
#ifndef PORT_LINUX_CONFIGURATION_H
#define PORT_LINUX_CONFIGURATION_H

#include <string>
#include <utility>
#include <vector>

#include "../backend/Result.h"

namespace port::linux_backend {

class LinuxConfiguration {
public:
    /// The files that are looked into, one after the other.
    explicit LinuxConfiguration(std::vector<std::string> files) : files_(std::move(files)) {}

    Result<Fact> text(const std::string& key);

private:
    const std::vector<std::string> files_;
};

} // namespace port::linux_backend

#endif
