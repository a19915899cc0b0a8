// SPDX-License-Identifier: Apache-2.0
// The connection functions over a backend that answers what a test says.
#include <net_connection.h>

#include <gmock/gmock.h>

#include "coresystem_port.h"
#include "shim/HandleKinds.h"
#include "support/FakeBackend.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using port::CellularState;
using port::Connections;
using port::LinkState;

namespace {

using Answers = FakeNetwork::Answers;

constexpr int INVALID = CONNECTION_ERROR_INVALID_PARAMETER;

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

    // Every read answers with a code.
    void expectCode(int code, connection_h handle)
    {
        EXPECT_EQ(code, connection_get_cellular_state(handle, &cellularState));
        EXPECT_EQ(code, connection_get_wifi_state(handle, &wifiState));
        EXPECT_EQ(code, connection_get_bt_state(handle, &bluetoothState));
    }
    // Every read fails with a code and leaves its state alone.
    void expectFailure(int code, connection_h handle)
    {
        expectCode(code, handle);
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

TEST_F(NetConnectionTest, EveryStateHasThePlatformsNumber)
{
    const CellularState states[] = {CellularState::OutOfService, CellularState::FlightMode,
                                    CellularState::RoamingOff,   CellularState::CallOnlyAvailable,
                                    CellularState::Available,    CellularState::Connected};
    const LinkState links[] = {LinkState::Deactivated, LinkState::Disconnected,
                               LinkState::Connected};
    for (int number = 0; number < 6; ++number) {
        backend.fakeNetwork.change([&](Answers& answers) {
            answers.cellular = answered(states[number]);
            answers.wifi = answered(links[number % 3]);
            answers.bluetooth = answered(links[2 - number % 3]);
        });
        expectCode(0, connection);
        EXPECT_EQ(number, static_cast<int>(cellularState));
        EXPECT_EQ(number % 3, static_cast<int>(wifiState));
        EXPECT_EQ(2 - number % 3, static_cast<int>(bluetoothState));
    }
    for (const Question question : {Question::Cellular, Question::Wifi, Question::Bluetooth})
        EXPECT_EQ("test", lastOrigin(question).source);
}

TEST_F(NetConnectionTest, FailuresHaveTheirCodesAndLeaveTheStateAlone)
{
    for (const auto& [error, code] :
         {std::pair(port::notAvailable("gone"), CONNECTION_ERROR_OPERATION_FAILED),
          {port::notSupported("none"), CONNECTION_ERROR_NOT_SUPPORTED},
          {port::denied("no"), CONNECTION_ERROR_PERMISSION_DENIED}}) {
        backend.fakeNetwork.change([&why = error](Answers& answers) {
            answers.cellular = why;
            answers.wifi = why;
            answers.bluetooth = why;
        });
        expectFailure(code, connection);
        for (const Question question : {Question::Cellular, Question::Wifi, Question::Bluetooth})
            EXPECT_EQ(error.reason, lastOrigin(question).reason);
    }
}

TEST_F(NetConnectionTest, NullArgumentsAreInvalid)
{
    EXPECT_EQ(INVALID, connection_create(nullptr));
    EXPECT_EQ(INVALID, connection_destroy(nullptr));
    EXPECT_EQ(INVALID, connection_get_cellular_state(connection, nullptr));
    EXPECT_EQ(INVALID, connection_get_wifi_state(connection, nullptr));
    EXPECT_EQ(INVALID, connection_get_bt_state(connection, nullptr));
}

TEST_F(NetConnectionTest, HandleThatIsNoneIsInvalid)
{
    connection_h released = nullptr;
    ASSERT_EQ(0, connection_create(&released));
    EXPECT_NE(connection, released);
    EXPECT_EQ(2U, Connections::live());
    ASSERT_EQ(0, connection_destroy(released));
    EXPECT_EQ(INVALID, connection_destroy(released));
    int something = 0;
    for (const connection_h none : {connection_h(), released, static_cast<void*>(&something)})
        expectFailure(INVALID, none);
}

} // namespace
