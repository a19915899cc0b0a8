// SPDX-License-Identifier: Apache-2.0
// The file system that holds the user's data.
#include <filesystem>

#include <gmock/gmock.h>
#include <sys/statvfs.h>

#include "linux/Storage.h"
#include "support/TemporaryTree.h"

using port::VolumeSize;
using port::linux_backend::LinuxStorage;
using port::linux_backend::volumeSizeOf;

namespace {

constexpr std::uint64_t TIB = 1024ULL * 1024 * 1024 * 1024;

TEST(LinuxStorageTest, SizeIsThatOfTheFileSystem)
{
    const TemporaryTree tree;
    const auto answer = LinuxStorage(tree.root()).internal();
    ASSERT_TRUE(answer) << answer.error().reason;
    const auto expected = std::filesystem::space(tree.root());
    const VolumeSize& size = answer.value().value;
    EXPECT_EQ(expected.capacity, size.fragmentSize * size.blocks);
    EXPECT_GE(expected.free, size.blockSize * size.availableBlocks);
    EXPECT_EQ("file system of " + tree.root(), answer.value().source);
}

TEST(LinuxStorageTest, NearestParentStandsForAFolderThatIsNotThereYet)
{
    const TemporaryTree tree;
    tree.write("/file", "");
    for (const char* const folder : {"/a/b/c", "/a"})
        EXPECT_EQ("file system of " + tree.root(),
                  LinuxStorage(tree.path(folder)).internal().value().source);
    EXPECT_EQ("file system of " + tree.path("/file"),
              LinuxStorage(tree.path("/file/a")).internal().value().source);
    EXPECT_EQ("file system of /", LinuxStorage("/nowhere/at/all").internal().value().source);
}

TEST(LinuxStorageTest, FolderThatCannotBeLookedAtIsTold)
{
    EXPECT_EQ("relative: No such file or directory",
              LinuxStorage("relative").internal().error().reason);
    const std::string tooLong = "/" + std::string(300, 'x');
    EXPECT_EQ(tooLong + ": File name too long", LinuxStorage(tooLong).internal().error().reason);
}

TEST(LinuxStorageTest, BlocksAreCountedInFragmentsAndNeverCut)
{
    for (const unsigned long blockSize : {4096UL, 1048576UL}) { // as a network file system says
        struct statvfs64 volume = {};
        volume.f_bsize = blockSize;
        volume.f_frsize = 4096;
        volume.f_blocks = 6 * TIB / 4096;
        volume.f_bavail = 3 * TIB / 4096 + 10;
        const VolumeSize size = volumeSizeOf(volume);
        EXPECT_EQ(6 * TIB, size.fragmentSize * size.blocks);
        EXPECT_EQ(3 * TIB + 40960, size.blockSize * size.availableBlocks);
        volume.f_blocks = 16 * 1024 * TIB / 512;
        EXPECT_EQ(volume.f_blocks, volumeSizeOf(volume).blocks);
    }
}

TEST(LinuxStorageTest, VolumeOfNoBytesIsAnAnswer)
{
    const auto answer = LinuxStorage("/proc").internal(); // it has no blocks
    ASSERT_TRUE(answer) << answer.error().reason;
    EXPECT_EQ(0U, answer.value().value.blocks);
    EXPECT_EQ(0U, answer.value().value.availableBlocks);
}

} // namespace
