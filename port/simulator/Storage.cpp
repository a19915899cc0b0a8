// SPDX-License-Identifier: Apache-2.0
#include "Storage.h"

namespace port::simulator {
namespace {

using devicefile::Device;
using devicefile::Section;

constexpr struct {
    const char* key;
    std::uint64_t VolumeSize::*size;
} SIZES[] = {
    {"block_size", &VolumeSize::blockSize},
    {"fragment_size", &VolumeSize::fragmentSize},
    {"blocks", &VolumeSize::blocks},
    {"available_blocks", &VolumeSize::availableBlocks},
};

} // namespace

Result<Sourced<VolumeSize>> internalStorage(devicefile::DeviceFile& file)
{
    return file.ask<VolumeSize>([](const Device& device) -> Result<Sourced<VolumeSize>> {
        const Section& storage = device.section("storage");
        VolumeSize volume;
        for (const auto& row : SIZES) {
            const auto size = storage.get<std::uint64_t>(row.key);
            if (!size)
                return size.error();
            volume.*row.size = size.value().value;
        }
        return Sourced<VolumeSize>{volume, storage.source()};
    });
}

} // namespace port::simulator
