// SPDX-License-Identifier: Apache-2.0
#include "KernelNetwork.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <vector>

#include <net/if.h>
#include <net/if_arp.h>

#include "Files.h"

namespace port::linux_backend {
namespace {

namespace fs = std::filesystem;

constexpr char INTERFACES[] = "/sys/class/net";
constexpr char ADAPTER_FOLDER[] = "/sys/class/bluetooth";
constexpr char MODEM_FOLDER[] = "/sys/class/wwan";

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

// The kernel's name for the kind of an interface; empty for a plain one.
std::string typeOf(const std::string& interface)
{
    const std::string mark = "\nDEVTYPE=";
    const std::string event = "\n" + textOf(interface, "/uevent") + "\n";
    const std::size_t found = event.find(mark);
    if (found == std::string::npos)
        return "";
    const std::size_t begin = found + mark.size();
    return event.substr(begin, event.find('\n', begin) - begin);
}

bool isBluetooth(const std::string& interface)
{
    return typeOf(interface) == "bluetooth";
}

// A container's end of a pair is its socket; the machine's ends are ports of a bridge.
bool isEthernet(const std::string& interface)
{
    const bool isPair = textOf(interface, "/iflink") != textOf(interface, "/ifindex") &&
                        !exists(interface + "/master");
    return textOf(interface, "/type") == std::to_string(ARPHRD_ETHER) && !isWifi(interface) &&
           typeOf(interface).empty() && (exists(interface + "/device") || isPair);
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

// The state of the interface of a kind that is furthest.
template <typename T>
Result<Sourced<T>> furthest(const std::string& root, const char* kind,
                            bool (*isOfKind)(const std::string&), T (*stateOf)(const std::string&))
{
    Result<Sourced<T>> found =
        notSupported(std::string("no ") + kind + " interface in " + INTERFACES);
    for (const std::string& interface : entriesOf(root + INTERFACES)) {
        if (!isOfKind(interface))
            continue;
        const T state = stateOf(interface);
        if (!found || found.value().value < state)
            found = Sourced<T>{state, interface.substr(root.size())};
    }
    return found;
}

} // namespace

Result<Sourced<LinkState>> KernelNetwork::wifi() const
{
    return furthest(root_, "Wi-Fi", &isWifi, &linkStateOf);
}

Result<Sourced<WifiConnection>> KernelNetwork::wifiConnection() const
{
    return furthest(root_, "Wi-Fi", &isWifi, &connectionOf);
}

Result<Sourced<LinkState>> KernelNetwork::ethernet() const
{
    return furthest(root_, "Ethernet", &isEthernet, &linkStateOf);
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

bool KernelNetwork::isBluetoothSwitchedOn() const
{
    const auto switches = entriesOf(root_ + SWITCHES);
    return std::any_of(switches.begin(), switches.end(), [](const std::string& each) {
        return textOf(each, "/type") == "bluetooth" && textOf(each, "/soft") != "1";
    });
}

bool KernelNetwork::hasModem() const
{
    const auto interfaces = entriesOf(root_ + INTERFACES);
    const auto switches = entriesOf(root_ + SWITCHES);
    return !entriesOf(root_ + MODEM_FOLDER).empty() ||
           std::any_of(interfaces.begin(), interfaces.end(),
                       [](const std::string& each) { return typeOf(each) == "wwan"; }) ||
           std::any_of(switches.begin(), switches.end(),
                       [](const std::string& each) { return textOf(each, "/type") == "wwan"; });
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
