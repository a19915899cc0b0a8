// SPDX-License-Identifier: Apache-2.0
// Serves applications that were built with 32-bit file offsets and those built with 64-bit ones.
#include <storage.h>

#include "Call.h"

#ifdef __USE_FILE_OFFSET64
#error "the two structures are the same one here, and so are the names of the functions"
#endif

extern "C" int storage_get_internal_memory_size64(struct statvfs64* buf);

namespace {

using port::Question;

constexpr port::Codes CODES{STORAGE_ERROR_OPERATION_FAILED, STORAGE_ERROR_NOT_SUPPORTED,
                            STORAGE_ERROR_OPERATION_FAILED};

template <typename Field>
bool fits(std::uint64_t value, Field& field)
{
    field = static_cast<Field>(value);
    return field == value;
}

// False when a field is too narrow: a size that was cut would be a wrong one.
template <typename Structure>
bool fits(const port::VolumeSize& size, Structure& structure)
{
    return fits(size.blockSize, structure.f_bsize) && fits(size.fragmentSize, structure.f_frsize) &&
           fits(size.blocks, structure.f_blocks) && fits(size.availableBlocks, structure.f_bavail);
}

template <typename Structure>
int internalSize(Structure* buf)
{
    const port::Call call("storage_get_internal_memory_size", CODES, {Question::Storage});
    const auto store = [buf](const port::VolumeSize& size) -> int {
        Structure structure = {};
        if (!fits(size, structure))
            return STORAGE_ERROR_OPERATION_FAILED;
        *buf = structure;
        return STORAGE_ERROR_NONE;
    };
    return call.run([&]() -> int {
        if (buf == nullptr)
            return STORAGE_ERROR_INVALID_PARAMETER;
        return call.pass(Question::Storage, port::backend().internalStorage(), store);
    });
}

} // namespace

int storage_get_internal_memory_size(struct statvfs* buf)
{
    return internalSize(buf);
}

int storage_get_internal_memory_size64(struct statvfs64* buf)
{
    return internalSize(buf);
}
