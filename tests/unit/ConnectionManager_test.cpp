// SPDX-License-Identifier: Apache-2.0
// The states of the networks, and whether one of them is connected.
#include "support/PlatformTest.h"
#include "support/Together.h"

using namespace fake;
using testing::IsEmpty;

namespace {

struct Network {
    std::string name; // of the method
    int (ConnectionManager::*read)();
    CoreSystemInternals::StateRead ask;
    std::string function; // of the platform
    Texts states;

    std::string readCall(const std::string& handle = "connection") const
    {
        return function + "(" + handle + ")";
    }
    int connected() const
    {
        return static_cast<int>(states.size()) - 1;
    }
    std::string stateLine(int state) const
    {
        return CONNECTION_MANAGER.debug(name,
                                        name + " : " + states.at(static_cast<std::size_t>(state)));
    }
    bool isListed(int state) const
    {
        return state >= 0 && static_cast<std::size_t>(state) < states.size();
    }
    // The calls of one read, with a handle of its own.
    Texts trace(int state, const std::string& handle = "connection") const
    {
        return Texts{"connection_create()", readCall(handle)} +
               (isListed(state) ? Texts{stateLine(state)} : Texts()) +
               Texts{"connection_destroy(" + handle + ")"};
    }
    void answer(int state, int code = 0) const
    {
        platform().answer("connection_create()", 0);
        platform().answer(readCall(), code, state);
        platform().answer("connection_destroy(connection)", 0);
    }
};

std::ostream& operator<<(std::ostream& out, const Network& network)
{
    return out << network.name;
}

const Network CELLULAR = {
    "GetCellularNetworkState",
    &ConnectionManager::GetCellularNetworkState,
    CoreSystemInternals::GET_CELLULAR_STATE,
    "connection_get_cellular_state",
    {"CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE", "CONNECTION_CELLULAR_STATE_FLIGHT_MODE",
     "CONNECTION_CELLULAR_STATE_ROAMING_OFF", "CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE",
     "CONNECTION_CELLULAR_STATE_AVAILABLE", "CONNECTION_CELLULAR_STATE_CONNECTED"}};
const Network WIFI = {"GetWifiNetworkState",
                      &ConnectionManager::GetWifiNetworkState,
                      CoreSystemInternals::GET_WIFI_STATE,
                      "connection_get_wifi_state",
                      {"CONNECTION_WIFI_STATE_DEACTIVATED", "CONNECTION_WIFI_STATE_DISCONNECTED",
                       "CONNECTION_WIFI_STATE_CONNECTED"}};
const Network BLUETOOTH = {"GetBTNetworkState",
                           &ConnectionManager::GetBTNetworkState,
                           CoreSystemInternals::GET_BT_STATE,
                           "connection_get_bt_state",
                           {"CONNECTION_BT_STATE_DEACTIVATED", "CONNECTION_BT_STATE_DISCONNECTED",
                            "CONNECTION_BT_STATE_CONNECTED"}};
const Network NETWORKS[] = {CELLULAR, WIFI, BLUETOOTH};

// Every state that the platform lists, and some that it does not.
const int STATES[] = {0, 1, 2, 3, 4, 5, 6, 7, -1, INT32_MAX, INT32_MIN};
const int CONNECTION_FAILURES[] = {-22, -12, -13, -29294591, -1, 1, INT32_MIN};

ConnectionManager& manager()
{
    return *CoreSystemInternals::instance<ConnectionManager>();
}

Texts facadeTrace(const std::string& method)
{
    return Texts{CORE_SYSTEM.debug(method, "CoreSystem " + method)} + CONNECTION_MANAGER.access();
}

std::vector<LoggedCall> stateCalls()
{
    std::vector<LoggedCall> calls;
    for (const Network& network : NETWORKS) {
        for (const int state : STATES) {
            std::string name = network.name + std::to_string(state);
            std::replace(name.begin(), name.end(), '-', 'n');
            calls.push_back({name,
                             [network, state] {
                                 network.answer(state);
                                 EXPECT_EQ((manager().*network.read)(), state);
                             },
                             network.trace(state)});
        }
        calls.push_back({"Facade" + network.name,
                         [network] {
                             network.answer(1);
                             EXPECT_EQ((coreSystem().*network.ask)(), 1);
                         },
                         facadeTrace(network.name) + network.trace(1)});
    }
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

LoggedCall connectedCall(const std::string& name, bool checkWifi, bool checkBT, bool answer,
                         const Texts& trace)
{
    return {name,
            [=] {
                answerAll(4, 2, 1);
                EXPECT_EQ(manager().IsNetworkConnected(checkWifi, checkBT), answer);
            },
            trace};
}

std::vector<LoggedCall> connectedCalls()
{
    return {
        connectedCall("NothingIsChecked", false, false, false, connectedTrace("", 4)),
        connectedCall("WifiIsChecked", true, false, true,
                      connectedTrace("[WIFI]", 4) + WIFI.trace(2)),
        connectedCall("BluetoothIsChecked", false, true, false,
                      connectedTrace("[BT]", 4) + BLUETOOTH.trace(1)),
        connectedCall("BothAreChecked", true, true, true,
                      connectedTrace("[WIFI][BT]", 4) + WIFI.trace(2) + BLUETOOTH.trace(1)),
        {"ConnectedCellularIsNoShortCut",
         [] {
             answerAll(5, 2, 2);
             EXPECT_TRUE(manager().IsNetworkConnected(true, true));
         },
         connectedTrace("[WIFI][BT]", 5) + WIFI.trace(2) + BLUETOOTH.trace(2)},
        {"FacadeIsNetworkConnectedWifi",
         [] {
             answerAll(0, 2, 0);
             EXPECT_TRUE(coreSystem().IsNetworkConnected(true, false));
         },
         facadeTrace("IsNetworkConnected") + connectedTrace("[WIFI]", 0) + WIFI.trace(2)},
        {"FacadeIsNetworkConnectedBluetooth",
         [] {
             answerAll(0, 0, 2);
             EXPECT_TRUE(coreSystem().IsNetworkConnected(false, true));
         },
         facadeTrace("IsNetworkConnected") + connectedTrace("[BT]", 0) + BLUETOOTH.trace(2)},
    };
}

INSTANTIATE_TEST_SUITE_P(NetworkStates, LoggedCallTest, testing::ValuesIn(stateCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(NetworkConnected, LoggedCallTest, testing::ValuesIn(connectedCalls()),
                         rowName<LoggedCall>);

class NetworkTest : public PlatformTest, public testing::WithParamInterface<Network> {
protected:
    const Network& network = GetParam();

    int state()
    {
        return (connections.*network.read)();
    }
    int stateOfFacade()
    {
        const CoreSystemInternals::StateRead ask = network.ask;
        return (system.*ask)();
    }
};

INSTANTIATE_TEST_SUITE_P(Every, NetworkTest, testing::ValuesIn(NETWORKS), rowName<Network>);

TEST_P(NetworkTest, FailedCreationReadsWithNoHandle)
{
    platform().debugMode = 1;
    platform().answer(network.readCall("no connection"), -22);
    platform().answer("connection_destroy(no connection)", -22);
    for (const int code : CONNECTION_FAILURES) {
        platform().forgetEvents();
        platform().answer("connection_create()", code);
        EXPECT_EQ(state(), 0);
        EXPECT_EQ(platform().trace(), network.trace(0, "no connection"));
    }
}

TEST_P(NetworkTest, FailedReadIsZero)
{
    platform().debugMode = 1;
    network.answer(0);
    for (const int code : CONNECTION_FAILURES) {
        platform().forgetEvents();
        platform().answer(network.readCall(), code);
        EXPECT_EQ(state(), 0);
        EXPECT_EQ(platform().trace(), network.trace(0));
    }
}

TEST_P(NetworkTest, ResultCodesPlayNoPart)
{
    platform().debugMode = 1;
    for (const int code : CONNECTION_FAILURES) {
        platform().forgetEvents();
        network.answer(network.connected(), code);
        platform().answer("connection_destroy(connection)", code);
        EXPECT_EQ(state(), network.connected());
        EXPECT_EQ(platform().trace(), network.trace(network.connected()));
    }
}

TEST_P(NetworkTest, HandleIsReleasedByEachCall)
{
    for (const int expected : {0, 1, 2, 7}) {
        network.answer(expected);
        EXPECT_EQ(state(), expected);
        EXPECT_THAT(platform().liveHandles(), IsEmpty());
    }
}

TEST_P(NetworkTest, FacadePassesEveryStateOn)
{
    for (const int expected : STATES) {
        network.answer(expected);
        EXPECT_EQ(stateOfFacade(), expected);
    }
}

class NetworkConnectedTest : public PlatformTest {};

TEST_F(NetworkConnectedTest, OnlyConnectedNetworksThatAreCheckedCount)
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

TEST_F(NetworkConnectedTest, NetworksThatAreNotCheckedAreNotAsked)
{
    CELLULAR.answer(0); // anything else has no answer
    EXPECT_FALSE(connections.IsNetworkConnected(false, false));
    EXPECT_EQ(platform().trace(), CELLULAR.trace(-1));
}

TEST_F(NetworkConnectedTest, NothingIsConnectedWhereNoHandleIsToBeHad)
{
    platform().answer("connection_create()", -12);
    for (const Network& network : NETWORKS)
        platform().answer(network.readCall("no connection"), -22);
    platform().answer("connection_destroy(no connection)", -22);
    EXPECT_FALSE(connections.IsNetworkConnected(true, true));
}

TEST_F(NetworkConnectedTest, ManyThreadsMayAskAtOnce)
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
