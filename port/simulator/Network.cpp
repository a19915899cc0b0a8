// SPDX-License-Identifier: Apache-2.0
#include "Network.h"

#include <utility>

#include "FileWatch.h"

namespace port::simulator {
namespace {

using devicefile::Device;
using devicefile::Section;

// A radio's state, from one reading of the file.
template <typename State>
Result<Sourced<State>> radio(const Device& device, const char* key, State switchedOff)
{
    const Section& network = device.section("network");
    if (network.find(key) == nullptr) {
        const auto flightMode = device.section("settings").get<bool>("flight_mode");
        if (flightMode && flightMode.value().value)
            return Sourced<State>{switchedOff, flightMode.value().source};
    }
    return network.get<State>(key);
}

Result<Sourced<WifiConnection>> connectionOf(const Result<Sourced<LinkState>>& wifi)
{
    if (!wifi)
        return wifi.error();
    return Sourced<WifiConnection>{wifi.value().value == LinkState::Connected
                                       ? WifiConnection::Connected
                                       : WifiConnection::Disconnected,
                                   wifi.value().source};
}

Result<Sourced<CellularState>> cellularOf(const Device& device)
{
    return radio(device, "cellular", CellularState::FlightMode);
}

Result<Sourced<LinkState>> bluetoothOf(const Device& device)
{
    return radio(device, "bluetooth", LinkState::Deactivated);
}

Result<Sourced<LinkState>> wifiOf(const Device& device)
{
    return radio(device, "wifi", LinkState::Deactivated);
}

Result<Sourced<LinkState>> ethernetOf(const Device& device)
{
    const Section& network = device.section("network");
    if (network.find("ethernet") == nullptr)
        return notSupported(network.source() + ": [network] has no ethernet");
    return network.get<LinkState>("ethernet");
}

// The connectivity that connected links provide, link by link, when the file does not say.
Result<Sourced<Connectivity>> connectivityOf(const Device& device)
{
    const auto cellular = cellularOf(device);
    const bool isConnected = cellular && cellular.value().value == CellularState::Connected;
    std::string source = cellular ? cellular.value().source : "";
    for (const auto& link : {wifiOf(device), bluetoothOf(device), ethernetOf(device)}) {
        if (!isConnected && link && link.value().value == LinkState::Connected)
            return Sourced<Connectivity>{Connectivity::Full, link.value().source};
        source = link && source.empty() ? link.value().source : source;
    }
    if (source.empty())
        return notAvailable(device.section("network").source() + ": [network] tells of no link");
    return Sourced<Connectivity>{isConnected ? Connectivity::Full : Connectivity::None, source};
}

} // namespace

Result<Sourced<CellularState>> SimulatedNetwork::cellular()
{
    return file_.ask<CellularState>(cellularOf);
}

Result<Sourced<LinkState>> SimulatedNetwork::wifi()
{
    return file_.ask<LinkState>(wifiOf);
}

Result<Sourced<WifiConnection>> SimulatedNetwork::wifiConnection()
{
    return file_.ask<WifiConnection>([](const Device& device) {
        const Section& network = device.section("network");
        if (network.find("wifi_connection") == nullptr)
            return connectionOf(wifiOf(device));
        return network.get<WifiConnection>("wifi_connection");
    });
}

Result<Sourced<LinkState>> SimulatedNetwork::bluetooth()
{
    return file_.ask<LinkState>(bluetoothOf);
}

Result<Sourced<LinkState>> SimulatedNetwork::ethernet()
{
    return file_.ask<LinkState>(ethernetOf);
}

Result<Sourced<Connectivity>> SimulatedNetwork::connectivity()
{
    return file_.ask<Connectivity>([](const Device& device) {
        const Section& network = device.section("network");
        const auto said = network.get<Connectivity>("connectivity");
        if (!said)
            return connectivityOf(device);
        if (said.value().value == Connectivity::Unknown)
            return Result<Sourced<Connectivity>>(
                notAvailable(said.value().source + ": the connectivity is unknown"));
        return said;
    });
}

Result<Fact> SimulatedNetwork::ssid()
{
    return file_.ask<std::string>([](const Device& device) -> Result<Fact> {
        const auto wifi = wifiOf(device);
        if (!wifi)
            return wifi.error();
        if (wifi.value().value != LinkState::Connected)
            return notAvailable(wifi.value().source + ": Wi-Fi is not connected");
        return device.section("network").get<std::string>("ssid");
    });
}

std::unique_ptr<Watch> SimulatedNetwork::watch(std::function<void()> changed)
{
    return watchFile(file_.path(), std::move(changed));
}

} // namespace port::simulator
