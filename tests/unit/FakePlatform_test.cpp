// SPDX-License-Identifier: Apache-2.0
// The fake itself: a test that stands on it must fail when it should.
#include <cstring>
#include <ctime>

#include <gtest/gtest-spi.h>

#include <CoreLogger.h>
#include <CoreMutex.h>
#include <CoreMutexLock.h>
#include <CoreUtil.h>
#include <dlog.h>
#include <system_info.h>
#include <tapi_common.h>
#include <telephony.h>

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

TEST_F(FakePlatformTest, LocksAreRecordedByNameAndStyle)
{
    {
        const CoreMutexLock scoped("one");
        CoreMutex other("two");
        other.Lock();
        other.Unlock();
    }
    EXPECT_THAT(platform().trace(),
                ElementsAre("lock one", "two.Lock()", "two.Unlock()", "unlock one"));
}

TEST_F(FakePlatformTest, LockTakenTwiceFailsTheTest)
{
    const CoreMutexLock outer("one");
    EXPECT_NONFATAL_FAILURE(const CoreMutexLock inner("one"), "one was taken twice");
    CoreMutex other("one");
    EXPECT_NONFATAL_FAILURE(other.Lock(), "one was taken twice");
    other.Unlock();
}

TEST_F(FakePlatformTest, NumbersBecomeText)
{
    EXPECT_EQ(CoreUtil::GetInstance()->intToStr(-12), "-12");
    EXPECT_THAT(platform().trace(), ElementsAre("intToStr(-12)"));
    platform().numberTextThrows = true;
    EXPECT_THROW(CoreUtil::GetInstance()->intToStr(-12), std::bad_alloc);
}

TEST_F(FakePlatformTest, FormatBuffersAreSearchedWhole)
{
    CoreLogger& logger = *CoreLogger::GetInstance();
    char* const buffer = logger.GetBuffer(logger.GetBufferIndex());
    std::strcpy(buffer + 580, "at the end");
    EXPECT_TRUE(isInFormatBuffer("at the end"));
    EXPECT_FALSE(isInFormatBuffer("at the beginning"));
    platform().reset();
    EXPECT_FALSE(isInFormatBuffer("at the end"));
}

TEST_F(FakePlatformTest, MessageBeyondItsBufferFailsTheTest)
{
    CoreLogger& logger = *CoreLogger::GetInstance();
    logger.GetBuffer(logger.GetBufferIndex())[599] = '\0';
    EXPECT_NONFATAL_FAILURE(platform().reset(), "longer than its buffer");
}

TEST_F(FakePlatformTest, ClockTellsTheTimeThatWasSet)
{
    EXPECT_GT(std::time(nullptr), 1000000);
    platform().now = 12345;
    std::time_t slot = 0;
    EXPECT_EQ(std::time(&slot), 12345);
    EXPECT_EQ(slot, 12345);
    platform().reset();
    EXPECT_GT(std::time(nullptr), 1000000);
}

TEST_F(FakePlatformTest, AnswerOfAnotherTypeFailsTheTest)
{
    platform().answer("read()", 0, 42L);
    int value = 0;
    EXPECT_NONFATAL_FAILURE(platform().reply(&value, "read"), "another type than its slot");
    EXPECT_EQ(value, 0);
    platform().answer("telephony_init()", 0, 2);
    telephony_handle_list_s list = {0, nullptr};
    EXPECT_NONFATAL_FAILURE(telephony_init(&list), "another type than its slot");
    EXPECT_EQ(list.handle, nullptr);
}

TEST_F(FakePlatformTest, EnumerationsTakeEveryNumber)
{
    for (const int number : {0, 3, 7, -1}) {
        platform().answer("read()", 0, number);
        telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
        EXPECT_EQ(platform().reply(&state, "read"), 0);
        EXPECT_EQ(std::memcmp(&state, &number, sizeof number), 0) << number;
    }
    platform().answer("read()", 0, TELEPHONY_SIM_STATE_UNKNOWN);
    telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
    platform().reply(&state, "read");
    EXPECT_EQ(state, TELEPHONY_SIM_STATE_UNKNOWN);
}

TEST_F(FakePlatformTest, OpenListsAreLiveUntilTheirRelease)
{
    platform().answer("telephony_init()", 0, 2u);
    platform().answer("telephony_deinit(list of 2)", 0);
    telephony_handle_list_s kept = {0, nullptr};
    telephony_handle_list_s released = {0, nullptr};
    EXPECT_EQ(telephony_init(&kept), 0);
    EXPECT_EQ(telephony_init(&released), 0);
    EXPECT_EQ(kept.count, 2u);
    EXPECT_EQ(callText("ask", kept.handle[1]), "ask(slot 1)");
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 2", "list of 2"));
    EXPECT_EQ(telephony_deinit(&released), 0);
    EXPECT_EQ(released.count, 0u);
    EXPECT_EQ(released.handle, nullptr);
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 2"));
    platform().reset();
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
}

TEST_F(FakePlatformTest, SecondReleaseOfListFailsTheTest)
{
    platform().answer("telephony_init()", 0, 1u);
    platform().answer("telephony_deinit(list of 1)", 0);
    platform().answer("telephony_deinit(no list)", 0);
    telephony_handle_list_s list = {0, nullptr};
    telephony_init(&list);
    telephony_handle_list_s copy = list;
    telephony_handle_list_s other = {1, &list.handle[0] + 1};
    EXPECT_NONFATAL_FAILURE(telephony_deinit(&other), "a list of 1 was released that is not open");
    EXPECT_EQ(telephony_deinit(&list), 0);
    EXPECT_EQ(telephony_deinit(&list), 0); // emptied: nothing to release
    EXPECT_NONFATAL_FAILURE(telephony_deinit(&copy), "a list of 1 was released that is not open");
}

TEST_F(FakePlatformTest, SecondReleaseOfModemFailsTheTest)
{
    platform().answer("tel_init(cp0)", 0);
    platform().answer("tel_init(null)", 0);
    platform().answer("tel_init(cp1)", -1);
    platform().answer("tel_deinit(modem cp0)", 0);
    EXPECT_EQ(tel_init("cp1"), nullptr);
    EXPECT_EQ(tel_init("cp0"), tel_init("cp0"));
    tel_init(nullptr);
    EXPECT_THAT(platform().liveHandles(), ElementsAre("modem cp0", "modem cp0", "modem null"));
    TapiHandle* const handle = tel_init("cp0");
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(tel_deinit(handle), 0);
    EXPECT_THAT(platform().liveHandles(), ElementsAre("modem null"));
    EXPECT_NONFATAL_FAILURE(tel_deinit(handle), "modem cp0 was released but is not open");
}

TEST_F(FakePlatformTest, NullHandlesHaveTextsToo)
{
    EXPECT_EQ(callText("ask", telephony_h(nullptr), static_cast<TapiHandle*>(nullptr)),
              "ask(no slot, no modem)");
}

TEST_F(FakePlatformTest, LedgerFreesWhatIsKept)
{
    ledger().handOut("a");
    EXPECT_NE(strdup("b"), nullptr);
    EXPECT_THAT(ledger().freeAll(), ElementsAre("copy: b", "platform: a"));
    EXPECT_THAT(ledger().live(), IsEmpty());
    EXPECT_THAT(ledger().freeAll(), IsEmpty());
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
    platform().numberTextThrows = true;
    platform().onEvent = [](const Event&) {};
    platform().call("call");
    char* const forgotten = ledger().handOut("text");
    platform().reset();
    EXPECT_THAT(platform().events(), IsEmpty());
    EXPECT_EQ(platform().debugMode, 0);
    EXPECT_FALSE(platform().tag);
    EXPECT_FALSE(platform().numberTextThrows);
    EXPECT_FALSE(platform().onEvent);
    EXPECT_THAT(ledger().live(), IsEmpty());
    EXPECT_NONFATAL_FAILURE(platform().call("call"), "no answer");
    std::free(forgotten);
}
