// SPDX-License-Identifier: Apache-2.0
// The platform at its cheapest, in place of the real one: every call answers at once and the same.
// Two slots with a card each; no text is longer than a device's.
#include <cstdlib>
#include <cstring>

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <app_alarm.h>
#include <dlog.h>
#include <net_connection.h>
#include <package_manager.h>
#include <runtime_info.h>
#include <storage.h>
#include <system_info.h>
#include <system_settings.h>
#include <telephony.h>
#include <vconf.h>
#include <wifi.h>

struct telephony_data {};
struct tapi_handle {};
struct package_info_s {};

namespace {

telephony_data slots[2];
telephony_h handles[2] = {&slots[0], &slots[1]};
tapi_handle modem;
char firstName[] = "modem0";
char secondName[] = "modem1";
char* names[] = {firstName, secondName, nullptr};
package_info_s package;

template <class Value>
int answer(Value* slot, Value value)
{
    *slot = value;
    return 0;
}

int answerText(char** slot, const char* text)
{
    return answer(slot, strdup(text));
}

} // namespace

extern "C" {

int __dlog_print(log_id_t, int, const char*, const char*, ...)
{
    return 0;
}

int system_info_get_platform_string(const char*, char** value)
{
    return answerText(value, "Dual Phone");
}

int system_settings_get_value_string(system_settings_key_e, char** value)
{
    return answerText(value, "ko_KR.UTF-8");
}

int system_settings_get_value_bool(system_settings_key_e, bool* value)
{
    return answer(value, true);
}

int system_settings_get_value_int(system_settings_key_e, int* value)
{
    return answer(value, 1);
}

int runtime_info_get_value_bool(runtime_info_key_e, bool* value)
{
    return answer(value, true);
}

int runtime_info_get_value_int(runtime_info_key_e, int* value)
{
    return answer(value, 2);
}

int runtime_info_set_changed_cb(runtime_info_key_e, runtime_info_changed_cb, void*)
{
    return 0;
}

int runtime_info_unset_changed_cb(runtime_info_key_e)
{
    return 0;
}

int wifi_initialize(void)
{
    return 0;
}

int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb, void*)
{
    return 0;
}

int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb, void*)
{
    return 0;
}

int wifi_unset_device_state_changed_cb(void)
{
    return 0;
}

int wifi_unset_connection_state_changed_cb(void)
{
    return 0;
}

int connection_create(connection_h* connection)
{
    return answer(connection, static_cast<connection_h>(&modem));
}

int connection_destroy(connection_h)
{
    return 0;
}

int connection_get_cellular_state(connection_h, connection_cellular_state_e* state)
{
    return answer(state, CONNECTION_CELLULAR_STATE_CONNECTED);
}

int connection_get_wifi_state(connection_h, connection_wifi_state_e* state)
{
    return answer(state, CONNECTION_WIFI_STATE_CONNECTED);
}

int connection_get_bt_state(connection_h, connection_bt_state_e* state)
{
    return answer(state, CONNECTION_BT_STATE_CONNECTED);
}

char* vconf_get_str(const char*)
{
    return strdup("KTC");
}

int alarm_get_current_time(struct tm* date)
{
    return answer(date, tm{});
}

int storage_get_internal_memory_size(struct statvfs* buf)
{
    buf->f_bsize = buf->f_frsize = 4096;
    buf->f_blocks = 4000000;
    buf->f_bavail = 1000000;
    return 0;
}

int package_info_create(const char*, package_info_h* info)
{
    return answer(info, &package);
}

int package_info_get_version(package_info_h, char** version)
{
    static char text[] = "1.2.3"; // the library never releases it
    return answer(version, static_cast<char*>(text));
}

int package_info_destroy(package_info_h)
{
    return 0;
}

int package_manager_get_package_size_info(const char*, package_manager_size_info_receive_cb, void*)
{
    return 0;
}

int telephony_init(telephony_handle_list_s* list)
{
    return answer(list, telephony_handle_list_s{2, handles});
}

int telephony_deinit(telephony_handle_list_s*)
{
    return 0;
}

int telephony_sim_get_state(telephony_h, telephony_sim_state_e* state)
{
    return answer(state, TELEPHONY_SIM_STATE_AVAILABLE);
}

int telephony_sim_get_subscriber_number(telephony_h, char** number)
{
    static char text[] = "+15551230001"; // the library never releases it
    return answer(number, static_cast<char*>(text));
}

int telephony_modem_get_imei(telephony_h, char** imei)
{
    return answerText(imei, "490154203237518");
}

int telephony_network_get_service_state(telephony_h, telephony_network_service_state_e* state)
{
    return answer(state, TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE);
}

int telephony_network_get_roaming_status(telephony_h, bool* roaming)
{
    return answer(roaming, true);
}

char** tel_get_cp_name_list(void)
{
    return names;
}

TapiHandle* tel_init(const char*)
{
    return &modem;
}

int tel_deinit(TapiHandle*)
{
    return 0;
}

int tel_get_sim_imsi(TapiHandle*, TelSimImsiInfo_t* imsi)
{
    return answer(imsi, TelSimImsiInfo_t{"450", "08", "0123456789"});
}

int tel_get_sim_init_info(TapiHandle*, TelSimCardStatus_t* status, int* card_changed)
{
    return answer(status, TAPI_SIM_STATUS_SIM_INIT_COMPLETED) + answer(card_changed, 0);
}

int tel_get_network_default_subscription(TapiHandle*, TelNetworkDefaultSubs_t* subs)
{
    return answer(subs, TAPI_NETWORK_DEFAULT_SUBS_SIM1);
}

int tel_get_network_default_data_subscription(TapiHandle*, TelNetworkDefaultDataSubs_t* subs)
{
    return answer(subs, TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1);
}

int tel_get_call_preferred_voice_subscription(TapiHandle*, TelCallPreferredVoiceSubs_t* subs)
{
    return answer(subs, TAPI_CALL_PREFERRED_VOICE_SUBS_SIM1);
}

int tel_check_sms_device_status(TapiHandle*, int* ready)
{
    return answer(ready, 1);
}

} // extern "C"
