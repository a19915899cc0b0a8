// SPDX-License-Identifier: Apache-2.0
// NetworkManager: its switches, a device for each radio, a connection for each of these.
#include <ModemManager/ModemManager.h>
#include <nm-dbus-interface.h>
#include <nm-version.h>

#include "Service.h"

namespace port::played {
namespace {

constexpr char MANAGER_OF_OBJECTS[] = "/org/freedesktop";
constexpr char WIRELESS[] = NM_DBUS_INTERFACE_DEVICE_WIRELESS;
constexpr char SECRET_AGENTS[] = NM_DBUS_INTERFACE ".AgentManager";
constexpr char DNS[] = NM_DBUS_INTERFACE ".DnsManager";
constexpr char DEVICE_MODEM[] = NM_DBUS_INTERFACE_DEVICE ".Modem";
constexpr char DEVICE_BLUETOOTH[] = NM_DBUS_INTERFACE_DEVICE_BLUETOOTH;
constexpr char ACCESS_POINT[] = NM_DBUS_PATH_ACCESS_POINT "/1";
// Taken from the range that is reserved for documentation (RFC 7042).
constexpr char WIFI_ADDRESS[] = "00:00:5E:00:53:01";
constexpr char BLUETOOTH_ADDRESS[] = "00:00:5E:00:53:03";
constexpr char NAME_OF_WIFI[] = "Wi-Fi";
constexpr guint32 FLAG_DEVICE_NM_SUPPORTED = 1;
constexpr guint32 ENCODED = NM_ENCODE_VERSION(NM_MAJOR_VERSION, NM_MINOR_VERSION, NM_MICRO_VERSION);

// The connections that the user has set up, one for each kind of radio.
struct Kind {
    const char* id;
    const char* uuid;
    const char* type;
    int number; // of its objects
};
constexpr Kind WIFI = {NAME_OF_WIFI, "2d9b2c9f-8d57-4e0c-9f4e-6a2f0a3c0001", "802-11-wireless", 1};
constexpr Kind GSM = {"Mobile data", "2d9b2c9f-8d57-4e0c-9f4e-6a2f0a3c0002", "gsm", 2};
constexpr Kind BLUETOOTH = {"Bluetooth", "2d9b2c9f-8d57-4e0c-9f4e-6a2f0a3c0003", "bluetooth", 3};
constexpr const Kind* KINDS[] = {&WIFI, &GSM, &BLUETOOTH};
constexpr int FIRST_MODEM = 3; // among the devices

std::string settingsOf(const Kind& kind)
{
    return numbered(NM_DBUS_PATH_SETTINGS, kind.number);
}
std::string activeOf(const Kind& kind)
{
    return numbered("/org/freedesktop/NetworkManager/ActiveConnection", kind.number);
}
std::string deviceAt(int number)
{
    return numbered("/org/freedesktop/NetworkManager/Devices", number);
}
// A network whose name the file does not say has one all the same.
std::string ssidOf(const Facts& facts)
{
    return facts.ssid.empty() ? NAME_OF_WIFI : facts.ssid;
}

GVariant* bytesOf(const std::string& text)
{
    return g_variant_new_fixed_array(G_VARIANT_TYPE_BYTE, text.data(), text.size(), 1);
}

NMDeviceState stateOfWifi(const Facts& facts)
{
    if (!facts.isWifiOn())
        return NM_DEVICE_STATE_UNAVAILABLE;
    if (facts.wifi == LinkState::Connected)
        return NM_DEVICE_STATE_ACTIVATED;
    switch (facts.wifiConnection.value_or(WifiConnection::Disconnected)) {
    case WifiConnection::Failure:
        return NM_DEVICE_STATE_FAILED;
    case WifiConnection::Association:
        return NM_DEVICE_STATE_CONFIG;
    case WifiConnection::Configuration:
        return NM_DEVICE_STATE_IP_CONFIG;
    default:
        return NM_DEVICE_STATE_DISCONNECTED;
    }
}

NMDeviceState stateOfModem(const Facts& facts, std::size_t index)
{
    if (facts.connectedSlot() == index)
        return NM_DEVICE_STATE_ACTIVATED;
    return facts.slots[index].isReady() && facts.isCellularOn() ? NM_DEVICE_STATE_DISCONNECTED
                                                                : NM_DEVICE_STATE_UNAVAILABLE;
}

bool isComingUp(NMDeviceState state)
{
    return state > NM_DEVICE_STATE_DISCONNECTED && state < NM_DEVICE_STATE_ACTIVATED;
}

// NetworkManager's objects for one kind of radio.
struct Radio {
    const Kind* kind;
    bool hasSettings;
    std::string device; // the one of the connection; empty where it has none
    NMDeviceState state = NM_DEVICE_STATE_UNKNOWN;

    bool isActive() const
    {
        return state == NM_DEVICE_STATE_ACTIVATED;
    }
    bool isUsed() const // by a connection that is up or coming up
    {
        return isActive() || isComingUp(state);
    }
};

class Network {
public:
    explicit Network(const Scene& scene) : scene_(scene), facts_(scene.facts)
    {
        const auto slot = facts_.connectedSlot();
        const bool isPan = facts_.bluetooth == LinkState::Connected;
        radios_ = {
            {&WIFI, facts_.wifi.has_value(), deviceAt(1), stateOfWifi(facts_)},
            {&GSM, hasModem() && knowsData(),
             slot ? deviceAt(FIRST_MODEM + scene.modems.numberOf(facts_.slots[*slot])) : "",
             slot ? NM_DEVICE_STATE_ACTIVATED : NM_DEVICE_STATE_UNKNOWN},
            {&BLUETOOTH, isPan, deviceAt(2),
             isPan ? NM_DEVICE_STATE_ACTIVATED : NM_DEVICE_STATE_UNKNOWN},
        };
        // Data goes over a connection, whoever set it up.
        radios_[1].hasSettings = radios_[1].hasSettings || radios_[1].isUsed();
        if (!facts_.wifi)
            radios_[0].state = NM_DEVICE_STATE_UNKNOWN;
    }

    World world() const
    {
        World world;
        showDevices(world);
        std::vector<std::string> devices;
        for (const Object& device : world)
            if (device.find(NM_DBUS_INTERFACE_DEVICE) != nullptr)
                devices.push_back(device.path);
        std::vector<std::string> settings;
        for (const Radio& radio : radios_) {
            if (radio.isUsed())
                world.push_back({activeOf(*radio.kind), {active(radio)}});
            if (!radio.hasSettings)
                continue;
            settings.push_back(settingsOf(*radio.kind));
            world.push_back({settings.back(), {face(NM_DBUS_INTERFACE_SETTINGS_CONNECTION)}});
        }
        world.push_back({NM_DBUS_PATH_SETTINGS,
                         {face(NM_DBUS_INTERFACE_SETTINGS,
                               {{"Connections", texts(settings, "ao")},
                                {"Hostname", value("s", facts_.hostName.c_str())}})}});
        world.push_back({NM_DBUS_PATH "/AgentManager", {face(SECRET_AGENTS)}});
        world.push_back({NM_DBUS_PATH "/DnsManager", {face(DNS)}});
        world.push_back({NM_DBUS_PATH, {manager(devices)}});
        return world;
    }

private:
    bool hasModem() const
    {
        return !facts_.slots.empty();
    }
    bool knowsData() const
    {
        return facts_.dataRoaming || facts_.packetData || facts_.mobileData;
    }
    // Over which traffic goes.
    const Radio* primary() const
    {
        for (const Radio& radio : radios_)
            if (radio.isActive())
                return &radio;
        return nullptr;
    }
    const Radio* activating() const
    {
        for (const Radio& radio : radios_)
            if (isComingUp(radio.state))
                return &radio;
        return nullptr;
    }

    Face device(NMDeviceType type, NMDeviceState state, const std::string& interface,
                const Radio& radio, Values more) const
    {
        const bool isUsed = radio.isUsed() && state != NM_DEVICE_STATE_DISCONNECTED &&
                            state != NM_DEVICE_STATE_UNAVAILABLE;
        const bool isUsable = radio.hasSettings && state >= NM_DEVICE_STATE_DISCONNECTED;
        using Paths = std::vector<std::string>;
        more.merge(Values{
            {"Interface", value("s", interface.c_str())},
            {"IpInterface", value("s", isUsed ? interface.c_str() : "")},
            {"Capabilities", value("u", FLAG_DEVICE_NM_SUPPORTED)},
            {"State", value("u", state)},
            {"StateReason", value("(uu)", state, NM_DEVICE_STATE_REASON_NONE)},
            {"DeviceType", value("u", type)},
            {"ActiveConnection", pathOf(isUsed ? activeOf(*radio.kind) : "/")},
            {"AvailableConnections",
             texts(isUsable ? Paths{settingsOf(*radio.kind)} : Paths(), "ao")},
        });
        return face(NM_DBUS_INTERFACE_DEVICE, std::move(more));
    }

    void showDevices(World& world) const
    {
        const Face statistics = face(NM_DBUS_INTERFACE_DEVICE_STATISTICS);
        if (facts_.wifi) {
            const Radio& wifi = radios_[0];
            world.push_back({wifi.device,
                             {device(NM_DEVICE_TYPE_WIFI, wifi.state, "wlan0", wifi,
                                     {{"HwAddress", value("s", WIFI_ADDRESS)},
                                      {"IpInterface", value("s", "wlan0")}}),
                              wireless(wifi), statistics}});
            if (wifi.isActive())
                world.push_back({ACCESS_POINT, {accessPoint()}});
        }
        for (std::size_t i = 0; i < facts_.slots.size(); ++i)
            showModem(world, i, statistics);
        if (facts_.bluetooth == LinkState::Connected)
            world.push_back(
                {deviceAt(2),
                 {device(NM_DEVICE_TYPE_BT, NM_DEVICE_STATE_ACTIVATED, BLUETOOTH_ADDRESS,
                         radios_[2], {{"HwAddress", value("s", BLUETOOTH_ADDRESS)}}),
                  face(DEVICE_BLUETOOTH, {{"HwAddress", value("s", BLUETOOTH_ADDRESS)},
                                          {"BtCapabilities", value("u", NM_BT_CAPABILITY_NAP)}}),
                  statistics}});
    }

    void showModem(World& world, std::size_t index, const Face& statistics) const
    {
        const SlotFacts& slot = facts_.slots[index];
        const int number = scene_.modems.numberOf(slot);
        const std::string modem = numbered(MM_DBUS_MODEM_PREFIX, number);
        world.push_back(
            {deviceAt(FIRST_MODEM + number),
             {device(NM_DEVICE_TYPE_MODEM, stateOfModem(facts_, index),
                     "cdc-wdm" + std::to_string(index), radios_[1],
                     {{"Udi", value("s", modem.c_str())},
                      {"IpInterface", value("s", facts_.connectedSlot() == index
                                                     ? ("wwan" + std::to_string(index)).c_str()
                                                     : "")}}),
              face(DEVICE_MODEM, {{"OperatorCode", value("s", slot.operatorCode().c_str())}}),
              statistics}});
    }

    static Face wireless(const Radio& wifi)
    {
        using Paths = std::vector<std::string>;
        return face(WIRELESS,
                    {{"HwAddress", value("s", WIFI_ADDRESS)},
                     {"PermHwAddress", value("s", WIFI_ADDRESS)},
                     {"Mode", value("u", NM_802_11_MODE_INFRA)},
                     {"LastScan", value("x", static_cast<gint64>(-1))},
                     {"AccessPoints", texts(wifi.isActive() ? Paths{ACCESS_POINT} : Paths(), "ao")},
                     {"ActiveAccessPoint", pathOf(wifi.isActive() ? ACCESS_POINT : "/")}});
    }

    Face accessPoint() const
    {
        return face(NM_DBUS_INTERFACE_ACCESS_POINT,
                    {{"Ssid", share(g_variant_ref_sink(bytesOf(ssidOf(facts_))))},
                     {"HwAddress", value("s", "00:00:5E:00:53:FF")},
                     {"Mode", value("u", NM_802_11_MODE_INFRA)},
                     {"LastSeen", value("i", -1)}});
    }

    Face active(const Radio& radio) const
    {
        const bool isPrimary = primary() == &radio;
        return face(
            NM_DBUS_INTERFACE_ACTIVE_CONNECTION,
            {{"Connection", pathOf(settingsOf(*radio.kind))},
             {"SpecificObject",
              pathOf(radio.kind == &WIFI && radio.isActive() ? ACCESS_POINT : "/")},
             {"Id", value("s", radio.kind->id)},
             {"Uuid", value("s", radio.kind->uuid)},
             {"Type", value("s", radio.kind->type)},
             {"Devices", texts({radio.device}, "ao")},
             {"State", value("u", radio.isActive() ? NM_ACTIVE_CONNECTION_STATE_ACTIVATED
                                                   : NM_ACTIVE_CONNECTION_STATE_ACTIVATING)},
             {"Default", value("b", isPrimary)}});
    }

    Face manager(const std::vector<std::string>& devices) const
    {
        const Radio* const first = primary();
        const Radio* const next = activating();
        std::vector<std::string> active;
        for (const Radio& radio : radios_)
            if (radio.isUsed())
                active.push_back(activeOf(*radio.kind));
        guint32 radios = NM_RADIO_FLAG_NONE;
        radios |= facts_.wifi ? NM_RADIO_FLAG_WLAN_AVAILABLE : NM_RADIO_FLAG_NONE;
        radios |= hasModem() ? NM_RADIO_FLAG_WWAN_AVAILABLE : NM_RADIO_FLAG_NONE;
        NMState state = NM_STATE_DISCONNECTED;
        if (first != nullptr)
            state = NM_STATE_CONNECTED_GLOBAL;
        else if (next != nullptr)
            state = NM_STATE_CONNECTING;
        return face(
            NM_DBUS_INTERFACE,
            {{"Version", textOf(versionText(NM_MAJOR_VERSION, NM_MINOR_VERSION, NM_MICRO_VERSION))},
             {"VersionInfo", value("@au", g_variant_new_fixed_array(G_VARIANT_TYPE_UINT32, &ENCODED,
                                                                    1, sizeof ENCODED))},
             {"Devices", texts(devices, "ao")},
             {"AllDevices", texts(devices, "ao")},
             {"ActiveConnections", texts(active, "ao")},
             {"WirelessEnabled", value("b", facts_.isWifiOn())},
             {"WwanEnabled", value("b", facts_.isCellularOn())},
             {"RadioFlags", value("u", radios)},
             {"PrimaryConnection", pathOf(first != nullptr ? activeOf(*first->kind) : "/")},
             {"PrimaryConnectionType", value("s", first != nullptr ? first->kind->type : "")},
             {"ActivatingConnection", pathOf(next != nullptr ? activeOf(*next->kind) : "/")},
             {"State", value("u", state)},
             {"Connectivity",
              value("u", first != nullptr ? NM_CONNECTIVITY_FULL : NM_CONNECTIVITY_NONE)}});
    }

    const Scene& scene_;
    const Facts& facts_;
    std::vector<Radio> radios_; // in the order in which traffic prefers them
};

World networkWorld(const Scene& scene)
{
    return Network(scene).world();
}

Outcome refused(const char* name, const std::string& text)
{
    return Outcome::refuse(std::string(NM_DBUS_INTERFACE ".") + name, text);
}

Outcome setWifi(const Request& request)
{
    const bool on = g_variant_get_boolean(request.arguments) != FALSE;
    const Facts& facts = request.scene.facts;
    if (!facts.wifi || on == facts.isWifiOn())
        return {};
    return Outcome::change(wifiSwitch(facts, on));
}

Outcome setCellular(const Request& request)
{
    const bool on = g_variant_get_boolean(request.arguments) != FALSE;
    const Facts& facts = request.scene.facts;
    if (facts.slots.empty() || on == facts.isCellularOn())
        return {};
    return Outcome::change(cellularSwitch(facts, on));
}

// Answers a method with a list that is also a property.
Outcome list(const Request& request, const char* property)
{
    return Outcome::answer(g_variant_new("(@ao)", request.value(property)));
}
Outcome devices(const Request& request)
{
    return list(request, "Devices");
}
Outcome connections(const Request& request)
{
    return list(request, "Connections");
}
Outcome state(const Request& request)
{
    return Outcome::answer(g_variant_new("(@u)", request.value("State")));
}
Outcome connectivity(const Request& request)
{
    return Outcome::answer(g_variant_new("(@u)", request.value("Connectivity")));
}

Outcome permissions(const Request&)
{
    GVariantBuilder all;
    g_variant_builder_init(&all, G_VARIANT_TYPE("a{ss}"));
    for (const char* const name :
         {"enable-disable-network", "enable-disable-wifi", "enable-disable-wwan",
          "enable-disable-wimax", "network-control", "settings.modify.system",
          "settings.modify.own", "settings.modify.hostname"})
        g_variant_builder_add(&all, "{ss}", (std::string(NM_DBUS_INTERFACE ".") + name).c_str(),
                              "yes");
    return Outcome::answer(g_variant_new("(a{ss})", &all));
}

const Object* findDevice(const Request& request, const std::string& interface)
{
    for (const Object& object : request.world)
        if (const Face* const device = object.find(NM_DBUS_INTERFACE_DEVICE))
            for (const char* const name : {"Interface", "IpInterface"})
                if (interface == g_variant_get_string(device->value(name), nullptr))
                    return &object;
    return nullptr;
}

Outcome deviceByInterface(const Request& request)
{
    const char* interface = nullptr;
    g_variant_get(request.arguments, "(&s)", &interface);
    const Object* const device = findDevice(request, interface);
    if (device == nullptr || *interface == '\0')
        return refused("UnknownDevice", "No device found for the requested iface.");
    return Outcome::answer(g_variant_new("(o)", device->path.c_str()));
}

const Kind* kindAt(const std::string& path, std::string (*pathOfKind)(const Kind&))
{
    for (const Kind* const kind : KINDS)
        if (pathOfKind(*kind) == path)
            return kind;
    return nullptr;
}

bool isShown(const Request& request, const std::string& path)
{
    for (const Object& object : request.world)
        if (object.path == path)
            return true;
    return false;
}

Outcome settings(const Request& request)
{
    const Kind& kind = *kindAt(request.path, settingsOf);
    const Facts& facts = request.scene.facts;
    const bool comesUp =
        &kind != &GSM || facts.packetData.value_or(facts.mobileData.value_or(false));
    GVariantDict connection;
    g_variant_dict_init(&connection, nullptr);
    g_variant_dict_insert(&connection, "id", "s", kind.id);
    g_variant_dict_insert(&connection, "uuid", "s", kind.uuid);
    g_variant_dict_insert(&connection, "type", "s", kind.type);
    if (!comesUp) // what has its default value is left out
        g_variant_dict_insert(&connection, "autoconnect", "b", FALSE);
    GVariantDict own;
    g_variant_dict_init(&own, nullptr);
    if (&kind == &WIFI)
        g_variant_dict_insert_value(&own, "ssid", bytesOf(ssidOf(facts)));
    if (&kind == &GSM && !facts.dataRoaming.value_or(true))
        g_variant_dict_insert(&own, "home-only", "b", TRUE);
    static const Variant automatic =
        share(g_variant_ref_sink(g_variant_new_parsed("{'method': <'auto'>}")));
    GVariantBuilder all;
    g_variant_builder_init(&all, G_VARIANT_TYPE("a{sa{sv}}"));
    g_variant_builder_add(&all, "{s@a{sv}}", "connection", g_variant_dict_end(&connection));
    g_variant_builder_add(&all, "{s@a{sv}}", kind.type, g_variant_dict_end(&own));
    g_variant_builder_add(&all, "{s@a{sv}}", "ipv4", automatic.get());
    g_variant_builder_add(&all, "{s@a{sv}}", "ipv6", automatic.get());
    return Outcome::answer(g_variant_new("(a{sa{sv}})", &all));
}

Outcome connectionByUuid(const Request& request)
{
    const char* uuid = nullptr;
    g_variant_get(request.arguments, "(&s)", &uuid);
    for (const Kind* const kind : KINDS)
        if (std::string(kind->uuid) == uuid && isShown(request, settingsOf(*kind)))
            return Outcome::answer(g_variant_new("(o)", settingsOf(*kind).c_str()));
    return Outcome::refuse(NM_DBUS_INTERFACE_SETTINGS ".InvalidConnection",
                           "No connection with the UUID was found.");
}

std::vector<devicefile::Edit> ended(const Kind& kind)
{
    if (&kind == &WIFI)
        return {set("network.wifi", "disconnected"), unset("network.wifi_connection")};
    if (&kind == &GSM)
        return {set("network.cellular", "available")};
    return {set("network.bluetooth", "disconnected")};
}

// Another connection than the radio's only one cannot be, so only that one is taken.
Outcome activate(const Request& request)
{
    const char* connection = nullptr;
    const char* device = nullptr;
    g_variant_get(request.arguments, "(&o&o&o)", &connection, &device, nullptr);
    const Kind* kind = kindAt(connection, settingsOf);
    const bool isAny = std::string(connection) == "/";
    if (isAny && std::string(device) == deviceAt(1))
        kind = &WIFI;
    if (isAny && !isShown(request, device))
        return refused("UnknownDevice",
                       "Only devices may be activated without a specifying a connection");
    if (kind == nullptr || !isShown(request, settingsOf(*kind)))
        return refused("UnknownConnection", "Connection could not be found.");
    const Facts& facts = request.scene.facts;
    if (kind == &WIFI ? !facts.isWifiOn() : !facts.isCellularOn())
        return refused("UnknownDevice", "No suitable device found for this connection.");
    Outcome outcome = Outcome::answer(g_variant_new("(o)", activeOf(*kind).c_str()));
    outcome.changes = {set(kind == &WIFI ? "network.wifi" : "network.cellular", "connected")};
    if (kind == &WIFI)
        outcome.changes.push_back(unset("network.wifi_connection"));
    return outcome;
}

Outcome deactivate(const Request& request)
{
    const char* path = nullptr;
    g_variant_get(request.arguments, "(&o)", &path);
    const Kind* const kind = kindAt(path, activeOf);
    if (kind == nullptr || !isShown(request, path))
        return refused("ConnectionNotActive", "The connection was not active.");
    return Outcome::change(ended(*kind));
}

Outcome disconnectDevice(const Request& request)
{
    const std::string active = g_variant_get_string(request.value("ActiveConnection"), nullptr);
    const Kind* const kind = kindAt(active, activeOf);
    if (kind == nullptr)
        return Outcome::refuse(NM_DBUS_INTERFACE_DEVICE ".NotActive", "This device is not active");
    return Outcome::change(ended(*kind));
}

Outcome noAccessPoints(const Request& request)
{
    return list(request, "AccessPoints");
}

Outcome logging(const Request&)
{
    return Outcome::answer(g_variant_new("(ss)", "INFO", "DEFAULT"));
}

Outcome refuseAsNotAuthorized(const Request& request)
{
    return refused("PermissionDenied", "Not authorized: " + request.member);
}

GVariant* stateOfDeviceTale(GVariant* before, GVariant* after)
{
    return g_variant_new("(uuu)", g_variant_get_uint32(after), g_variant_get_uint32(before),
                         NM_DEVICE_STATE_REASON_NONE);
}
GVariant* stateOfActiveTale(GVariant*, GVariant* after)
{
    return g_variant_new("(uu)", g_variant_get_uint32(after),
                         NM_ACTIVE_CONNECTION_STATE_REASON_UNKNOWN);
}
GVariant* networkStateTale(GVariant*, GVariant* after)
{
    return g_variant_new("(u)", g_variant_get_uint32(after));
}

} // namespace

const Role& networkManager()
{
    static const Role service = {
        "NetworkManager",
        NM_DBUS_SERVICE,
        MANAGER_OF_OBJECTS,
        networkWorld,
        nullptr,
        {
            {NM_DBUS_INTERFACE, "GetDevices", devices},
            {NM_DBUS_INTERFACE, "GetAllDevices", devices},
            {NM_DBUS_INTERFACE, "GetDeviceByIpIface", deviceByInterface},
            {NM_DBUS_INTERFACE, "GetPermissions", permissions},
            {NM_DBUS_INTERFACE, "GetLogging", logging},
            {NM_DBUS_INTERFACE, "CheckConnectivity", connectivity},
            {NM_DBUS_INTERFACE, "state", state},
            {NM_DBUS_INTERFACE, "ActivateConnection", activate},
            {NM_DBUS_INTERFACE, "DeactivateConnection", deactivate},
            {NM_DBUS_INTERFACE_DEVICE, "Disconnect", disconnectDevice},
            {NM_DBUS_INTERFACE_SETTINGS, "ListConnections", connections},
            {NM_DBUS_INTERFACE_SETTINGS, "GetConnectionByUuid", connectionByUuid},
            {NM_DBUS_INTERFACE_SETTINGS_CONNECTION, "GetSettings", settings},
            {WIRELESS, "GetAccessPoints", noAccessPoints},
            {WIRELESS, "GetAllAccessPoints", noAccessPoints},
            {WIRELESS, "RequestScan", nothing},
            {SECRET_AGENTS, "Register", nothing},
            {SECRET_AGENTS, "RegisterWithCapabilities", nothing},
            {SECRET_AGENTS, "Unregister", nothing},
        },
        {{NM_DBUS_INTERFACE, "WirelessEnabled", setWifi},
         {NM_DBUS_INTERFACE, "WwanEnabled", setCellular}},
        {{NM_DBUS_INTERFACE_DEVICE, "State", "StateChanged", false, stateOfDeviceTale},
         {NM_DBUS_INTERFACE_ACTIVE_CONNECTION, "State", "StateChanged", true, stateOfActiveTale},
         {NM_DBUS_INTERFACE, "State", "StateChanged", false, networkStateTale}},
        {{NM_DBUS_INTERFACE, "AllDevices", "DeviceAdded", "DeviceRemoved"},
         {NM_DBUS_INTERFACE_SETTINGS, "Connections", "NewConnection", "ConnectionRemoved"},
         {WIRELESS, "AccessPoints", "AccessPointAdded", "AccessPointRemoved"}},
        refuseAsNotAuthorized,
        false,
        {{NM_DBUS_INTERFACE_SETTINGS_CONNECTION, "GetSettings", "Updated"}},
    };
    return service;
}

} // namespace port::played
