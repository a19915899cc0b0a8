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

} // namespace

Result<Sourced<CellularState>> SimulatedNetwork::cellular()
{
    return file_.ask<CellularState>(
        [](const Device& device) { return radio(device, "cellular", CellularState::FlightMode); });
}

Result<Sourced<LinkState>> SimulatedNetwork::wifi()
{
    return file_.ask<LinkState>(
        [](const Device& device) { return radio(device, "wifi", LinkState::Deactivated); });
}

Result<Sourced<WifiConnection>> SimulatedNetwork::wifiConnection()
{
    return file_.ask<WifiConnection>([](const Device& device) {
        const Section& network = device.section("network");
        if (network.find("wifi_connection") == nullptr)
            return connectionOf(radio(device, "wifi", LinkState::Deactivated));
        return network.get<WifiConnection>("wifi_connection");
    });
}

Result<Sourced<LinkState>> SimulatedNetwork::bluetooth()
{
    return file_.ask<LinkState>(
        [](const Device& device) { return radio(device, "bluetooth", LinkState::Deactivated); });
}

std::unique_ptr<Watch> SimulatedNetwork::watch(std::function<void()> changed)
{
    return watchFile(file_.path(), std::move(changed));
}

} // namespace port::simulator
