// SPDX-License-Identifier: Apache-2.0
// The serial number that the device daemon tells on the system bus.
#include <array>

#include "support/FakeBus.h"
#include "support/PlatformTest.h"

using namespace fake;
using testing::Each;
using testing::ElementsAre;
using testing::Field;
using testing::IsEmpty;
using testing::StrEq;

namespace {

const std::string QUESTION = "GetDeviceUniqueID";
const std::string INIT = "InitDbusConnection";
const std::string SEND = "SendDbusMethodNReceive";
const std::string PARSE = "ParseDeviceUniqueID";

const std::string CONNECT_CALL = "g_bus_get_sync(system, no cancellable)";
const std::string SEND_CALL =
    "send(connection, org.tizen.system.deviced /Org/Tizen/System/DeviceD/Board "
    "org.tizen.system.deviced.Board GetSerial no body, flags 0, timeout -1, no serial, "
    "no cancellable)";
const std::string FLUSH_CALL = "flush(connection, no cancellable, no error)";

std::string debugLine(const std::string& function, const std::string& text)
{
    return D_BUS_MANAGER.debug(function, text);
}

std::string errorLine(const std::string& function, const std::string& text)
{
    return D_BUS_MANAGER.error(function, text);
}

// "FUNCTION failed:[CODE:MESSAGE]"
std::string detailLine(const std::string& step, const std::string& function, int code,
                       const std::string& message)
{
    return errorLine(step, function + " failed:[" + std::to_string(code) + ":" + message + "] <- " +
                               function + " failed:[%d:%s]");
}

const Texts ENTERED = {debugLine(QUESTION, "DBusManager::GetDeviceUniqueID"),
                       debugLine(INIT, "DBusManager::InitDbusConnection"), "g_type_init()",
                       CONNECT_CALL};
const Texts REFUSED = ENTERED + Texts{errorLine(INIT, "GDBusConnection is NULL")};
const Texts SENT =
    ENTERED + Texts{debugLine(INIT, "Success GDBusConnection !!"),
                    debugLine(SEND, "DBusManager::SendDbusMethodNReceive"), SEND_CALL};
const Texts UNANSWERED = SENT + Texts{errorLine(SEND, "reply is NULL")};
const Texts NO_REPLY = {errorLine(SEND, "[dbus] CORE_DBUS_ERROR_REPLY_FAIL")};
const Texts REPLIED = SENT + Texts{debugLine(SEND, "Success get reply"), FLUSH_CALL,
                                   debugLine(PARSE, "DBusManager::ParseDeviceUniqueID")};
const Texts ERROR_REPLIED = REPLIED + Texts{"g_dbus_message_to_gerror()"};

Texts answeredTrace(const std::string& serial)
{
    return REPLIED + Texts{debugLine(PARSE, "Success to get deviceUniqueID: " + serial + " "),
                           debugLine(QUESTION, "deviceUniqueID : " + serial)};
}

// The slot's content after a question that begins with `preset` in it.
char* ask(int expectedCode, char* preset = nullptr)
{
    char* slot = preset;
    EXPECT_EQ(CoreSystemInternals::instance<DBusManager>()->GetDeviceUniqueID(&slot), expectedCode);
    return slot;
}

void expectFailure(int code)
{
    char preset = 'p';
    EXPECT_EQ(ask(code, &preset), nullptr);
    EXPECT_EQ(preset, 'p');
}

const FakeBus::Error TIMED_OUT = {G_IO_ERROR, 24, "Time out was reached"};
const FakeBus::Error REFUSED_ERROR = {G_IO_ERROR, 39, "Could not connect: Connection refused"};
const FakeBus::Error NO_SERVICE = {G_DBUS_ERROR, 2, "no such service"};

// The bus answers what `arrange` says, and the question fails with the code.
LoggedCall failedCall(const std::string& name, int code, const std::function<void()>& arrange,
                      const Texts& trace)
{
    return {name,
            [=] {
                bus().reset();
                arrange();
                expectFailure(code);
            },
            trace};
}

const std::vector<LoggedCall> READ_CALLS = {
    {"SerialAnswered",
     [] {
         bus().reset();
         bus().answerText("R38N50A4ZB");
         std::free(ask(0));
     },
     answeredTrace("R38N50A4ZB")},
    failedCall(
        "SerialConnectionFailedWithoutError", 1, [] { bus().refuseConnection({}); },
        REFUSED + Texts{errorLine(INIT, "[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL")}),
    failedCall(
        "SerialConnectionFailed", 1, [] { bus().refuseConnection(REFUSED_ERROR); },
        REFUSED +
            Texts{detailLine(INIT, "g_bus_get_sync()", 39, "Could not connect: Connection refused"),
                  errorLine(INIT, "[dbus] DBUS_ERROR_CONNECTION_FAIL")}),
    failedCall(
        "SerialConnectionTimedOut", 3, [] { bus().refuseConnection(TIMED_OUT); },
        REFUSED + Texts{detailLine(INIT, "g_bus_get_sync()", 24, "Time out was reached"),
                        errorLine(INIT, "[dbus] DBUS_ERROR_CONNECTION_TIME_OUT")}),
    failedCall(
        "SerialUnansweredWithoutError", 2, [] { bus().answerNothing({}); }, UNANSWERED + NO_REPLY),
    failedCall(
        "SerialUnanswered", 2, [] { bus().answerNothing(NO_SERVICE); },
        UNANSWERED +
            Texts{detailLine(SEND, "g_dbus_connection_send_message_with_reply_sync()", 2,
                             "no such service")} +
            NO_REPLY),
    failedCall(
        "SerialErrorReply", 2,
        [] { bus().answerError("org.freedesktop.DBus.Error.AccessDenied", "not for you"); },
        ERROR_REPLIED +
            Texts{detailLine(PARSE, "g_dbus_message_to_gerror()", 9,
                             "GDBus.Error:org.freedesktop.DBus.Error.AccessDenied: not for you")}),
    failedCall(
        "SerialErrorReplyWithoutDetail", 2,
        [] {
            bus().answerError("org.freedesktop.DBus.Error.AccessDenied", "not for you");
            bus().producesErrors = false;
        },
        ERROR_REPLIED),
    failedCall(
        "SerialReplyWithoutBody", 2, [] { bus().answer(nullptr); }, REPLIED),
    failedCall(
        "SerialReplyWithNumber", 2, [] { bus().answer(g_variant_new("(i)", 7)); }, REPLIED),
};

INSTANTIATE_TEST_SUITE_P(Serial, LoggedCallTest, testing::ValuesIn(READ_CALLS),
                         rowName<LoggedCall>);

class DBusManagerTest : public PlatformTest {
protected:
    DBusManagerTest()
    {
        bus().reset();
    }
    ~DBusManagerTest() override
    {
        bus().reset();
    }
};

TEST_F(DBusManagerTest, SerialIsCopyThatTheCallerFrees)
{
    bus().answerText("R38N50A4ZB");
    char preset = 'p';
    char* const serial = ask(0, &preset);
    ASSERT_THAT(serial, StrEq("R38N50A4ZB"));
    EXPECT_THAT(ledger().live(), ElementsAre("copy: R38N50A4ZB")); // the parser's is freed
    EXPECT_EQ(ledger().origin(serial), "copy: R38N50A4ZB");
    std::free(serial);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_F(DBusManagerTest, TwoCallsGiveTwoAllocationsOfTheSameText)
{
    bus().answerText("R38N50A4ZB");
    char* const first = ask(0);
    char* const second = ask(0);
    EXPECT_NE(first, second);
    EXPECT_THAT(first, StrEq("R38N50A4ZB"));
    EXPECT_THAT(second, StrEq("R38N50A4ZB"));
    std::free(first);
    std::free(second);
}

TEST_F(DBusManagerTest, NothingIsCached)
{
    for (const std::string serial : {"first", "second"}) {
        platform().forgetEvents();
        platform().debugMode = 1;
        bus().answerText(serial);
        char* const answer = ask(0);
        EXPECT_EQ(answer, serial);
        EXPECT_EQ(platform().trace(), answeredTrace(serial));
        std::free(answer);
    }
    bus().answerNothing(NO_SERVICE);
    expectFailure(2);
    bus().refuseConnection(TIMED_OUT);
    expectFailure(3);
}

TEST_F(DBusManagerTest, OddSerialsPassThroughUnchanged)
{
    for (const std::string& odd : {std::string(), std::string("%s%n"), std::string(" \n"),
                                   std::string("\xc3\xa9"), std::string(10 << 20, 's')})
        for (const int mode : {0, 1}) {
            platform().debugMode = mode;
            bus().answerText(odd);
            char* const serial = ask(0);
            EXPECT_TRUE(serial == odd);
            std::free(serial);
        }
}

TEST_F(DBusManagerTest, LongSerialIsCutInTheLogOnly)
{
    platform().debugMode = 1;
    const std::string serial(700, 's');
    bus().answerText(serial);
    char* const answer = ask(0);
    EXPECT_EQ(answer, serial);
    const Texts trace = platform().trace();
    const std::string shown = "deviceUniqueID : " + serial;
    EXPECT_EQ(trace.back(), debugLine(QUESTION, shown.substr(0, 598)));
    std::free(answer);
}

TEST_F(DBusManagerTest, OnlyTheReferenceToTheConnectionIsKept)
{
    bus().answerText("R38N50A4ZB");
    Texts held;
    for (int i = 0; i < 3; ++i) {
        std::free(ask(0));
        held.push_back("connection");
        EXPECT_EQ(bus().held(), held);
    }
    bus().answerNothing(NO_SERVICE);
    expectFailure(2);
    held.push_back("connection");
    EXPECT_EQ(bus().held(), held);
    bus().answerError("org.freedesktop.DBus.Error.Failed", "text");
    expectFailure(2);
    held.push_back("connection");
    EXPECT_EQ(bus().held(), held);
    bus().answer(nullptr);
    expectFailure(2);
    held.push_back("connection");
    EXPECT_EQ(bus().held(), held);
}

TEST_F(DBusManagerTest, RefusedConnectionLeavesNothingHeld)
{
    for (const FakeBus::Error& error : {TIMED_OUT, REFUSED_ERROR}) {
        bus().refuseConnection(error);
        ask(error.message == TIMED_OUT.message ? 3 : 1);
        EXPECT_THAT(bus().held(), IsEmpty());
    }
    bus().refuseConnection({});
    expectFailure(1);
    EXPECT_THAT(bus().held(), IsEmpty());
}

TEST_F(DBusManagerTest, TimeOutIsToldByTheTextAloneWhereverItStands)
{
    const std::pair<std::string, int> messages[] = {{"Time", 3},
                                                    {"Timeout", 3},
                                                    {"a Time in between", 3},
                                                    {"at the end: Time", 3},
                                                    {"LifeTime of it", 3},
                                                    {"TTime", 3},
                                                    {"time", 1},
                                                    {"TIME", 1},
                                                    {"Tim", 1},
                                                    {"T ime", 1},
                                                    {"timed out", 1},
                                                    {"Tim\ne", 1},
                                                    {"", 1},
                                                    {"%s Time %n", 3},
                                                    {"%s%n", 1},
                                                    {std::string(10 << 20, 'x') + "Time", 3}};
    for (const auto& [message, code] : messages)
        for (const auto& [domain, number] :
             {std::pair<GQuark, int>{G_IO_ERROR, G_IO_ERROR_TIMED_OUT},
              {G_DBUS_ERROR, G_DBUS_ERROR_TIMEOUT},
              {G_DBUS_ERROR, G_DBUS_ERROR_NO_SERVER},
              {G_IO_ERROR, -1}}) {
            platform().forgetEvents();
            bus().refuseConnection(FakeBus::Error{domain, number, message});
            expectFailure(code);
            EXPECT_TRUE(
                platform().trace() ==
                (Texts{"g_type_init()", CONNECT_CALL, errorLine(INIT, "GDBusConnection is NULL"),
                       detailLine(INIT, "g_bus_get_sync()", number, message),
                       errorLine(INIT, code == 3 ? "[dbus] DBUS_ERROR_CONNECTION_TIME_OUT"
                                                 : "[dbus] DBUS_ERROR_CONNECTION_FAIL")}))
                << message.substr(0, 100);
        }
}

TEST_F(DBusManagerTest, TimeOutOfTheCallIsAnAbsentReply)
{
    bus().answerNothing(TIMED_OUT);
    expectFailure(2);
}

TEST_F(DBusManagerTest, RepliesWithoutTextFirstAreNoSerial)
{
    GVariant* const bodies[] = {
        nullptr,
        g_variant_new("()"),
        g_variant_new("(i)", 7),
        g_variant_new("(o)", "/a/path"),
        g_variant_new("(v)", g_variant_new_string("in a variant")),
        g_variant_new("(is)", 7, "second"),
        g_variant_new("((s))", "in a structure"),
        g_variant_new("(^as)", std::array<const char*, 2>{"in an array", nullptr}.data())};
    for (GVariant* const body : bodies) {
        platform().forgetEvents();
        bus().answer(body);
        expectFailure(2);
        EXPECT_EQ(platform().trace(),
                  (Texts{"g_type_init()", CONNECT_CALL, SEND_CALL, FLUSH_CALL}));
        EXPECT_THAT(bus().held(), Each("connection"));
        EXPECT_THAT(ledger().live(), IsEmpty());
    }
}

TEST_F(DBusManagerTest, FirstTextOfSeveralArgumentsIsTheSerial)
{
    bus().answer(g_variant_new("(ssi)", "first", "second", 7));
    char* const serial = ask(0);
    EXPECT_THAT(serial, StrEq("first"));
    std::free(serial);
}

TEST_F(DBusManagerTest, EveryTypeButErrorsIsAnAnswer)
{
    platform().debugMode = 1;
    for (const GDBusMessageType type :
         {G_DBUS_MESSAGE_TYPE_INVALID, G_DBUS_MESSAGE_TYPE_METHOD_CALL,
          G_DBUS_MESSAGE_TYPE_METHOD_RETURN, G_DBUS_MESSAGE_TYPE_SIGNAL}) {
        platform().forgetEvents();
        bus().answer(g_variant_new("(s)", "a serial"), type);
        char* const serial = ask(0);
        EXPECT_THAT(serial, StrEq("a serial"));
        EXPECT_EQ(platform().trace(), answeredTrace("a serial"));
        std::free(serial);
    }
}

TEST_F(DBusManagerTest, TextOfAnErrorReplyIsNoSerial)
{
    bus().answer(g_variant_new("(s)", "looks like a serial"), G_DBUS_MESSAGE_TYPE_ERROR);
    expectFailure(2);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_F(DBusManagerTest, FailedParsersCopyGivesNull)
{
    platform().debugMode = 1;
    bus().answerText("a serial");
    const FailingAllocation failure(Allocation::STRDUP);
    char preset = 'p';
    EXPECT_EQ(ask(0, &preset), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(platform().trace(),
              REPLIED + Texts{debugLine(PARSE, "Success to get deviceUniqueID: a serial ")});
    EXPECT_THAT(bus().held(), ElementsAre("connection"));
}

TEST_F(DBusManagerTest, FailedCallersCopyGivesNull)
{
    platform().debugMode = 1;
    bus().answerText("a serial");
    const FailingAllocation failure(Allocation::STRDUP, 1);
    char preset = 'p';
    EXPECT_EQ(ask(0, &preset), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(platform().trace(),
              (REPLIED + Texts{debugLine(PARSE, "Success to get deviceUniqueID: a serial "),
                               debugLine(QUESTION, "deviceUniqueID : (null)")}));
    EXPECT_THAT(ledger().live(), IsEmpty());
    EXPECT_THAT(bus().held(), ElementsAre("connection"));
}

TEST_F(DBusManagerTest, StepsStoreTheirCodeOnFailureOnly)
{
    int status = 77;
    GDBusConnection* const connection = dbus.InitDbusConnection(&status);
    bus().answerText("a serial");
    GDBusMessage* const reply = dbus.SendDbusMethodNReceive(connection, &status);
    EXPECT_THAT(bus().held(), ElementsAre("connection", "reply"));
    char* const serial = dbus.ParseDeviceUniqueID(reply, &status);
    EXPECT_THAT(bus().held(), ElementsAre("connection", "reply"));
    EXPECT_THAT(serial, StrEq("a serial"));
    EXPECT_EQ(status, 77);
    std::free(serial);

    bus().answer(nullptr);
    EXPECT_EQ(dbus.ParseDeviceUniqueID(dbus.SendDbusMethodNReceive(connection, &status), &status),
              nullptr);
    EXPECT_EQ(status, 2);
    status = 77;
    bus().answerNothing({});
    EXPECT_EQ(dbus.SendDbusMethodNReceive(connection, &status), nullptr);
    EXPECT_EQ(status, 2);
    bus().refuseConnection({});
    EXPECT_EQ(dbus.InitDbusConnection(&status), nullptr);
    EXPECT_EQ(status, 1);
    bus().refuseConnection(TIMED_OUT);
    EXPECT_EQ(dbus.InitDbusConnection(&status), nullptr);
    EXPECT_EQ(status, 3);
}

TEST_F(DBusManagerTest, EveryLineCarriesItsOwnTagUnlessTheApplicationHasOne)
{
    platform().debugMode = 1;
    bus().refuseConnection(TIMED_OUT);
    expectFailure(3);
    EXPECT_THAT(platform().lines(), Each(Field(&LogLine::tag, "Logger")));
    EXPECT_EQ(platform().lines().size(), 5u);
    platform().forgetEvents();
    platform().tag = "MyApplication";
    expectFailure(3);
    EXPECT_THAT(platform().lines(), Each(Field(&LogLine::tag, "MyApplication")));
}

} // namespace
