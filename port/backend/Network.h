// SPDX-License-Identifier: Apache-2.0
// Radios and connections. Any thread.
#ifndef PORT_BACKEND_NETWORK_H
#define PORT_BACKEND_NETWORK_H

#include <functional>
#include <memory>

#include "Result.h"

namespace port {

enum class CellularState {
    OutOfService,
    FlightMode,
    RoamingOff,        // abroad, and data is not allowed there
    CallOnlyAvailable, // registered for calls, not for data
    Available,         // data can be had, and is not connected
    Connected,
};

// The state of a radio that carries connections, Wi-Fi or Bluetooth.
enum class LinkState { Deactivated, Disconnected, Connected };

// How far the network reaches: nowhere, to a page that asks for consent, not to the
// Internet, to all of it. Unknown is what a device file says; it is no answer.
enum class Connectivity { Unknown, None, Portal, Limited, Full };

enum class WifiConnection { Failure, Disconnected, Association, Configuration, Connected };

// Something that is watched for as long as this lives.
class Watch {
public:
    virtual ~Watch() = default;

    /// Has `settled` called as well, on the same thread: after `changed`, once no other change waits
    /// to be told. Each question that it asks is answered as things are now.
    virtual void tellSettled(std::function<void()> settled) = 0;
};

class Network {
public:
    virtual ~Network() = default;

    /// NotSupported: this device has no such radio; so for each of these.
    virtual Result<Sourced<CellularState>> cellular()
    {
        return notSupported("no cellular radio");
    }
    virtual Result<Sourced<LinkState>> wifi()
    {
        return notSupported("no Wi-Fi");
    }
    /// The finer state of the Wi-Fi connection.
    virtual Result<Sourced<WifiConnection>> wifiConnection()
    {
        return notSupported("no Wi-Fi");
    }
    /// Connections over Bluetooth.
    virtual Result<Sourced<LinkState>> bluetooth()
    {
        return notSupported("no Bluetooth");
    }

    // No call of the platform asks for what follows.
    virtual Result<Sourced<LinkState>> ethernet()
    {
        return notSupported("no Ethernet");
    }
    /// The name of the Wi-Fi network that is connected, UTF-8.
    virtual Result<Fact> ssid()
    {
        return notSupported("no Wi-Fi");
    }
    virtual Result<Sourced<Connectivity>> connectivity()
    {
        return notAvailable("connectivity is not known");
    }

    /// Calls `changed` whenever one of the answers, or a switch of the cellular network or of
    /// flight mode, may have changed, on a thread of the watch's own, one call at a time, until the
    /// watch is destroyed; destroying it waits for a call that runs. Null when changes cannot be
    /// watched.
    // NOLINTNEXTLINE(performance-unnecessary-value-param): whoever watches keeps it
    virtual std::unique_ptr<Watch> watch(std::function<void()>)
    {
        return nullptr;
    }
};

} // namespace port

#endif
