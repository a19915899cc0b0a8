// SPDX-License-Identifier: Apache-2.0
/// \file
/// The interface that an application implements to hear of connection changes.
#ifndef CORESYSTEM_I_CONNECTION_STATE_LISTENER_H
#define CORESYSTEM_I_CONNECTION_STATE_LISTENER_H

#include <wifi.h>

/// A listener for CoreSystem::SetConnectionEventListener().
///
/// Threads. The operations are called on the thread that the platform delivers its events on: the
/// one that runs the GLib main context that was thread-default at registration.
///
/// `userData` is what was given at registration, unchanged. The order of the operations is part of
/// every application's binary: new ones go behind the last.
class IConnectionStateListener {
public:
    /// Wi-Fi was switched on (`state` 1) or off (0), a `wifi_device_state_e`.
    virtual void OnWifiDeviceStateChanged(int state, void* userData) = 0;

    /// The Wi-Fi connection changed: `state` is a `wifi_connection_state_e`, from -1 failure and 0
    /// disconnected over the intermediate 1 association and 2 configuration to 3 connected. `ap` is
    /// the platform's access point, valid during the call.
    virtual void OnWifiConnectionStateChanged(int state, wifi_ap_h ap, void* userData) = 0;

    /// Flight mode was switched on or off.
    virtual void OnFlightModeChanged(bool enabled, void* userData) = 0;

    /// Data over the cellular network was switched on or off.
    virtual void OnPacketDataChanged(bool enabled, void* userData) = 0;

    /// Wi-Fi became connected, or not connected: disabled or without a connection.
    virtual void OnWifiStatusChanged(bool connected, void* userData) = 0;

    // Behind the operations, so that these keep their places.
    virtual ~IConnectionStateListener() {}
};

#endif
