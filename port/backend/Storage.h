// SPDX-License-Identifier: Apache-2.0
// The device's internal storage. Any thread.
#ifndef PORT_BACKEND_STORAGE_H
#define PORT_BACKEND_STORAGE_H

#include <cstdint>

#include "Result.h"

namespace port {

// As statvfs(3) counts: sizes in bytes, 64 bits on every machine.
struct VolumeSize {
    std::uint64_t blockSize = 0;       // of the available blocks
    std::uint64_t fragmentSize = 0;    // of all blocks
    std::uint64_t blocks = 0;          // in fragments
    std::uint64_t availableBlocks = 0; // for ordinary users
};

class Storage {
public:
    virtual ~Storage() = default;

    virtual Result<Sourced<VolumeSize>> internal()
    {
        return notSupported("no internal storage");
    }
};

} // namespace port

#endif
