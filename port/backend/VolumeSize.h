// SPDX-License-Identifier: Apache-2.0
// The size of a storage.
#ifndef PORT_BACKEND_VOLUME_SIZE_H
#define PORT_BACKEND_VOLUME_SIZE_H

#include <cstdint>

namespace port {

// As statvfs(3) counts: sizes in bytes, 64 bits on every machine.
struct VolumeSize {
    std::uint64_t blockSize = 0;       // of the available blocks
    std::uint64_t fragmentSize = 0;    // of all blocks
    std::uint64_t blocks = 0;          // in fragments
    std::uint64_t availableBlocks = 0; // for ordinary users
};

} // namespace port

#endif
