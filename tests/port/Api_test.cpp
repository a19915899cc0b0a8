// SPDX-License-Identifier: Apache-2.0
// The numbers of the platform's headers, which are part of every application's binary. The library's
// recorded interface holds those of the types of its own methods.
#include <algorithm>
#include <map>

#include <ITapiSim.h>
#include <gmock/gmock.h>
#include <package_manager.h>
#include <runtime_info.h>
#include <system_settings.h>
#include <tapi_common.h>
#include <telephony.h>
#include <tizen_error.h>

#include "devicefile/ErrorNames.h"

using testing::ElementsAre;

namespace {

using port::devicefile::Name;
using Numbers = std::vector<long>;

// By what the names of a list begin with, what they end with and the numbers.
using Lists = std::map<std::string, std::string>;

std::string beginningOf(const Name* begin, const Name* end)
{
    std::string common(begin->name);
    for (; begin != end; ++begin)
        common.erase(std::mismatch(common.begin(), common.end(), begin->name.begin()).first,
                     common.end());
    return common.substr(0, common.rfind('_') + 1);
}

template <std::size_t count>
void note(Lists& lists, const Name (&names)[count])
{
    const std::string beginning = beginningOf(std::begin(names), std::end(names));
    std::string all;
    for (const Name& name : names)
        all += " " + std::string(name.name.substr(beginning.size())) + " " +
               std::to_string(name.meaning.number);
    lists[beginning] = all.substr(1);
}

// These stand for what a call answers in place of an error; they have no number.
constexpr struct {
} OR_NULL, OR_EMPTY;
template <class None>
void note(Lists& /*lists*/, None /*none*/)
{
}

TEST(ApiTest, ErrorsOfEveryFunctionAreThePlatforms)
{
    const Lists platforms{
        {"ALARM_ERROR_", "INVALID_PARAMETER -22 INVALID_TIME -17825787 INVALID_DATE -17825786 "
                         "CONNECTION_FAIL -17825785 OUT_OF_MEMORY -12 PERMISSION_DENIED -13"},
        {"CONNECTION_ERROR_",
         "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 INVALID_OPERATION -38 "
         "ADDRESS_FAMILY_NOT_SUPPORTED -97 OPERATION_FAILED -29424639 "
         "ITERATOR_END -29424638 NO_CONNECTION -29424637 NOW_IN_PROGRESS -115 "
         "ALREADY_EXISTS -29424636 OPERATION_ABORTED -29424635 DHCP_FAILED -29424634 "
         "INVALID_KEY -29424633 NO_REPLY -29424632 PERMISSION_DENIED -13 "
         "NOT_SUPPORTED -1073741822"},
        {"DLOG_ERROR_", "NOT_PERMITTED -1 INVALID_PARAMETER -22"},
        {"PACKAGE_MANAGER_ERROR_",
         "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 IO_ERROR -5 NO_SUCH_PACKAGE -18153359 "
         "SYSTEM_ERROR -18153358 PERMISSION_DENIED -13"},
        {"RUNTIME_INFO_ERROR_",
         "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 IO_ERROR -5 PERMISSION_DENIED -13 "
         "NOT_SUPPORTED -1073741822 REMOTE_IO -121"},
        {"STORAGE_ERROR_", "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 NOT_SUPPORTED -6 "
                           "OPERATION_FAILED -131054"},
        {"SYSTEM_INFO_ERROR_",
         "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 IO_ERROR -5 PERMISSION_DENIED -13"},
        {"SYSTEM_SETTINGS_ERROR_",
         "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 IO_ERROR -5 PERMISSION_DENIED -13 "
         "NOT_SUPPORTED -1073741822 LOCKSCREEN_APP_PASSWORD_MODE -38141951"},
        {"TAPI_API_", "INVALID_INPUT -1 INVALID_PTR -2 NOT_SUPPORTED -3 SYSTEM_OUT_OF_MEM -5 "
                      "SYSTEM_RPC_LINK_DOWN -6 SERVICE_NOT_READY -7 OPERATION_FAILED -17 "
                      "ACCESS_DENIED -19 SIM_CARD_ERROR -500 SIM_NOT_FOUND -501 "
                      "SIM_NOT_INITIALIZED -502 SIM_LOCKED -503 SIM_PERM_BLOCKED -504"},
        {"TAPI_SIM_ACCESS_",
         "CARD_ERROR 1 FILE_NOT_FOUND 2 ACCESS_CONDITION_NOT_SATISFIED 3 FAILED 4"},
        {"TELEPHONY_ERROR_", "OUT_OF_MEMORY -12 INVALID_PARAMETER -22 PERMISSION_DENIED -13 "
                             "NOT_SUPPORTED -1073741822 OPERATION_FAILED -39845887 "
                             "SIM_NOT_AVAILABLE -39841791"},
        {"WIFI_ERROR_",
         "INVALID_PARAMETER -22 OUT_OF_MEMORY -12 INVALID_OPERATION -38 "
         "OPERATION_FAILED -29687039 PERMISSION_DENIED -13 NOT_SUPPORTED -1073741822"},
    };
    using namespace port::devicefile;
    Lists errors;
#define FAULT(call, ...) [&](const auto&... lists) { (note(errors, lists), ...); }(__VA_ARGS__);
    PLATFORM_FAULTS(FAULT)
    EXPECT_EQ(platforms, errors);
    EXPECT_THAT((Numbers{TIZEN_ERROR_NONE, TELEPHONY_ERROR_NONE, SYSTEM_INFO_ERROR_NONE,
                         DLOG_ERROR_NONE, TAPI_API_SUCCESS, TAPI_SIM_ACCESS_SUCCESS}),
                testing::Each(0));
    EXPECT_EQ(0xFDA01001U, static_cast<unsigned>(TELEPHONY_ERROR_SIM_NOT_AVAILABLE));
}

TEST(ApiTest, NumbersAreThePlatforms)
{
    EXPECT_THAT(
        (Numbers{LOG_ID_MAIN, LOG_ID_MAX, DLOG_DEBUG, DLOG_INFO, DLOG_ERROR, DLOG_PRIO_MAX}),
        ElementsAre(0, 4, 3, 4, 6, 9));
    EXPECT_THAT(
        (Numbers{SYSTEM_SETTINGS_KEY_INCOMING_CALL_RINGTONE, SYSTEM_SETTINGS_KEY_FONT_SIZE,
                 SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED, SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE,
                 SYSTEM_SETTINGS_KEY_DEVICE_NAME, SYSTEM_SETTINGS_KEY_MAX}),
        ElementsAre(0, 3, 8, 13, 21, 29));
    EXPECT_THAT((Numbers{SYSTEM_SETTINGS_FONT_SIZE_SMALL, SYSTEM_SETTINGS_FONT_SIZE_NORMAL,
                         SYSTEM_SETTINGS_FONT_SIZE_LARGE, SYSTEM_SETTINGS_FONT_SIZE_HUGE,
                         SYSTEM_SETTINGS_FONT_SIZE_GIANT}),
                ElementsAre(0, 1, 2, 3, 4));
    EXPECT_THAT((Numbers{TELEPHONY_SIM_STATE_UNAVAILABLE, TELEPHONY_SIM_STATE_LOCKED,
                         TELEPHONY_SIM_STATE_AVAILABLE, TELEPHONY_SIM_STATE_UNKNOWN}),
                ElementsAre(0, 1, 2, 3));
    EXPECT_THAT((Numbers{TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,
                         TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE,
                         TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY}),
                ElementsAre(0, 1, 2));
    EXPECT_THAT(
        (Numbers{CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE, CONNECTION_CELLULAR_STATE_FLIGHT_MODE,
                 CONNECTION_CELLULAR_STATE_ROAMING_OFF,
                 CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE, CONNECTION_CELLULAR_STATE_AVAILABLE,
                 CONNECTION_CELLULAR_STATE_CONNECTED}),
        ElementsAre(0, 1, 2, 3, 4, 5));
    EXPECT_THAT((Numbers{CONNECTION_WIFI_STATE_DEACTIVATED, CONNECTION_WIFI_STATE_DISCONNECTED,
                         CONNECTION_WIFI_STATE_CONNECTED}),
                ElementsAre(0, 1, 2));
    EXPECT_THAT((Numbers{CONNECTION_BT_STATE_DEACTIVATED, CONNECTION_BT_STATE_DISCONNECTED,
                         CONNECTION_BT_STATE_CONNECTED}),
                ElementsAre(0, 1, 2));
    EXPECT_THAT((Numbers{WIFI_DEVICE_STATE_DEACTIVATED, WIFI_DEVICE_STATE_ACTIVATED}),
                ElementsAre(0, 1));
    EXPECT_THAT((Numbers{WIFI_CONNECTION_STATE_FAILURE, WIFI_CONNECTION_STATE_DISCONNECTED,
                         WIFI_CONNECTION_STATE_ASSOCIATION, WIFI_CONNECTION_STATE_CONFIGURATION,
                         WIFI_CONNECTION_STATE_CONNECTED}),
                ElementsAre(-1, 0, 1, 2, 3));
    EXPECT_THAT(
        (Numbers{RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, RUNTIME_INFO_KEY_WIFI_STATUS,
                 RUNTIME_INFO_KEY_PACKET_DATA_ENABLED, RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED,
                 RUNTIME_INFO_KEY_LANGUAGE, RUNTIME_INFO_KEY_AUTO_ROTATION_ENABLED}),
        ElementsAre(0, 1, 9, 10, 15, 26));
    EXPECT_THAT((Numbers{RUNTIME_INFO_WIFI_STATUS_DISABLED, RUNTIME_INFO_WIFI_STATUS_UNCONNECTED,
                         RUNTIME_INFO_WIFI_STATUS_CONNECTED}),
                ElementsAre(0, 1, 2));
}

TEST(ApiTest, StructuresAreThePlatforms)
{
    EXPECT_THAT((Numbers{offsetof(TelSimImsiInfo_t, szMcc), offsetof(TelSimImsiInfo_t, szMnc),
                         offsetof(TelSimImsiInfo_t, szMsin), sizeof(TelSimImsiInfo_t)}),
                ElementsAre(0, 4, 8, 19));
    using Sizes = package_size_info_t;
    EXPECT_THAT(
        (Numbers{offsetof(Sizes, data_size), offsetof(Sizes, cache_size), offsetof(Sizes, app_size),
                 offsetof(Sizes, ext_data_size), offsetof(Sizes, ext_cache_size),
                 offsetof(Sizes, ext_app_size), sizeof(Sizes)}),
        ElementsAre(0, 8, 16, 24, 32, 40, 48));
}

template <typename... Enumerations>
void expectIntSized()
{
    EXPECT_THAT((Numbers{sizeof(Enumerations)...}), testing::Each(sizeof(int)));
}

TEST(ApiTest, EnumerationsAreIntSized)
{
    expectIntSized<log_id_t, system_settings_key_e, telephony_sim_state_e,
                   telephony_network_service_state_e, connection_cellular_state_e,
                   connection_wifi_state_e, connection_bt_state_e, wifi_device_state_e,
                   wifi_connection_state_e, runtime_info_key_e>();
}

} // namespace
