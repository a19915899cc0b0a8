// SPDX-License-Identifier: Apache-2.0
// NetworkManager's state: switches of radios, devices, connections.
#ifndef PORT_LINUX_NETWORK_MANAGER_H
#define PORT_LINUX_NETWORK_MANAGER_H

#include <initializer_list>
#include <optional>
#include <string>
#include <vector>

#include <nm-dbus-interface.h>

#include "Bus.h"
#include "Properties.h"

namespace port::linux_backend {

constexpr BusObject NETWORK_MANAGER = {NM_DBUS_SERVICE, NM_DBUS_PATH, NM_DBUS_INTERFACE,
                                       Start::Never};

constexpr Names NETWORK_INTERFACES = {NM_DBUS_INTERFACE,
                                      NM_DBUS_INTERFACE_DEVICE,
                                      NM_DBUS_INTERFACE_ACTIVE_CONNECTION,
                                      NM_DBUS_INTERFACE_SETTINGS_CONNECTION,
                                      NM_DBUS_INTERFACE_DEVICE_WIRELESS,
                                      NM_DBUS_INTERFACE_ACCESS_POINT};
// Properties that change all the time on a radio and decide nothing.
constexpr Names NETWORK_NOISE = {"AccessPoints", "Bitrate", "LastScan", "LastSeen", "Strength"};
// The object manager stands above the service's main object.
constexpr ObjectService NETWORKS = {NETWORK_MANAGER,
                                    "/org/freedesktop",
                                    "WirelessEnabled",
                                    NETWORK_INTERFACES,
                                    NM_DBUS_INTERFACE_SETTINGS_CONNECTION,
                                    "Updated",
                                    NM_DBUS_INTERFACE_DEVICE,
                                    NETWORK_NOISE};

enum class Radio { Wifi, Cellular };

// A device that NetworkManager knows; a number, since a service may say what its enumeration lacks.
struct NetworkDevice {
    std::uint32_t state;   // NMDeviceState
    std::string interface; // empty when it has none
};

// A connection of type gsm or cdma as the user set it up.
struct CellularConnection {
    bool isActive = false;
    bool connectsItself = true;
    std::int32_t priority = 0;
    bool isHomeOnly = false;
};

// NetworkManager as it was when it told of itself.
class NetworkView {
public:
    /// From the objects of NETWORKS.
    static Result<NetworkView> from(const Result<Objects>& objects);

    /// Whether networking as a whole is switched on.
    Result<bool> isOn() const;
    /// Whether the user's switch of a radio is on; it is there also when the radio is not.
    Result<bool> isSwitchedOn(Radio radio) const;
    /// The same and the switch on the case, where there is one.
    Result<bool> isOn(Radio radio) const;
    Result<bool> isThere(Radio radio) const;
    /// All devices of one of these types.
    Result<std::vector<NetworkDevice>> devicesOf(std::initializer_list<NMDeviceType> types) const;
    Result<std::uint32_t> connectivity() const; // NMConnectivityState
    /// The name of the network of the first Wi-Fi device that is connected.
    Result<Fact> ssid() const;
    /// Whether a cellular connection is up, or coming up.
    bool hasActiveCellularConnection() const;

    /// Those whose settings may be read.
    Result<std::vector<CellularConnection>> cellularConnections() const;

    /// The ModemManager object of the modem over which this machine's traffic goes; nothing when it
    /// goes elsewhere.
    std::optional<std::string> primaryModem() const;

private:
    explicit NetworkView(Objects objects) : objects_(std::move(objects)) {}

    Result<Properties> manager() const;
    Result<bool> managerFlag(const char* name) const;
    Result<Properties> at(const std::string& path, const char* interface) const;
    bool isActive(const std::string& connection) const;
    Result<std::string> nameOf(const std::string& accessPoint) const;
    std::optional<std::string> deviceBelow(const Properties& connection) const;

    Objects objects_;
};

} // namespace port::linux_backend

#endif
