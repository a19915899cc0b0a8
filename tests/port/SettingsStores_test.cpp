// SPDX-License-Identifier: Apache-2.0
// Settings, configuration store and clock over a backend that answers what a test says.
#include <cstdlib>

#include <app_alarm.h>
#include <gmock/gmock.h>
#include <system_settings.h>
#include <vconf.h>

#include "coresystem_port.h"
#include "support/FakeBackend.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using port::FontSize;

namespace {

class SettingsStoresTest : public testing::Test {
protected:
    int mobileData()
    {
        return system_settings_get_value_bool(SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED, &on);
    }
    int fontSize()
    {
        return system_settings_get_value_int(SYSTEM_SETTINGS_KEY_FONT_SIZE, &size);
    }

    FakedBackend backend;
    bool on = true;
    int size = 77;
};

TEST_F(SettingsStoresTest, MobileDataIsTheSettingNotTheStatus)
{
    backend.fakeNetwork.change(
        [](FakeNetwork::Answers& answers) { answers.packetData = answered(true); });
    EXPECT_EQ(0, mobileData());
    EXPECT_FALSE(on);
    EXPECT_EQ("test", lastOrigin(Question::MobileData).source);
}

TEST_F(SettingsStoresTest, FontSizesHaveThePlatformsNumbers)
{
    const FontSize sizes[] = {FontSize::Small, FontSize::Normal, FontSize::Large,
                              FontSize::Huge,  FontSize::Giant,  static_cast<FontSize>(9)};
    for (const int number : {0, 1, 2, 3, 4, 9}) {
        backend.fontSizeAnswer = answered(sizes[std::min(number, 5)]);
        EXPECT_EQ(0, fontSize());
        EXPECT_EQ(number, size);
    }
}

TEST_F(SettingsStoresTest, FailuresHaveTheirCodesAndLeaveTheValueAlone)
{
    std::tm date = {};
    date.tm_mday = 78;
    for (const auto& [error, code, clockCode] :
         {std::tuple(port::notAvailable("why"), SYSTEM_SETTINGS_ERROR_IO_ERROR,
                     ALARM_ERROR_CONNECTION_FAIL),
          {port::notSupported("why"), SYSTEM_SETTINGS_ERROR_NOT_SUPPORTED,
           ALARM_ERROR_CONNECTION_FAIL},
          {port::denied("why"), SYSTEM_SETTINGS_ERROR_PERMISSION_DENIED,
           ALARM_ERROR_PERMISSION_DENIED}}) {
        backend.fontSizeAnswer = error;
        backend.nowAnswer = error;
        backend.fakeNetwork.change(
            [&why = error](FakeNetwork::Answers& answers) { answers.mobileData = why; });
        EXPECT_EQ(code, mobileData());
        EXPECT_EQ(code, fontSize());
        EXPECT_EQ(clockCode, alarm_get_current_time(&date));
        EXPECT_TRUE(on);
        EXPECT_EQ(77, size);
        EXPECT_EQ(78, date.tm_mday);
    }
}

TEST_F(SettingsStoresTest, NullArgumentsAreInvalid)
{
    EXPECT_EQ(-22,
              system_settings_get_value_bool(SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED, nullptr));
    EXPECT_EQ(-22, system_settings_get_value_int(SYSTEM_SETTINGS_KEY_FONT_SIZE, nullptr));
    EXPECT_EQ(-22, alarm_get_current_time(nullptr));
    EXPECT_EQ(nullptr, vconf_get_str(nullptr));
}

TEST_F(SettingsStoresTest, ConfigurationIsReadByKey)
{
    for (const char* const key : {"db/csc/salescode", "file/a", "memory/b/c"}) {
        char* const text = vconf_get_str(key);
        EXPECT_STREQ(("value of " + std::string(key)).c_str(), text);
        free(text);
    }
    EXPECT_EQ("test", lastOrigin(Question::SalesCode).source);
}

TEST_F(SettingsStoresTest, ConfigurationThatIsMissingOrOutsideAStoreIsNull)
{
    for (const char* const key : {"", "db", "csc/salescode", "DB/csc/salescode", " db/a", "dbx/a"})
        EXPECT_EQ(nullptr, vconf_get_str(key)) << key;
    backend.textAnswer = [](const std::string&) -> Answer<std::string> {
        return port::notAvailable("no such key");
    };
    EXPECT_EQ(nullptr, vconf_get_str(VCONFKEY_CSC_SALESCODE));
    EXPECT_EQ("no such key", lastOrigin(Question::SalesCode).reason);
}

TEST_F(SettingsStoresTest, TimeIsHandedOutWhole)
{
    std::tm now = {};
    now.tm_year = 126;
    now.tm_yday = 324;
    now.tm_gmtoff = 19800;
    now.tm_zone = "IST";
    backend.nowAnswer = answered(now);
    std::tm date = {};
    ASSERT_EQ(0, alarm_get_current_time(&date));
    EXPECT_EQ(126, date.tm_year);
    EXPECT_EQ(324, date.tm_yday);
    EXPECT_EQ(19800, date.tm_gmtoff);
    EXPECT_STREQ("IST", date.tm_zone);
    EXPECT_EQ("test", lastOrigin(Question::CurrentTime).source);
}

} // namespace
