// SPDX-License-Identifier: Apache-2.0
// Radios and interfaces as the kernel tells of them, in a made-up tree.
#include <gmock/gmock.h>

#include "linux/KernelNetwork.h"
#include "support/TemporaryTree.h"

using port::Error;
using port::LinkState;
using port::WifiConnection;
using port::linux_backend::KernelNetwork;

namespace {

class LinuxKernelNetworkTest : public testing::Test {
protected:
    void addInterface(const std::string& name, const std::string& flags, const std::string& carrier,
                      const std::string& state)
    {
        const std::string folder = "/sys/class/net/" + name;
        tree.write(folder + "/flags", flags + "\n");
        tree.write(folder + "/carrier", carrier + "\n");
        tree.write(folder + "/operstate", state + "\n");
    }
    void addWifi(const std::string& name, const std::string& flags, const std::string& carrier,
                 const std::string& state)
    {
        addInterface(name, flags, carrier, state);
        tree.write("/sys/class/net/" + name + "/wireless/status", "");
    }
    void addSwitch(const std::string& name, const std::string& type, const std::string& soft)
    {
        tree.write("/sys/class/rfkill/" + name + "/type", type + "\n");
        tree.write("/sys/class/rfkill/" + name + "/soft", soft + "\n");
    }

    const TemporaryTree tree;
    const KernelNetwork kernel{tree.root()};
};

TEST_F(LinuxKernelNetworkTest, MachineWithoutWifiHasNone)
{
    for (const bool hasCable : {false, true}) {
        if (hasCable)
            addInterface("eth0", "0x1003", "1", "up");
        EXPECT_EQ(Error::Kind::NotSupported, kernel.wifi().error().kind);
        EXPECT_EQ("no Wi-Fi interface in /sys/class/net", kernel.wifiConnection().error().reason);
    }
}

TEST_F(LinuxKernelNetworkTest, WifiFollowsItsInterface)
{
    const struct {
        const char *flags, *carrier, *state;
        LinkState link;
        WifiConnection connection;
    } rows[] = {
        {"0x1003", "1", "up", LinkState::Connected, WifiConnection::Connected},
        {"0x1003", "1", "unknown", LinkState::Connected, WifiConnection::Connected},
        {"0x1003", "1", "dormant", LinkState::Disconnected, WifiConnection::Association},
        {"0x1003", "0", "down", LinkState::Disconnected, WifiConnection::Disconnected},
        {"0x1003", "0", "up", LinkState::Disconnected, WifiConnection::Disconnected},
        {"0x1002", "1", "up", LinkState::Deactivated, WifiConnection::Disconnected},
        {"0x1002", "", "down", LinkState::Deactivated, WifiConnection::Disconnected},
        {"garbage", "1", "up", LinkState::Deactivated, WifiConnection::Disconnected},
        {"", "", "", LinkState::Deactivated, WifiConnection::Disconnected},
    };
    for (const auto& row : rows) {
        addWifi("wlan0", row.flags, row.carrier, row.state);
        EXPECT_EQ(row.link, kernel.wifi().value().value) << row.flags << row.state;
        EXPECT_EQ(row.connection, kernel.wifiConnection().value().value) << row.flags << row.state;
    }
}

TEST_F(LinuxKernelNetworkTest, InterfaceThatIsFurthestCounts)
{
    addInterface("eth0", "0x1003", "1", "up");
    addWifi("wlan0", "0x1002", "0", "down");
    addWifi("wlan1", "0x1003", "0", "down");
    EXPECT_EQ(LinkState::Disconnected, kernel.wifi().value().value);
}

TEST_F(LinuxKernelNetworkTest, BluetoothIsToldByItsType)
{
    EXPECT_FALSE(kernel.hasBluetoothAdapter());
    tree.write("/sys/class/bluetooth/hci0/uevent", "");
    EXPECT_TRUE(kernel.hasBluetoothAdapter());
    addInterface("bnep0", "0x1003", "1", "up");
    tree.write("/sys/class/net/bnep0/uevent", "INTERFACE=bnep0\nDEVTYPE=bluetooth2\n");
    EXPECT_FALSE(kernel.isConnectedOverBluetooth());
    tree.write("/sys/class/net/bnep0/uevent", "INTERFACE=bnep0\nDEVTYPE=bluetooth\n");
    EXPECT_TRUE(kernel.isConnectedOverBluetooth());
    addInterface("bnep0", "0x1003", "0", "down");
    EXPECT_FALSE(kernel.isConnectedOverBluetooth());
}

TEST_F(LinuxKernelNetworkTest, RadiosAreOffWhenEverySwitchIs)
{
    EXPECT_EQ("no switch of a radio in /sys/class/rfkill",
              kernel.areRadiosSwitchedOff().error().reason);
    addSwitch("rfkill0", "bluetooth", "1");
    EXPECT_FALSE(kernel.areRadiosSwitchedOff());
    addSwitch("rfkill1", "wlan", "1");
    EXPECT_TRUE(kernel.areRadiosSwitchedOff().value().value);
    addSwitch("rfkill2", "wwan", "0");
    EXPECT_FALSE(kernel.areRadiosSwitchedOff().value().value);
    addSwitch("rfkill2", "wwan", "1");
    EXPECT_TRUE(kernel.areRadiosSwitchedOff().value().value);
    addSwitch("rfkill0", "bluetooth", "0");
    EXPECT_TRUE(kernel.areRadiosSwitchedOff().value().value);
    addSwitch("rfkill2", "wwan", "garbage");
    EXPECT_FALSE(kernel.areRadiosSwitchedOff().value().value);
}

TEST_F(LinuxKernelNetworkTest, EthernetIsACardOrAContainersEndOfAPair)
{
    const struct {
        const char* name;
        std::vector<std::pair<const char*, const char*>> files;
        bool counts;
    } rows[] = {
        {"br0", {{"uevent", "DEVTYPE=bridge\n"}, {"iflink", "2"}, {"ifindex", "2"}}, false},
        {"dummy0", {{"iflink", "3"}, {"ifindex", "3"}}, false},
        {"lo", {{"type", "772"}, {"device/uevent", ""}}, false},
        {"veth0", {{"iflink", "9"}, {"ifindex", "4"}, {"master/uevent", ""}}, false},
        {"wlan0", {{"device/uevent", ""}, {"wireless/status", ""}}, false},
        {"wwan0", {{"uevent", "DEVTYPE=wwan\n"}, {"device/uevent", ""}}, false},
        {"eth0", {{"device/uevent", ""}}, true},
        {"eth1", {{"iflink", "9"}, {"ifindex", "5"}}, true},
    };
    for (const auto& row : rows) {
        const TemporaryTree machine;
        const std::string folder = std::string("/sys/class/net/") + row.name;
        machine.write(folder + "/type", "1\n");
        for (const auto& [file, text] : row.files)
            machine.write(folder + "/" + file, text);
        const auto found = KernelNetwork(machine.root()).ethernet();
        EXPECT_EQ(row.counts, static_cast<bool>(found)) << row.name;
        EXPECT_EQ(row.counts ? folder : "no Ethernet interface in /sys/class/net",
                  found ? found.value().source : found.error().reason);
    }
}

TEST_F(LinuxKernelNetworkTest, ModemAndSwitchOfBluetoothAreFound)
{
    EXPECT_FALSE(kernel.hasModem());
    EXPECT_FALSE(kernel.isBluetoothSwitchedOn());
    addSwitch("rfkill0", "bluetooth", "1");
    EXPECT_FALSE(kernel.isBluetoothSwitchedOn());
    addSwitch("rfkill1", "bluetooth", "0");
    EXPECT_TRUE(kernel.isBluetoothSwitchedOn());
    for (const auto& [file, text] : {std::pair("/sys/class/wwan/wwan0/uevent", ""),
                                     {"/sys/class/net/wwan0/uevent", "DEVTYPE=wwan\n"},
                                     {"/sys/class/rfkill/rfkill0/type", "wwan\n"}}) {
        const TemporaryTree machine;
        machine.write(file, text);
        EXPECT_TRUE(KernelNetwork(machine.root()).hasModem()) << file;
    }
}

} // namespace
