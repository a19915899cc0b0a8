// SPDX-License-Identifier: Apache-2.0
// The serial number that the device daemon tells on the system bus: asked by the manager, and
// through the facade.
#include <array>

#include "support/FakeBus.h"
#include "support/PlatformTest.h"

using namespace fake;
using testing::Each;
using testing::ElementsAre;
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

Texts serialTrace(const std::string& serial)
{
    return REPLIED + Texts{debugLine(PARSE, "Success to get deviceUniqueID: " + serial + " "),
                           debugLine(QUESTION, "deviceUniqueID : " + serial)};
}

// The slot's content after a question that begins with something else in it.
char* ask(int expectedCode)
{
    char preset = 'p';
    char* slot = &preset;
    EXPECT_EQ(CoreSystemInternals::instance<DBusManager>()->GetDeviceUniqueID(&slot), expectedCode);
    EXPECT_EQ(preset, 'p');
    return slot;
}

const FakeBus::Error TIMED_OUT = {G_IO_ERROR, 24, "Time out was reached"};
const FakeBus::Error REFUSED_ERROR = {G_IO_ERROR, 39, "Could not connect: Connection refused"};
const FakeBus::Error NO_SERVICE = {G_DBUS_ERROR, 2, "no such service"};

const char* const SERIAL = "R38N50A4ZB";

class SerialCalls : public std::vector<LoggedCall> {
public:
    // The bus answers what `arrange` says; the facade's lines are around the manager's.
    void add(const std::string& name, int code, const Texts& trace,
             const std::function<void()>& arrange)
    {
        const std::string result = code == 0 ? SERIAL : "(null)";
        const auto run = [=] {
            arrange();
            const char* slot = "preset";
            EXPECT_EQ(coreSystem().GetDeviceUniqueID(&slot), code);
            char* const serial = const_cast<char*>(slot);
            // The parser's copy is freed; the connection is kept, and nothing of a refused one.
            EXPECT_EQ(ledger().live(), code == 0 ? Texts{"copy: R38N50A4ZB"} : Texts());
            EXPECT_EQ(ledger().origin(serial), code == 0 ? "copy: R38N50A4ZB" : "");
            EXPECT_EQ(bus().held(), code % 2 == 0 ? Texts{"connection"} : Texts());
            if (code == 0)
                std::free(serial);
            else
                EXPECT_EQ(serial, nullptr);
        };
        push_back({"Serial" + name, run,
                   Texts{CORE_SYSTEM.debug(QUESTION, "CoreSystem::GetDeviceUniqueID")} +
                       D_BUS_MANAGER.access() + trace +
                       Texts{CORE_SYSTEM.debug(QUESTION, "DeviceUniqueID : " + result)}});
    }
};

SerialCalls serialCalls()
{
    const std::string send = "g_dbus_connection_send_message_with_reply_sync()";
    const auto deny = [] {
        bus().answer(g_variant_new("(s)", "not for you"), G_DBUS_MESSAGE_TYPE_ERROR,
                     "org.freedesktop.DBus.Error.AccessDenied");
    };
    const auto refusedWith = [](const FakeBus::Error& error, const std::string& line) {
        return REFUSED + Texts{detailLine(INIT, "g_bus_get_sync()", error.code, error.message),
                               errorLine(INIT, "[dbus] " + line)};
    };
    const auto unansweredWith = [&](const FakeBus::Error& error) {
        return UNANSWERED + Texts{detailLine(SEND, send, error.code, error.message)} + NO_REPLY;
    };
    SerialCalls calls;
    calls.add("Answered", 0, serialTrace(SERIAL), [] { bus().answerText(SERIAL); });
    calls.add("ConnectionFailedWithoutError", 1,
              REFUSED + Texts{errorLine(INIT, "[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL")},
              [] { bus().refuseConnection({}); });
    calls.add("ConnectionFailed", 1, refusedWith(REFUSED_ERROR, "DBUS_ERROR_CONNECTION_FAIL"),
              [] { bus().refuseConnection(REFUSED_ERROR); });
    calls.add("ConnectionTimedOut", 3, refusedWith(TIMED_OUT, "DBUS_ERROR_CONNECTION_TIME_OUT"),
              [] { bus().refuseConnection(TIMED_OUT); });
    calls.add("UnansweredWithoutError", 2, UNANSWERED + NO_REPLY, [] { bus().answerNothing({}); });
    calls.add("Unanswered", 2, unansweredWith(NO_SERVICE), [] { bus().answerNothing(NO_SERVICE); });
    // A time-out of the call is an absent reply.
    calls.add("TimedOut", 2, unansweredWith(TIMED_OUT), [] { bus().answerNothing(TIMED_OUT); });
    calls.add(
        "ErrorReply", 2,
        ERROR_REPLIED +
            Texts{detailLine(PARSE, "g_dbus_message_to_gerror()", 9,
                             "GDBus.Error:org.freedesktop.DBus.Error.AccessDenied: not for you")},
        deny);
    calls.add("ErrorReplyWithoutDetail", 2, ERROR_REPLIED, [=] {
        deny();
        bus().producesErrors = false;
    });
    calls.add("ReplyWithoutBody", 2, REPLIED, [] { bus().answer(nullptr); });
    return calls;
}

LOGGED_CALLS(Serial, serialCalls());

class DBusManagerTest : public PlatformTest {};

TEST_F(DBusManagerTest, OddSerialsPassThroughUnchanged)
{
    for (const std::string& odd :
         {ODD_TEXTS[0], ODD_TEXTS[1], std::string("\xc3\xa9 \n"), ODD_TEXTS[3]})
        for (const int mode : {0, 1}) {
            platform().debugMode = mode;
            bus().answerText(odd);
            char* const serial = ask(0);
            EXPECT_TRUE(serial == odd);
            std::free(serial);
        }
}

TEST_F(DBusManagerTest, EachAnswerIsACopyThatTheCallerFrees)
{
    bus().answerText("SN");
    char* const first = ask(0);
    char* const second = ask(0);
    EXPECT_NE(first, second);
    EXPECT_STREQ(first, second);
    std::free(first);
    std::free(second);
}

TEST_F(DBusManagerTest, TimeOutIsToldByTheTextAloneWhereverItStands)
{
    const auto expectCode = [](const std::string& message, int code, GQuark domain, int number) {
        platform().forgetEvents();
        bus().refuseConnection(FakeBus::Error{domain, number, message});
        EXPECT_EQ(ask(code), nullptr);
        const std::string kind = code == 3 ? "TIME_OUT" : "FAIL";
        EXPECT_TRUE(
            platform().trace() ==
            (Texts{"g_type_init()", CONNECT_CALL, errorLine(INIT, "GDBusConnection is NULL"),
                   detailLine(INIT, "g_bus_get_sync()", number, message),
                   errorLine(INIT, "[dbus] DBUS_ERROR_CONNECTION_" + kind)}))
            << message.substr(0, 100);
    };
    for (const std::string& message :
         {std::string("Time"), std::string("Timeout"), std::string("a Time in between"),
          std::string("TTime"), std::string("%s Time %n"), std::string(10 << 20, 'x') + "Time"})
        expectCode(message, 3, G_DBUS_ERROR, G_DBUS_ERROR_NO_SERVER);
    for (const char* message : {"time", "TIME", "Tim", "T ime", "Tim\ne", "", "%s%n"})
        expectCode(message, 1, G_IO_ERROR, G_IO_ERROR_TIMED_OUT);
}

TEST_F(DBusManagerTest, FailedCopyGivesNull)
{
    const Texts parsed = REPLIED + Texts{debugLine(PARSE, "Success to get deviceUniqueID: text ")};
    for (const int skipped : {0, 1}) { // the parser's copy, and the caller's
        platform().reset();
        platform().debugMode = 1;
        bus().answerText("text");
        const FailingAllocation failure(Allocation::STRDUP, skipped);
        EXPECT_EQ(ask(0), nullptr);
        EXPECT_TRUE(failure.happened());
        const Texts copied = {debugLine(QUESTION, "deviceUniqueID : (null)")};
        EXPECT_EQ(platform().trace(), parsed + (skipped == 1 ? copied : Texts()));
        EXPECT_THAT(ledger().live(), IsEmpty());
        EXPECT_THAT(bus().held(), ElementsAre("connection"));
    }
}

TEST_F(DBusManagerTest, RepliesWithoutTextFirstAreNoSerial)
{
    GVariant* const bodies[] = {
        nullptr,
        g_variant_new("()"),
        g_variant_new("(i)", 7),
        g_variant_new("(v)", g_variant_new_string("in a variant")),
        g_variant_new("(is)", 7, "second"),
        g_variant_new("(^as)", std::array<const char*, 2>{"in an array", nullptr}.data())};
    for (GVariant* const body : bodies) {
        platform().forgetEvents();
        bus().answer(body);
        EXPECT_EQ(ask(2), nullptr);
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
    for (const GDBusMessageType type : {G_DBUS_MESSAGE_TYPE_INVALID, G_DBUS_MESSAGE_TYPE_SIGNAL}) {
        platform().forgetEvents();
        bus().answer(g_variant_new("(s)", "a serial"), type);
        char* const serial = ask(0);
        EXPECT_THAT(serial, StrEq("a serial"));
        EXPECT_EQ(platform().trace(), serialTrace("a serial"));
        std::free(serial);
    }
}

TEST_F(DBusManagerTest, TextOfAnErrorReplyIsNoSerial)
{
    bus().answer(g_variant_new("(s)", "looks like a serial"), G_DBUS_MESSAGE_TYPE_ERROR);
    EXPECT_EQ(ask(2), nullptr);
    EXPECT_THAT(ledger().live(), IsEmpty());
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

} // namespace
