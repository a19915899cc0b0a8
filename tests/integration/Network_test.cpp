// SPDX-License-Identifier: Apache-2.0
// Radios and connections, from scripted services under their real names.
#include "linux/Network.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <mutex>
#include <numeric>
#include <thread>

#include <gmock/gmock.h>
#include <net/if.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include "devicefile/Descriptor.h"
#include "support/Answer.h"
#include "support/Pauses.h"
#include "support/ScriptedModems.h"
#include "support/ScriptedService.h"

using port::CellularState;
using port::LinkState;
using port::WifiConnection;
using port::linux_backend::Bus;
using port::linux_backend::LinuxNetwork;
using testing::HasSubstr;
using testing::StartsWith;

namespace {

const std::string NM = "org.freedesktop.NetworkManager";
const std::string NM_PATH = "/org/freedesktop/NetworkManager";
const std::string NM_DEVICE = NM + ".Device";
const std::string NM_CONNECTION = NM + ".Settings.Connection";
const std::string ACTIVE = NM_PATH + "/ActiveConnection/1";
const std::string MM = "org.freedesktop.ModemManager1";
const std::string MM_MODEM = MM + ".Modem";
const std::string MODEM_PATH = "/org/freedesktop/ModemManager1/Modem/";

// The text of an object for a reply of GetManagedObjects.
std::string object(const std::string& path, const std::string& interface,
                   const std::string& properties)
{
    return "@o '" + path + "': {'" + interface + "': {" + properties + "}}";
}

struct Device {
    unsigned type;
    unsigned state;
    const char* interface = "";
};

// The state that NetworkManager is made to show.
struct Networks {
    bool networking = true;
    bool wifiOn = true;
    bool wifiHardwareOn = true;
    bool cellularOn = true;
    unsigned radioFlags = 3;
    std::vector<Device> devices;
    std::vector<std::string> connections; // "connection" and further settings
    int active = -1;                      // one of the connections
};

constexpr unsigned WIFI = 2;
constexpr unsigned BLUETOOTH = 5;
constexpr unsigned MODEM = 8;

std::string flag(const char* name, bool value)
{
    return std::string("'") + name + "': <" + (value ? "true" : "false") + ">, ";
}

std::string number(const char* name, unsigned value)
{
    return std::string("'") + name + "': <uint32 " + std::to_string(value) + ">";
}

std::string connectionPath(std::size_t index)
{
    return NM_PATH + "/Settings/" + std::to_string(index);
}

std::string managerObject(const Networks& networks)
{
    return object(NM_PATH, NM,
                  flag("NetworkingEnabled", networks.networking) +
                      flag("WirelessEnabled", networks.wifiOn) +
                      flag("WirelessHardwareEnabled", networks.wifiHardwareOn) +
                      flag("WwanEnabled", networks.cellularOn) + flag("WwanHardwareEnabled", true) +
                      number("RadioFlags", networks.radioFlags));
}

std::string objectsOf(const Networks& networks)
{
    std::vector<std::string> objects = {managerObject(networks)};
    for (const auto& [type, state, interface] : networks.devices)
        objects.push_back(object(NM_PATH + "/Devices/" + std::to_string(objects.size() - 1),
                                 NM_DEVICE,
                                 number("DeviceType", type) + ", " + number("State", state) +
                                     ", 'Interface': <'" + interface + "'>"));
    for (std::size_t i = 0; i < networks.connections.size(); ++i)
        objects.push_back(object(connectionPath(i), NM_CONNECTION, "'Unsaved': <false>"));
    if (networks.active >= 0)
        objects.push_back(object(ACTIVE, NM + ".Connection.Active",
                                 "'Type': <'gsm'>, 'Connection': <@o '" +
                                     connectionPath(static_cast<std::size_t>(networks.active)) +
                                     "'>, " + number("State", 2)));
    return treeOf(objects);
}

template <typename T>
std::string shown(T value, const std::string& source)
{
    return std::to_string(static_cast<int>(value)) + " <" + source + ">";
}

// The sources of what a modem and an adapter tell.
const std::string MODEM_0 = MM + " " + MODEM_PATH + "0";
const std::string MODEM_2 = MM + " " + MODEM_PATH + "2";
const std::string HCI_0 = "org.bluez hci0";
const std::string HCI_1 = "org.bluez hci1";

const std::string ON = "1 <org.freedesktop.NetworkManager>";
const std::string OFF = "0 <org.freedesktop.NetworkManager>";

class NetworkTest : public testing::Test {
protected:
    NetworkTest()
    {
        daemon.start();
    }

    ScriptedService& serve(std::unique_ptr<ScriptedService>& service, const std::string& name,
                           const std::string& objects)
    {
        if (!service)
            service = std::make_unique<ScriptedService>(daemon.address(), name);
        service->answerTo("GetManagedObjects", objects);
        return *service;
    }
    // What `networks` says.
    void serve()
    {
        serve(networkManager, NM, objectsOf(networks));
        for (std::size_t i = 0; i < networks.connections.size(); ++i) {
            networkManager->answerTo("GetSettings", "({" + networks.connections[i] + "},)",
                                     connectionPath(i));
            networkManager->emit(connectionPath(i), NM_CONNECTION, "Updated", "()");
        }
    }
    void serveDevices(const std::vector<Device>& devices)
    {
        networks.devices = devices;
        serve();
    }
    void serveConnections(const std::vector<std::string>& connections, int active = -1)
    {
        networks.connections = connections;
        networks.active = active;
        serve();
    }
    // One modem for each text of properties; "|" begins those of Modem3gpp.
    void serveModems(const std::vector<std::string>& modems)
    {
        std::vector<std::string> objects;
        for (const std::string& text : modems) {
            const std::size_t bar = text.find('|');
            std::string one =
                object(MODEM_PATH + std::to_string(objects.size()), MM_MODEM, text.substr(0, bar));
            if (bar != std::string::npos)
                one.insert(one.size() - 1,
                           ", '" + MM + ".Modem.Modem3gpp': {" + text.substr(bar + 1) + "}");
            objects.push_back(one);
        }
        serve(modemManager, MM, treeOf(objects));
    }
    void serveAdapters(const std::vector<std::string>& adapters)
    {
        std::vector<std::string> objects = {
            object("/org/bluez", "org.bluez.AgentManager1", "'x': <1>")};
        for (std::size_t i = 0; i < adapters.size(); ++i)
            objects.push_back(
                object("/org/bluez/hci" + std::to_string(i), "org.bluez.Adapter1", adapters[i]));
        serve(bluez, "org.bluez", treeOf(objects));
    }

    // A link that is on, with a file by which its kind is known; its folder.
    std::string writeLink(const std::string& name, const std::string& file,
                          const std::string& state)
    {
        const std::string folder = "/sys/class/net/" + name;
        root.write(folder + file, "DEVTYPE=bluetooth\nINTERFACE=" + name + "\n");
        root.write(folder + "/flags", "0x1003\n");
        root.write(folder + "/carrier", "1\n");
        root.write(folder + "/operstate", state + "\n");
        return folder;
    }

    // The kernel's switch of a radio; 1 has it off.
    void writeSwitch(int index, const std::string& type, int soft)
    {
        const std::string folder = "/sys/class/rfkill/rfkill" + std::to_string(index);
        root.write(folder + "/type", type + "\n");
        root.write(folder + "/soft", std::to_string(soft) + "\n");
    }

    PrivateBus daemon;
    Networks networks;
    std::unique_ptr<ScriptedService> networkManager;
    std::unique_ptr<ScriptedService> modemManager;
    std::unique_ptr<ScriptedService> bluez;
    const TemporaryTree root;
    Bus bus;
    LinuxNetwork network{bus, root.root()};
};

TEST_F(NetworkTest, WifiFollowsItsDevice)
{
    const struct {
        unsigned device;
        LinkState link;
        WifiConnection connection;
    } rows[] = {
        {20, LinkState::Deactivated, WifiConnection::Disconnected},
        {30, LinkState::Disconnected, WifiConnection::Disconnected},
        {40, LinkState::Disconnected, WifiConnection::Association},
        {50, LinkState::Disconnected, WifiConnection::Association},
        {60, LinkState::Disconnected, WifiConnection::Association},
        {70, LinkState::Disconnected, WifiConnection::Configuration},
        {80, LinkState::Disconnected, WifiConnection::Configuration},
        {90, LinkState::Disconnected, WifiConnection::Configuration},
        {100, LinkState::Connected, WifiConnection::Connected},
        {110, LinkState::Disconnected, WifiConnection::Disconnected},
        {120, LinkState::Disconnected, WifiConnection::Failure},
    };
    for (const auto& row : rows) {
        serveDevices({{1, 100}, {WIFI, row.device}});
        EXPECT_EQ(shown(row.link, NM), show(network.wifi())) << row.device;
        EXPECT_EQ(shown(row.connection, NM), show(network.wifiConnection())) << row.device;
    }
    serveDevices({{WIFI, 30}, {WIFI, 100}, {WIFI, 10}}); // the one that is furthest counts
    EXPECT_EQ(shown(LinkState::Connected, NM), show(network.wifi()));
    EXPECT_EQ(shown(WifiConnection::Connected, NM), show(network.wifiConnection()));
}

TEST_F(NetworkTest, WifiThatIsSwitchedOffIsDeactivated)
{
    for (const int which : {0, 1, 2}) {
        networks.devices = {{WIFI, 100}};
        networks.wifiOn = which != 0;
        networks.wifiHardwareOn = which != 1;
        networks.networking = which != 2;
        serve();
        EXPECT_EQ(shown(LinkState::Deactivated, NM), show(network.wifi())) << which;
        EXPECT_EQ(shown(WifiConnection::Disconnected, NM), show(network.wifiConnection()));
    }
}

TEST_F(NetworkTest, MachineWithoutWifiHasNone)
{
    networks.radioFlags = 2;
    serveDevices({{1, 100}, {MODEM, 100}});
    const char* const none = "not supported: NetworkManager knows no Wi-Fi device";
    EXPECT_EQ(none, show(network.wifi()));
    EXPECT_EQ(none, show(network.wifiConnection()));
    EXPECT_EQ(none, show(network.ssid()));
    networks.radioFlags = 1; // there is a radio, and its device has gone
    serve();
    EXPECT_EQ(shown(LinkState::Deactivated, NM), show(network.wifi()));
}

TEST_F(NetworkTest, KernelTellsOfAWifiDeviceThatNobodyManages)
{
    EXPECT_EQ("not supported: org.freedesktop.NetworkManager is not on the system bus; "
              "no Wi-Fi interface in /sys/class/net",
              show(network.wifi()));
    serveDevices({{WIFI, 10}});
    EXPECT_EQ("not supported: NetworkManager leaves the Wi-Fi device to others; "
              "no Wi-Fi interface in /sys/class/net",
              show(network.wifi()));
    const std::string wlan = writeLink("wlan0", "/phy80211/name", "up");
    EXPECT_EQ(shown(LinkState::Connected, wlan), show(network.wifi()));
    EXPECT_EQ(shown(WifiConnection::Connected, wlan), show(network.wifiConnection()));
}

TEST_F(NetworkTest, BluetoothFollowsItsAdapters)
{
    EXPECT_EQ("not supported: org.bluez is not on the system bus; "
              "no Bluetooth adapter in /sys/class",
              show(network.bluetooth()));
    root.write("/sys/class/bluetooth/hci0/type", "");
    EXPECT_EQ("error: org.bluez is not on the system bus", show(network.bluetooth()));
    serveAdapters({});
    EXPECT_EQ("not supported: BlueZ knows no Bluetooth adapter", show(network.bluetooth()));
    serve();
    serveAdapters({"'Powered': <false>"});
    EXPECT_EQ(shown(LinkState::Deactivated, HCI_0), show(network.bluetooth()));
    serveAdapters({"'Powered': <false>", "'Powered': <true>"});
    EXPECT_EQ(shown(LinkState::Disconnected, HCI_1), show(network.bluetooth()));
    serveDevices({{BLUETOOTH, 30}});
    EXPECT_EQ(shown(LinkState::Disconnected, HCI_1), show(network.bluetooth()));
    serveDevices({{BLUETOOTH, 30}, {BLUETOOTH, 100}});
    EXPECT_EQ(shown(LinkState::Connected, HCI_1), show(network.bluetooth()));
    serveAdapters({"'Powered': <false>"});
    EXPECT_EQ(shown(LinkState::Deactivated, HCI_0), show(network.bluetooth()));
}

TEST_F(NetworkTest, KernelTellsOfABluetoothConnectionWithoutNetworkManager)
{
    serveAdapters({"'Powered': <true>"});
    const std::string bnep = writeLink("bnep0", "/uevent", "down");
    EXPECT_EQ(shown(LinkState::Disconnected, HCI_0), show(network.bluetooth()));
    root.write(bnep + "/operstate", "up\n");
    EXPECT_EQ(shown(LinkState::Connected, HCI_0), show(network.bluetooth()));
}

TEST_F(NetworkTest, FlightModeIsEveryRadioSwitchedOff)
{
    const struct {
        unsigned radios; // 1 Wi-Fi, 2 cellular
        bool wifiOn;
        bool cellularOn;
        bool flightMode;
    } rows[] = {
        {3, true, true, false},  {3, false, true, false}, {3, true, false, false},
        {3, false, false, true}, {1, false, true, true},  {1, true, false, false},
        {2, true, false, true},  {2, false, true, false}, {0, false, true, false},
        {0, false, false, true},
    };
    for (const auto& row : rows) {
        networks.radioFlags = row.radios;
        networks.wifiOn = row.wifiOn;
        networks.cellularOn = row.cellularOn;
        serve();
        EXPECT_EQ(row.flightMode ? ON : OFF, show(network.flightMode()))
            << row.radios << row.wifiOn << row.cellularOn;
    }
    networks = {};
    networks.radioFlags = 1;
    networks.wifiHardwareOn = false; // the switch on the case
    serve();
    EXPECT_EQ(OFF, show(network.flightMode()));
}

TEST_F(NetworkTest, BluetoothThatIsOnIsNoFlightMode)
{
    networks.radioFlags = 1;
    networks.wifiOn = false;
    serve();
    EXPECT_EQ(ON, show(network.flightMode()));
    writeSwitch(0, "bluetooth", 0);
    EXPECT_EQ("0 </sys/class/rfkill>", show(network.flightMode()));
    serveAdapters({"'Powered': <false>"}); // BlueZ knows better
    EXPECT_EQ(ON, show(network.flightMode()));
    serveAdapters({});
    EXPECT_EQ(ON, show(network.flightMode()));
    serveAdapters({"'Powered': <false>", "'Powered': <true>"});
    EXPECT_EQ("0 <org.bluez hci1>", show(network.flightMode()));
    serveModems({"'State': <3>"});
    EXPECT_EQ(shown(CellularState::OutOfService, MODEM_0), show(network.cellular()));
    networkManager.reset(); // the kernel's switches count
    writeSwitch(1, "wlan", 1);
    EXPECT_EQ("0 <org.bluez hci1>", show(network.flightMode()));
    bluez.reset();
    root.remove("/sys/class/rfkill/rfkill0");
    EXPECT_EQ("1 </sys/class/rfkill>", show(network.flightMode()));
    root.remove("/sys/class/rfkill");
    EXPECT_EQ("error: org.freedesktop.NetworkManager is not on the system bus; "
              "no switch of a radio in /sys/class/rfkill",
              show(network.flightMode()));
}

TEST_F(NetworkTest, DataIsOnWhenAConnectionWouldComeUp)
{
    serveDevices({{MODEM, 30}});
    EXPECT_EQ(OFF, show(network.packetData()));
    const std::string wireless = "'connection': {'type': <'802-11-wireless'>}";
    const std::string manual = "'connection': {'type': <'gsm'>, 'autoconnect': <false>}";
    for (const int active : {-1, 1}) {
        serveConnections({wireless, manual}, active);
        EXPECT_EQ(active == 1 ? ON : OFF, show(network.packetData()));
        EXPECT_EQ(active == 1 ? ON : OFF, show(network.mobileData()));
    }
    serveConnections({wireless, "'connection': {'type': <'cdma'>}"});
    EXPECT_EQ(ON, show(network.packetData()));
    networks.cellularOn = false;
    serve();
    EXPECT_EQ(OFF, show(network.packetData()));
}

TEST_F(NetworkTest, DataIsOnWhileAModemIsConnectedWhoeverHadItConnect)
{
    const std::string on = "1 <org.freedesktop.ModemManager1>";
    serveDevices({{MODEM, 30}});
    serveModems({"'State': <8>", "'State': <11>"});
    EXPECT_EQ(on, show(network.packetData()));
    EXPECT_EQ(on, show(network.mobileData()));
    networkManager.reset();
    EXPECT_EQ(on, show(network.mobileData()));
    serve();
    serveModems({"'State': <8>"});
    EXPECT_EQ(OFF, show(network.mobileData()));
}

TEST_F(NetworkTest, EthernetIsConnectedByItsCable)
{
    const struct {
        unsigned device;
        bool networking;
        LinkState state;
    } rows[] = {{20, true, LinkState::Disconnected},
                {70, true, LinkState::Disconnected},
                {100, true, LinkState::Connected},
                {100, false, LinkState::Deactivated}};
    for (const auto& row : rows) {
        networks.networking = row.networking;
        serveDevices({{1, 10, "eth0"}, {1, row.device, "eth1"}, {WIFI, 100, "wlan0"}});
        EXPECT_EQ(shown(row.state, "org.freedesktop.NetworkManager eth1"), show(network.ethernet()))
            << row.device;
        if (row.networking) {
            EXPECT_EQ(shown(LinkState::Connected, "org.freedesktop.NetworkManager wlan0"),
                      show(network.wifi()));
        }
    }
    networks = {};
    serveDevices({{1, 10}});
    EXPECT_EQ("not supported: NetworkManager manages no Ethernet device; "
              "no Ethernet interface in /sys/class/net",
              show(network.ethernet()));
    root.write("/sys/class/net/eth0/type", "1\n");
    root.write("/sys/class/net/eth0/device/uevent", "");
    root.write("/sys/class/net/eth0/flags", "0x1003\n");
    EXPECT_EQ(shown(LinkState::Disconnected, "/sys/class/net/eth0"), show(network.ethernet()));
}

TEST_F(NetworkTest, ConnectivityIsWhatNetworkManagerSays)
{
    for (unsigned known = 0; known <= 4; ++known) {
        serve(networkManager, NM,
              treeOf({object(NM_PATH, NM,
                             flag("WirelessEnabled", true) + number("Connectivity", known))}));
        EXPECT_EQ(known == 0 ? "error: NetworkManager does not know the connectivity"
                             : std::to_string(known) + " <org.freedesktop.NetworkManager>",
                  show(network.connectivity()));
    }
}

// What NetworkManager tells of a Wi-Fi device at an access point.
std::string wifiAt(unsigned state, const std::string& point, const std::string& name)
{
    return treeOf({object(NM_PATH, NM, flag("WirelessEnabled", true) + number("RadioFlags", 1)),
                   "@o '/Devices/1': {'" + NM_DEVICE + "': {" + number("DeviceType", WIFI) + ", " +
                       number("State", state) + ", 'Interface': <'wlan0'>}, '" + NM_DEVICE +
                       ".Wireless': {'ActiveAccessPoint': <@o '" + point +
                       "'>, 'Bitrate': <uint32 1>}}",
                   object("/AccessPoint/7", NM + ".AccessPoint", "'Ssid': <" + name + ">")});
}

TEST_F(NetworkTest, SsidIsThatOfTheAccessPointThatIsUsed)
{
    const char* const point = "/AccessPoint/7";
    const char* const noText = "error: the name of the Wi-Fi network is no text";
    const struct {
        unsigned state;
        const char* point;
        const char* name;
        const char* answer;
    } rows[] = {
        {100, point, "[byte 0x43, 0x00]", noText},
        {100, point, "[byte 0x43, 0xc3, 0xa9]", "C\u00e9 <org.freedesktop.NetworkManager wlan0>"},
        {100, point, "[byte 0x43, 0xe9]", noText},
        {100, point, "@ay []", "error: the Wi-Fi network hides its name"},
        {100, point, "'C'", "error: NetworkManager: Ssid is no list of bytes"},
        {100, "/", "[byte 0x43]", "error: NetworkManager: / is not there"},
        {70, point, "[byte 0x43]", "error: Wi-Fi is not connected"},
    };
    for (const auto& row : rows) {
        serve(networkManager, NM, wifiAt(row.state, row.point, row.name));
        EXPECT_EQ(row.answer, show(network.ssid()));
    }
    const int before = networkManager->timesAsked();
    network.ssid();
    EXPECT_EQ(1, networkManager->timesAsked() - before);
    serve();
    EXPECT_EQ("error: Wi-Fi is not connected", show(network.ssid()));
}

TEST_F(NetworkTest, ConnectionThatIsUsedTellsWhetherDataMayRoam)
{
    serveDevices({{MODEM, 30}});
    EXPECT_EQ("error: NetworkManager has no cellular connection", show(network.dataRoaming()));
    std::vector<std::string> connections = {
        "'connection': {'type': <'gsm'>, 'autoconnect': <false>}, 'gsm': {'apn': <'a'>}",
        "'connection': {'type': <'gsm'>}, 'gsm': {'home-only': <true>}"};
    serveConnections(connections);
    EXPECT_EQ(OFF, show(network.dataRoaming())); // the one that connects itself
    serveConnections(connections, 0);
    EXPECT_EQ(ON, show(network.dataRoaming())); // the one that is up
    connections.push_back("'connection': {'type': <'gsm'>, 'autoconnect-priority': <5>}");
    serveConnections(connections);
    EXPECT_EQ(ON, show(network.dataRoaming())); // the one that connects itself first
}

TEST_F(NetworkTest, CellularFollowsTheModem)
{
    serveDevices({{MODEM, 30}});
    using State = CellularState;
    const std::pair<const char*, State> rows[] = {
        {"'State': <-1>", State::OutOfService},
        {"'State': <2>", State::OutOfService},
        {"'State': <3>|'RegistrationState': <uint32 4>", State::OutOfService},
        {"'State': <7>|'RegistrationState': <uint32 2>", State::OutOfService},
        {"'State': <8>|'RegistrationState': <uint32 1>, 'PacketServiceState': <uint32 2>",
         State::Available},
        {"'State': <8>|'RegistrationState': <uint32 1>, 'PacketServiceState': <uint32 1>",
         State::CallOnlyAvailable},
        {"'State': <8>|'RegistrationState': <uint32 6>, 'PacketServiceState': <uint32 2>",
         State::CallOnlyAvailable},
        {"'State': <8>|'RegistrationState': <uint32 1>", State::Available},
        {"'State': <8>", State::Available},
        {"'State': <10>|'RegistrationState': <uint32 1>", State::Available},
        {"'State': <11>|'RegistrationState': <uint32 5>", State::Connected},
        {"'State': <8>|'RegistrationState': <uint32 5>", State::Available},
    };
    for (const auto& [modem, state] : rows) {
        serveModems({modem});
        EXPECT_EQ(shown(state, MODEM_0), show(network.cellular())) << modem;
    }
    serveModems({"'State': <'broken'>", "'State': <3>",
                 "'State': <8>|'RegistrationState': <uint32 5>", "'State': <7>"});
    EXPECT_EQ(shown(State::Available, MODEM_2), show(network.cellular())); // is furthest
    serveConnections({"'connection': {'type': <'gsm'>}, 'gsm': {'home-only': <true>}"});
    const char* const cdma = "'State': <8>}, 'org.freedesktop.ModemManager1.Modem.ModemCdma': {"
                             "'Cdma1xRegistrationState': <uint32 ";
    for (const auto& [registrations, state] : // of the two networks, either of which may be abroad
         {std::pair("2>, 'EvdoRegistrationState': <uint32 2>", State::Available),
          {"3>, 'EvdoRegistrationState': <uint32 2>", State::RoamingOff},
          {"2>, 'EvdoRegistrationState': <uint32 3>", State::RoamingOff}}) {
        serveModems({std::string(cdma) + registrations});
        EXPECT_EQ(shown(state, MODEM_0), show(network.cellular())) << registrations;
    }
    networks.connections = {};
    serveDevices({{MODEM, 100}}); // up
    serveModems({"'State': <8>|'RegistrationState': <uint32 1>"});
    EXPECT_EQ(shown(State::Connected, MODEM_0), show(network.cellular()));
}

TEST_F(NetworkTest, MachineWithoutAModemHasNoCellular)
{
    const std::string reason = "org.freedesktop.ModemManager1 is not on the system bus";
    EXPECT_EQ("not supported: " + reason + "; no modem in /sys/class", show(network.cellular()));
    root.write("/sys/class/wwan/wwan0/uevent", "");
    EXPECT_EQ("error: " + reason, show(network.cellular()));
    std::filesystem::remove_all(root.path("/sys/class/wwan"));
    serveDevices({{MODEM, 30}});
    EXPECT_EQ("error: " + reason, show(network.cellular()));
    serveModems({});
    EXPECT_EQ("not supported: ModemManager knows no modem", show(network.cellular()));

    networks.radioFlags = 1;
    networks.connections = {"'connection': {'type': <'gsm'>}"};
    serveDevices({});
    for (const auto& answer : {network.packetData(), network.mobileData(), network.dataRoaming()})
        EXPECT_EQ("not supported: NetworkManager knows no modem", show(answer));
    networkManager.reset();
    EXPECT_EQ("error: org.freedesktop.NetworkManager is not on the system bus",
              show(network.packetData()));
}

TEST_F(NetworkTest, MalformedPropertiesAreTold)
{
    serve(networkManager, NM, treeOf({}));
    EXPECT_THAT(show(network.flightMode()),
                StartsWith("error: NetworkManager: /org/freedesktop/NetworkManager is not there"));
    serve(networkManager, NM, treeOf({object(NM_PATH, "com.example.Other", "'x': <1>")}));
    EXPECT_THAT(show(network.wifi()), HasSubstr("/org/freedesktop/NetworkManager has no "));
    serve(networkManager, NM,
          treeOf({object(NM_PATH, NM, "'WirelessEnabled': <'yes'>, 'WwanEnabled': <true>")}));
    EXPECT_THAT(show(network.flightMode()),
                StartsWith("error: NetworkManager: WirelessEnabled is no truth value"));
    serve(networkManager, NM,
          treeOf({managerObject(Networks()), object(NM_PATH + "/Devices/1", NM_DEVICE,
                                                    "'DeviceType': <uint32 2>, 'State': <'up'>")}));
    EXPECT_THAT(show(network.wifi()), HasSubstr("NetworkManager: State is no number"));

    serveConnections({"'connection': {'type': <'gsm'>, 'autoconnect': <'no'>}"});
    EXPECT_EQ("error: NetworkManager: a cellular connection has malformed settings",
              show(network.dataRoaming()));
    serveAdapters({"'Powered': <'on'>"});
    EXPECT_EQ("error: bluez: Powered is no truth value", show(network.bluetooth()));
    serveAdapters({"'Name': <'x'>"});
    EXPECT_EQ("error: bluez: Powered is missing", show(network.bluetooth()));
    serveModems({"'State': <uint32 8>"});
    EXPECT_EQ("error: org.freedesktop.ModemManager1: State is no number", show(network.cellular()));
    for (const char* const body : {"()", "('text',)", "({'/m/0': 5},)", "(@a{sv} {},)"}) {
        serve(networkManager, NM, body);
        EXPECT_THAT(show(network.flightMode()),
                    StartsWith("error: org.freedesktop.NetworkManager: "))
            << body;
    }
}

TEST_F(NetworkTest, ServiceThatKeepsSilentIsNotWaitedForLong)
{
    networks.devices = {{MODEM, 30}};
    networks.connections = {"'connection': {'type': <'gsm'>, 'autoconnect': <false>}"};
    serve(networkManager, NM, objectsOf(networks)).whenAsked([] {}, "GetSettings");
    EXPECT_LT(millisecondsOf([this] {
                  EXPECT_EQ("error: NetworkManager tells the settings of no connection",
                            show(network.dataRoaming()));
              }),
              2000);
}

TEST_F(NetworkTest, SilentServicesAreNotWaitedForLong)
{
    // Every question, and how long it took.
    const auto timesOfAll = [this] {
        return std::vector<int>{
            millisecondsOf([&] { EXPECT_FALSE(network.cellular()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.wifi()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.wifiConnection()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.bluetooth()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.flightMode()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.packetData()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.mobileData()); }),
            millisecondsOf([&] { EXPECT_FALSE(network.dataRoaming()); }),
        };
    };
    EXPECT_THAT(timesOfAll(), testing::Each(testing::Lt(500))); // while they are absent
    serve();
    serveModems({});
    serveAdapters({});
    for (const auto* const service : {&networkManager, &modemManager, &bluez})
        (*service)->whenAsked([] {}, "GetManagedObjects");
    const std::vector<int> times = timesOfAll();
    EXPECT_THAT(times, testing::Each(testing::Lt(2000)));
    // Each of them was waited for once.
    EXPECT_LT(std::accumulate(times.begin(), times.end(), 0), 4000);
    EXPECT_GE(times.front(), 500);
}

// Counts calls, and lets a test wait for one.
class Calls {
public:
    void note()
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        ++count_;
        changed_.notify_all();
    }
    bool waitFor(int count)
    {
        std::unique_lock<std::mutex> lock(mutex_);
        return changed_.wait_for(lock, std::chrono::seconds(10), [&] { return count_ >= count; });
    }
    int count() const
    {
        return count_;
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::atomic<int> count_{0};
};

class WatchTest : public NetworkTest {
protected:
    static void tellChanged(ScriptedService& service, const std::string& path,
                            const std::string& interface,
                            const std::string& changes = "'X': <uint32 1>")
    {
        service.emit(path, "org.freedesktop.DBus.Properties", "PropertiesChanged",
                     "('" + interface + "', {" + changes + "}, @as [])");
    }
    void begin()
    {
        watch = network.watch([this] { calls.note(); });
        ASSERT_TRUE(calls.waitFor(1)); // at first it always tells
    }
    // Whether something that happens now is told.
    template <typename Work>
    bool isTold(Work work)
    {
        const int before = calls.count();
        work();
        return calls.waitFor(before + 1);
    }

    Calls calls;
    std::unique_ptr<port::Watch> watch;
};

TEST_F(WatchTest, EveryKindOfChangeIsTold)
{
    networks.devices = {{WIFI, 30}};
    serveConnections({"'connection': {'type': <'vpn'>}", "'connection': {'type': <'gsm'>}"}, 1);
    serveModems({"'State': <8>|'RegistrationState': <uint32 1>"});
    serveAdapters({"'Powered': <true>"});
    begin();
    const struct {
        ScriptedService& service;
        std::string path;
        std::string interface;
    } rows[] = {
        {*networkManager, NM_PATH, NM},
        {*networkManager, NM_PATH + "/Devices/0", NM_DEVICE},
        {*networkManager, ACTIVE, NM + ".Connection.Active"},
        {*modemManager, MODEM_PATH + "0", MM_MODEM},
        {*modemManager, MODEM_PATH + "0", MM_MODEM + ".Modem3gpp"},
        {*bluez, "/org/bluez/hci0", "org.bluez.Adapter1"},
    };
    for (const auto& row : rows)
        EXPECT_TRUE(isTold([&row] { tellChanged(row.service, row.path, row.interface); }))
            << row.interface;
    EXPECT_TRUE(isTold(
        [this] { networkManager->emit(connectionPath(1), NM_CONNECTION, "Updated", "()"); }));
    EXPECT_TRUE(isTold([this] { serveModems({}); }));
    EXPECT_TRUE(isTold([this] { serveAdapters({}); }));
}

// A radio measures all the time. The kernel may tell of this machine's own interfaces meanwhile.
TEST_F(WatchTest, NoiseOfARadioIsNotTold)
{
    constexpr int TIMES = 100;
    serve(networkManager, NM, wifiAt(100, "/AccessPoint/7", "[byte 0x43]"));
    Calls ends; // seen by who is told
    watch = network.watch([&] { network.ssid() ? calls.note() : ends.note(); });
    ASSERT_TRUE(calls.waitFor(1));
    const auto emit = [this](const char* path, const char* face, const std::string& changes) {
        tellChanged(*networkManager, path, NM + "." + face, changes);
    };
    const int before = calls.count();
    for (int i = 0; i < TIMES; ++i) {
        emit("/Devices/1", "Device.Wireless", "'Bitrate': <uint32 " + std::to_string(i + 2) + ">");
        emit("/AccessPoint/7", "AccessPoint", "'Strength': <byte " + std::to_string(i) + ">");
    }
    emit("/Devices/1", "Device.Wireless", "'ActiveAccessPoint': <@o '/'>");
    EXPECT_TRUE(ends.waitFor(1));
    EXPECT_LT(calls.count(), before + TIMES);
    watch.reset();
}

TEST_F(WatchTest, FailureThatDoesNotLastIsTold)
{
    serveDevices({{WIFI, 50}});
    std::vector<WifiConnection> told;
    watch = network.watch([&] {
        const auto now = network.wifiConnection();
        if (now && (told.empty() || told.back() != now.value().value)) {
            told.push_back(now.value().value);
            calls.note();
        }
    });
    ASSERT_TRUE(calls.waitFor(1));
    const std::string device = NM_PATH + "/Devices/0";
    networkManager->emit(device, NM_DEVICE, "StateChanged", "(uint32 120, uint32 50, uint32 7)");
    tellChanged(*networkManager, device, NM_DEVICE, "'State': <uint32 30>");
    EXPECT_TRUE(calls.waitFor(3));
    watch.reset();
    EXPECT_THAT(told, testing::ElementsAre(WifiConnection::Association, WifiConnection::Failure,
                                           WifiConnection::Disconnected));
}

// Sets an interface's flags, of which the kernel tells whoever listens in this network.
bool switchOn(const char* interface)
{
    ifreq request = {};
    std::snprintf(request.ifr_name, sizeof request.ifr_name, "%s", interface);
    request.ifr_flags = IFF_UP;
    const port::Descriptor socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    return ioctl(socket.number(), SIOCSIFFLAGS, &request) == 0;
}

TEST_F(WatchTest, KernelTellsOfALinkWhileNetworkManagerIsGone)
{
    const std::string wlan = writeLink("wlan0", "/wireless/status", "down");
    std::atomic<LinkState> told{LinkState::Deactivated};
    bool hasNetwork = false;
    bool isToldOf = false;
    std::thread inANetworkOfItsOwn([&] {
        hasNetwork = unshare(CLONE_NEWNET) == 0;
        if (!hasNetwork)
            return;
        watch = network.watch([&] {
            told = network.wifi().value().value;
            calls.note();
        });
        if (!calls.waitFor(1))
            return;
        root.write(wlan + "/operstate", "up\n");
        isToldOf = isTold([] { EXPECT_TRUE(switchOn("lo")); });
    });
    inANetworkOfItsOwn.join();
    if (!hasNetwork)
        GTEST_SKIP() << "needs a network namespace";
    EXPECT_TRUE(isToldOf);
    EXPECT_EQ(LinkState::Connected, told);
    watch.reset();
}

TEST_F(WatchTest, BusOrServiceThatGoesAndComesIsTold)
{
    daemon.kill();
    begin(); // what the kernel knows is told without a bus
    EXPECT_TRUE(isTold([this] { daemon.start(); }));
    EXPECT_TRUE(isTold([this] { serve(); }));
    EXPECT_TRUE(isTold([this] { tellChanged(*networkManager, NM_PATH, NM); }));
    EXPECT_TRUE(isTold([this] { networkManager.reset(); }));
    EXPECT_TRUE(isTold([this] { serve(); }));
    networkManager.reset();
    EXPECT_TRUE(isTold([this] { daemon.kill(); }));
    EXPECT_TRUE(isTold([this] { daemon.start(); }));
    EXPECT_TRUE(isTold([this] { serve(); }));
}

TEST_F(WatchTest, BurstIsToldInFewCalls)
{
    serve();
    begin();
    const int before = calls.count();
    constexpr int SIGNALS = 1000;
    for (int i = 0; i < SIGNALS; ++i)
        tellChanged(*networkManager, NM_PATH, NM);
    EXPECT_TRUE(calls.waitFor(before + 1));
    EXPECT_TRUE(isTold([this] { networkManager.reset(); }));
    EXPECT_LT(calls.count() - before, SIGNALS / 2);
}

TEST_F(WatchTest, NothingIsToldAfterItsEnd)
{
    serve();
    begin();
    for (int i = 0; i < 50; ++i)
        tellChanged(*networkManager, NM_PATH, NM);
    watch.reset();
    const int atTheEnd = calls.count();
    // A second watch has seen what came after.
    Calls other;
    const auto second = network.watch([&other] { other.note(); });
    ASSERT_TRUE(other.waitFor(1));
    networkManager.reset();
    EXPECT_TRUE(other.waitFor(2));
    EXPECT_EQ(atTheEnd, calls.count());
}

TEST_F(WatchTest, WatchesBeginAndEndWhileSignalsArrive)
{
    serve();
    std::atomic<bool> isOver{false};
    std::thread sender([&] {
        while (!isOver)
            tellChanged(*networkManager, NM_PATH, NM);
    });
    constexpr int WATCHES = 200;
    for (int i = 0; i < WATCHES; ++i) {
        auto living = std::make_unique<bool>(true);
        const int before = calls.count();
        watch = network.watch([&] {
            EXPECT_TRUE(*living);
            calls.note();
        });
        if (i % 2 == 0) {
            EXPECT_TRUE(calls.waitFor(before + 1));
        }
        watch.reset();
        living.reset();
    }
    isOver = true;
    sender.join();
}

TEST_F(WatchTest, EndOfAWatchThatNeverReachedTheBusIsQuick)
{
    daemon.freeze();
    watch = network.watch([this] { calls.note(); });
    EXPECT_LT(millisecondsOf([this] { watch.reset(); }), 1000);
    daemon.thaw();
}

} // namespace
