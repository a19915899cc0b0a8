// SPDX-License-Identifier: Apache-2.0
// The fake itself: a test that stands on it must fail when it should.
#include <cstring>

#include <gtest/gtest-spi.h>

#include <CoreMutex.h>
#include <CoreMutexLock.h>
#include <CoreUtil.h>
#include <dlog.h>
#include <system_info.h>

#include "support/PlatformTest.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;

class FakePlatformTest : public PlatformTest {};

TEST_F(FakePlatformTest, CallWithoutAnswerFailsTheTest)
{
    char* value = nullptr;
    EXPECT_NONFATAL_FAILURE(system_info_get_platform_string("no.such/key", &value),
                            "no answer was set for system_info_get_platform_string(no.such/key)");
    EXPECT_EQ(value, nullptr);
}

TEST_F(FakePlatformTest, ValueIsWrittenWhateverTheResult)
{
    platform().answer("read(7, null)", -5, 42);
    int value = 0;
    EXPECT_EQ(platform().reply(&value, "read", 7, static_cast<const char*>(nullptr)), -5);
    EXPECT_EQ(value, 42);
    platform().answer("close(7)", -1);
    EXPECT_EQ(platform().call("close", 7), -1);
    EXPECT_THAT(platform().trace(), ElementsAre("read(7, null)", "close(7)"));
}

TEST_F(FakePlatformTest, LineWithoutThePrefixFailsTheTest)
{
    EXPECT_NONFATAL_FAILURE(
        __dlog_print(LOG_ID_MAIN, DLOG_ERROR, "Tag", "%s %s %d and more text", "a.cpp", "f", 1),
        "and more text");
}

TEST_F(FakePlatformTest, LineOfAnotherLogOrPlaceFailsTheTest)
{
    const char* const format = "%s: %s(%d) > text";
    EXPECT_NONFATAL_FAILURE(__dlog_print(LOG_ID_RADIO, DLOG_ERROR, "Tag", format, "a.cpp", "f", 1),
                            "LOG_ID_MAIN");
    EXPECT_NONFATAL_FAILURE(__dlog_print(LOG_ID_MAIN, DLOG_ERROR, "Tag", format, "a.cpp", "f", 0),
                            "line.line");
    EXPECT_NONFATAL_FAILURE(__dlog_print(LOG_ID_MAIN, DLOG_ERROR, "Tag", format, "b/a.cpp", "f", 1),
                            "b/a.cpp");
}

TEST_F(FakePlatformTest, NoticesAndOtherPrioritiesAreToldApart)
{
    const char* const format = "%s: %s(%d) > %s";
    __dlog_print(LOG_ID_MAIN, DLOG_INFO, "Tag", format, "a.cpp", "f", 1, "text");
    __dlog_print(LOG_ID_MAIN, DLOG_WARN, "Tag", format, "a.cpp", "f", 2, "text");
    EXPECT_THAT(platform().trace(),
                ElementsAre("notice a.cpp f: text <- %s", "priority 5 a.cpp f: text <- %s"));
}

TEST_F(FakePlatformTest, CipherIsReversibleAndHidesEveryByte)
{
    std::string plain;
    for (int byte = 0; byte < 256; ++byte)
        plain += static_cast<char>(byte);
    EXPECT_EQ(decipher(encipher(plain)), plain);
    EXPECT_EQ(encipher(plain).find_first_not_of("0123456789abcdef"), std::string::npos);
}

TEST_F(FakePlatformTest, LocksAreRecordedByName)
{
    {
        const CoreMutexLock scoped("one");
        CoreMutex other("two");
        other.Lock();
        other.Unlock();
    }
    EXPECT_THAT(platform().trace(),
                ElementsAre("lock one", "lock two", "unlock two", "unlock one"));
}

TEST_F(FakePlatformTest, NumbersBecomeText)
{
    EXPECT_EQ(CoreUtil::GetInstance()->intToStr(-12), "-12");
}

TEST_F(FakePlatformTest, LedgerTellsOwnersApart)
{
    char* const handedOut = ledger().handOut("a");
    char* const copied = strdup("b");
    EXPECT_EQ(ledger().origin(handedOut), "platform: a");
    EXPECT_EQ(ledger().origin(copied), "copy: b");
    EXPECT_THAT(ledger().live(), ElementsAre("copy: b", "platform: a"));
    std::free(handedOut);
    EXPECT_THAT(ledger().live(), ElementsAre("copy: b"));
    std::free(copied);
    EXPECT_THAT(ledger().live(), IsEmpty());
    std::free(nullptr);
}

TEST_F(FakePlatformTest, ChosenAllocationFailsOnce)
{
    const FailingAllocation failure(Allocation::STRDUP, 1);
    char* const first = strdup("a");
    EXPECT_NE(first, nullptr);
    EXPECT_FALSE(failure.happened());
    EXPECT_EQ(strdup("b"), nullptr);
    EXPECT_TRUE(failure.happened());
    std::free(first);
}

TEST_F(FakePlatformTest, FailingNewThrowsOrGivesNull)
{
    const auto allocate = [] { ::operator delete(::operator new(100)); };
    {
        const FailingAllocation failure(Allocation::THROWING);
        EXPECT_THROW(allocate(), std::bad_alloc);
        EXPECT_NO_THROW(allocate());
    }
    const FailingAllocation failure(Allocation::NOTHROW);
    EXPECT_NO_THROW(allocate());
    EXPECT_EQ(::operator new(100, std::nothrow), nullptr);
}

TEST_F(FakePlatformTest, PauseKeepsAllocationsFromFailing)
{
    const FailingAllocation failure(Allocation::THROWING);
    {
        const AllocationPause pause;
        EXPECT_NO_THROW(::operator delete(::operator new(100)));
    }
    EXPECT_FALSE(failure.happened());
}

TEST_F(FakePlatformTest, ResetForgetsEverything)
{
    platform().answer("call()", 0);
    platform().debugMode = 1;
    platform().tag = "Tag";
    platform().onEvent = [](const Event&) {};
    platform().call("call");
    char* const forgotten = ledger().handOut("text");
    platform().reset();
    EXPECT_THAT(platform().events(), IsEmpty());
    EXPECT_EQ(platform().debugMode, 0);
    EXPECT_FALSE(platform().tag);
    EXPECT_FALSE(platform().onEvent);
    EXPECT_THAT(ledger().live(), IsEmpty());
    EXPECT_NONFATAL_FAILURE(platform().call("call"), "no answer");
    std::free(forgotten);
}
