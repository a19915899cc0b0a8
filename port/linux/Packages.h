// SPDX-License-Identifier: Apache-2.0
// Installed packages and their versions.
#ifndef PORT_LINUX_PACKAGES_H
#define PORT_LINUX_PACKAGES_H

#include <cstddef>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include <sys/stat.h>

#include "../../devicefile/ForkMutex.h"
#include "../backend/Result.h"

namespace port::linux_backend {

/// The package database of dpkg(1), below the root.
constexpr const char DPKG_STATUS[] = "/var/lib/dpkg/status";

// Installed packages, as that database lists them. Its text is read no further than questions
// want it, and what was read is known; in bounded memory.
class PackageIndex {
public:
    /// Appends what stands at an offset of the text; nothing at its end. False when that fails.
    using Read = std::function<bool(std::size_t offset, std::string& text)>;

    /// The version of an installed package. The error says what is wrong with the text; its reason
    /// is empty when it could not be read.
    Result<std::optional<std::string>> version(const std::string& name, const Read& read);

private:
    bool add(std::string_view name, std::string_view version);

    std::map<std::string, std::string, std::less<>> versions_; // an empty one is missing
    std::size_t size_ = 0;                                     // of these texts
    std::size_t known_ = 0; // so much of the text has been read, in whole packages
};

/// The version of an installed package in the text of that database.
Result<std::optional<std::string>> versionIn(const std::string& status, const std::string& name);

/// Any thread.
class LinuxPackages {
public:
    /// `root` stands before every path that is read; "" for this machine.
    explicit LinuxPackages(std::string root) : root_(std::move(root)) {}

    Result<Sourced<std::optional<std::string>>> version(const std::string& name);

private:
    Result<std::optional<std::string>> ask(const std::string& name);

    const std::string root_;
    devicefile::ForkMutex mutex_;
    PackageIndex index_;
    struct stat indexed_ = {}; // the file of that index
};

} // namespace port::linux_backend

#endif
