// SPDX-License-Identifier: Apache-2.0
// The Wi-Fi functions over a backend that answers what a test says.
#include <wifi.h>

#include <gio/gio.h>
#include <gmock/gmock.h>

#include "support/Child.h"
#include "support/NetworkBackend.h"

using port::LinkState;
using port::WifiConnection;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

class WifiTest : public testing::Test {
protected:
    using Answers = FakeNetwork::Answers;

    WifiTest()
    {
        network.change([](Answers& answers) { answers = {}; });
        wifi_initialize(); // in this process already, perhaps
    }
    ~WifiTest() override
    {
        EXPECT_EQ(0, wifi_unset_device_state_changed_cb());
        EXPECT_EQ(0, wifi_unset_connection_state_changed_cb());
    }

    static void onDevice(wifi_device_state_e state, void* test)
    {
        static_cast<WifiTest*>(test)->told.push_back("device " + std::to_string(state));
    }
    static void onConnection(wifi_connection_state_e state, wifi_ap_h ap, void* test)
    {
        EXPECT_EQ(nullptr, ap);
        static_cast<WifiTest*>(test)->told.push_back("connection " + std::to_string(state));
    }
    std::vector<std::string> taken()
    {
        while (g_main_context_iteration(nullptr, FALSE) != FALSE) {}
        return std::exchange(told, {});
    }

    FakeNetwork& network = networkBackend().fakeNetwork;
    std::vector<std::string> told;
};

// The results of all operations in a process of its own.
std::string resultsAfter(const std::function<int()>& initialize)
{
    return inChild([&] {
        std::string results = std::to_string(initialize());
        for (const int result :
             {wifi_set_device_state_changed_cb([](wifi_device_state_e, void*) {}, nullptr),
              wifi_set_connection_state_changed_cb([](wifi_connection_state_e, wifi_ap_h, void*) {},
                                                   nullptr),
              wifi_unset_device_state_changed_cb(), wifi_unset_connection_state_changed_cb()})
            results += " " + std::to_string(result);
        return results;
    });
}

std::string initializedWith(const Answer<LinkState>& wifi)
{
    return resultsAfter([&] {
        networkBackend().fakeNetwork.change(
            [&](FakeNetwork::Answers& answers) { answers.wifi = wifi; });
        return wifi_initialize();
    });
}

// Here no process has initialised anything yet.
TEST(WifiInitializationTest, NothingGoesBeforeItAndASecondOneIsInvalid)
{
    EXPECT_EQ("0 -38 -38 -38 -38", resultsAfter([] {
                  networkBackend();
                  return 0;
              }));
    EXPECT_EQ("-38 0 0 0 0", resultsAfter([] {
                  networkBackend();
                  EXPECT_EQ(0, wifi_initialize());
                  return wifi_initialize();
              }));
}

TEST(WifiInitializationTest, DeviceWithoutWifiIsNotSupportedAndOneThatCannotBeAskedMayAnswerLater)
{
    EXPECT_EQ("-1073741822 -1073741822 -1073741822 -1073741822 -1073741822",
              initializedWith(port::notSupported("no Wi-Fi")));
    EXPECT_EQ("0 0 0 0 0", initializedWith(port::notAvailable("not yet")));
}

TEST(WifiInitializationTest, WorksWhenTheRadioCameLater)
{
    EXPECT_EQ("0 0 0 0 0", resultsAfter([] {
                  FakeNetwork& network = networkBackend().fakeNetwork;
                  network.change([](FakeNetwork::Answers& answers) {
                      answers.wifi = port::notSupported("no Wi-Fi");
                  });
                  EXPECT_EQ(WIFI_ERROR_NOT_SUPPORTED, wifi_initialize());
                  network.change([](FakeNetwork::Answers& answers) { answers = {}; });
                  return wifi_initialize();
              }));
}

TEST_F(WifiTest, NullCallbackIsInvalidAndChangesThatCannotBeWatchedFail)
{
    EXPECT_EQ(WIFI_ERROR_INVALID_PARAMETER, wifi_set_device_state_changed_cb(nullptr, this));
    EXPECT_EQ(WIFI_ERROR_INVALID_PARAMETER, wifi_set_connection_state_changed_cb(nullptr, this));
    EXPECT_EQ(0, network.watches());
    network.watchable = false;
    EXPECT_EQ(WIFI_ERROR_OPERATION_FAILED, wifi_set_device_state_changed_cb(onDevice, this));
    network.watchable = true;
}

TEST_F(WifiTest, StatesAreToldWithThePlatformsNumbersUntilUnset)
{
    EXPECT_EQ(0, wifi_set_connection_state_changed_cb(onConnection, this));
    EXPECT_EQ(0, wifi_set_device_state_changed_cb(onDevice, this));
    EXPECT_THAT(taken(), IsEmpty());
    network.change([](Answers& answers) {
        answers.wifi = answered(LinkState::Deactivated);
        answers.wifiConnection = answered(WifiConnection::Failure);
    });
    EXPECT_THAT(taken(), ElementsAre("device 0", "connection -1"));
    const WifiConnection states[] = {WifiConnection::Disconnected, WifiConnection::Association,
                                     WifiConnection::Configuration, WifiConnection::Connected};
    for (int number = 0; number < 4; ++number) {
        network.change(
            [&](Answers& answers) { answers.wifiConnection = answered(states[number]); });
        EXPECT_THAT(taken(), ElementsAre("connection " + std::to_string(number)));
    }
    network.change([](Answers& answers) { answers.wifi = answered(LinkState::Connected); });
    EXPECT_THAT(taken(), ElementsAre("device 1"));

    network.change([](Answers& answers) {
        answers.wifi = answered(LinkState::Deactivated);
        answers.wifiConnection = answered(WifiConnection::Failure);
    });
    EXPECT_EQ(0, wifi_unset_connection_state_changed_cb());
    EXPECT_THAT(taken(), ElementsAre("device 0"));
    EXPECT_EQ(1, network.watches());
    EXPECT_EQ(0, wifi_unset_device_state_changed_cb());
    EXPECT_EQ(0, network.watches());
}

} // namespace
