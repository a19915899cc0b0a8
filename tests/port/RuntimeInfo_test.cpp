// SPDX-License-Identifier: Apache-2.0
// Runtime information over a backend that answers what a test says.
#include <runtime_info.h>

#include <cstring>

#include <gio/gio.h>
#include <gmock/gmock.h>

#include "coresystem_port.h"
#include "support/NetworkBackend.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using port::LinkState;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

// An application may be built against headers with more keys than these.
__attribute__((no_sanitize("undefined"))) runtime_info_key_e keyOf(int number)
{
    runtime_info_key_e key{};
    std::memcpy(&key, &number, sizeof key);
    return key;
}

class RuntimeInfoTest : public testing::Test {
protected:
    RuntimeInfoTest()
    {
        network.change([](Answers& answers) { answers = {}; });
    }
    ~RuntimeInfoTest() override
    {
        for (const int key : {0, 1, 9, 10})
            EXPECT_EQ(0, runtime_info_unset_changed_cb(keyOf(key)));
    }

    static void onChanged(runtime_info_key_e key, void* test)
    {
        static_cast<RuntimeInfoTest*>(test)->told.push_back(static_cast<int>(key));
    }
    int listen(int key)
    {
        return runtime_info_set_changed_cb(keyOf(key), onChanged, this);
    }
    std::vector<int> taken()
    {
        while (g_main_context_iteration(nullptr, FALSE) != FALSE) {}
        return std::exchange(told, {});
    }

    using Answers = FakeNetwork::Answers;

    FakeNetwork& network = networkBackend().fakeNetwork;
    std::vector<int> told;
};

int failedSwitch(int key)
{
    bool value = true;
    const int result = runtime_info_get_value_bool(keyOf(key), &value);
    EXPECT_TRUE(value);
    return result;
}

int failedNumber(int key)
{
    int value = 77;
    const int result = runtime_info_get_value_int(keyOf(key), &value);
    EXPECT_EQ(77, value);
    return result;
}

TEST_F(RuntimeInfoTest, EachSwitchIsItsOwn)
{
    const struct {
        int key;
        Answer<bool> Answers::*answer;
        Question question;
    } switches[] = {
        {0, &Answers::flightMode, Question::FlightMode},
        {9, &Answers::packetData, Question::PacketData},
        {10, &Answers::dataRoaming, Question::DataRoaming},
    };
    for (const auto& one : switches) {
        network.change([&](Answers& answers) {
            answers = {};
            answers.*one.answer = port::Sourced<bool>{true, "switch"};
        });
        for (const auto& other : switches) {
            bool value = other.key != one.key;
            EXPECT_EQ(0, runtime_info_get_value_bool(keyOf(other.key), &value));
            EXPECT_EQ(other.key == one.key, value) << one.key << " " << other.key;
        }
        EXPECT_EQ("switch", lastOrigin(one.question).source);
    }
}

TEST_F(RuntimeInfoTest, WifiStatusHasThePlatformsNumber)
{
    const LinkState states[] = {LinkState::Deactivated, LinkState::Disconnected,
                                LinkState::Connected};
    for (int number = 0; number < 3; ++number) {
        int value = 77;
        network.change([&](Answers& answers) { answers.wifi = answered(states[number]); });
        EXPECT_EQ(0, runtime_info_get_value_int(RUNTIME_INFO_KEY_WIFI_STATUS, &value));
        EXPECT_EQ(number, value);
    }
}

TEST_F(RuntimeInfoTest, FailuresHaveTheirCodesAndLeaveTheValueAlone)
{
    for (const auto& [error, code] :
         {std::pair(port::notAvailable("why"), RUNTIME_INFO_ERROR_IO_ERROR),
          {port::notSupported("why"), RUNTIME_INFO_ERROR_NOT_SUPPORTED},
          {port::denied("why"), RUNTIME_INFO_ERROR_PERMISSION_DENIED}}) {
        network.change([&why = error](Answers& answers) {
            answers.flightMode = answers.packetData = answers.dataRoaming = why;
            answers.wifi = why;
        });
        for (const int key : {0, 9, 10})
            EXPECT_EQ(code, failedSwitch(key)) << key;
        EXPECT_EQ(code, failedNumber(1));
    }
}

TEST_F(RuntimeInfoTest, OtherKeysAreNotSupportedOrInvalid)
{
    for (const int key : {-1, 1, 14, 15, 16, 18, 21, 25, 27, 1000}) // unknown, or of another type
        EXPECT_EQ(RUNTIME_INFO_ERROR_INVALID_PARAMETER, failedSwitch(key)) << key;
    for (const int key : {-1, 0, 2, 9, 10, 15, 16, 26, 27, 1000})
        EXPECT_EQ(RUNTIME_INFO_ERROR_INVALID_PARAMETER, failedNumber(key)) << key;
    for (const int key : {2, 3, 4, 5, 6, 7, 8, 11, 12, 13, 17, 19, 20, 22, 23, 24, 26})
        EXPECT_EQ(RUNTIME_INFO_ERROR_NOT_SUPPORTED, failedSwitch(key)) << key;
    for (const int key : {14, 18, 21, 25})
        EXPECT_EQ(RUNTIME_INFO_ERROR_NOT_SUPPORTED, failedNumber(key)) << key;
}

TEST_F(RuntimeInfoTest, NullArgumentsAreInvalid)
{
    EXPECT_EQ(-22, runtime_info_get_value_bool(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, nullptr));
    EXPECT_EQ(-22, runtime_info_get_value_int(RUNTIME_INFO_KEY_WIFI_STATUS, nullptr));
    EXPECT_EQ(-22,
              runtime_info_set_changed_cb(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, nullptr, this));
}

TEST_F(RuntimeInfoTest, ChangesAreToldByKeyInAFixedOrderAndNotAfterUnset)
{
    for (const int key : {10, 0, 9, 1})
        EXPECT_EQ(0, listen(key));
    EXPECT_THAT(taken(), IsEmpty());
    network.change([](Answers& answers) {
        answers.flightMode = answered(true);
        answers.wifi = answered(LinkState::Connected);
        answers.packetData = answered(true);
        answers.dataRoaming = answered(true);
    });
    EXPECT_THAT(taken(), ElementsAre(1, 9, 0, 10));
    network.change([](Answers& answers) { answers = {}; });
    EXPECT_EQ(0, runtime_info_unset_changed_cb(keyOf(0)));
    EXPECT_THAT(taken(), ElementsAre(1, 9, 10));
}

TEST_F(RuntimeInfoTest, OtherKeysAreNotToldAndUnsetTakesAnyThatThereIs)
{
    for (const int key : {2, 8, 11, 15, 26})
        EXPECT_EQ(RUNTIME_INFO_ERROR_NOT_SUPPORTED, listen(key)) << key;
    for (const int key : {0, 2, 15, 26})
        EXPECT_EQ(0, runtime_info_unset_changed_cb(keyOf(key))) << key;
    for (const int key : {-1, 27, 1000}) {
        EXPECT_EQ(RUNTIME_INFO_ERROR_INVALID_PARAMETER, listen(key)) << key;
        EXPECT_EQ(RUNTIME_INFO_ERROR_INVALID_PARAMETER, runtime_info_unset_changed_cb(keyOf(key)));
    }
    network.watchable = false;
    EXPECT_EQ(RUNTIME_INFO_ERROR_NOT_SUPPORTED, listen(0)) << "it cannot be watched now";
    network.watchable = true;
    EXPECT_EQ(0, network.watches());
    EXPECT_EQ(0, listen(0));
}

} // namespace
