// SPDX-License-Identifier: Apache-2.0
// The service that stands in for the device daemon, started by a private system bus.
#include <algorithm>
#include <array>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <vector>

#include <gmock/gmock.h>
#include <unistd.h>

#include "backend/Backend.h"
#include "linux/Bus.h"
#include "support/Program.h"
#include "support/ScriptedService.h"
#include "support/Together.h"
#include "support/Usage.h"

using port::Out;
using port::Owned;
using testing::AnyOf;
using testing::HasSubstr;
using testing::StartsWith;

namespace {

const char NAME[] = "org.tizen.system.deviced";
const char PATH[] = "/Org/Tizen/System/DeviceD/Board";
const char INTERFACE[] = "org.tizen.system.deviced.Board";

class Client : public BusClient {
public:
    using BusClient::BusClient;

    // The text of the reply, or "error: " and its name and message.
    std::string ask(const char* path, const char* interface, const char* method,
                    GVariant* arguments = nullptr) const
    {
        Owned<GError> error;
        const auto reply = call(NAME, path, interface, method, arguments, Out(error));
        if (!reply)
            return std::string("error: ") + error->message;
        return Owned<char>(g_variant_print(reply.get(), FALSE)).get();
    }
    std::string serial() const
    {
        return ask(PATH, INTERFACE, "GetSerial");
    }
};

class DevicedTest : public testing::Test {
protected:
    DevicedTest()
    {
        useFault("");
        setenv("CORESYSTEM_DEVICE", tree.path("/device.toml").c_str(), 1);
        bus.addActivatable(NAME, "'" PROGRAM "'"); // a command line
    }
    ~DevicedTest() override
    {
        unsetenv("CORESYSTEM_DEVICE");
    }

    void useSerial(const std::string& line) const
    {
        tree.write("/device.toml", "schema = 1\n[device]\n" + line + "\n");
    }
    // The serial number, and how it fails.
    void useFault(const std::string& fault) const
    {
        useSerial("serial = \"SN-4711\"" +
                  (fault.empty() ? "" : "\n[fault]\nGetSerial = " + fault));
    }
    std::string serial() const
    {
        return Client(bus.address()).serial();
    }
    pid_t processOfService() const
    {
        const auto reply =
            Client(bus.address()).askBus("GetConnectionUnixProcessID", g_variant_new("(s)", NAME));
        guint32 process = 0;
        g_variant_get(reply.get(), "(u)", &process);
        return static_cast<pid_t>(process);
    }

    const TemporaryTree tree;
    PrivateBus bus;
};

// Asks so many times and reads no answer.
void send(const Client& client, int count, GDBusMessageFlags flags)
{
    for (int i = 0; i < count; ++i) {
        const Owned<GDBusMessage> call(
            g_dbus_message_new_method_call(NAME, PATH, INTERFACE, "GetSerial"));
        g_dbus_message_set_flags(call.get(), flags);
        ASSERT_TRUE(g_dbus_connection_send_message(
            client.connection(), call.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr));
    }
    g_dbus_connection_flush_sync(client.connection(), nullptr, nullptr);
}

TEST_F(DevicedTest, SerialOfTheBackendIsAnswered)
{
    bus.start();
    EXPECT_EQ("('SN-4711',)", serial());
    useSerial("serial = \"\xc3\x9c-1\"");
    EXPECT_EQ("('\xc3\x9c-1',)", serial());
}

TEST_F(DevicedTest, MissingSerialIsAnErrorAndNeverInvented)
{
    useSerial("model_name = \"x\"");
    bus.start();
    EXPECT_THAT(serial(), StartsWith("error: GDBus.Error:org.tizen.system.deviced.Error."
                                     "NotAvailable: "));
}

TEST_F(DevicedTest, FaultOfTheDeviceFileIsTheAnswer)
{
    bus.start();
    useFault("\"org.freedesktop.DBus.Error.AccessDenied\"");
    EXPECT_EQ(
        "error: GDBus.Error:org.freedesktop.DBus.Error.AccessDenied: " + tree.path("/device.toml") +
            ":5: GetSerial fails with org.freedesktop.DBus.Error.AccessDenied",
        serial());
    useFault("\"not_a_string\"");
    EXPECT_EQ("(0,)", serial());
    useFault("{ error = \"not_a_string\", call = 2 }");
    EXPECT_EQ("('SN-4711',)", serial());
    EXPECT_EQ("(0,)", serial());
    EXPECT_EQ("('SN-4711',)", serial());
}

// The one that is late waits by itself.
TEST_F(DevicedTest, LateAnswerKeepsNobodyElseWaiting)
{
    bus.start();
    useFault("{ delay_ms = 60000, call = 2 }");
    EXPECT_EQ("('SN-4711',)", serial());
    const Client late(bus.address());
    send(late, 1, G_DBUS_MESSAGE_FLAGS_NONE);
    EXPECT_EQ("('SN-4711',)", late.serial());
}

TEST_F(DevicedTest, MachinesOwnSerialIsTheAnswerWithoutADeviceFile)
{
    unsetenv("CORESYSTEM_DEVICE");
    bus.start();
    port::linux_backend::Bus own;
    const auto backend = port::makeLinuxBackend();
    const auto expected = backend->get<port::Question::DeviceSerial>();
    if (expected)
        EXPECT_EQ("('" + expected.value().value + "',)", serial());
    else
        EXPECT_THAT(serial(), HasSubstr(expected.error().reason));
}

TEST_F(DevicedTest, OtherCallsAreErrors)
{
    bus.start();
    const Client client(bus.address());
    const std::array<const char*, 3> rows[] = {
        // path, interface, method
        {"/", INTERFACE, "GetSerial"},
        {"/Org/Tizen/System/DeviceD", INTERFACE, "GetSerial"},
        {PATH, "org.tizen.system.deviced.board", "GetSerial"},
        {PATH, INTERFACE, "SetSerial"},
    };
    for (const auto& [path, interface, method] : rows)
        EXPECT_THAT(client.ask(path, interface, method), StartsWith("error: ")) << path << method;
    EXPECT_THAT(client.ask(PATH, INTERFACE, "GetSerial", g_variant_new("(s)", "x")),
                StartsWith("error: "));
    EXPECT_EQ("('SN-4711',)", client.serial());
}

TEST_F(DevicedTest, ManyAskAtOnce)
{
    bus.start();
    together(8, [this](int) {
        const Client client(bus.address());
        for (int i = 0; i < 70; ++i) // more than may be under way at a time
            EXPECT_EQ("('SN-4711',)", client.serial());
    });
}

TEST_F(DevicedTest, ServiceThatWasKilledIsStartedAgain)
{
    bus.start();
    EXPECT_EQ("('SN-4711',)", serial());
    const pid_t first = processOfService();
    ASSERT_GT(first, 1);
    ASSERT_EQ(0, kill(first, SIGKILL));
    // While the bus has not noticed yet, the call may reach the one that was killed.
    EXPECT_THAT(serial(), AnyOf("('SN-4711',)", HasSubstr("disconnected")));
    EXPECT_EQ("('SN-4711',)", serial());
    EXPECT_NE(first, processOfService());
}

TEST_F(DevicedTest, EveryUserMayAskAndOnlyRootMayOwnTheName)
{
    if (geteuid() != 0)
        GTEST_SKIP() << "needs root, to be another user";
    bus.usePolicy(POLICY);
    bus.start();
    EXPECT_EQ("('SN-4711',)", serial());
    const std::string asNobody = "setpriv --reuid=65534 --regid=65534 --clear-groups gdbus call "
                                 "--system --timeout 10 ";
    EXPECT_EQ("('SN-4711',)\n", outputOf(asNobody + "-d " + NAME + " -o " + PATH + " -m " +
                                         INTERFACE + ".GetSerial"));
    EXPECT_THAT(outputOf(asNobody + "-d org.freedesktop.DBus -o /org/freedesktop/DBus " +
                         "-m org.freedesktop.DBus.RequestName " + NAME + " 0 || true"),
                HasSubstr("is not allowed to own the service"));
}

TEST_F(DevicedTest, CallerWhoFloodsItHarmsNobodyAndItsNextCallIsAnswered)
{
    bus.start();
    const Client other(bus.address());
    ASSERT_EQ("('SN-4711',)", other.serial());
    const pid_t service = processOfService();
    const long before = Usage::statusLine("VmHWM:", service);
    const Client flooding(bus.address());
    send(flooding, 40000, G_DBUS_MESSAGE_FLAGS_NO_REPLY_EXPECTED);
    EXPECT_EQ("('SN-4711',)", other.serial());
    EXPECT_EQ("('SN-4711',)", flooding.serial());
#ifdef WITH_SANITIZERS // they keep what is released
    constexpr long MOST_KB = 512 * 1024;
#else
    constexpr long MOST_KB = 16 * 1024;
#endif
    EXPECT_LT(Usage::statusLine("VmHWM:", service) - before, MOST_KB);
}

TEST_F(DevicedTest, CallerHasALimitedNumberOfCallsUnderWay)
{
    bus.start();
    useFault("{ delay_ms = 60000 }");
    const Client many(bus.address());
    send(many, 64, G_DBUS_MESSAGE_FLAGS_NONE);
    EXPECT_THAT(many.serial(), HasSubstr("LimitsExceeded: too many calls under way"));
    useFault("");
    EXPECT_EQ("('SN-4711',)", serial()); // another caller
}

TEST_F(DevicedTest, CallersTogetherHaveALimitedNumberOfCallsUnderWay)
{
    bus.start();
    ASSERT_EQ("('SN-4711',)", serial()); // it runs
    useFault("{ delay_ms = 60000 }");
    std::vector<std::unique_ptr<Client>> callers;
    const auto sendFrom = [](const Client& caller, int count) {
        send(caller, count, G_DBUS_MESSAGE_FLAGS_NONE);
        caller.askBus("GetId", nullptr); // the bus has passed them on
    };
    for (int left = 4095; left > 0; left -= 64) {
        callers.push_back(std::make_unique<Client>(bus.address()));
        sendFrom(*callers.back(), std::min(left, 64));
    }
    EXPECT_THAT(
        Client(bus.address()).ask(PATH, "org.freedesktop.DBus.Introspectable", "Introspect"),
        HasSubstr(R"(<arg type="s" name="serial" direction="out")"));
    sendFrom(*callers.back(), 1);
    EXPECT_THAT(serial(), HasSubstr("LimitsExceeded: too many calls under way"));
}

// Runs the service by hand.
class Service : public Process {
public:
    Service()
    {
        start([] { execl(PROGRAM, PROGRAM, static_cast<char*>(nullptr)); });
    }
    void expectOn(const PrivateBus& bus) const
    {
        const BusClient client(bus.address());
        ASSERT_TRUE(client.waitUntil([&] { return client.isThere(NAME); }));
    }
};

TEST_F(DevicedTest, EndsCleanlyWhenItIsToldTo)
{
    bus.start();
    for (const int signal : {SIGTERM, SIGINT}) {
        Service service;
        service.expectOn(bus);
        service.tell(signal);
        EXPECT_EQ(0, service.end()) << signal;
    }
}

TEST_F(DevicedTest, EndsCleanlyWithTheBus)
{
    bus.start();
    Service service;
    service.expectOn(bus);
    bus.kill();
    EXPECT_EQ(0, service.end());
}

TEST_F(DevicedTest, FailsWithoutABus)
{
    bus.start();
    bus.kill();
    EXPECT_EQ(1, Service().end());
}

TEST_F(DevicedTest, FailsWhenTheNameIsTaken)
{
    bus.start();
    const ScriptedService other(bus.address(), NAME);
    EXPECT_EQ(1, Service().end());
}

} // namespace
