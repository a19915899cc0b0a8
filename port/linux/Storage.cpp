// SPDX-License-Identifier: Apache-2.0
#include "Storage.h"

#include <cerrno>
#include <cstring>
#include <filesystem>

#include <sys/statvfs.h>

namespace port::linux_backend {
namespace {

bool isNotThere(int error)
{
    return error == ENOENT || error == ENOTDIR;
}

} // namespace

VolumeSize volumeSizeOf(const struct statvfs64& fileSystem)
{
    VolumeSize size;
    // Available blocks are counted in fragments too; f_bsize is only the preferred size of a
    // transfer, and larger on some file systems.
    size.blockSize = fileSystem.f_frsize;
    size.fragmentSize = fileSystem.f_frsize;
    size.blocks = fileSystem.f_blocks;
    size.availableBlocks = fileSystem.f_bavail;
    return size;
}

Result<Sourced<VolumeSize>> LinuxStorage::internal()
{
    std::filesystem::path folder(folder_);
    struct statvfs64 fileSystem = {};
    // A parent that is there lies on the file system on which the folder will be made.
    while (statvfs64(folder.c_str(), &fileSystem) != 0) {
        const int error = errno;
        if (!isNotThere(error) || folder == folder.parent_path())
            return notAvailable(folder_ + ": " + std::strerror(error));
        folder = folder.parent_path();
    }
    return Sourced<VolumeSize>{volumeSizeOf(fileSystem), "file system of " + folder.string()};
}

} // namespace port::linux_backend
