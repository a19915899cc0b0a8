// SPDX-License-Identifier: Apache-2.0
#include <wifi.h>

#include <atomic>
#include <utility>

#include "../events/ChangeEvents.h"
#include "Call.h"

namespace {

using port::Change;
using port::ChangeEvents;
using port::WifiConnection;

constexpr port::Codes CODES{WIFI_ERROR_OPERATION_FAILED, WIFI_ERROR_NOT_SUPPORTED};

constexpr wifi_connection_state_e stateOf(int connection)
{
    return static_cast<wifi_connection_state_e>(connection + WIFI_CONNECTION_STATE_FAILURE);
}
static_assert(stateOf(static_cast<int>(WifiConnection::Failure)) == WIFI_CONNECTION_STATE_FAILURE &&
                  stateOf(static_cast<int>(WifiConnection::Connected)) ==
                      WIFI_CONNECTION_STATE_CONNECTED,
              "both count the states alike, from another start");

// The result of an operation: 0 once the interface is on, otherwise the reason why it is not.
std::atomic<int> readiness{WIFI_ERROR_INVALID_OPERATION};

// A radio that cannot be asked now may answer later; a device without one never does.
bool hasWifi()
{
    const auto state = port::backend().network().wifi();
    return state || state.error().kind != port::Error::Kind::NotSupported;
}

int set(const char* name, Change change, bool hasCallback, ChangeEvents::Callback callback)
{
    return port::Call(name, CODES).run([&]() -> int {
        if (readiness != WIFI_ERROR_NONE)
            return readiness;
        if (!hasCallback)
            return WIFI_ERROR_INVALID_PARAMETER;
        return port::changeEvents().set(change, std::move(callback)) ? WIFI_ERROR_NONE
                                                                     : WIFI_ERROR_OPERATION_FAILED;
    });
}

int unset(const char* name, Change change)
{
    return port::Call(name, CODES).release([change]() -> int {
        if (readiness == WIFI_ERROR_NONE)
            port::changeEvents().unset(change);
        return readiness;
    });
}

} // namespace

int wifi_initialize(void)
{
    return port::Call(__func__, CODES).run([]() -> int {
        const int next = hasWifi() ? WIFI_ERROR_NONE : WIFI_ERROR_NOT_SUPPORTED;
        int expected = readiness;
        while (expected != WIFI_ERROR_NONE)
            if (readiness.compare_exchange_weak(expected, next))
                return next;
        return WIFI_ERROR_INVALID_OPERATION;
    });
}

int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data)
{
    return set(__func__, Change::WifiDevice, callback != nullptr,
               [=](int state) { callback(static_cast<wifi_device_state_e>(state), user_data); });
}

int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback, void* user_data)
{
    return set(__func__, Change::WifiConnection, callback != nullptr,
               [=](int state) { callback(stateOf(state), nullptr, user_data); });
}

int wifi_unset_device_state_changed_cb(void)
{
    return unset(__func__, Change::WifiDevice);
}

int wifi_unset_connection_state_changed_cb(void)
{
    return unset(__func__, Change::WifiConnection);
}
