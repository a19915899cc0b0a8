// SPDX-License-Identifier: Apache-2.0
// Whether the internal storage has more than so many megabytes free.
#include <cmath>
#include <limits>

#include <sys/statvfs.h>

#include "support/PlatformTest.h"

using namespace fake;

namespace {

const std::string CALL = "storage_get_internal_memory_size()";
const std::string STORAGE_METHOD = "IsSystemMemoryAvailable";
const double NAN_VALUE = std::numeric_limits<double>::quiet_NaN();
const double INFINITE = std::numeric_limits<double>::infinity();
const double LARGEST = std::numeric_limits<double>::max();
const double SMALLEST = std::numeric_limits<double>::denorm_min();

// A volume with blocks of one size; `free` of them for everybody, and one more for the superuser.
struct statvfs volume(unsigned long blockSize, fsblkcnt_t blocks, fsblkcnt_t free)
{
    struct statvfs fs = {};
    fs.f_bsize = blockSize;
    fs.f_frsize = blockSize;
    fs.f_blocks = blocks;
    fs.f_bavail = free;
    fs.f_bfree = free + 1;
    return fs;
}

// 3 MiB free of 5 MiB.
const struct statvfs SMALL = volume(4096, 1280, 768);

bool ask(double requiredMegabytes)
{
    return coreSystem().IsSystemMemoryAvailable(requiredMegabytes);
}

bool isAvailable(const struct statvfs& fs, double requiredMegabytes)
{
    platform().answer(CALL, 0, fs);
    return ask(requiredMegabytes);
}

const std::string ENTRY = CORE_SYSTEM.debug(STORAGE_METHOD, "CoreSystem IsSystemMemoryAvailable");

Texts trace(const std::string& bytes, const std::string& converted, const std::string& result)
{
    return {ENTRY, CALL, CORE_SYSTEM.debug(STORAGE_METHOD, bytes),
            CORE_SYSTEM.debug(STORAGE_METHOD, "[convert] Avail Memory : " + converted + " "),
            CORE_SYSTEM.debug(STORAGE_METHOD, result)};
}

const std::string SMALL_BYTES =
    "Total Memory : 5242880.000000 byte, Avail Memory : 3145728.000000 byte";
const std::string SMALL_CONVERTED = "3.000000 mb(0.002930 gb)";

LoggedCall smallCall(const std::string& name, double required, bool answer,
                     const std::string& result)
{
    return {name, [=] { EXPECT_EQ(isAvailable(SMALL, required), answer); },
            trace(SMALL_BYTES, SMALL_CONVERTED, result)};
}

const std::vector<LoggedCall> STORAGE_CALLS = {
    smallCall("StorageIsEnough", 2.5, true, "Avail Memory is upper 2.500000"),
    smallCall("StorageIsExactlyThat", 3, false, "Total mem under 3.000000"),
    smallCall("StorageIsTooSmall", 3.25, false, "Total mem under 3.250000"),
    smallCall("StorageForNaN", NAN_VALUE, false, "Total mem under nan"),
    smallCall("StorageForInfinity", INFINITE, false, "Total mem under inf"),
    smallCall("StorageForNegative", -1, true, "Avail Memory is upper -1.000000"),
    {"StorageIsFull", [] { EXPECT_FALSE(isAvailable(volume(4096, 1280, 0), 0)); },
     trace("Total Memory : 5242880.000000 byte, Avail Memory : 0.000000 byte",
           "0.000000 mb(0.000000 gb)", "Total mem under 0.000000")},
    {"StorageOfNothing", [] { EXPECT_FALSE(isAvailable(volume(0, 0, 0), 0)); },
     trace("Total Memory : 0.000000 byte, Avail Memory : 0.000000 byte", "0.000000 mb(0.000000 gb)",
           "Total mem under 0.000000")},
    {"StorageOfThreeTebibytes",
     [] { EXPECT_TRUE(isAvailable(volume(4096, 805306368, 402653184), 1572863)); },
     trace("Total Memory : 3298534883328.000000 byte, Avail Memory : 1649267441664.000000 byte",
           "1572864.000000 mb(1536.000000 gb)", "Avail Memory is upper 1572863.000000")},
    {"StorageUnreadable",
     [] {
         platform().answer(CALL, -1);
         EXPECT_FALSE(ask(0));
     },
     {ENTRY, CALL, CORE_SYSTEM.error(STORAGE_METHOD, "Fail to get internal memory size")}},
};

LOGGED_CALLS(Storage, STORAGE_CALLS);

class StorageTest : public PlatformTest {};

TEST_F(StorageTest, MoreThanWhatIsRequiredMustBeFree)
{
    const unsigned long width = std::numeric_limits<unsigned long>::max();
    const fsblkcnt_t most = std::numeric_limits<fsblkcnt_t>::max();
    const struct statvfs everything = volume(width, most, most);
    const struct statvfs nothing = volume(0, 0, 0);
    const struct statvfs fourGibibytes = volume(65536, 65536, 65536);
    const struct statvfs nearly16Tebibytes = volume(4096, UINT32_MAX, UINT32_MAX); // a block less
    const struct {
        std::string name;
        struct statvfs fs;
        double required;
        bool answer;
    } rows[] = {
        {"a little less", SMALL, std::nextafter(3.0, 0.0), true},
        {"exactly that", SMALL, 3.0, false},
        {"a little more", SMALL, std::nextafter(3.0, 4.0), false},
        {"none of one byte", volume(1, 1, 1), 0.0, true},
        {"the largest of everything", everything, LARGEST, false},
        {"the smallest below zero of nothing", nothing, -SMALLEST, true},
        {"a product beyond 32 bits", fourGibibytes, 4095.5, true},
        {"all of a product beyond 32 bits", fourGibibytes, 4096, false},
        {"blocks counted with 32 bits", nearly16Tebibytes, 16777215.5, true},
        {"all blocks counted with 32 bits", nearly16Tebibytes, 16777215.99609375, false},
        {"both of 32 bits", volume(UINT32_MAX, UINT32_MAX, UINT32_MAX), 17592186036223.5, true},
    };
    for (const auto& row : rows)
        EXPECT_EQ(isAvailable(row.fs, row.required), row.answer) << row.name;
}

TEST_F(StorageTest, FieldsOf64BitsAreWhole)
{
    if constexpr (sizeof(fsblkcnt_t) >= 8) {
        const fsblkcnt_t blocks = fsblkcnt_t(1) << 40;
        const struct statvfs fs = volume(4096, blocks, blocks); // 2^52 bytes
        EXPECT_TRUE(isAvailable(fs, 4294967295.5));
        EXPECT_FALSE(isAvailable(fs, 4294967296));
        // A product beyond 64 bits: 2^72 bytes.
        EXPECT_TRUE(isAvailable(volume(1u << 31, blocks << 1, blocks << 1), 4503599627370495.5));
        EXPECT_FALSE(isAvailable(volume(1u << 31, blocks << 1, blocks << 1), 4503599627370496));
    } else {
        GTEST_SKIP() << "the machine counts blocks with 32 bits";
    }
}

TEST_F(StorageTest, FreeSpaceIsThatOfOrdinaryUsersInBlocksOfTheirOwnSize)
{
    platform().debugMode = 1;
    struct statvfs fs = volume(1 << 20, 7, 3);
    fs.f_frsize = 1 << 10;
    fs.f_bfree = 5;
    EXPECT_FALSE(isAvailable(fs, 3));
    EXPECT_EQ(platform().trace(),
              trace("Total Memory : 7168.000000 byte, Avail Memory : 3145728.000000 byte",
                    SMALL_CONVERTED, "Total mem under 3.000000"));
}

TEST_F(StorageTest, NegativeResultsAloneAreFailures)
{
    const std::string failed =
        CORE_SYSTEM.error(STORAGE_METHOD, "Fail to get internal memory size");
    for (const int code : {-1, INT32_MIN, 1}) {
        platform().forgetEvents();
        platform().answer(CALL, code, SMALL);
        EXPECT_EQ(ask(code < 0 ? -INFINITE : 2.5), code > 0) << code;
        EXPECT_EQ(platform().trace(), code < 0 ? (Texts{CALL, failed}) : Texts{CALL}) << code;
    }
}

} // namespace
