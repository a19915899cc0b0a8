// SPDX-License-Identifier: Apache-2.0
// Counts without an atomic, so that a mutex that does not exclude loses counts; the thread sanitizer
// sees every unordered access.
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "CoreMutex.h"
#include "CoreMutexLock.h"
#include "support/Together.h"

namespace {

// Reads, lets others run, writes.
void countSlowly(int& count)
{
    const int before = count;
    std::this_thread::yield();
    count = before + 1;
}

// Every thread counts 200 times, each time while `countOnce(number, count)` holds the mutex.
template <typename Work>
void expectExclusion(int threads, Work countOnce)
{
    int count = 0;
    together(threads, [&](int number) {
        for (int round = 0; round < 200; ++round)
            countOnce(number, count);
    });
    EXPECT_EQ(threads * 200, count);
}

TEST(NamedMutexTest, BothClassesMeanTheSameMutex)
{
    expectExclusion(8, [](int number, int& count) {
        if (number % 2 == 0) {
            const CoreMutexLock lock("NamedMutexTest::both");
            countSlowly(count);
        } else {
            CoreMutex mutex("NamedMutexTest::both");
            mutex.Lock();
            countSlowly(count);
            mutex.Unlock();
        }
    });
}

TEST(NamedMutexTest, HolderMayTakeItAgain)
{
    expectExclusion(4, [](int, int& count) {
        const CoreMutexLock outer("NamedMutexTest::again");
        {
            const CoreMutexLock inner("NamedMutexTest::again");
            CoreMutex mutex("NamedMutexTest::again");
            mutex.Lock();
            mutex.Unlock();
        }
        countSlowly(count); // the outer lock still holds
    });
}

TEST(NamedMutexTest, LockOutlivesTheObjectThatTookIt)
{
    expectExclusion(4, [](int, int& count) {
        CoreMutex("NamedMutexTest::outlives").Lock();
        countSlowly(count);
        CoreMutex("NamedMutexTest::outlives").Unlock();
    });
}

TEST(NamedMutexTest, ThousandNamesAreThousandMutexes)
{
    const auto name = [](int i) { return "NamedMutexTest::name " + std::to_string(i); };
    for (const int held : {0, 1, 500, 999}) {
        const CoreMutexLock lock(name(held).c_str());
        std::thread([&] { // hangs if another name meant the held mutex
            for (int i = 0; i < 1000; ++i)
                if (i != held)
                    const CoreMutexLock other(name(i).c_str());
        })
            .join();
    }
}

TEST(NamedMutexTest, ThreadsThatMakeTheSameNameAtOnceGetOneMutex)
{
    for (int i = 0; i < 50; ++i) {
        const std::string name = "NamedMutexTest::made at once " + std::to_string(i);
        int count = 0;
        together(8, [&](int) {
            const CoreMutexLock lock(name.c_str());
            countSlowly(count);
        });
        ASSERT_EQ(8, count) << name;
    }
}

TEST(NamedMutexTest, NameIsCopied)
{
    std::string name = "NamedMutexTest::copied";
    CoreMutex mutex(name.c_str());
    name.assign(name.size(), 'x');
    expectExclusion(4, [&](int number, int& count) {
        CoreMutex own("NamedMutexTest::copied");
        CoreMutex& used = number % 2 == 0 ? mutex : own;
        used.Lock();
        countSlowly(count);
        used.Unlock();
    });
}

TEST(NamedMutexTest, NullIsTheEmptyName)
{
    expectExclusion(4, [](int number, int& count) {
        const CoreMutexLock lock(number % 2 == 0 ? nullptr : "");
        countSlowly(count);
    });
}

TEST(NamedMutexTest, UnlockByAThreadThatDoesNotHoldItDoesNothing)
{
#if defined(__SANITIZE_THREAD__)
    GTEST_SKIP() << "the thread sanitizer reports such an unlock, as it should";
#endif
    expectExclusion(4, [](int, int& count) {
        const CoreMutexLock lock("NamedMutexTest::not held");
        std::thread([] { CoreMutex("NamedMutexTest::not held").Unlock(); }).join();
        countSlowly(count);
    });
}

} // namespace
