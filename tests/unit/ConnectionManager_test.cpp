// SPDX-License-Identifier: Apache-2.0
// The states of the networks, and whether one of them is connected.
#include "support/PlatformTest.h"
#include "support/Together.h"

using namespace fake;
using testing::IsEmpty;

namespace {

struct Network {
    std::string name; // of the method
    CoreSystemInternals::StateRead ask;
    std::string function; // of the platform
    Texts states;

    std::string readCall(const std::string& handle = "connection") const
    {
        return function + "(" + handle + ")";
    }
    // The calls of one read, with a handle of its own; the line of a state that is listed.
    Texts trace(int state, const std::string& handle = "connection") const
    {
        Texts texts = {"connection_create()", readCall(handle)};
        if (state >= 0 && state < static_cast<int>(states.size()))
            texts.push_back(CONNECTION_MANAGER.debug(
                name, name + " : " + states[static_cast<std::size_t>(state)]));
        return texts + Texts{"connection_destroy(" + handle + ")"};
    }
    void answer(int state, int code = 0) const
    {
        platform().answer("connection_create()", 0);
        platform().answer(readCall(), code, state);
        platform().answer("connection_destroy(connection)", 0);
    }
};

// The names of the states begin with the same words.
Texts statesOf(const std::string& network, const Texts& states)
{
    Texts names;
    for (const std::string& state : states)
        names.push_back("CONNECTION_" + network + "_STATE_" + state);
    return names;
}

const Texts CELLULAR_STATES =
    statesOf("CELLULAR", {"OUT_OF_SERVICE", "FLIGHT_MODE", "ROAMING_OFF", "CALL_ONLY_AVAILABLE",
                          "AVAILABLE", "CONNECTED"});
const Texts OTHER_STATES = {"DEACTIVATED", "DISCONNECTED", "CONNECTED"};
const Network NETWORKS[] = {
    {"GetCellularNetworkState", CoreSystemInternals::GET_CELLULAR_STATE,
     "connection_get_cellular_state", CELLULAR_STATES},
    {"GetWifiNetworkState", CoreSystemInternals::GET_WIFI_STATE, "connection_get_wifi_state",
     statesOf("WIFI", OTHER_STATES)},
    {"GetBTNetworkState", CoreSystemInternals::GET_BT_STATE, "connection_get_bt_state",
     statesOf("BT", OTHER_STATES)},
};
const Network& CELLULAR = NETWORKS[0];
const Network& WIFI = NETWORKS[1];
const Network& BLUETOOTH = NETWORKS[2];

// Every state that the platform lists, and some that it does not.
const int STATES[] = {0, 1, 2, 3, 4, 5, 6, 7, -1, INT32_MAX, INT32_MIN};
Texts facadeTrace(const std::string& method)
{
    return Texts{CORE_SYSTEM.debug(method, "CoreSystem " + method)} + CONNECTION_MANAGER.access();
}

std::vector<LoggedCall> stateCalls()
{
    std::vector<LoggedCall> calls;
    for (const Network& network : NETWORKS)
        for (const int state : STATES)
            calls.push_back({network.name + std::to_string(static_cast<unsigned int>(state)),
                             [=] {
                                 network.answer(state);
                                 EXPECT_EQ((coreSystem().*network.ask)(), state);
                                 EXPECT_THAT(platform().liveHandles(), IsEmpty());
                             },
                             facadeTrace(network.name) + network.trace(state)});
    return calls;
}

void answerAll(int cellular, int wifi, int bluetooth)
{
    CELLULAR.answer(cellular);
    WIFI.answer(wifi);
    BLUETOOTH.answer(bluetooth);
}

Texts connectedTrace(const std::string& checked, int cellular)
{
    return Texts{CONNECTION_MANAGER.debug("IsNetworkConnected",
                                          "IsNetworkConnected : CHECK [Cellular]" + checked)} +
           CELLULAR.trace(cellular);
}

std::vector<LoggedCall> connectedCalls()
{
    std::vector<LoggedCall> calls;
    const auto add = [&](const std::string& name, bool checkWifi, bool checkBT, int cellular,
                         int wifi, int bluetooth, bool answer) {
        const std::string checked =
            std::string(checkWifi ? "[WIFI]" : "") + (checkBT ? "[BT]" : "");
        const Texts trace = connectedTrace(checked, cellular) +
                            (checkWifi ? WIFI.trace(wifi) : Texts()) +
                            (checkBT ? BLUETOOTH.trace(bluetooth) : Texts());
        calls.push_back({name,
                         [=] {
                             answerAll(cellular, wifi, bluetooth);
                             EXPECT_EQ(coreSystem().IsNetworkConnected(checkWifi, checkBT), answer);
                         },
                         facadeTrace("IsNetworkConnected") + trace});
    };
    add("NothingIsChecked", false, false, 4, 2, 1, false);
    add("WifiIsChecked", true, false, 4, 2, 1, true);
    add("BluetoothIsChecked", false, true, 4, 2, 1, false);
    add("BothAreChecked", true, true, 4, 2, 1, true);
    add("ConnectedCellularIsNoShortCut", true, true, 5, 2, 2, true);
    add("OnlyWifiIsConnected", true, false, 0, 2, 0, true);
    add("OnlyBluetoothIsConnected", false, true, 0, 0, 2, true);
    return calls;
}

LOGGED_CALLS(NetworkStates, stateCalls());
LOGGED_CALLS(NetworkConnected, connectedCalls());

class NetworkTest : public PlatformTest {};

TEST_F(NetworkTest, ResultCodesPlayNoPartAndWhatIsNotReadIsZero)
{
    platform().debugMode = 1;
    platform().answer("connection_destroy(no connection)", -22);
    for (const Network& network : NETWORKS) {
        const auto expectState = [&](int state, const std::string& handle) {
            platform().forgetEvents();
            EXPECT_EQ((system.*network.ask)(), state);
            EXPECT_EQ(platform().trace(), facadeTrace(network.name) + network.trace(state, handle));
        };
        for (const int code : {-22, 1}) {
            network.answer(2, code);
            platform().answer("connection_destroy(connection)", code);
            expectState(2, "connection");
            platform().answer(network.readCall(), code);
            expectState(0, "connection");
            platform().answer("connection_create()", code);
            platform().answer(network.readCall("no connection"), -22);
            expectState(0, "no connection");
        }
    }
}

TEST_F(NetworkTest, OnlyConnectedNetworksThatAreCheckedCount)
{
    for (const int cellular : STATES)
        for (const int wifi : STATES)
            for (const int bluetooth : STATES)
                for (const bool checkWifi : {false, true})
                    for (const bool checkBT : {false, true}) {
                        platform().forgetEvents();
                        answerAll(cellular, wifi, bluetooth);
                        EXPECT_EQ(connections.IsNetworkConnected(checkWifi, checkBT),
                                  cellular == 5 || (checkWifi && wifi == 2) ||
                                      (checkBT && bluetooth == 2))
                            << cellular << wifi << bluetooth << checkWifi << checkBT;
                    }
}

TEST_F(NetworkTest, ManyThreadsMayAskAtOnce)
{
    answerAll(0, 1, 2);
    together(8, [&](int) {
        for (int i = 0; i < 20; ++i) {
            EXPECT_TRUE(connections.IsNetworkConnected(true, true));
            EXPECT_FALSE(connections.IsNetworkConnected(true, false));
        }
    });
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
}

} // namespace
