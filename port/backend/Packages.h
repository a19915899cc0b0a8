// SPDX-License-Identifier: Apache-2.0
// The installed packages. Any thread.
#ifndef PORT_BACKEND_PACKAGES_H
#define PORT_BACKEND_PACKAGES_H

#include <optional>
#include <string>

#include "Result.h"

namespace port {

class Packages {
public:
    virtual ~Packages() = default;

    /// The version of a package by its exact name; nothing when it is not installed.
    virtual Result<Sourced<std::optional<std::string>>> version(const std::string&)
    {
        return notSupported("no package database");
    }
};

} // namespace port

#endif
