// SPDX-License-Identifier: Apache-2.0
// The size of the storage over a backend that answers what a test says, in both structures.
#include <storage.h>

#include <cstdint>
#include <limits>

#include <gtest/gtest.h>

#include "coresystem_port.h"
#include "support/FakeBackend.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;

extern "C" int storage_get_internal_memory_size64(struct statvfs64* buf);

namespace {

int sizeOf(struct statvfs* buf)
{
    return storage_get_internal_memory_size(buf);
}

int sizeOf(struct statvfs64* buf)
{
    return storage_get_internal_memory_size64(buf);
}

template <typename Structure>
class StorageTest : public testing::Test {
protected:
    StorageTest()
    {
        size.f_bsize = 77;
        size.f_bavail = 78;
    }

    // A read that leaves the structure alone.
    int failure(const Answer<port::VolumeSize>& answer)
    {
        backend.storageAnswer = answer;
        const int result = sizeOf(&size);
        EXPECT_EQ(77U, size.f_bsize);
        EXPECT_EQ(78U, size.f_bavail);
        return result;
    }

    FakedBackend backend;
    Structure size = {};
};

using Structures = testing::Types<struct statvfs, struct statvfs64>;
TYPED_TEST_SUITE(StorageTest, Structures, );

TYPED_TEST(StorageTest, EveryFieldIsFilled)
{
    ASSERT_EQ(0, sizeOf(&this->size));
    EXPECT_EQ(4096U, this->size.f_bsize);
    EXPECT_EQ(1024U, this->size.f_frsize);
    EXPECT_EQ(40U, this->size.f_blocks);
    EXPECT_EQ(5U, this->size.f_bavail);
    EXPECT_EQ(0U, this->size.f_bfree); // which nobody asked for
    EXPECT_EQ("test", lastOrigin(Question::Storage).source);
}

TYPED_TEST(StorageTest, EmptyVolumeIsAnAnswer)
{
    this->backend.storageAnswer = answered(port::VolumeSize{});
    ASSERT_EQ(0, sizeOf(&this->size));
    EXPECT_EQ(0U, this->size.f_blocks);
    EXPECT_EQ(0U, this->size.f_bavail);
}

TYPED_TEST(StorageTest, FailuresHaveTheirCodesAndLeaveTheStructureAlone)
{
    EXPECT_EQ(STORAGE_ERROR_INVALID_PARAMETER, sizeOf(static_cast<TypeParam*>(nullptr)));
    EXPECT_EQ(STORAGE_ERROR_OPERATION_FAILED, this->failure(port::notAvailable("why")));
    EXPECT_EQ("why", lastOrigin(Question::Storage).reason);
    EXPECT_EQ(STORAGE_ERROR_OPERATION_FAILED, this->failure(port::denied("why")));
    EXPECT_EQ(STORAGE_ERROR_NOT_SUPPORTED, this->failure(port::notSupported("why")));
}

TYPED_TEST(StorageTest, ThreeTebibytesFitOrFailAndAreNeverCut)
{
    constexpr std::uint64_t BLOCKS = (std::uint64_t(3) << 40) / 512; // more than 32 bits hold
    const auto answer = answered(port::VolumeSize{512, 512, BLOCKS, BLOCKS});
    if (std::numeric_limits<decltype(this->size.f_blocks)>::max() < BLOCKS) {
        EXPECT_EQ(STORAGE_ERROR_OPERATION_FAILED, this->failure(answer));
        return;
    }
    this->backend.storageAnswer = answer;
    ASSERT_EQ(0, sizeOf(&this->size));
    EXPECT_EQ(BLOCKS, this->size.f_blocks);
    EXPECT_EQ(BLOCKS, this->size.f_bavail);
}

} // namespace
