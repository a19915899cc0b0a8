// SPDX-License-Identifier: Apache-2.0
// BlueZ: one adapter, and the device that it is connected to.
#include "Service.h"

namespace port::played {
namespace {

constexpr char ADAPTER[] = "org.bluez.Adapter1";
constexpr char DEVICE[] = "org.bluez.Device1";
constexpr char AGENT_MANAGER[] = "org.bluez.AgentManager1";
// Taken from the range that is reserved for documentation (RFC 7042).
constexpr char ADDRESS[] = "00:00:5E:00:53:02";
constexpr char PEER[] = "00:00:5E:00:53:03";
// Offered without any profile: generic access and attributes, device information, PnP.
constexpr const char* OWN_SERVICES[] = {
    "00001800-0000-1000-8000-00805f9b34fb",
    "00001801-0000-1000-8000-00805f9b34fb",
    "0000180a-0000-1000-8000-00805f9b34fb",
    "00001200-0000-1000-8000-00805f9b34fb",
};
constexpr char ADAPTER_PATH[] = "/org/bluez/hci0";
constexpr char PEER_PATH[] = "/org/bluez/hci0/dev_00_00_5E_00_53_03";

Face adapter(const Facts& facts)
{
    return face(ADAPTER, {{"Address", textOf(ADDRESS)},
                          {"AddressType", textOf("public")},
                          {"Name", textOf(facts.deviceName)},
                          {"Alias", textOf(facts.deviceName)},
                          {"Powered", value("b", facts.isBluetoothOn())},
                          {"PowerState", textOf(facts.isBluetoothOn() ? "on" : "off")},
                          {"DiscoverableTimeout", value("u", 180)},
                          {"Pairable", value("b", facts.isBluetoothOn())},
                          {"UUIDs", texts({OWN_SERVICES, std::end(OWN_SERVICES)})},
                          {"Modalias", textOf("usb:v1D6Bp0246d0542")}, // the kernel's, and 5.66
                          {"Roles", texts({"central", "peripheral"})}});
}

Face peer()
{
    return face(DEVICE, {{"Address", textOf(PEER)},
                         {"AddressType", textOf("public")},
                         {"Alias", textOf("00-00-5E-00-53-03")},
                         {"Paired", value("b", TRUE)},
                         {"Bonded", value("b", TRUE)},
                         {"Trusted", value("b", TRUE)},
                         {"Connected", value("b", TRUE)},
                         {"Adapter", value("o", ADAPTER_PATH)},
                         {"ServicesResolved", value("b", TRUE)}});
}

World bluezWorld(const Scene& scene)
{
    World world = {{"/org/bluez",
                    {face(AGENT_MANAGER), face("org.bluez.HealthManager1"),
                     face("org.bluez.ProfileManager1")}}};
    if (scene.facts.bluetooth)
        world.push_back({ADAPTER_PATH,
                         {adapter(scene.facts), face("org.bluez.GattManager1"),
                          face("org.bluez.LEAdvertisingManager1"), face("org.bluez.Media1"),
                          face("org.bluez.NetworkServer1")}});
    if (scene.facts.bluetooth == LinkState::Connected)
        world.push_back({PEER_PATH, {peer()}});
    return world;
}

Outcome setPowered(const Request& request)
{
    const bool on = g_variant_get_boolean(request.arguments) != FALSE;
    if (on == request.scene.facts.isBluetoothOn())
        return {};
    return Outcome::change(bluetoothSwitch(request.scene.facts, on));
}

Outcome disconnectPeer(const Request&)
{
    return Outcome::change({set("network.bluetooth", "disconnected")});
}

Outcome filters(const Request&)
{
    return Outcome::answer(g_variant_new_parsed("(['UUIDs', 'RSSI', 'Pathloss', 'Transport'],)"));
}

Outcome refuseInBluez(const Request& request)
{
    if (!request.scene.facts.isBluetoothOn())
        return Outcome::refuse("org.bluez.Error.NotReady", "Resource Not Ready");
    return Outcome::refuse("org.bluez.Error.NotSupported", "Operation is not supported");
}

} // namespace

const Role& bluez()
{
    static const Role service = {
        "bluez",
        "org.bluez",
        "/",
        bluezWorld,
        nullptr,
        {{AGENT_MANAGER, "RegisterAgent", nothing},
         {AGENT_MANAGER, "UnregisterAgent", nothing},
         {AGENT_MANAGER, "RequestDefaultAgent", nothing},
         {ADAPTER, "GetDiscoveryFilters", filters},
         {DEVICE, "Connect", nothing},
         {DEVICE, "Disconnect", disconnectPeer}},
        {{ADAPTER, "Powered", setPowered}},
        {},
        {},
        refuseInBluez,
        false,
    };
    return service;
}

} // namespace port::played
