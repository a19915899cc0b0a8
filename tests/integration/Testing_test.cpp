// SPDX-License-Identifier: Apache-2.0
// An application's tests on many devices in one process, as an application writes them.
#include <cstdlib>
#include <stdexcept>

#include <CoreSystem.h>
#include <coresystem_testing.h>
#include <gmock/gmock.h>

using coresystem_testing::Device;
using coresystem_testing::runUntil;
using testing::HasSubstr;
using testing::ThrowsMessage;

namespace {

std::string deviceName()
{
    char* name = nullptr;
    CoreSystem::GetInstance()->GetDeviceName(&name);
    const std::string text = name != nullptr ? name : "none";
    std::free(name);
    return text;
}

struct Listener : IConnectionStateListener {
    void OnWifiDeviceStateChanged(int, void*) override {}
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override {}
    void OnPacketDataChanged(bool, void*) override {}
    void OnFlightModeChanged(bool enabled, void*) override
    {
        isFlying = enabled;
    }
    void OnWifiStatusChanged(bool connected, void*) override
    {
        isOnWifi = connected;
    }
    bool isFlying = false;
    bool isOnWifi = true;
};

TEST(Testing, OneDeviceFollowsAnother)
{
    for (int i = 0; i < 20; ++i) {
        {
            const Device device(SAMPLES "/phone.toml");
            EXPECT_EQ(deviceName(), "Sample phone");
            EXPECT_FALSE(CoreSystem::GetInstance()->IsFlightMode());
        }
        EXPECT_EQ(deviceName(), "none");
        Device device(SAMPLES "/flight_mode.toml");
        EXPECT_EQ(deviceName(), "Flying phone");
        EXPECT_TRUE(CoreSystem::GetInstance()->IsFlightMode());
        device.set("settings.device_name", "Other");
        EXPECT_EQ(deviceName(), "Other");
        device.unset("settings.device_name");
        EXPECT_EQ(deviceName(), "none");
        EXPECT_FALSE(device.step());
    }
}

TEST(Testing, AListenerIsToldOfEachStep)
{
    Device device(SAMPLES "/travel.toml");
    Listener listener;
    CoreSystem::GetInstance()->SetConnectionEventListener(&listener, nullptr);
    for (int i = 0; i < 3; ++i)
        EXPECT_TRUE(device.step());
    EXPECT_TRUE(runUntil([&] { return !listener.isOnWifi; }));
    EXPECT_TRUE(device.step());
    EXPECT_TRUE(runUntil([&] { return listener.isFlying; }));
    EXPECT_TRUE(device.step());
    EXPECT_TRUE(runUntil([&] { return listener.isOnWifi && !listener.isFlying; }));
    EXPECT_FALSE(device.step());
    EXPECT_FALSE(runUntil([] { return false; }, 1));
    CoreSystem::GetInstance()->SetConnectionEventListener(nullptr, nullptr);
}

TEST(Testing, AMistakeIsToldAndChangesNothing)
{
    const auto make = [](const char* file) { return [file] { const Device device(file); }; };
    EXPECT_THAT(make("no such device"), ThrowsMessage<std::runtime_error>(HasSubstr("no such")));
    EXPECT_THAT(make(SAMPLES "/../tests/devices/bad_key.toml"),
                ThrowsMessage<std::runtime_error>(HasSubstr("modell_name")));
    Device device(SAMPLES "/phone.toml");
    EXPECT_THAT(make(SAMPLES "/phone.toml"), ThrowsMessage<std::runtime_error>(HasSubstr("still")));
    EXPECT_THAT([&] { device.set("settings.flight_mode", "maybe"); },
                ThrowsMessage<std::runtime_error>(HasSubstr("true or false")));
    EXPECT_EQ(deviceName(), "Sample phone");
}

} // namespace
