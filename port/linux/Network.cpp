// SPDX-License-Identifier: Apache-2.0
#include "Network.h"

#include <algorithm>
#include <tuple>

#include "BlueZ.h"

namespace port::linux_backend {
namespace {

LinkState linkStateOf(std::uint32_t deviceState)
{
    if (deviceState == NM_DEVICE_STATE_ACTIVATED)
        return LinkState::Connected;
    return deviceState > NM_DEVICE_STATE_UNAVAILABLE ? LinkState::Disconnected
                                                     : LinkState::Deactivated;
}

WifiConnection wifiConnectionOf(std::uint32_t deviceState)
{
    switch (deviceState) {
    case NM_DEVICE_STATE_PREPARE:
    case NM_DEVICE_STATE_CONFIG:
    case NM_DEVICE_STATE_NEED_AUTH:
        return WifiConnection::Association;
    case NM_DEVICE_STATE_IP_CONFIG:
    case NM_DEVICE_STATE_IP_CHECK:
    case NM_DEVICE_STATE_SECONDARIES:
        return WifiConnection::Configuration;
    case NM_DEVICE_STATE_ACTIVATED:
        return WifiConnection::Connected;
    case NM_DEVICE_STATE_FAILED:
        return WifiConnection::Failure;
    default:
        return WifiConnection::Disconnected;
    }
}

bool isManaged(std::uint32_t deviceState)
{
    return deviceState > NM_DEVICE_STATE_UNMANAGED;
}

// The state of the Wi-Fi device that is furthest.
template <typename T>
Result<T> wifiIn(const Result<NetworkView>& now, T off, T (*stateOf)(std::uint32_t deviceState))
{
    if (!now)
        return now.error();
    const NetworkView& view = now.value();
    const auto isThere = view.isThere(Radio::Wifi);
    const auto devices = view.statesOf(NM_DEVICE_TYPE_WIFI);
    const auto isOn = view.isOn(Radio::Wifi);
    const auto networking = view.isOn();
    if (!isThere || !isThere.value())
        return isThere ? notSupported("NetworkManager knows no Wi-Fi device") : isThere.error();
    if (!devices || !isOn || !networking)
        return devices ? isOn ? networking.error() : isOn.error() : devices.error();
    if (!isOn.value() || !networking.value() || devices.value().empty())
        return off;
    std::vector<T> states;
    for (const std::uint32_t device : devices.value())
        if (isManaged(device))
            states.push_back(stateOf(device));
    if (states.empty())
        return notAvailable("NetworkManager leaves the Wi-Fi device to others");
    return *std::max_element(states.begin(), states.end());
}

template <typename T>
Result<Sourced<T>> from(const BusObject& service, const Result<T>& answer)
{
    if (!answer)
        return answer.error();
    return Sourced<T>{answer.value(), service.name};
}

// NetworkManager's answer, or the kernel's when it has none.
template <typename T>
Result<Sourced<T>> orKernel(const Result<T>& answer, const KernelNetwork& kernel,
                            Result<Sourced<T>> (KernelNetwork::*read)() const)
{
    if (answer || answer.error().kind != Error::Kind::NotAvailable)
        return from(NETWORK_MANAGER, answer);
    return orElse(answer.error(), (kernel.*read)());
}

// Every radio that is there counts; where none is, the switches count that the user sees all the
// same.
Result<bool> areRadiosSwitchedOff(const NetworkView& view)
{
    const auto isWifiThere = view.isThere(Radio::Wifi);
    const auto isCellularThere = view.isThere(Radio::Cellular);
    const auto isWifiOn = view.isSwitchedOn(Radio::Wifi);
    const auto isCellularOn = view.isSwitchedOn(Radio::Cellular);
    for (const auto* const answer : {&isWifiThere, &isCellularThere, &isWifiOn, &isCellularOn})
        if (!*answer)
            return answer->error();
    if (isWifiThere.value() == isCellularThere.value())
        return !isWifiOn.value() && !isCellularOn.value();
    return isWifiThere.value() ? !isWifiOn.value() : !isCellularOn.value();
}

bool hasActivated(const Result<std::vector<std::uint32_t>>& deviceStates)
{
    return deviceStates && std::count(deviceStates.value().begin(), deviceStates.value().end(),
                                      NM_DEVICE_STATE_ACTIVATED) != 0;
}

bool isAbroad(const Modem& modem)
{
    const auto state = modem.registration();
    const auto registration = state ? findRegistration(state.value()) : std::nullopt;
    return registration ? registration->roaming : modem.isCdmaRoaming();
}

// Registered for messages or calls, and not for data.
bool hasNoData(const Modem& modem)
{
    const auto registration = modem.registration();
    const auto packets = modem.packetService();
    return (registration &&
            (registration.value() == MM_MODEM_3GPP_REGISTRATION_STATE_HOME_SMS_ONLY ||
             registration.value() == MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING_SMS_ONLY)) ||
           (packets && packets.value() == MM_MODEM_3GPP_PACKET_SERVICE_STATE_DETACHED);
}

// RoamingOff stands for "abroad"; whether data is allowed there is asked only when that matters.
Result<CellularState> cellularStateOf(const Modem& modem)
{
    const auto state = modem.state();
    if (!state)
        return notAvailable(std::string(MODEM_MANAGER.name) + ": " + state.error().reason);
    if (state.value() < MM_MODEM_STATE_REGISTERED)
        return CellularState::OutOfService;
    if (state.value() == MM_MODEM_STATE_CONNECTED)
        return CellularState::Connected;
    if (hasNoData(modem))
        return CellularState::CallOnlyAvailable;
    return isAbroad(modem) ? CellularState::RoamingOff : CellularState::Available;
}

// Of the modem that is furthest; a modem that cannot be read counts only when no other can.
Result<CellularState> furthestOf(const std::vector<Modem>& modems)
{
    std::optional<Result<CellularState>> furthest;
    for (const Modem& modem : modems) {
        const auto state = cellularStateOf(modem);
        if (!furthest || !*furthest || (state && state.value() > furthest->value()))
            furthest = state;
    }
    return furthest ? *furthest : notSupported("ModemManager knows no modem");
}

// The connection that is up, else the one that would come up by itself first.
auto rankOf(const CellularConnection& connection)
{
    return std::make_tuple(connection.isActive, connection.connectsItself, connection.priority);
}

Result<bool> isRoamingAllowed(const NetworkView& view)
{
    const auto connections = view.cellularConnections();
    if (!connections)
        return connections.error();
    const auto used =
        std::max_element(connections.value().begin(), connections.value().end(),
                         [](const auto& a, const auto& b) { return rankOf(a) < rankOf(b); });
    if (used == connections.value().end())
        return notAvailable("NetworkManager has no cellular connection");
    return !used->isHomeOnly;
}

Result<bool> isPacketDataOn(const NetworkView& view)
{
    const auto isOn = view.isOn(Radio::Cellular);
    if (!isOn || !isOn.value())
        return isOn;
    if (view.hasActiveCellularConnection())
        return true;
    const auto connections = view.cellularConnections();
    if (!connections)
        return connections.error();
    return std::any_of(connections.value().begin(), connections.value().end(),
                       [](const auto& connection) { return connection.connectsItself; });
}

} // namespace

Result<NetworkView> LinuxNetwork::view()
{
    return NetworkView::from(bus_.look({NETWORKS, nullptr}));
}

Result<Sourced<LinkState>> LinuxNetwork::wifi()
{
    return orKernel(wifiIn(view(), LinkState::Deactivated, &linkStateOf), kernel_,
                    &KernelNetwork::wifi);
}

Result<Sourced<WifiConnection>> LinuxNetwork::wifiConnection()
{
    return orKernel(wifiIn(view(), WifiConnection::Disconnected, &wifiConnectionOf), kernel_,
                    &KernelNetwork::wifiConnection);
}

Result<Sourced<LinkState>> LinuxNetwork::bluetooth()
{
    const auto replies = bus_.look({adapters(), {NETWORKS, nullptr}});
    if (!replies[0] && !kernel_.hasBluetoothAdapter())
        return notSupported(replies[0].error().reason + "; no Bluetooth adapter in /sys/class");
    const auto adapters = adaptersIn(replies[0]);
    if (!adapters)
        return adapters.error();
    if (adapters.value().empty())
        return notSupported("BlueZ knows no Bluetooth adapter");
    if (std::count(adapters.value().begin(), adapters.value().end(), true) == 0)
        return Sourced<LinkState>{LinkState::Deactivated, BLUEZ.name};
    const auto view = NetworkView::from(replies[1]);
    const bool isConnected = view ? hasActivated(view.value().statesOf(NM_DEVICE_TYPE_BT))
                                  : kernel_.isConnectedOverBluetooth();
    return Sourced<LinkState>{isConnected ? LinkState::Connected : LinkState::Disconnected,
                              BLUEZ.name};
}

Result<Sourced<bool>> LinuxNetwork::flightModeIn(const Result<NetworkView>& view) const
{
    const auto off = view ? areRadiosSwitchedOff(view.value()) : Result<bool>(view.error());
    return orKernel(off, kernel_, &KernelNetwork::areRadiosSwitchedOff);
}

Result<Sourced<bool>> LinuxNetwork::flightMode()
{
    return flightModeIn(view());
}

// A setting of the cellular radio, for a machine that has one.
Result<Sourced<bool>> LinuxNetwork::cellularSetting(Result<bool> (*read)(const NetworkView&))
{
    const auto now = view();
    if (!now)
        return now.error();
    const auto isThere = now.value().isThere(Radio::Cellular);
    if (!isThere || !isThere.value())
        return isThere ? notSupported("NetworkManager knows no modem") : isThere.error();
    return from(NETWORK_MANAGER, read(now.value()));
}

Result<Sourced<bool>> LinuxNetwork::packetData()
{
    return cellularSetting(&isPacketDataOn);
}

// The platform keeps the setting and its effect apart; NetworkManager keeps one of them.
Result<Sourced<bool>> LinuxNetwork::mobileData()
{
    return packetData();
}

Result<Sourced<bool>> LinuxNetwork::dataRoaming()
{
    return cellularSetting(&isRoamingAllowed);
}

Result<CellularState> LinuxNetwork::cellularIn(const std::vector<Modem>& modems,
                                               const Result<NetworkView>& view) const
{
    const auto state = furthestOf(modems);
    if (!state || state.value() == CellularState::Connected)
        return state;
    if (view && hasActivated(view.value().statesOf(NM_DEVICE_TYPE_MODEM)))
        return CellularState::Connected;
    const auto flightMode = flightModeIn(view);
    if (flightMode && flightMode.value().value)
        return CellularState::FlightMode;
    if (state.value() != CellularState::RoamingOff)
        return state;
    const auto allowed = view ? isRoamingAllowed(view.value()) : Result<bool>(view.error());
    // Where nobody forbids it, data is allowed abroad.
    return allowed && !allowed.value() ? CellularState::RoamingOff : CellularState::Available;
}

Result<Sourced<CellularState>> LinuxNetwork::cellular()
{
    const auto replies = bus_.look({modems(), {NETWORKS, nullptr}});
    const auto modems = modemsIn(replies[0]);
    if (!modems)
        return modems.error();
    return from(MODEM_MANAGER, cellularIn(modems.value(), NetworkView::from(replies[1])));
}

std::unique_ptr<Watch> LinuxNetwork::watch(std::function<void()> changed)
{
    return bus_.watch({&NETWORKS, &MODEMS, &ADAPTERS}, std::move(changed));
}

} // namespace port::linux_backend
