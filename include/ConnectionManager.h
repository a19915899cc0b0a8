// SPDX-License-Identifier: Apache-2.0
// Internal: the singleton that answers connectivity questions. Never installed.
#ifndef CORESYSTEM_CONNECTION_MANAGER_H
#define CORESYSTEM_CONNECTION_MANAGER_H

#include "IConnectionStateListener.h"

/// Connectivity questions, reached through GetInstance() on every call.
///
/// The queries ask the platform through a connection handle of their own at every call; they keep
/// nothing, take no lock and may run on any thread.
class ConnectionManager {
public:
    /// The one instance, made by the first call; null if allocation failed. Any thread.
    static ConnectionManager* GetInstance();

    /// A `connection_cellular_state_e` as the platform gives it; 0, out of service, when it cannot
    /// be read.
    int GetCellularNetworkState();
    /// A `connection_wifi_state_e`; 0, deactivated, when it cannot be read.
    int GetWifiNetworkState();
    /// A `connection_bt_state_e`; 0, deactivated, when it cannot be read.
    int GetBTNetworkState();

    /// True when cellular data, or a network that is to be checked, is connected. Each is queried
    /// whatever the others answer.
    bool IsNetworkConnected(bool checkWifi, bool checkBT);

    /// Sets the one listener of the process and registers with the platform, or unregisters when
    /// `listener` is null. The listener stays the caller's, who keeps it alive until another null
    /// is set and no event is under way.
    void SetConnectionEventListener(IConnectionStateListener* listener, void* userData);

private:
    friend struct CoreSystemInternals;

    ConnectionManager();
    virtual ~ConnectionManager();
    ConnectionManager(const ConnectionManager&) = delete;
    ConnectionManager& operator=(const ConnectionManager&) = delete;

    static ConnectionManager* instance_;
};

#endif
