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

// The answer for each type of slot: by default the first of its kind, as in service, or the first SIM.
template <class Value>
const Value ANSWER{};
template <>
const bool ANSWER<bool> = true;
template <>
const int ANSWER<int> = 1;
template <>
const telephony_sim_state_e ANSWER<telephony_sim_state_e> = TELEPHONY_SIM_STATE_AVAILABLE;
template <>
const connection_cellular_state_e ANSWER<connection_cellular_state_e> =
    CONNECTION_CELLULAR_STATE_CONNECTED;
template <>
const connection_wifi_state_e ANSWER<connection_wifi_state_e> = CONNECTION_WIFI_STATE_CONNECTED;
template <>
const connection_bt_state_e ANSWER<connection_bt_state_e> = CONNECTION_BT_STATE_CONNECTED;
template <>
const TelSimImsiInfo_t ANSWER<TelSimImsiInfo_t> = {"450", "08", "0123456789"};

template <class Value, class... Arguments>
int answer(Value* slot, const Arguments&... /*arguments*/)
{
    *slot = ANSWER<Value>;
    return 0;
}

template <class... Arguments>
int answer(char** slot, const Arguments&... /*arguments*/)
{
    *slot = strdup("ko_KR.UTF-8");
    return 0;
}

int answer(struct statvfs* slot)
{
    slot->f_bsize = slot->f_frsize = 4096;
    slot->f_blocks = 4000000;
    slot->f_bavail = 1000000;
    return 0;
}

template <class Handle>
int answerKept(char** slot, Handle /*handle*/)
{
    static char text[] = "+15551230001";
    *slot = text;
    return 0;
}

connection_h nameOf(connection_h connection)
{
    return connection;
}

} // namespace

extern "C" {

#define REPLY(name, parameters, ...) \
    int name parameters              \
    {                                \
        return answer(__VA_ARGS__);  \
    }
#define KEPT(name, parameters, ...)     \
    int name parameters                 \
    {                                   \
        return answerKept(__VA_ARGS__); \
    }
#include "support/platform_replies.def"

int __dlog_print(log_id_t, int, const char*, const char*, ...)
{
    return 0;
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
    *connection = &modem;
    return 0;
}

int connection_destroy(connection_h)
{
    return 0;
}

char* vconf_get_str(const char*)
{
    return strdup("KTC");
}

int package_info_create(const char*, package_info_h* info)
{
    *info = &package;
    return 0;
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
    *list = {2, handles};
    return 0;
}

int telephony_deinit(telephony_handle_list_s*)
{
    return 0;
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

int tel_get_sim_init_info(TapiHandle*, TelSimCardStatus_t* status, int* card_changed)
{
    *status = TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
    *card_changed = 0;
    return 0;
}

} // extern "C"
