// SPDX-License-Identifier: Apache-2.0
// The fake bus itself: a test that stands on it must fail when it should.
#include <gtest/gtest-spi.h>

#include "support/FakeBus.h"
#include "support/PlatformTest.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;

class FakeBusTest : public PlatformTest {
protected:
    FakeBusTest()
    {
        bus().reset();
    }
    ~FakeBusTest() override
    {
        bus().reset();
    }

    static GDBusMessage* reply()
    {
        GDBusMessage* const call = g_dbus_message_new_method_call("a.b", "/c", "d.e", "F");
        GDBusMessage* const answer = bus().send(call, nullptr);
        g_object_unref(call);
        return answer;
    }
};

TEST_F(FakeBusTest, SecondReleaseFailsTheTest)
{
    bus().answerText("text");
    GDBusMessage* const answer = reply();
    g_object_unref(answer);
    EXPECT_NONFATAL_FAILURE(g_object_unref(answer), "the reply was released too often");
}

TEST_F(FakeBusTest, ErrorsAreHeldUntilTheyAreFreed)
{
    GError* error = nullptr;
    bus().giveError({G_IO_ERROR, 7, "text"}, &error);
    EXPECT_THAT(bus().held(), ElementsAre("error"));
    EXPECT_EQ(error->code, 7);
    EXPECT_STREQ(error->message, "text");
    g_error_free(error);
    EXPECT_THAT(bus().held(), IsEmpty());
    EXPECT_NONFATAL_FAILURE(bus().forgetError(error), "an error was freed that is not held");
}

TEST_F(FakeBusTest, WhatGLibFindsWrongFailsTheTest)
{
    EXPECT_NONFATAL_FAILURE(g_critical("wrong argument"), "wrong argument");
}
