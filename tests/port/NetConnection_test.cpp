// SPDX-License-Identifier: Apache-2.0
// The connection functions over a backend that answers what a test says.
#include <net_connection.h>

#include <gmock/gmock.h>

#include "coresystem_port.h"
#include "shim/HandleKinds.h"
#include "support/FakeBackend.h"
#include "support/Together.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using port::CellularState;
using port::Connections;
using port::LinkState;

namespace {

using Answers = FakeNetwork::Answers;

class NetConnectionTest : public testing::Test {
protected:
    NetConnectionTest()
    {
        EXPECT_EQ(0, connection_create(&connection));
    }
    ~NetConnectionTest() override
    {
        EXPECT_EQ(0, connection_destroy(connection));
        EXPECT_EQ(0U, Connections::live());
    }

    int cellular()
    {
        return connection_get_cellular_state(connection, &cellularState);
    }
    int wifi()
    {
        return connection_get_wifi_state(connection, &wifiState);
    }
    int bluetooth()
    {
        return connection_get_bt_state(connection, &bluetoothState);
    }

    // Every read fails with a code and leaves its state alone.
    void expectFailures(const port::Error& error, int code)
    {
        backend.fakeNetwork.change([&error](Answers& answers) {
            answers.cellular = error;
            answers.wifi = error;
            answers.bluetooth = error;
        });
        EXPECT_EQ(code, cellular());
        EXPECT_EQ(code, wifi());
        EXPECT_EQ(code, bluetooth());
        EXPECT_EQ(CONNECTION_CELLULAR_STATE_ROAMING_OFF, cellularState);
        EXPECT_EQ(CONNECTION_WIFI_STATE_DISCONNECTED, wifiState);
        EXPECT_EQ(CONNECTION_BT_STATE_DISCONNECTED, bluetoothState);
    }

    FakedBackend backend;
    connection_h connection = nullptr;
    connection_cellular_state_e cellularState = CONNECTION_CELLULAR_STATE_ROAMING_OFF;
    connection_wifi_state_e wifiState = CONNECTION_WIFI_STATE_DISCONNECTED;
    connection_bt_state_e bluetoothState = CONNECTION_BT_STATE_DISCONNECTED;
};

TEST_F(NetConnectionTest, EveryCellularStateHasThePlatformsNumber)
{
    const CellularState states[] = {CellularState::OutOfService, CellularState::FlightMode,
                                    CellularState::RoamingOff,   CellularState::CallOnlyAvailable,
                                    CellularState::Available,    CellularState::Connected};
    for (int number = 0; number < 6; ++number) {
        backend.fakeNetwork.change(
            [&](Answers& answers) { answers.cellular = answered(states[number]); });
        EXPECT_EQ(0, cellular());
        EXPECT_EQ(number, static_cast<int>(cellularState));
    }
}

TEST_F(NetConnectionTest, EveryLinkStateHasThePlatformsNumber)
{
    const LinkState states[] = {LinkState::Deactivated, LinkState::Disconnected,
                                LinkState::Connected};
    for (int number = 0; number < 3; ++number) {
        backend.fakeNetwork.change([&](Answers& answers) {
            answers.wifi = answered(states[number]);
            answers.bluetooth = answered(states[2 - number]);
        });
        EXPECT_EQ(0, wifi());
        EXPECT_EQ(0, bluetooth());
        EXPECT_EQ(number, static_cast<int>(wifiState));
        EXPECT_EQ(2 - number, static_cast<int>(bluetoothState));
    }
}

TEST_F(NetConnectionTest, FailuresHaveTheirCodesAndLeaveTheStateAlone)
{
    expectFailures(port::notAvailable("why"), CONNECTION_ERROR_OPERATION_FAILED);
    expectFailures(port::notSupported("why"), CONNECTION_ERROR_NOT_SUPPORTED);
    expectFailures(port::denied("why"), CONNECTION_ERROR_PERMISSION_DENIED);
}

TEST_F(NetConnectionTest, OriginsAreKept)
{
    cellular();
    bluetooth();
    backend.fakeNetwork.change([](Answers& answers) { answers.wifi = port::denied("no"); });
    wifi();
    EXPECT_EQ("test", lastOrigin(Question::Cellular).source);
    EXPECT_EQ("test", lastOrigin(Question::Bluetooth).source);
    EXPECT_EQ("no", lastOrigin(Question::Wifi).reason);
}

TEST_F(NetConnectionTest, NullArgumentsAreInvalid)
{
    EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER, connection_create(nullptr));
    EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER, connection_destroy(nullptr));
    EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER,
              connection_get_cellular_state(connection, nullptr));
    EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER, connection_get_wifi_state(connection, nullptr));
    EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER, connection_get_bt_state(connection, nullptr));
}

TEST_F(NetConnectionTest, HandleThatIsNoneIsInvalid)
{
    connection_h released = nullptr;
    ASSERT_EQ(0, connection_create(&released));
    EXPECT_NE(connection, released);
    EXPECT_EQ(2U, Connections::live());
    ASSERT_EQ(0, connection_destroy(released));
    EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER, connection_destroy(released));
    int something = 0;
    for (const connection_h none : {connection_h(), released, static_cast<void*>(&something)}) {
        EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER,
                  connection_get_cellular_state(none, &cellularState));
        EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER, connection_get_wifi_state(none, &wifiState));
        EXPECT_EQ(CONNECTION_ERROR_INVALID_PARAMETER,
                  connection_get_bt_state(none, &bluetoothState));
    }
    EXPECT_EQ(CONNECTION_CELLULAR_STATE_ROAMING_OFF, cellularState);
}

TEST_F(NetConnectionTest, ThreadsHaveHandlesOfTheirOwn)
{
    together(8, [](int) {
        for (int round = 0; round < 100; ++round) {
            connection_h own = nullptr;
            connection_wifi_state_e state = CONNECTION_WIFI_STATE_CONNECTED;
            EXPECT_EQ(0, connection_create(&own));
            EXPECT_EQ(0, connection_get_wifi_state(own, &state));
            EXPECT_EQ(CONNECTION_WIFI_STATE_DISCONNECTED, state);
            EXPECT_EQ(0, connection_destroy(own));
        }
    });
}

} // namespace
