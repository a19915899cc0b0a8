// SPDX-License-Identifier: Apache-2.0
// The application's listener: registration, and what of the platform's events reaches it.
#include <mutex>
#include <utility>

#include "support/PlatformTest.h"
#include "support/Together.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

char firstData = 'a';
char secondData = 'b';
char accessPoint = 'w';

std::string nameOf(const void* data)
{
    if (data == nullptr)
        return "null";
    if (data == &firstData)
        return "first";
    if (data == &secondData)
        return "second";
    return data == &accessPoint ? "ap" : "other";
}

// Writes down on any thread what it is told: "OPERATION(argument, ..., DATA)".
class Recorder : public IConnectionStateListener {
public:
    void OnWifiDeviceStateChanged(int state, void* userData) override
    {
        note("WifiDevice", state, nameOf(userData));
    }
    void OnWifiConnectionStateChanged(int state, wifi_ap_h ap, void* userData) override
    {
        note("WifiConnection", state, nameOf(ap), nameOf(userData));
    }
    void OnFlightModeChanged(bool enabled, void* userData) override
    {
        note("FlightMode", enabled, nameOf(userData));
    }
    void OnPacketDataChanged(bool enabled, void* userData) override
    {
        note("PacketData", enabled, nameOf(userData));
    }
    void OnWifiStatusChanged(bool connected, void* userData) override
    {
        note("WifiStatus", connected, nameOf(userData));
    }
    Texts takeCalls()
    {
        return std::exchange(calls, {});
    }

    Texts calls;

private:
    template <class... Arguments>
    void note(const Arguments&... arguments)
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        calls.push_back(callText(arguments...));
    }

    std::mutex mutex_;
};

Texts registrationCalls(const std::string& step)
{
    return {"wifi_initialize()",
            "wifi_" + step + "_device_state_changed_cb()",
            "wifi_" + step + "_connection_state_changed_cb()",
            "runtime_info_" + step + "_changed_cb(1)",
            "runtime_info_" + step + "_changed_cb(9)",
            "runtime_info_" + step + "_changed_cb(0)"};
}

const Texts SET_CALLS = registrationCalls("set");
const Texts UNSET_CALLS = registrationCalls("unset");
const std::string LISTENER_METHOD = "SetConnectionEventListener";
const Texts SET_TRACE =
    SET_CALLS + Texts{CONNECTION_MANAGER.notice(LISTENER_METHOD, "Set Connection Change Callback")};
const Texts UNSET_TRACE =
    UNSET_CALLS +
    Texts{CONNECTION_MANAGER.notice(LISTENER_METHOD, "Unset Connection Change Callback")};

void answerRegistration(int code = 0)
{
    for (const std::string& call : SET_CALLS + UNSET_CALLS)
        platform().answer(call, code);
}

void set(IConnectionStateListener* listener, void* userData)
{
    answerRegistration();
    CoreSystemInternals::instance<ConnectionManager>()->SetConnectionEventListener(listener,
                                                                                   userData);
}

// A platform may have numbers that the enumerations of these headers lack, so it calls with
// numbers.
template <class Callback, class... Arguments>
void callWithNumbers(Callback* callback, Arguments... arguments)
{
    const auto untyped = reinterpret_cast<void (*)()>(callback);
    reinterpret_cast<void (*)(Arguments...)>(untyped)(arguments...);
}

// The callbacks that are registered with the platform.
void wifiDeviceEvent(int state)
{
    callWithNumbers(platform().callbacks.wifiDevice, state, platform().callbacks.wifiDeviceData);
}

void wifiConnectionEvent(int state, wifi_ap_h ap = &accessPoint)
{
    callWithNumbers(platform().callbacks.wifiConnection, state, ap,
                    platform().callbacks.wifiConnectionData);
}

// By any of the three registrations: one function serves all keys.
void runtimeEvent(int key)
{
    const auto [callback, data] = platform().callbacks.runtime.at(0);
    callWithNumbers(callback, key, data);
}

// Lives as long as the rows that use it: nothing unsets it behind them.
Recorder& rowsRecorder()
{
    static Recorder& recorder = *new Recorder;
    return recorder;
}

const std::string DEVICE = "wifi_device_state_changed";
const std::string CONNECTION = "wifi_connection_state_changed";
const std::string RUNTIME = "OnConnectionStateChanged";
const std::string PACKET_DATA_READ = "runtime_info_get_value_bool(9)";
const std::string FLIGHT_MODE_READ = "runtime_info_get_value_bool(0)";
const std::string WIFI_STATUS_READ = "runtime_info_get_value_int(1)";

std::string numberName(int number)
{
    return std::to_string(static_cast<unsigned int>(number));
}

class EventCalls : public std::vector<LoggedCall> {
public:
    // One event, what the listener is told of it, and all that happens.
    void add(const std::string& name, const std::string& told, const Texts& trace,
             const std::function<void()>& event)
    {
        const auto run = [=] {
            set(&rowsRecorder(), &firstData);
            platform().forgetEvents();
            event();
            EXPECT_EQ(rowsRecorder().takeCalls(), told.empty() ? Texts() : Texts{told});
        };
        push_back({name, run, trace});
    }

    // A wifi event, with a line of its own where it has one.
    void addWifi(const std::string& function, int state, const std::string& line = "")
    {
        const Texts told = {CONNECTION_MANAGER.debug(function, line)};
        const Texts trace =
            Texts{CONNECTION_MANAGER.debug(function, function)} + (line.empty() ? Texts() : told);
        if (function == DEVICE)
            add("WifiDeviceState" + numberName(state), callText("WifiDevice", state, "first"),
                trace, [=] { wifiDeviceEvent(state); });
        else
            add("WifiConnectionState" + numberName(state),
                callText("WifiConnection", state, "ap", "first"), trace,
                [=] { wifiConnectionEvent(state); });
    }

    void addRuntime(const std::string& name, int key, const std::string& read, int code,
                    const std::any& value, const std::string& told)
    {
        add(name, told, {CONNECTION_MANAGER.debug(RUNTIME, RUNTIME), read}, [=] {
            platform().answer(read, code, value);
            runtimeEvent(key);
        });
    }
};

EventCalls eventCalls()
{
    EventCalls calls;
    calls.addWifi(DEVICE, 1, "wifi activated");
    calls.addWifi(DEVICE, 0, "wifi deactivated");
    for (const int state : {2, 7, -1, INT32_MIN})
        calls.addWifi(DEVICE, state);
    calls.addWifi(CONNECTION, 3, "wifi connected");
    calls.addWifi(CONNECTION, 0, "wifi disconnected");
    for (const int state : {1, 2, -1, 4, INT32_MAX})
        calls.addWifi(CONNECTION, state);
    for (const auto& [name, key, read] :
         {std::tuple{"PacketData", 9, PACKET_DATA_READ}, {"FlightMode", 0, FLIGHT_MODE_READ}}) {
        const std::string off = callText(name, 0, "first");
        calls.addRuntime(name + std::string("On"), key, read, 0, true, callText(name, 1, "first"));
        calls.addRuntime(name + std::string("Off"), key, read, 0, false, off);
        calls.addRuntime(name + std::string("Unwritten"), key, read, 0, {}, off);
        calls.addRuntime(name + std::string("Unreadable"), key, read, -5, true, "");
        calls.addRuntime(name + std::string("UnreadableAboveZero"), key, read, 1, true, "");
    }
    for (const int status : {0, 1, 2, 3, 7, -1, INT32_MIN})
        calls.addRuntime("WifiStatus" + numberName(status), 1, WIFI_STATUS_READ, 0, status,
                         callText("WifiStatus", status == 2, "first"));
    calls.addRuntime("WifiStatusUnwritten", 1, WIFI_STATUS_READ, 0, {}, "WifiStatus(0, first)");
    calls.addRuntime("WifiStatusUnreadable", 1, WIFI_STATUS_READ, -1073741822, 2, "");
    for (const int key : {2, 3, 8, 10, 26, 27, -1, INT32_MAX})
        calls.add("RuntimeKey" + numberName(key), "", {CONNECTION_MANAGER.debug(RUNTIME, RUNTIME)},
                  [=] { runtimeEvent(key); });
    return calls;
}

std::vector<LoggedCall> registrationCalls()
{
    const Texts entry =
        Texts{CORE_SYSTEM.debug(LISTENER_METHOD, "CoreSystem SetConnectionEventListener")} +
        CONNECTION_MANAGER.access();
    std::vector<LoggedCall> calls;
    for (const bool isSet : {true, false})
        calls.push_back({isSet ? "ListenerSet" : "ListenerUnset",
                         [=] {
                             answerRegistration();
                             coreSystem().SetConnectionEventListener(
                                 isSet ? &rowsRecorder() : nullptr, &firstData);
                         },
                         entry + (isSet ? SET_TRACE : UNSET_TRACE)});
    return calls;
}

LOGGED_CALLS(ConnectionEvents, eventCalls());
LOGGED_CALLS(Registration, registrationCalls());

class ConnectionListenerTest : public PlatformTest {
protected:
    ~ConnectionListenerTest() override
    {
        platform().onEvent = nullptr;
        set(nullptr, nullptr);
    }

    // Every event once, in a fixed order.
    static void allEvents()
    {
        platform().answer(PACKET_DATA_READ, 0, true);
        platform().answer(FLIGHT_MODE_READ, 0, true);
        platform().answer(WIFI_STATUS_READ, 0, 2);
        wifiDeviceEvent(1);
        wifiConnectionEvent(3);
        runtimeEvent(0);
        runtimeEvent(9);
        runtimeEvent(1);
    }

    static Texts allTold(const std::string& data)
    {
        return {"WifiDevice(1, " + data + ")", "WifiConnection(3, ap, " + data + ")",
                "FlightMode(1, " + data + ")", "PacketData(1, " + data + ")",
                "WifiStatus(1, " + data + ")"};
    }

    Recorder recorder;
    Recorder other;
};

TEST_F(ConnectionListenerTest, UserDataComesBackUnchanged)
{
    set(&recorder, &secondData);
    allEvents();
    EXPECT_EQ(recorder.takeCalls(), allTold("second"));
    coreSystem().SetConnectionEventListener(&recorder, nullptr);
    allEvents();
    EXPECT_EQ(recorder.takeCalls(), allTold("null"));
}

TEST_F(ConnectionListenerTest, AccessPointMayBeNull)
{
    set(&recorder, &firstData);
    wifiConnectionEvent(2, nullptr);
    EXPECT_THAT(recorder.calls, ElementsAre("WifiConnection(2, null, first)"));
}

TEST_F(ConnectionListenerTest, OneFunctionServesAllRuntimeKeys)
{
    set(&recorder, &firstData);
    const auto& runtime = platform().callbacks.runtime;
    ASSERT_EQ(runtime.size(), 3u);
    EXPECT_EQ(runtime.at(0), runtime.at(1));
    EXPECT_EQ(runtime.at(0), runtime.at(9));
}

TEST_F(ConnectionListenerTest, SecondListenerReplacesTheFirst)
{
    set(&recorder, &firstData);
    platform().forgetEvents();
    set(&other, &secondData);
    EXPECT_EQ(platform().trace(), SET_TRACE);
    allEvents();
    EXPECT_EQ(other.takeCalls(), allTold("second"));
    EXPECT_THAT(recorder.calls, IsEmpty());
}

TEST_F(ConnectionListenerTest, SetAndUnsetMayBeRepeated)
{
    for (int i = 0; i < 2; ++i) {
        set(&recorder, &firstData);
        set(&recorder, &firstData);
        allEvents();
        EXPECT_EQ(recorder.takeCalls(), allTold("first"));
        platform().forgetEvents();
        set(nullptr, nullptr);
        set(nullptr, nullptr);
        EXPECT_EQ(platform().trace(), UNSET_TRACE + UNSET_TRACE);
    }
}

TEST_F(ConnectionListenerTest, FailedRegistrationsAreIgnored)
{
    answerRegistration(-22);
    connections.SetConnectionEventListener(&recorder, &firstData);
    connections.SetConnectionEventListener(nullptr, nullptr);
    EXPECT_EQ(platform().trace(), SET_TRACE + UNSET_TRACE);
}

TEST_F(ConnectionListenerTest, ListenerIsThereBeforeTheFirstRegistration)
{
    bool cameEarly = false;
    platform().onEvent = [&](const Event& event) {
        if (event.text == "wifi_set_device_state_changed_cb()") {
            cameEarly = true;
            wifiDeviceEvent(1);
        }
    };
    set(&recorder, &firstData);
    EXPECT_TRUE(cameEarly);
    EXPECT_THAT(recorder.calls, ElementsAre("WifiDevice(1, first)"));
}

TEST_F(ConnectionListenerTest, ListenerIsGoneBeforeTheFirstUnregistration)
{
    set(&recorder, &firstData);
    bool cameLate = false;
    platform().onEvent = [&](const Event& event) {
        if (event.text == "wifi_initialize()") {
            cameLate = true;
            wifiDeviceEvent(1);
            wifiConnectionEvent(3);
        }
    };
    set(nullptr, nullptr);
    EXPECT_TRUE(cameLate);
    EXPECT_THAT(recorder.calls, IsEmpty());
}

// Events that were under way when the listener was unset: they are read, and nobody is told.
TEST_F(ConnectionListenerTest, EventsWithoutListenerAreLoggedAndReadAndToldToNobody)
{
    set(&recorder, &firstData);
    const FakePlatform::Callbacks late = platform().callbacks;
    set(nullptr, nullptr);
    for (const int code : {0, -5}) {
        platform().forgetEvents();
        platform().debugMode = 1;
        platform().answer(PACKET_DATA_READ, code, true);
        platform().answer(FLIGHT_MODE_READ, code, true);
        platform().answer(WIFI_STATUS_READ, code, 2);
        late.wifiDevice(WIFI_DEVICE_STATE_ACTIVATED, &firstData);
        late.wifiConnection(WIFI_CONNECTION_STATE_CONNECTED, &accessPoint, &firstData);
        for (const int key : {0, 1, 9})
            late.runtime.at(key).first(static_cast<runtime_info_key_e>(key), &firstData);
        const std::string entry = CONNECTION_MANAGER.debug(RUNTIME, RUNTIME);
        EXPECT_THAT(platform().trace(),
                    ElementsAre(CONNECTION_MANAGER.debug(DEVICE, DEVICE),
                                CONNECTION_MANAGER.debug(DEVICE, "wifi activated"),
                                CONNECTION_MANAGER.debug(CONNECTION, CONNECTION),
                                CONNECTION_MANAGER.debug(CONNECTION, "wifi connected"), entry,
                                FLIGHT_MODE_READ, entry, WIFI_STATUS_READ, entry,
                                PACKET_DATA_READ));
        EXPECT_THAT(recorder.calls, IsEmpty());
    }
}

// The listener goes between the read and the call, which is made certain by the read itself.
TEST_F(ConnectionListenerTest, ListenerThatIsUnsetDuringAReadIsNotCalled)
{
    set(&recorder, &firstData);
    platform().answer(WIFI_STATUS_READ, 0, 2);
    const FakePlatform::Callbacks registered = platform().callbacks;
    platform().onEvent = [](const Event& event) {
        if (event.text == WIFI_STATUS_READ)
            set(nullptr, nullptr);
    };
    registered.runtime.at(1).first(RUNTIME_INFO_KEY_WIFI_STATUS, &firstData);
    EXPECT_THAT(recorder.calls, IsEmpty());
}

TEST_F(ConnectionListenerTest, EventsOfOtherThreadsReachOneListenerWhileItIsReplaced)
{
    const int THREADS = 4;
    const int ROUNDS = 50;
    platform().answer(PACKET_DATA_READ, 0, true);
    platform().answer(WIFI_STATUS_READ, 0, 2);
    set(&recorder, &firstData);
    const FakePlatform::Callbacks registered = platform().callbacks;
    together(THREADS, [&](int thread) {
        for (int round = 0; round < ROUNDS; ++round) {
            if (thread == 0) {
                set(round % 2 == 0 ? &other : &recorder, &firstData);
                continue;
            }
            registered.wifiDevice(WIFI_DEVICE_STATE_ACTIVATED, &firstData);
            registered.wifiConnection(WIFI_CONNECTION_STATE_CONNECTED, nullptr, &firstData);
            for (const int key : {1, 9})
                registered.runtime.at(key).first(static_cast<runtime_info_key_e>(key), &firstData);
        }
    });
    EXPECT_EQ(recorder.calls.size() + other.calls.size(), (THREADS - 1) * ROUNDS * 4u);
}

} // namespace
