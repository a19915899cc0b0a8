// SPDX-License-Identifier: Apache-2.0
#include "KernelNetwork.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <vector>

#include <net/if.h>

#include "Files.h"

namespace port::linux_backend {
namespace {

namespace fs = std::filesystem;

constexpr char INTERFACES[] = "/sys/class/net";
constexpr char ADAPTER_FOLDER[] = "/sys/class/bluetooth";
constexpr char SWITCHES[] = "/sys/class/rfkill";

// The entries of a folder, in a fixed order; none when it is not there.
std::vector<std::string> entriesOf(const std::string& folder)
{
    std::vector<std::string> entries;
    std::error_code ignored;
    for (fs::directory_iterator entry(folder, ignored), end; !ignored && entry != end;
         entry.increment(ignored))
        entries.push_back(entry->path().string());
    std::sort(entries.begin(), entries.end());
    return entries;
}

bool exists(const std::string& path)
{
    std::error_code ignored;
    return fs::exists(path, ignored);
}

// Empty when it cannot be read: some say nothing while an interface is down.
std::string textOf(const std::string& folder, const char* file)
{
    const auto text = readFirst(folder, {file});
    return text ? text.value().value : "";
}

bool isWifi(const std::string& interface)
{
    return exists(interface + "/phy80211") || exists(interface + "/wireless");
}

bool isBluetooth(const std::string& interface)
{
    return ("\n" + textOf(interface, "/uevent") + "\n").find("\nDEVTYPE=bluetooth\n") !=
           std::string::npos;
}

bool isUp(const std::string& interface)
{
    return (std::strtoul(textOf(interface, "/flags").c_str(), nullptr, 16) & IFF_UP) != 0;
}

bool isConnected(const std::string& interface)
{
    const std::string state = textOf(interface, "/operstate");
    // Some drivers never say more than "unknown"; then the carrier alone counts.
    return isUp(interface) && textOf(interface, "/carrier") == "1" &&
           (state == "up" || state == "unknown");
}

LinkState linkStateOf(const std::string& interface)
{
    if (isConnected(interface))
        return LinkState::Connected;
    return isUp(interface) ? LinkState::Disconnected : LinkState::Deactivated;
}

WifiConnection connectionOf(const std::string& interface)
{
    if (isConnected(interface))
        return WifiConnection::Connected;
    // There is a link, and whoever set it up still negotiates.
    return isUp(interface) && textOf(interface, "/operstate") == "dormant"
               ? WifiConnection::Association
               : WifiConnection::Disconnected;
}

// The state of the Wi-Fi interface that is furthest.
template <typename T>
Result<Sourced<T>> furthestWifi(const std::string& root, T (*stateOf)(const std::string&))
{
    std::vector<T> states;
    for (const std::string& interface : entriesOf(root + INTERFACES))
        if (isWifi(interface))
            states.push_back(stateOf(interface));
    if (states.empty())
        return notSupported(std::string("no Wi-Fi interface in ") + INTERFACES);
    return Sourced<T>{*std::max_element(states.begin(), states.end()), INTERFACES};
}

} // namespace

Result<Sourced<LinkState>> KernelNetwork::wifi() const
{
    return furthestWifi(root_, &linkStateOf);
}

Result<Sourced<WifiConnection>> KernelNetwork::wifiConnection() const
{
    return furthestWifi(root_, &connectionOf);
}

bool KernelNetwork::isConnectedOverBluetooth() const
{
    const auto interfaces = entriesOf(root_ + INTERFACES);
    return std::any_of(interfaces.begin(), interfaces.end(), [](const std::string& interface) {
        return isBluetooth(interface) && isConnected(interface);
    });
}

bool KernelNetwork::hasBluetoothAdapter() const
{
    return !entriesOf(root_ + ADAPTER_FOLDER).empty();
}

Result<Sourced<bool>> KernelNetwork::areRadiosSwitchedOff() const
{
    std::vector<bool> off;
    for (const std::string& radio : entriesOf(root_ + SWITCHES)) {
        const std::string type = textOf(radio, "/type");
        if (type == "wlan" || type == "wwan")
            off.push_back(textOf(radio, "/soft") == "1");
    }
    if (off.empty())
        return notAvailable(std::string("no switch of a radio in ") + SWITCHES);
    return Sourced<bool>{std::count(off.begin(), off.end(), false) == 0, SWITCHES};
}

} // namespace port::linux_backend
