// SPDX-License-Identifier: Apache-2.0
#include <wifi.h>

#include <atomic>
#include <utility>

#include "../backend/Backend.h"
#include "../events/ChangeEvents.h"
#include "Refusal.h"

namespace {

using port::Change;
using port::ChangeEvents;
using port::WifiConnection;

constexpr wifi_connection_state_e stateOf(int connection)
{
    return static_cast<wifi_connection_state_e>(connection + WIFI_CONNECTION_STATE_FAILURE);
}
static_assert(stateOf(static_cast<int>(WifiConnection::Failure)) == WIFI_CONNECTION_STATE_FAILURE &&
                  stateOf(static_cast<int>(WifiConnection::Connected)) ==
                      WIFI_CONNECTION_STATE_CONNECTED,
              "both count the states alike, from another start");

// What an operation answers: 0 once the interface is on, else why it is not.
std::atomic<int> readiness{WIFI_ERROR_INVALID_OPERATION};

// A radio that cannot be asked now may answer later; a device without one never does.
bool hasWifi()
{
    const auto state = port::backend().network().wifi();
    return state || state.error().kind != port::Error::Kind::NotSupported;
}

int set(Change change, bool hasCallback, ChangeEvents::Callback callback)
{
    if (readiness != WIFI_ERROR_NONE)
        return readiness;
    if (!hasCallback)
        return WIFI_ERROR_INVALID_PARAMETER;
    return port::changeEvents().set(change, std::move(callback)) ? WIFI_ERROR_NONE
                                                                 : WIFI_ERROR_OPERATION_FAILED;
}

int unset(Change change)
{
    return port::guarded(
        [change]() -> int {
            if (readiness == WIFI_ERROR_NONE)
                port::changeEvents().unset(change);
            return readiness;
        },
        WIFI_ERROR_OPERATION_FAILED);
}

} // namespace

int wifi_initialize(void)
{
    if (const port::Refusal refusal{__func__})
        return refusal.code();
    return port::guarded(
        []() -> int {
            const int next = hasWifi() ? WIFI_ERROR_NONE : WIFI_ERROR_NOT_SUPPORTED;
            int expected = readiness;
            while (expected != WIFI_ERROR_NONE)
                if (readiness.compare_exchange_weak(expected, next))
                    return next;
            return WIFI_ERROR_INVALID_OPERATION;
        },
        WIFI_ERROR_OPERATION_FAILED);
}

int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data)
{
    if (const port::Refusal refusal{__func__})
        return refusal.code();
    return port::guarded(
        [=] {
            return set(Change::WifiDevice, callback != nullptr, [=](int state) {
                callback(static_cast<wifi_device_state_e>(state), user_data);
            });
        },
        WIFI_ERROR_OPERATION_FAILED);
}

int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback, void* user_data)
{
    if (const port::Refusal refusal{__func__})
        return refusal.code();
    return port::guarded(
        [=] {
            return set(Change::WifiConnection, callback != nullptr,
                       [=](int state) { callback(stateOf(state), nullptr, user_data); });
        },
        WIFI_ERROR_OPERATION_FAILED);
}

int wifi_unset_device_state_changed_cb(void)
{
    const port::Refusal refusal{__func__};
    return refusal.after(unset(Change::WifiDevice));
}

int wifi_unset_connection_state_changed_cb(void)
{
    const port::Refusal refusal{__func__};
    return refusal.after(unset(Change::WifiConnection));
}
