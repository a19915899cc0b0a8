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

// An Ethernet device without a cable is "unavailable".
LinkState ethernetStateOf(std::uint32_t deviceState)
{
    return deviceState == NM_DEVICE_STATE_ACTIVATED ? LinkState::Connected
                                                    : LinkState::Disconnected;
}

std::string sourceOf(const BusObject& service, const std::string& part)
{
    return service.name + (part.empty() ? "" : " " + part);
}

// The state of the device that is furthest, of those that NetworkManager manages.
template <typename T>
std::optional<Sourced<T>> furthestOf(const std::vector<NetworkDevice>& devices,
                                     T (*stateOf)(std::uint32_t deviceState))
{
    std::optional<Sourced<T>> furthest;
    for (const NetworkDevice& device : devices) {
        const T state = stateOf(device.state);
        if (device.state > NM_DEVICE_STATE_UNMANAGED && (!furthest || furthest->value < state))
            furthest = Sourced<T>{state, sourceOf(NETWORK_MANAGER, device.interface)};
    }
    return furthest;
}

template <typename T>
Result<Sourced<T>> wifiIn(const Result<NetworkView>& now, T off,
                          T (*stateOf)(std::uint32_t deviceState))
{
    if (!now)
        return now.error();
    const NetworkView& view = now.value();
    const auto isThere = view.isThere(Radio::Wifi);
    const auto devices = view.devicesOf({NM_DEVICE_TYPE_WIFI});
    const auto isOn = view.isOn(Radio::Wifi);
    const auto networking = view.isOn();
    if (!isThere || !isThere.value())
        return isThere ? notSupported("NetworkManager knows no Wi-Fi device") : isThere.error();
    if (!devices || !isOn || !networking)
        return devices ? isOn ? networking.error() : isOn.error() : devices.error();
    if (!isOn.value() || !networking.value() || devices.value().empty())
        return Sourced<T>{off, NETWORK_MANAGER.name};
    const auto furthest = furthestOf(devices.value(), stateOf);
    if (!furthest)
        return notAvailable("NetworkManager leaves the Wi-Fi device to others");
    return *furthest;
}

Result<Sourced<LinkState>> ethernetIn(const Result<NetworkView>& view)
{
    if (!view)
        return view.error();
    const auto devices = view.value().devicesOf({NM_DEVICE_TYPE_ETHERNET});
    const auto networking = view.value().isOn();
    if (!devices || !networking)
        return devices ? networking.error() : devices.error();
    auto furthest = furthestOf(devices.value(), &ethernetStateOf);
    if (!furthest)
        return notAvailable("NetworkManager manages no Ethernet device");
    if (!networking.value())
        furthest->value = LinkState::Deactivated;
    return *furthest;
}

Result<Connectivity> connectivityOf(std::uint32_t state)
{
    switch (state) {
    case NM_CONNECTIVITY_NONE:
        return Connectivity::None;
    case NM_CONNECTIVITY_PORTAL:
        return Connectivity::Portal;
    case NM_CONNECTIVITY_LIMITED:
        return Connectivity::Limited;
    case NM_CONNECTIVITY_FULL:
        return Connectivity::Full;
    default:
        return notAvailable("NetworkManager does not know the connectivity");
    }
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
Result<Sourced<T>> orKernel(const Result<Sourced<T>>& answer, const KernelNetwork& kernel,
                            Result<Sourced<T>> (KernelNetwork::*read)() const)
{
    if (answer || answer.error().kind != Error::Kind::NotAvailable)
        return answer;
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

bool hasActivated(const NetworkView& view, NMDeviceType type)
{
    const auto devices = view.devicesOf({type});
    return devices && std::any_of(devices.value().begin(), devices.value().end(),
                                  [](const NetworkDevice& device) {
                                      return device.state == NM_DEVICE_STATE_ACTIVATED;
                                  });
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

// Takes the modem that got furthest; one that cannot be read counts only when no other can.
Result<Sourced<CellularState>> furthestOf(const std::vector<Modem>& modems)
{
    std::optional<Result<Sourced<CellularState>>> furthest;
    for (const Modem& modem : modems) {
        const auto state = cellularStateOf(modem);
        if (!furthest || !*furthest || (state && state.value() > furthest->value().value))
            furthest = state ? Sourced<CellularState>{state.value(),
                                                      sourceOf(MODEM_MANAGER, modem.device())}
                             : Result<Sourced<CellularState>>(state.error());
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

bool isAnyConnected(const std::vector<Modem>& modems)
{
    return std::any_of(modems.begin(), modems.end(), [](const Modem& modem) {
        const auto state = modem.state();
        return state && state.value() == MM_MODEM_STATE_CONNECTED;
    });
}

// A setting of the cellular radio, for a machine that has one.
Result<Sourced<bool>> cellularSetting(const Result<NetworkView>& view,
                                      Result<bool> (*read)(const NetworkView&))
{
    if (!view)
        return view.error();
    const auto isThere = view.value().isThere(Radio::Cellular);
    if (!isThere || !isThere.value())
        return isThere ? notSupported("NetworkManager knows no modem") : isThere.error();
    return from(NETWORK_MANAGER, read(view.value()));
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
    const Adapter& first = adapters.value().front();
    const std::string source = sourceOf(BLUEZ, first.name);
    if (!first.isPowered)
        return Sourced<LinkState>{LinkState::Deactivated, source};
    const auto view = NetworkView::from(replies[1]);
    const bool isConnected =
        view ? hasActivated(view.value(), NM_DEVICE_TYPE_BT) : kernel_.isConnectedOverBluetooth();
    return Sourced<LinkState>{isConnected ? LinkState::Connected : LinkState::Disconnected, source};
}

Result<Sourced<LinkState>> LinuxNetwork::ethernet()
{
    return orKernel(ethernetIn(view()), kernel_, &KernelNetwork::ethernet);
}

// BlueZ, or where it does not tell the kernel's switches; nobody when Bluetooth is off.
std::string LinuxNetwork::whoHasBluetoothOn()
{
    const auto adapters = adaptersIn(bus_.look(linux_backend::adapters()));
    if (!adapters)
        return kernel_.isBluetoothSwitchedOn() ? KernelNetwork::SWITCHES : "";
    const bool isOn = !adapters.value().empty() && adapters.value().front().isPowered;
    return isOn ? sourceOf(BLUEZ, adapters.value().front().name) : "";
}

// Bluetooth is asked only where all else is off.
Result<Sourced<bool>> LinuxNetwork::flightModeIn(const Result<NetworkView>& view)
{
    const auto off = view ? areRadiosSwitchedOff(view.value()) : Result<bool>(view.error());
    auto flightMode =
        orKernel(from(NETWORK_MANAGER, off), kernel_, &KernelNetwork::areRadiosSwitchedOff);
    if (!flightMode || !flightMode.value().value)
        return flightMode;
    const std::string witness = whoHasBluetoothOn();
    return witness.empty() ? flightMode : Sourced<bool>{false, witness};
}

Result<Sourced<Connectivity>> LinuxNetwork::connectivity()
{
    const auto now = view();
    const auto state = now ? now.value().connectivity() : Result<std::uint32_t>(now.error());
    return from(NETWORK_MANAGER, state ? connectivityOf(state.value()) : state.error());
}

Result<Fact> LinuxNetwork::ssid()
{
    const auto now = view();
    if (!now)
        return now.error();
    const auto isThere = now.value().isThere(Radio::Wifi);
    if (isThere && !isThere.value())
        return notSupported("NetworkManager knows no Wi-Fi device");
    return now.value().ssid();
}

Result<Sourced<bool>> LinuxNetwork::flightMode()
{
    return flightModeIn(view());
}

// Data that flows is on, whoever had it flow: a connection may be made of ModemManager itself.
Result<Sourced<bool>> LinuxNetwork::packetData()
{
    const auto replies = bus_.look({{NETWORKS, nullptr}, modems()});
    const auto modems = modemsIn(replies[1]);
    if (modems && isAnyConnected(modems.value()))
        return Sourced<bool>{true, MODEM_MANAGER.name};
    return cellularSetting(NetworkView::from(replies[0]), &isPacketDataOn);
}

// The platform keeps the setting and its effect apart; NetworkManager keeps one of them.
Result<Sourced<bool>> LinuxNetwork::mobileData()
{
    return packetData();
}

Result<Sourced<bool>> LinuxNetwork::dataRoaming()
{
    return cellularSetting(view(), &isRoamingAllowed);
}

Result<Sourced<CellularState>> LinuxNetwork::cellularIn(const std::vector<Modem>& modems,
                                                        const Result<NetworkView>& view)
{
    const auto state = furthestOf(modems);
    if (!state || state.value().value == CellularState::Connected)
        return state;
    const auto but = [&state](CellularState other) {
        return Sourced<CellularState>{other, state.value().source};
    };
    if (view && hasActivated(view.value(), NM_DEVICE_TYPE_MODEM))
        return but(CellularState::Connected);
    const auto flightMode = flightModeIn(view);
    if (flightMode && flightMode.value().value)
        return but(CellularState::FlightMode);
    if (state.value().value != CellularState::RoamingOff)
        return state;
    const auto allowed = view ? isRoamingAllowed(view.value()) : Result<bool>(view.error());
    // Where nobody forbids it, data is allowed abroad.
    return but(allowed && !allowed.value() ? CellularState::RoamingOff : CellularState::Available);
}

Result<Sourced<CellularState>> LinuxNetwork::cellular()
{
    const auto replies = bus_.look({modems(), {NETWORKS, nullptr}});
    const auto modems = modemsIn(replies[0]);
    const auto view = NetworkView::from(replies[1]);
    if (modems)
        return cellularIn(modems.value(), view);
    const auto isKnown = view ? view.value().isThere(Radio::Cellular) : Result<bool>(false);
    if (!saysAbsent(modems.error(), MODEM_MANAGER) || !isKnown || isKnown.value() ||
        kernel_.hasModem())
        return modems.error();
    return notSupported(modems.error().reason + "; no modem in /sys/class");
}

std::unique_ptr<Watch> LinuxNetwork::watch(std::function<void()> changed)
{
    return bus_.watch({&NETWORKS, &MODEMS, &ADAPTERS}, std::move(changed));
}

} // namespace port::linux_backend
