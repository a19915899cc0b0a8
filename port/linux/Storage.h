// SPDX-License-Identifier: Apache-2.0
// The file system that holds the user's data.
#ifndef PORT_LINUX_STORAGE_H
#define PORT_LINUX_STORAGE_H

#include <string>
#include <utility>

#include "../backend/Result.h"
#include "../backend/VolumeSize.h"

struct statvfs64;

namespace port::linux_backend {

class LinuxStorage {
public:
    /// `folder` is where the user's data lies or will lie: it need not be there yet.
    explicit LinuxStorage(std::string folder) : folder_(std::move(folder)) {}

    Result<Sourced<VolumeSize>> internal();

private:
    const std::string folder_;
};

VolumeSize volumeSizeOf(const struct statvfs64& fileSystem);

} // namespace port::linux_backend

#endif
