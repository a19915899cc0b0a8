// SPDX-License-Identifier: Apache-2.0
// The application's listener: registration, and what of the platform's events reaches it.
#include <atomic>
#include <new>
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

// Writes down what it is told: "OPERATION(argument, ..., DATA)".
class Recorder : public IConnectionStateListener {
public:
    void OnWifiDeviceStateChanged(int state, void* userData) override
    {
        calls.push_back(callText("WifiDevice", state, nameOf(userData)));
    }
    void OnWifiConnectionStateChanged(int state, wifi_ap_h ap, void* userData) override
    {
        calls.push_back(callText("WifiConnection", state, nameOf(ap), nameOf(userData)));
    }
    void OnFlightModeChanged(bool enabled, void* userData) override
    {
        calls.push_back(callText("FlightMode", enabled, nameOf(userData)));
    }
    void OnPacketDataChanged(bool enabled, void* userData) override
    {
        calls.push_back(callText("PacketData", enabled, nameOf(userData)));
    }
    void OnWifiStatusChanged(bool connected, void* userData) override
    {
        calls.push_back(callText("WifiStatus", connected, nameOf(userData)));
    }
    ~Recorder() override
    {
        if (destroyed != nullptr)
            *destroyed = true;
    }

    Texts takeCalls()
    {
        return std::exchange(calls, {});
    }

    Texts calls;
    bool* destroyed = nullptr;
};

const Texts SET_CALLS = {"wifi_initialize()",
                         "wifi_set_device_state_changed_cb()",
                         "wifi_set_connection_state_changed_cb()",
                         "runtime_info_set_changed_cb(1)",
                         "runtime_info_set_changed_cb(9)",
                         "runtime_info_set_changed_cb(0)"};
const Texts UNSET_CALLS = {"wifi_initialize()",
                           "wifi_unset_device_state_changed_cb()",
                           "wifi_unset_connection_state_changed_cb()",
                           "runtime_info_unset_changed_cb(1)",
                           "runtime_info_unset_changed_cb(9)",
                           "runtime_info_unset_changed_cb(0)"};
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
void runtimeEvent(int key, int registeredKey)
{
    const auto [callback, data] = platform().callbacks.runtime.at(registeredKey);
    callWithNumbers(callback, key, data);
}

void runtimeEvent(int key)
{
    runtimeEvent(key, key);
}

// Lives as long as the rows that use it: nothing unsets it behind them.
Recorder& rowsRecorder()
{
    static Recorder& recorder = *new Recorder;
    return recorder;
}

// One event, what the listener is told of it, and all that happens.
LoggedCall eventCall(const std::string& name, const std::function<void()>& event,
                     const std::string& told, const Texts& trace)
{
    return {name,
            [=] {
                set(&rowsRecorder(), &firstData);
                platform().forgetEvents();
                event();
                EXPECT_EQ(rowsRecorder().takeCalls(), told.empty() ? Texts() : Texts{told});
            },
            trace};
}

// Texts of negative numbers are no names.
std::string numberName(int number)
{
    return number < 0 ? "Minus" + std::to_string(-static_cast<long long>(number))
                      : std::to_string(number);
}

LoggedCall wifiDeviceCall(int state, const Texts& stateLine)
{
    return eventCall(
        "WifiDeviceState" + numberName(state), [=] { wifiDeviceEvent(state); },
        callText("WifiDevice", state, "first"),
        Texts{CONNECTION_MANAGER.debug("wifi_device_state_changed", "wifi_device_state_changed")} +
            stateLine);
}

LoggedCall wifiConnectionCall(int state, const Texts& stateLine)
{
    return eventCall(
        "WifiConnectionState" + numberName(state), [=] { wifiConnectionEvent(state); },
        callText("WifiConnection", state, "ap", "first"),
        Texts{CONNECTION_MANAGER.debug("wifi_connection_state_changed",
                                       "wifi_connection_state_changed")} +
            stateLine);
}

const std::string RUNTIME_ENTRY =
    CONNECTION_MANAGER.debug("OnConnectionStateChanged", "OnConnectionStateChanged");

LoggedCall runtimeCall(const std::string& name, int key, const std::string& read, int code,
                       const std::any& value, const std::string& told)
{
    return eventCall(name,
                     [=] {
                         platform().answer(read, code, value);
                         runtimeEvent(key);
                     },
                     told, {RUNTIME_ENTRY, read});
}

const std::string PACKET_DATA_READ = "runtime_info_get_value_bool(9)";
const std::string FLIGHT_MODE_READ = "runtime_info_get_value_bool(0)";
const std::string WIFI_STATUS_READ = "runtime_info_get_value_int(1)";

std::vector<LoggedCall> eventCalls()
{
    const std::string device = "wifi_device_state_changed";
    const std::string connection = "wifi_connection_state_changed";
    std::vector<LoggedCall> calls = {
        wifiDeviceCall(1, {CONNECTION_MANAGER.debug(device, "wifi activated")}),
        wifiDeviceCall(0, {CONNECTION_MANAGER.debug(device, "wifi deactivated")}),
        wifiDeviceCall(2, {}),
        wifiDeviceCall(7, {}),
        wifiDeviceCall(-1, {}),
        wifiDeviceCall(INT32_MIN, {}),
        wifiConnectionCall(3, {CONNECTION_MANAGER.debug(connection, "wifi connected")}),
        wifiConnectionCall(0, {CONNECTION_MANAGER.debug(connection, "wifi disconnected")}),
        wifiConnectionCall(1, {}),
        wifiConnectionCall(2, {}),
        wifiConnectionCall(-1, {}),
        wifiConnectionCall(4, {}),
        wifiConnectionCall(INT32_MAX, {}),
        runtimeCall("PacketDataOn", 9, PACKET_DATA_READ, 0, true, "PacketData(1, first)"),
        runtimeCall("PacketDataOff", 9, PACKET_DATA_READ, 0, false, "PacketData(0, first)"),
        runtimeCall("PacketDataUnwritten", 9, PACKET_DATA_READ, 0, {}, "PacketData(0, first)"),
        runtimeCall("PacketDataUnreadable", 9, PACKET_DATA_READ, -5, true, ""),
        runtimeCall("FlightModeOn", 0, FLIGHT_MODE_READ, 0, true, "FlightMode(1, first)"),
        runtimeCall("FlightModeOff", 0, FLIGHT_MODE_READ, 0, false, "FlightMode(0, first)"),
        runtimeCall("FlightModeUnwritten", 0, FLIGHT_MODE_READ, 0, {}, "FlightMode(0, first)"),
        runtimeCall("FlightModeUnreadable", 0, FLIGHT_MODE_READ, 1, true, ""),
        runtimeCall("WifiStatusUnwritten", 1, WIFI_STATUS_READ, 0, {}, "WifiStatus(0, first)"),
        runtimeCall("WifiStatusUnreadable", 1, WIFI_STATUS_READ, -1073741822, 2, ""),
    };
    for (const int status : {0, 1, 2, 3, 7, -1, INT32_MIN})
        calls.push_back(runtimeCall("WifiStatus" + numberName(status), 1, WIFI_STATUS_READ, 0,
                                    status, callText("WifiStatus", status == 2, "first")));
    for (const int key : {2, 3, 8, 10, 26, 27, -1, INT32_MAX})
        calls.push_back(eventCall("RuntimeKey" + numberName(key), [key] { runtimeEvent(key, 0); },
                                  "", {RUNTIME_ENTRY}));
    return calls;
}

LoggedCall registrationCall(const std::string& name, IConnectionStateListener* listener,
                            const Texts& trace)
{
    return {name, [listener] { set(listener, &firstData); }, trace};
}

LoggedCall facadeCall(const std::string& name, IConnectionStateListener* listener,
                      const Texts& trace)
{
    return {name,
            [listener] {
                answerRegistration();
                coreSystem().SetConnectionEventListener(listener, &firstData);
            },
            Texts{CORE_SYSTEM.debug(LISTENER_METHOD, "CoreSystem SetConnectionEventListener")} +
                CONNECTION_MANAGER.access() + trace};
}

std::vector<LoggedCall> registrationCalls()
{
    return {
        registrationCall("ListenerSet", &rowsRecorder(), SET_TRACE),
        registrationCall("ListenerUnset", nullptr, UNSET_TRACE),
        facadeCall("FacadeListenerSet", &rowsRecorder(), SET_TRACE),
        facadeCall("FacadeListenerUnset", nullptr, UNSET_TRACE),
    };
}

INSTANTIATE_TEST_SUITE_P(ConnectionEvents, LoggedCallTest, testing::ValuesIn(eventCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(Registration, LoggedCallTest, testing::ValuesIn(registrationCalls()),
                         rowName<LoggedCall>);

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

TEST_F(ConnectionListenerTest, OperationsKeepTheirPlacesInTheVirtualTable)
{
    bool destroyed = false;
    alignas(Recorder) unsigned char memory[sizeof(Recorder)];
    Recorder* const recorderInPlace = new (memory) Recorder;
    recorderInPlace->destroyed = &destroyed;

    // As a caller does that was compiled with another header of the same places.
    void* const self = static_cast<IConnectionStateListener*>(recorderInPlace);
    void* const* const table = *static_cast<void* const* const*>(self);
    const auto slot = [table](int number, auto* type) {
        return reinterpret_cast<decltype(type)>(table[number]);
    };
    typedef void StateOperation(void*, int, void*);
    typedef void AccessPointOperation(void*, int, wifi_ap_h, void*);
    typedef void SwitchOperation(void*, bool, void*);
    typedef void Destructor(void*);

    slot(0, static_cast<StateOperation*>(nullptr))(self, 1, &firstData);
    slot(1, static_cast<AccessPointOperation*>(nullptr))(self, -1, &accessPoint, &secondData);
    slot(2, static_cast<SwitchOperation*>(nullptr))(self, true, &firstData);
    slot(3, static_cast<SwitchOperation*>(nullptr))(self, false, &secondData);
    slot(4, static_cast<SwitchOperation*>(nullptr))(self, true, nullptr);
    EXPECT_THAT(recorderInPlace->calls,
                ElementsAre("WifiDevice(1, first)", "WifiConnection(-1, ap, second)",
                            "FlightMode(1, first)", "PacketData(0, second)",
                            "WifiStatus(1, null)"));
    EXPECT_FALSE(destroyed);
    slot(5, static_cast<Destructor*>(nullptr))(self);
    EXPECT_TRUE(destroyed);
}

TEST_F(ConnectionListenerTest, UserDataComesBackUnchanged)
{
    set(&recorder, &secondData);
    allEvents();
    EXPECT_EQ(recorder.takeCalls(), allTold("second"));
    set(&recorder, nullptr);
    allEvents();
    EXPECT_EQ(recorder.takeCalls(), allTold("null"));
}

TEST_F(ConnectionListenerTest, FacadeHandsListenerAndUserDataOn)
{
    answerRegistration();
    system.SetConnectionEventListener(&recorder, &secondData);
    allEvents();
    EXPECT_EQ(recorder.calls, allTold("second"));
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

TEST_F(ConnectionListenerTest, UnsetWithoutListenerStillUnregistersEverything)
{
    set(nullptr, &firstData);
    EXPECT_EQ(platform().trace(), UNSET_TRACE);
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
    Texts expected;
    for (int i = 0; i < 3; ++i) {
        set(&recorder, &firstData);
        set(&recorder, &firstData);
        allEvents();
        EXPECT_EQ(recorder.takeCalls(), allTold("first"));
        platform().forgetEvents();
        set(nullptr, nullptr);
        set(nullptr, nullptr);
        EXPECT_EQ(platform().trace(), UNSET_TRACE + UNSET_TRACE);
        EXPECT_EQ(platform().callbacks.wifiDevice, nullptr);
        EXPECT_EQ(platform().callbacks.wifiConnection, nullptr);
        EXPECT_THAT(platform().callbacks.runtime, IsEmpty());
    }
}

TEST_F(ConnectionListenerTest, FailedRegistrationsAreIgnored)
{
    for (const int code : {-1, -22, -1073741822}) {
        for (IConnectionStateListener* const listener : {&recorder, &recorder}) {
            platform().forgetEvents();
            answerRegistration(code);
            connections.SetConnectionEventListener(listener, &firstData);
            EXPECT_EQ(platform().trace(), SET_TRACE);
        }
        platform().forgetEvents();
        connections.SetConnectionEventListener(nullptr, nullptr);
        EXPECT_EQ(platform().trace(), UNSET_TRACE);
    }
}

TEST_F(ConnectionListenerTest, NoticesArePlainInEveryMode)
{
    for (const int mode : {0, 1}) {
        platform().forgetEvents();
        platform().debugMode = mode;
        set(&recorder, &firstData);
        set(nullptr, nullptr);
        const std::vector<LogLine> lines = platform().lines();
        ASSERT_EQ(lines.size(), 2u);
        EXPECT_EQ(lines[0].format, "%s: %s(%d) > Set Connection Change Callback");
        EXPECT_EQ(lines[1].format, "%s: %s(%d) > Unset Connection Change Callback");
        for (const LogLine& line : lines) {
            EXPECT_EQ(line.priority, 4);
            EXPECT_EQ(line.tag, "CoreSystem");
        }
        EXPECT_THAT(platform().texts(Event::Kind::CIPHER), IsEmpty());
    }
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

TEST_F(ConnectionListenerTest, WifiEventsWithoutListenerOnlyLog)
{
    set(&recorder, &firstData);
    const FakePlatform::Callbacks late = platform().callbacks;
    set(nullptr, nullptr);
    platform().forgetEvents();
    platform().debugMode = 1;
    late.wifiDevice(WIFI_DEVICE_STATE_ACTIVATED, &firstData);
    late.wifiConnection(WIFI_CONNECTION_STATE_CONNECTED, &accessPoint, &firstData);
    const std::string device = "wifi_device_state_changed";
    const std::string connection = "wifi_connection_state_changed";
    EXPECT_THAT(platform().trace(),
                ElementsAre(CONNECTION_MANAGER.debug(device, device),
                            CONNECTION_MANAGER.debug(device, "wifi activated"),
                            CONNECTION_MANAGER.debug(connection, connection),
                            CONNECTION_MANAGER.debug(connection, "wifi connected")));
    EXPECT_THAT(recorder.calls, IsEmpty());
}

TEST_F(ConnectionListenerTest, RuntimeEventsThatCannotBeReadNeedNoListener)
{
    set(&recorder, &firstData);
    const FakePlatform::Callbacks late = platform().callbacks;
    set(nullptr, nullptr);
    for (const std::string& read : {PACKET_DATA_READ, FLIGHT_MODE_READ, WIFI_STATUS_READ})
        platform().answer(read, -5);
    for (const auto& [key, registration] : late.runtime)
        registration.first(static_cast<runtime_info_key_e>(key), registration.second);
    EXPECT_THAT(recorder.calls, IsEmpty());
}

// An event that was under way when the listener was unset: it is read, and nobody is told.
TEST_F(ConnectionListenerTest, RuntimeEventsWithoutListenerAreReadAndToldToNobody)
{
    set(&recorder, &firstData);
    const FakePlatform::Callbacks late = platform().callbacks;
    set(nullptr, nullptr);
    platform().forgetEvents();
    platform().answer(PACKET_DATA_READ, 0, true);
    platform().answer(FLIGHT_MODE_READ, 0, true);
    platform().answer(WIFI_STATUS_READ, 0, 2);
    for (const int key : {0, 1, 9})
        late.runtime.at(key).first(static_cast<runtime_info_key_e>(key), &firstData);
    EXPECT_THAT(platform().trace(),
                ElementsAre(FLIGHT_MODE_READ, WIFI_STATUS_READ, PACKET_DATA_READ));
    EXPECT_THAT(recorder.calls, IsEmpty());
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

TEST_F(ConnectionListenerTest, ValuesAreReadAnewForEachEvent)
{
    set(&recorder, &firstData);
    for (const bool value : {true, false, true}) {
        platform().answer(FLIGHT_MODE_READ, 0, value);
        runtimeEvent(0);
    }
    EXPECT_THAT(recorder.calls, ElementsAre("FlightMode(1, first)", "FlightMode(0, first)",
                                            "FlightMode(1, first)"));
}

TEST_F(ConnectionListenerTest, ListenerIsNeverDeleted)
{
    bool destroyed = false;
    recorder.destroyed = &destroyed;
    set(&recorder, &firstData);
    set(&other, &firstData);
    set(&recorder, &firstData);
    set(nullptr, nullptr);
    EXPECT_FALSE(destroyed);
    recorder.destroyed = nullptr;
}

// Counts on any thread what it is told.
class Counter : public IConnectionStateListener {
public:
    void OnWifiDeviceStateChanged(int, void*) override
    {
        ++told;
    }
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override
    {
        ++told;
    }
    void OnFlightModeChanged(bool, void*) override
    {
        ++told;
    }
    void OnPacketDataChanged(bool, void*) override
    {
        ++told;
    }
    void OnWifiStatusChanged(bool, void*) override
    {
        ++told;
    }

    std::atomic<int> told{0};
};

TEST_F(ConnectionListenerTest, EventsOfOtherThreadsReachOneListenerWhileItIsReplaced)
{
    const int THREADS = 4;
    const int ROUNDS = 50;
    Counter first;
    Counter second;
    platform().answer(PACKET_DATA_READ, 0, true);
    platform().answer(WIFI_STATUS_READ, 0, 2);
    set(&first, &firstData);
    const FakePlatform::Callbacks registered = platform().callbacks;
    together(THREADS, [&](int thread) {
        for (int round = 0; round < ROUNDS; ++round) {
            if (thread == 0) {
                set(round % 2 == 0 ? &second : &first, &firstData);
                continue;
            }
            registered.wifiDevice(WIFI_DEVICE_STATE_ACTIVATED, &firstData);
            registered.wifiConnection(WIFI_CONNECTION_STATE_CONNECTED, nullptr, &firstData);
            for (const int key : {1, 9})
                registered.runtime.at(key).first(static_cast<runtime_info_key_e>(key), &firstData);
        }
    });
    EXPECT_EQ(first.told + second.told, (THREADS - 1) * ROUNDS * 4);
    set(nullptr, nullptr);
}

TEST_F(ConnectionListenerTest, QueriesLeaveTheListenerAlone)
{
    set(&recorder, &firstData);
    for (const std::string call :
         {"connection_create()", "connection_get_cellular_state(connection)",
          "connection_destroy(connection)"})
        platform().answer(call, 0);
    EXPECT_FALSE(connections.IsNetworkConnected(false, false));
    allEvents();
    EXPECT_EQ(recorder.calls, allTold("first"));
}

} // namespace
