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

TEST_F(FakeBusTest, WhatIsNotReleasedIsHeld)
{
    bus().answerText("text");
    GDBusMessage* const call = g_dbus_message_new_method_call("a.b", "/c", "d.e", "F");
    GDBusMessage* const answer = bus().send(call, nullptr);
    EXPECT_THAT(bus().held(), ElementsAre("call", "reply"));
    g_object_unref(call);
    EXPECT_THAT(bus().held(), ElementsAre("reply"));
    g_object_unref(answer);
    EXPECT_THAT(bus().held(), IsEmpty());
}

TEST_F(FakeBusTest, EachReferenceToTheConnectionCounts)
{
    GDBusConnection* const first = bus().connect(nullptr);
    EXPECT_EQ(bus().connect(nullptr), first);
    EXPECT_THAT(bus().held(), ElementsAre("connection", "connection"));
    g_object_unref(first);
    EXPECT_THAT(bus().held(), ElementsAre("connection"));
    bus().reset();
    EXPECT_THAT(bus().held(), IsEmpty());
}

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

TEST_F(FakeBusTest, CallIsDescribedWhole)
{
    bus().answerNothing({});
    GDBusMessage* const call = g_dbus_message_new_method_call(nullptr, "/c", "d.e", "F");
    g_dbus_message_set_body(call, g_variant_new("(i)", 7));
    GDBusConnection* const connection = bus().connect(nullptr);
    guint32 serial = 0;
    GCancellable* const cancellable = g_cancellable_new();
    g_dbus_connection_send_message_with_reply_sync(connection, call,
                                                   G_DBUS_SEND_MESSAGE_FLAGS_PRESERVE_SERIAL, 20,
                                                   &serial, cancellable, nullptr);
    g_dbus_connection_flush_sync(nullptr, cancellable, nullptr);
    g_bus_get_sync(G_BUS_TYPE_SESSION, cancellable, nullptr);
    EXPECT_THAT(platform().trace(),
                ElementsAre("send(connection, nothing /c d.e F body, flags 1, timeout 20, serial, "
                            "cancellable)",
                            "flush(no connection, cancellable, no error)",
                            "g_bus_get_sync(another bus, cancellable)"));
    g_object_unref(cancellable);
    g_object_unref(call);
}
