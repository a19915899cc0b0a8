// SPDX-License-Identifier: Apache-2.0
#include "ConnectionManager.h"

#include <atomic>

#include <net_connection.h>
#include <runtime_info.h>
#include <wifi.h>

#include "Log.h"
#include "PlatformEnum.h"
#include "Singleton.h"

using namespace coresystem;

namespace {

const char* const CELLULAR_STATES[] = {
    "CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE", "CONNECTION_CELLULAR_STATE_FLIGHT_MODE",
    "CONNECTION_CELLULAR_STATE_ROAMING_OFF",    "CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE",
    "CONNECTION_CELLULAR_STATE_AVAILABLE",      "CONNECTION_CELLULAR_STATE_CONNECTED"};
const char* const WIFI_STATES[] = {"CONNECTION_WIFI_STATE_DEACTIVATED",
                                   "CONNECTION_WIFI_STATE_DISCONNECTED",
                                   "CONNECTION_WIFI_STATE_CONNECTED"};
const char* const BT_STATES[] = {"CONNECTION_BT_STATE_DEACTIVATED",
                                 "CONNECTION_BT_STATE_DISCONNECTED",
                                 "CONNECTION_BT_STATE_CONNECTED"};

// Reads one state through a handle of its own. No result code counts: frozen 30, a failed read
// leaves the state at 0.
template <class State, int count>
int readState(int (*read)(connection_h, State*), const char* const (&names)[count],
              const LogSite& site)
{
    State state = static_cast<State>(0);
    connection_h handle = nullptr;
    connection_create(&handle);
    read(handle, &state);
    const int number = numberOf(state);
    if (number >= 0 && number < count)
        DEBUG_LINE_AT(site, "%s : %s", site.functionName, names[number]);
    connection_destroy(handle);
    return number;
}

// Set by one thread, read by the platform's: a plain load and store, nothing waits for it.
std::atomic<IConnectionStateListener*> listenerOfProcess(nullptr);

IConnectionStateListener* currentListener()
{
    return listenerOfProcess.load(std::memory_order_relaxed);
}

// The callbacks are named as their lines say.

void wifi_device_state_changed(wifi_device_state_e state, void* userData)
{
    const int number = numberOf(state);
    DEBUG_LINE("wifi_device_state_changed");
    if (number == WIFI_DEVICE_STATE_ACTIVATED)
        DEBUG_LINE("wifi activated");
    else if (number == WIFI_DEVICE_STATE_DEACTIVATED)
        DEBUG_LINE("wifi deactivated");
    IConnectionStateListener* const listener = currentListener();
    if (listener != nullptr)
        listener->OnWifiDeviceStateChanged(number, userData);
}

void wifi_connection_state_changed(wifi_connection_state_e state, wifi_ap_h ap, void* userData)
{
    const int number = numberOf(state);
    DEBUG_LINE("wifi_connection_state_changed");
    if (number == WIFI_CONNECTION_STATE_CONNECTED)
        DEBUG_LINE("wifi connected");
    else if (number == WIFI_CONNECTION_STATE_DISCONNECTED)
        DEBUG_LINE("wifi disconnected");
    IConnectionStateListener* const listener = currentListener();
    if (listener != nullptr)
        listener->OnWifiConnectionStateChanged(number, ap, userData);
}

// Read once and tested: while it is unset the pointer is null before the registration is gone.
void tell(void (IConnectionStateListener::*operation)(bool, void*), bool value, void* userData)
{
    IConnectionStateListener* const listener = currentListener();
    if (listener != nullptr)
        (listener->*operation)(value, userData);
}

// Tells the listener a switch that is read again; nothing when it cannot be read.
void tellSwitch(runtime_info_key_e key, void (IConnectionStateListener::*operation)(bool, void*),
                void* userData)
{
    bool isOn = false;
    if (runtime_info_get_value_bool(key, &isOn) == RUNTIME_INFO_ERROR_NONE)
        tell(operation, isOn, userData);
}

void tellWifiStatus(void* userData)
{
    int status = RUNTIME_INFO_WIFI_STATUS_DISABLED;
    if (runtime_info_get_value_int(RUNTIME_INFO_KEY_WIFI_STATUS, &status) ==
        RUNTIME_INFO_ERROR_NONE)
        tell(&IConnectionStateListener::OnWifiStatusChanged,
             status == RUNTIME_INFO_WIFI_STATUS_CONNECTED, userData);
}

// The read comes first, with and without a listener: the platform sees the same calls.
void OnConnectionStateChanged(runtime_info_key_e key, void* userData)
{
    DEBUG_LINE("OnConnectionStateChanged");
    switch (numberOf(key)) {
    case RUNTIME_INFO_KEY_PACKET_DATA_ENABLED:
        tellSwitch(RUNTIME_INFO_KEY_PACKET_DATA_ENABLED,
                   &IConnectionStateListener::OnPacketDataChanged, userData);
        break;
    case RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED:
        tellSwitch(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED,
                   &IConnectionStateListener::OnFlightModeChanged, userData);
        break;
    case RUNTIME_INFO_KEY_WIFI_STATUS:
        tellWifiStatus(userData);
        break;
    default:
        break;
    }
}

// In the order of registration.
const runtime_info_key_e WATCHED_KEYS[] = {RUNTIME_INFO_KEY_WIFI_STATUS,
                                           RUNTIME_INFO_KEY_PACKET_DATA_ENABLED,
                                           RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED};

} // namespace

CORESYSTEM_DEFINE_GET_INSTANCE(ConnectionManager);

ConnectionManager::ConnectionManager()
{
    DEBUG_LINE("ConnectionManager()");
}

ConnectionManager::~ConnectionManager() {}

int ConnectionManager::GetCellularNetworkState()
{
    return readState(&connection_get_cellular_state, CELLULAR_STATES, LOG_SITE);
}

int ConnectionManager::GetWifiNetworkState()
{
    return readState(&connection_get_wifi_state, WIFI_STATES, LOG_SITE);
}

int ConnectionManager::GetBTNetworkState()
{
    return readState(&connection_get_bt_state, BT_STATES, LOG_SITE);
}

bool ConnectionManager::IsNetworkConnected(bool checkWifi, bool checkBT)
{
    DEBUG_LINE("IsNetworkConnected : CHECK [Cellular]%s%s", checkWifi ? "[WIFI]" : "",
               checkBT ? "[BT]" : "");
    // Every network that counts is queried, also when one is known to be connected: frozen 31.
    bool isConnected = GetCellularNetworkState() == CONNECTION_CELLULAR_STATE_CONNECTED;
    if (checkWifi && GetWifiNetworkState() == CONNECTION_WIFI_STATE_CONNECTED)
        isConnected = true;
    if (checkBT && GetBTNetworkState() == CONNECTION_BT_STATE_CONNECTED)
        isConnected = true;
    return isConnected;
}

void ConnectionManager::SetConnectionEventListener(IConnectionStateListener* listener,
                                                   void* userData)
{
    listenerOfProcess.store(listener, std::memory_order_relaxed);
    wifi_initialize(); // every time, and never undone: frozen 32
    if (listener == nullptr) {
        wifi_unset_device_state_changed_cb();
        wifi_unset_connection_state_changed_cb();
        for (const runtime_info_key_e key : WATCHED_KEYS)
            runtime_info_unset_changed_cb(key);
        NOTICE_LINE("Unset Connection Change Callback");
    } else {
        wifi_set_device_state_changed_cb(&wifi_device_state_changed, userData);
        wifi_set_connection_state_changed_cb(&wifi_connection_state_changed, userData);
        for (const runtime_info_key_e key : WATCHED_KEYS)
            runtime_info_set_changed_cb(key, &OnConnectionStateChanged, userData);
        NOTICE_LINE("Set Connection Change Callback");
    }
}
