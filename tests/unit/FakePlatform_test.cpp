// SPDX-License-Identifier: Apache-2.0
// The fake itself: a test that stands on it must fail when it should.
#include <gtest/gtest-spi.h>

#include <CoreLogger.h>
#include <CoreMutex.h>
#include <CoreMutexLock.h>
#include <dlog.h>
#include <system_info.h>
#include <tapi_common.h>
#include <telephony.h>

#include "support/FakeBus.h"
#include "support/PlatformTest.h"

using namespace fake;
using testing::ElementsAre;

class FakePlatformTest : public PlatformTest {};

TEST_F(FakePlatformTest, CallWithoutAnswerFailsTheTest)
{
    char* value = nullptr;
    EXPECT_NONFATAL_FAILURE(system_info_get_platform_string("no.such/key", &value),
                            "no answer was set for system_info_get_platform_string(no.such/key)");
    EXPECT_EQ(value, nullptr);
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

TEST_F(FakePlatformTest, LockTakenTwiceFailsTheTest)
{
    const CoreMutexLock outer("one");
    EXPECT_NONFATAL_FAILURE(const CoreMutexLock inner("one"), "one was taken twice");
    CoreMutex other("one");
    EXPECT_NONFATAL_FAILURE(other.Lock(), "one was taken twice");
    other.Unlock();
}

TEST_F(FakePlatformTest, MessageBeyondItsBufferFailsTheTest)
{
    CoreLogger& logger = *CoreLogger::GetInstance();
    logger.GetBuffer(logger.GetBufferIndex())[599] = '\0';
    EXPECT_NONFATAL_FAILURE(platform().reset(), "longer than its buffer");
}

TEST_F(FakePlatformTest, AnswerOfAnotherTypeFailsTheTest)
{
    platform().answer("read()", 0, 42L);
    int value = 0;
    EXPECT_NONFATAL_FAILURE(platform().reply("read", &value), "another type than its slot");
    EXPECT_EQ(value, 0);
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

TEST_F(FakePlatformTest, SecondReleaseOfBusObjectFailsTheTest)
{
    bus().answerText("text");
    GDBusMessage* const call = g_dbus_message_new_method_call("a.b", "/c", "d.e", "F");
    GDBusMessage* const answer = bus().send(call, nullptr);
    g_object_unref(answer);
    EXPECT_NONFATAL_FAILURE(g_object_unref(answer), "the reply was released too often");
    g_object_unref(call);
}

TEST_F(FakePlatformTest, ErrorsAreHeldUntilTheyAreFreed)
{
    GError* error = nullptr;
    bus().giveError({G_IO_ERROR, 7, "text"}, &error);
    EXPECT_THAT(bus().held(), ElementsAre("error"));
    g_error_free(error);
    EXPECT_NONFATAL_FAILURE(bus().forgetError(error), "an error was freed that is not held");
}

TEST_F(FakePlatformTest, WhatGLibFindsWrongFailsTheTest)
{
    EXPECT_NONFATAL_FAILURE(g_critical("wrong argument"), "wrong argument");
}
